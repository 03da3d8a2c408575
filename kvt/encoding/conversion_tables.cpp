// The tables of code pages (see detail/conversion_tables.h): how ICU is asked for them, and the loops that read them.
#include <kvt/encoding/detail/conversion_tables.h>

#include <kvt/encoding/detail/icu.h>
#include <kvt/foundation/detail/utf.h>

#include <algorithm>
#include <bit>
#include <cstring>
#include <iterator>
#include <optional>

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
    std::vector<icu::Converter::Range> characters() const { return converter_.characters(); }

    /// What some bytes are by themselves, whatever follows.
    struct Read {
        std::optional<char16_t> unit; ///< when they are one
        bool isBeginning = false;     ///< when they are not, whether of something longer
    };
    Read read(std::string_view bytes) {
        const char* source = bytes.data();
        char16_t units[4];
        char16_t* target = units;
        isQuiet_ = true;
        const icu::Progress progress =
            converter_.toUnicode(source, source + bytes.size(), target, std::end(units), false);
        const bool isHeld = converter_.heldBytes() != 0;
        if (progress.end != icu::Progress::inputTaken || !isQuiet_ || isHeld) {
            converter_.reset();
            return {std::nullopt, isQuiet_ && isHeld && target == units};
        }
        const bool isUnit = target - units == 1 && !isSurrogate(units[0]);
        return {isUnit ? std::optional(units[0]) : std::nullopt, false};
    }

    /// The bytes of a unit, whatever follows it; empty when it has none or could be joined with the next.
    std::string_view write(char16_t unit) {
        const char16_t* source = &unit;
        char* target = bytes_;
        isQuiet_ = true;
        const icu::Progress progress =
            converter_.fromUnicode(source, &unit + 1, target, std::end(bytes_), false);
        if (progress.end != icu::Progress::inputTaken || !isQuiet_ || converter_.holdsUnits()) {
            converter_.reset();
            return {};
        }
        return {bytes_, static_cast<std::size_t>(target - bytes_)};
    }

private:
    void onBadInput(std::string_view, const char16_t*, int) noexcept override { isQuiet_ = false; }
    void onNotRepresentable(char32_t, int) noexcept override { isQuiet_ = false; }

    icu::Converter converter_;
    bool isQuiet_ = true;
    char bytes_[16];
};

// As many ASCII characters as a register of a plain processor holds.

bool areAscii(const unsigned char* bytes) {
    std::uint64_t all;
    std::memcpy(&all, bytes, sizeof all);
    return (all & 0x8080808080808080U) == 0;
}
constexpr std::size_t asciiBytes = 8;

bool areAscii(const char16_t* units) {
    std::uint64_t all;
    std::memcpy(&all, units, sizeof all);
    return (all & 0xFF80FF80FF80FF80U) == 0;
}
constexpr std::size_t asciiUnits = 4;

} // namespace

// ---- From bytes --------------------------------------------------------------------------------------------------

DecodingTable::DecodingTable(Encoding encoding) : pages_(pageSize, noUnit) {
    singles_.fill(noUnit);
    Probe probe(encoding);
    for (std::size_t first = 0; first < singles_.size() && probe.isOpen(); ++first) {
        char bytes[2] = {static_cast<char>(first), 0};
        const Probe::Read alone = probe.read({bytes, 1});
        if (alone.unit) {
            singles_[first] = *alone.unit;
        } else if (alone.isBeginning) {
            const std::size_t page = pages_.size();
            pageOf_[first] = static_cast<std::uint32_t>(page);
            pages_.resize(page + pageSize, noUnit);
            for (std::size_t second = 0; second < pageSize; ++second) {
                bytes[1] = static_cast<char>(second);
                pages_[page + second] = probe.read({bytes, 2}).unit.value_or(noUnit);
            }
        }
        keepsAscii_ = keepsAscii_ && (first >= 0x80 || singles_[first] == first);
    }
}

std::size_t DecodingTable::read(std::string_view& in, char16_t* out, std::size_t room) const {
    return pages_.size() == pageSize ? readSingles(in, out, room) : readPairs(in, out, room);
}

std::size_t DecodingTable::readSingles(std::string_view& in, char16_t* out, std::size_t room) const {
    constexpr std::size_t block = 16;
    const auto* const bytes = reinterpret_cast<const unsigned char*>(in.data());
    const std::size_t count = std::min(in.size(), room);
    std::size_t i = 0;
    for (bool areKnown = true; areKnown && i + block <= count; i += areKnown ? block : 0) {
        for (std::size_t place = i; place < i + block; ++place) {
            out[place] = singles_[bytes[place]];
            areKnown = areKnown && out[place] != noUnit;
        }
    }
    while (i < count && (out[i] = singles_[bytes[i]]) != noUnit) {
        ++i;
    }
    in.remove_prefix(i);
    return i;
}

std::size_t DecodingTable::readPairs(std::string_view& in, char16_t* out, std::size_t room) const {
    const auto* p = reinterpret_cast<const unsigned char*>(in.data());
    const unsigned char* const end = p + in.size();
    const char16_t* const outEnd = out + room;
    const char16_t* const pages = pages_.data();
    char16_t* q = out;
    while (p < end && q < outEnd) {
        const std::size_t page = pageOf_[*p];
        if (page != 0) {
            if (end - p < 2 || pages[page + p[1]] == noUnit) {
                break;
            }
            *q++ = pages[page + p[1]];
            p += 2;
            continue;
        }
        if (singles_[*p] == noUnit) {
            break;
        }
        *q++ = singles_[*p++];
        // Behind one ASCII character there are likely to be more.
        while (keepsAscii_ && static_cast<std::size_t>(std::min(end - p, outEnd - q)) >= asciiBytes &&
               areAscii(p)) {
            std::copy(p, p + asciiBytes, q);
            p += asciiBytes;
            q += asciiBytes;
        }
    }
    in.remove_prefix(static_cast<std::size_t>(p - reinterpret_cast<const unsigned char*>(in.data())));
    return static_cast<std::size_t>(q - out);
}

std::size_t DecodingTable::bytesOf(std::string_view in, std::size_t units) const {
    std::size_t bytes = 0;
    for (; units > 0; --units) {
        bytes += pageOf_[static_cast<unsigned char>(in[bytes])] != 0 ? 2 : 1;
    }
    return bytes;
}

// ---- To bytes ----------------------------------------------------------------------------------------------------

EncodingTable::EncodingTable(Encoding encoding) : pages_(pageSize, noCode) {
    Probe probe(encoding);
    if (!probe.isOpen()) {
        return;
    }
    for (const auto& [first, last] : probe.characters()) {
        for (char32_t c = first; c <= last && c < firstSupplementary; ++c) {
            if (!isSurrogate(c)) {
                const auto unit = static_cast<char16_t>(c);
                add(unit, probe.write(unit));
            }
        }
    }
    for (char16_t unit = 0; unit < 0x80; ++unit) {
        keepsAscii_ = keepsAscii_ && codeOf(unit) == unit;
    }
}

void EncodingTable::add(char16_t unit, std::string_view bytes) {
    if (bytes.empty() || bytes.size() > 2) {
        return;
    }
    const auto first = static_cast<unsigned char>(bytes[0]);
    const std::size_t code = bytes.size() == 1 ? first : first << 8 | static_cast<unsigned char>(bytes[1]);
    // The number would say something else.
    if (bytes.size() == 2 && (first == 0 || code == noCode)) {
        return;
    }
    std::uint16_t& page = pageOf_[unit / pageSize];
    if (page == 0) {
        page = static_cast<std::uint16_t>(pages_.size());
        pages_.resize(pages_.size() + pageSize, noCode);
    }
    pages_[page + unit % pageSize] = static_cast<std::uint16_t>(code);
    longest_ = std::max(longest_, bytes.size());
    isWithinUtf8_ = isWithinUtf8_ && (bytes.size() == 1 || unit >= 0x80);
}

std::size_t EncodingTable::roomFor(const vectors::Extent& text) const {
    const std::size_t bytes = text.utf32 * longest_;
    return isWithinUtf8_ ? std::min(bytes, text.utf8) : bytes;
}

EncodingTable::Written EncodingTable::write(const char16_t* units, std::size_t count, char* out,
                                            std::size_t room) const {
    // Where there is less room than units, one of them is beyond U+FFFF, and not in the table.
    return longest_ == 1 ? writeSingles(units, std::min(count, room), out) : writePairs(units, count, out);
}

EncodingTable::Written EncodingTable::writeSingles(const char16_t* units, std::size_t count,
                                                   char* out) const {
    constexpr std::size_t block = 16;
    // Kept here, since a write of bytes could change the tables for all that the compiler knows.
    const std::uint16_t* const pageOf = pageOf_.data();
    const std::uint16_t* const pages = pages_.data();
    const auto put = [=](std::size_t i) {
        const std::uint16_t code = pages[pageOf[units[i] / pageSize] + units[i] % pageSize];
        out[i] = static_cast<char>(code);
        return code;
    };
    std::size_t i = keepsAscii_ ? vectors::narrowAscii(reinterpret_cast<const char*>(units), count, out) : 0;
    for (bool areKnown = true; areKnown && i + block <= count; i += areKnown ? block : 0) {
        for (std::size_t place = i; place < i + block; ++place) {
            areKnown = put(place) != noCode && areKnown;
        }
    }
    while (i < count && put(i) != noCode) {
        ++i;
    }
    return {i, i};
}

EncodingTable::Written EncodingTable::writePairs(const char16_t* units, std::size_t count, char* out) const {
    const std::uint16_t* const pageOf = pageOf_.data();
    const std::uint16_t* const pages = pages_.data();
    const char16_t* p = units;
    const char16_t* const end = units + count;
    char* q = out;
    for (std::uint16_t code = 0; p < end; ++p) {
        if ((code = pages[pageOf[*p / pageSize] + *p % pageSize]) == noCode) {
            break;
        }
        if (code > 0xFF) {
            *q++ = static_cast<char>(code >> 8);
            *q++ = static_cast<char>(code);
            continue;
        }
        *q++ = static_cast<char>(code);
        // Behind one ASCII character there are likely to be more.
        for (; keepsAscii_ && static_cast<std::size_t>(end - p) > asciiUnits && areAscii(p + 1);
             p += asciiUnits) {
            std::copy(p + 1, p + 1 + asciiUnits, q);
            q += asciiUnits;
        }
    }
    return {static_cast<std::size_t>(p - units), static_cast<std::size_t>(q - out)};
}

} // namespace kvt::ex::detail
