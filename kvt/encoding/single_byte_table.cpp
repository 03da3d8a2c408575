// The tables of a single-byte encoding (see detail/single_byte_table.h), asked from ICU byte by byte.
#include <kvt/encoding/detail/single_byte_table.h>

#include <kvt/encoding/detail/icu.h>
#include <kvt/foundation/detail/utf.h>

#include <iterator>

namespace kvt::ex::detail {
namespace {

/// A converter of its own that is asked for single characters.
class Probe final : private icu::LossListener {
public:
    explicit Probe(Encoding encoding) : converter_(encoding) {
        if (converter_.isOpen()) {
            converter_.setListener(*this);
        }
    }
    Probe(const Probe&) = delete;
    Probe& operator=(const Probe&) = delete;

    bool isOpen() const { return converter_.isOpen(); }

    /// `noUnit` where the byte is not just one unit of its own, whatever follows.
    char16_t unitOf(std::uint8_t byte) {
        const char source = static_cast<char>(byte);
        const char* position = &source;
        char16_t units[4];
        char16_t* target = units;
        isQuiet_ = true;
        const icu::Progress progress =
            converter_.toUnicode(position, &source + 1, target, std::end(units), false);
        return endedWell(progress, converter_.heldBytes() != 0) && target - units == 1 &&
                       !isSurrogate(units[0])
                   ? units[0]
                   : SingleByteTable::noUnit;
    }

    /// Whether the unit, whatever follows it, becomes one byte; and which.
    bool byteOf(char16_t unit, std::uint8_t& byte) {
        const char16_t* position = &unit;
        char bytes[8];
        char* target = bytes;
        isQuiet_ = true;
        const icu::Progress progress =
            converter_.fromUnicode(position, &unit + 1, target, std::end(bytes), false);
        if (!endedWell(progress, converter_.holdsUnits()) || target - bytes != 1) {
            return false;
        }
        byte = static_cast<std::uint8_t>(bytes[0]);
        return true;
    }

private:
    /// ICU holds what could be the beginning of something longer. It is to forget that before the next question.
    bool endedWell(const icu::Progress& progress, bool holdsSomething) {
        if (progress.end == icu::Progress::inputTaken && isQuiet_ && !holdsSomething) {
            return true;
        }
        converter_.reset();
        return false;
    }

    void onBadInput(std::string_view, const char16_t*, int) noexcept override { isQuiet_ = false; }
    void onNotRepresentable(char32_t, int) noexcept override { isQuiet_ = false; }

    icu::Converter converter_;
    bool isQuiet_ = true;
};

std::uint32_t weightOf(char16_t unit) {
    return unit == SingleByteTable::noUnit ? SingleByteTable::noCharacter
           : unit < 0x80                   ? 1
           : unit < 0x800                  ? 2
                                           : 3;
}

std::unique_ptr<const SingleByteTable::Tables> build(Encoding encoding) {
    auto tables = std::make_unique<SingleByteTable::Tables>();
    tables->units.fill(SingleByteTable::noUnit);
    tables->pages.resize(SingleByteTable::pageSize);
    Probe probe(encoding);
    for (std::size_t i = 0; i < tables->units.size() && probe.isOpen(); ++i) {
        const char16_t unit = probe.unitOf(static_cast<std::uint8_t>(i));
        tables->units[i] = unit;
        std::uint8_t byte = 0;
        if (unit == SingleByteTable::noUnit || !probe.byteOf(unit, byte)) {
            continue;
        }
        std::uint16_t& page = tables->pageOf[unit / SingleByteTable::pageSize];
        if (page == 0) {
            page = static_cast<std::uint16_t>(tables->pages.size());
            tables->pages.resize(tables->pages.size() + SingleByteTable::pageSize);
        }
        tables->pages[page + unit % SingleByteTable::pageSize] = static_cast<std::uint16_t>(0x100 | byte);
    }
    for (std::size_t i = 0; i < tables->units.size(); ++i) {
        tables->weights[i] = weightOf(tables->units[i]);
    }
    return tables;
}

} // namespace

const SingleByteTable::Tables& SingleByteTable::tables() {
    if (tables_ == nullptr) {
        tables_ = build(encoding_);
    }
    return *tables_;
}

} // namespace kvt::ex::detail
