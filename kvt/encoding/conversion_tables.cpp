// The tables of code pages (see detail/conversion_tables.h): how ICU is asked for them, and the loops that read them.
#include <kvt/encoding/detail/conversion_tables.h>

#include <kvt/encoding/detail/icu.h>
#include <kvt/encoding/detail/short_ascii.h>
#include <kvt/foundation/detail/utf.h>

#include <algorithm>
#include <bit>
#include <cstring>
#include <iterator>
#include <optional>
#include <utility>

namespace kvt::ex::detail {
namespace {

/// A converter of its own that is asked for single characters.
class Probe final : private icu::LossListener {
public:
    explicit Probe(Encoding encoding) : converter_(encoding) {
        converter_.requireMemory();
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

template <std::size_t bytes>
bool areAscii(const unsigned char* p) {
    std::uint64_t words[bytes / 8];
    std::memcpy(words, p, bytes);
    std::uint64_t all = 0;
    for (const std::uint64_t word : words) {
        all |= word;
    }
    return (all & 0x8080808080808080U) == 0;
}

template <std::size_t units>
bool areAscii(const char16_t* p) {
    std::uint64_t words[units / 4];
    std::memcpy(words, p, sizeof words);
    std::uint64_t all = 0;
    for (const std::uint64_t word : words) {
        all |= word;
    }
    return (all & 0xFF80FF80FF80FF80U) == 0;
}

constexpr bool isLatin(std::size_t number) {
    return number >= 0xA0 && number <= 0xFF;
}

/// Whether each byte is ASCII or one of the letters and signs of Latin-1.
template <std::size_t bytes>
bool areLatin(const unsigned char* p) {
    constexpr std::uint64_t ones = 0x0101010101010101U;
    std::uint64_t any = 0;
    for (std::size_t i = 0; i < bytes; i += 8) {
        std::uint64_t word = 0;
        std::memcpy(&word, p + i, sizeof word);
        word = (word & 0xE0 * ones) ^ 0x80 * ones; // zero for one of the others
        any |= (word - ones) & ~word;
    }
    return (any & 0x80 * ones) == 0;
}

template <std::size_t units>
bool areLatin(const char16_t* p) {
    constexpr std::uint64_t ones = 0x0001000100010001U;
    std::uint64_t all = 0;
    std::uint64_t any = 0;
    for (std::size_t i = 0; i < units; i += 4) {
        std::uint64_t word = 0;
        std::memcpy(&word, p + i, sizeof word);
        all |= word;
        word = (word & 0xE0 * ones) ^ 0x80 * ones;
        any |= (word - ones) & ~word;
    }
    return (all & 0xFF00 * ones) == 0 && (any & 0x8000 * ones) == 0;
}

/// The bytes that end a pair, in a block that begins with a character: those behind a byte that begins one, where that
/// is no end itself. In a run of such bytes that is every second one, behind it the next byte if the run's length is
/// odd. The carry of an addition runs through each of them (as G. Langdale and D. Lemire find what a run of backslashes
/// escapes, in "Parsing Gigabytes of JSON per Second", 2019). `overhang` is whether the last pair ends behind the
/// block.
std::uint64_t endsOfPairs(std::uint64_t leads, bool& overhang) {
    constexpr std::uint64_t even = 0x5555555555555555U;
    const std::uint64_t behindLead = leads << 1;
    const std::uint64_t oddRunStarts = leads & ~even & ~behindLead;
    std::uint64_t flipped = 0;
    overhang = __builtin_add_overflow(oddRunStarts, leads, &flipped);
    return (even ^ flipped << 1) & behindLead;
}

} // namespace

// ---- From bytes --------------------------------------------------------------------------------------------------

DecodingTable::DecodingTable(Encoding encoding) : units_(pageSize, noUnit) {
    Probe probe(encoding);
    std::vector<std::size_t> leads;
    for (std::size_t first = 0; first < pageSize && probe.isOpen(); ++first) {
        const char byte = static_cast<char>(first);
        const Probe::Read alone = probe.read({&byte, 1});
        units_[first] = alone.unit.value_or(noUnit);
        keepsAscii_ = keepsAscii_ && (first >= 0x80 || units_[first] == first);
        keepsLatin_ = keepsLatin_ && (!isLatin(first) || units_[first] == first);
        if (alone.isBeginning) {
            leads.push_back(first);
        }
    }
    if (!leads.empty()) {
        const std::vector<char16_t> singles =
            std::exchange(units_, std::vector<char16_t>(pageSize * pageSize));
        for (std::size_t first = 0; first < pageSize; ++first) {
            const auto page = units_.begin() + static_cast<std::ptrdiff_t>(first * pageSize);
            std::fill(page, page + pageSize, singles[first]);
        }
    }
    for (const std::size_t first : leads) {
        pairs_[first / 64] |= std::uint64_t{1} << first % 64;
        leads_.add(static_cast<std::uint8_t>(first));
        for (std::size_t second = 0; second < pageSize; ++second) {
            const char bytes[] = {static_cast<char>(first), static_cast<char>(second)};
            units_[first * pageSize + second] = probe.read({bytes, 2}).unit.value_or(noUnit);
        }
    }
    utf8_.reserve(units_.size());
    std::transform(units_.begin(), units_.end(), std::back_inserter(utf8_), cellOf);
}

DecodingTable::Utf8Cell DecodingTable::cellOf(char16_t unit) {
    Utf8Cell cell{};
    if (unit != noUnit) {
        cell.length = static_cast<std::uint8_t>(encodeUtf8(unit, cell.bytes));
    }
    return cell;
}

void DecodingTable::put(char16_t unit, char16_t*& out) {
    *out++ = unit;
}

void DecodingTable::put(const Utf8Cell& cell, char*& out) {
    std::memcpy(out, &cell, sizeof cell);
    out += cell.length;
}

std::size_t DecodingTable::read(std::string_view& in, char16_t* out, std::size_t room) const {
    return readAny(units_, in, out, room);
}

std::size_t DecodingTable::readUtf8(std::string_view& in, char* out, std::size_t room) const {
    return readAny(utf8_, in, out, room);
}

std::size_t DecodingTable::roomForUtf8(std::string_view text) const {
    constexpr std::size_t longest = sizeof(Utf8Cell::bytes);
    const std::size_t longer = keepsAscii_ ? countBeyondAscii(text) : text.size();
    // The last character may be the shortest and is written as a cell, too.
    return text.size() + (longest - 1) * longer + sizeof(Utf8Cell) - 1;
}

template <typename Cell, typename Unit>
std::size_t DecodingTable::readAny(const std::vector<Cell>& cells, std::string_view& in, Unit* out,
                                   std::size_t room) const {
    const auto* const begin = reinterpret_cast<const unsigned char*>(in.data());
    const unsigned char* const end = begin + in.size();
    Unit* q = out;
    const unsigned char* const stop = cells.size() == pageSize
                                          ? readSingles(cells.data(), begin, end, q, out + room)
                                          : readPairs(cells.data(), begin, end, q, out + room);
    in.remove_prefix(static_cast<std::size_t>(stop - begin));
    return static_cast<std::size_t>(q - out);
}

template <typename Cell, typename Unit>
const unsigned char* DecodingTable::readSingles(const Cell* cells, const unsigned char* p,
                                                const unsigned char* end, Unit*& q,
                                                const Unit* outEnd) const {
    constexpr std::size_t block = 16;
    constexpr std::size_t most = sizeof(Cell) / sizeof(Unit);
    // As UTF-8, letters beyond ASCII are others.
    const bool keepsLatin = this->keepsLatin() && sizeof(Unit) != 1;
    const bool keepsAscii = keepsAscii_ && !keepsLatin;
    Unit* out = q;
    const auto room = [&] { return static_cast<std::size_t>(outEnd - out); };
    bool areKnown = true;
    while (areKnown && static_cast<std::size_t>(end - p) >= block && room() >= block * most) {
        if ((keepsAscii && areAscii<block>(p)) || (keepsLatin && areLatin<block>(p))) {
            out = std::copy(p, p + block, out);
            p += block;
            continue;
        }
        Unit* const before = out;
        for (std::size_t i = 0; i < block; ++i) {
            const Cell cell = cells[p[i]];
            areKnown &= isKnown(cell);
            put(cell, out);
        }
        if (areKnown) {
            p += block;
        } else {
            out = before;
        }
    }
    for (; p < end && room() >= most && isKnown(cells[*p]); ++p) {
        put(cells[*p], out);
    }
    q = out;
    return p;
}

// A block at a time, where nothing has to wait for the length of the character before; the rest one by one.
template <typename Cell, typename Unit>
const unsigned char* DecodingTable::readPairs(const Cell* cells, const unsigned char* p,
                                              const unsigned char* end, Unit*& q, const Unit* outEnd) const {
    constexpr std::size_t block = vectors::ByteSet::block;
    constexpr std::size_t most = sizeof(Cell) / sizeof(Unit);
    const bool keepsAscii = keepsAscii_;
    Unit* out = q;
    bool areKnown = true;
    while (areKnown && static_cast<std::size_t>(end - p) > block &&
           static_cast<std::size_t>(outEnd - out) >= block * most) {
        if (keepsAscii && areAscii<block>(p)) {
            out = std::copy(p, p + block, out);
            p += block;
            continue;
        }
        bool overhang = false;
        const std::uint64_t ends = endsOfPairs(leads_.bitsOf(p), overhang);
        const unsigned char* next = p + block + (overhang ? 1 : 0);
        for (std::uint64_t starts = ~ends; starts != 0; starts &= starts - 1) {
            const unsigned char* const character = p + std::countr_zero(starts);
            const Cell cell = cells[character[0] * pageSize + character[1]];
            if (!isKnown(cell)) {
                next = character;
                areKnown = false;
                break;
            }
            put(cell, out);
        }
        p = next;
    }
    while (areKnown && p < end && static_cast<std::size_t>(outEnd - out) >= most) {
        const std::ptrdiff_t length = isPair(*p) ? 2 : 1;
        const Cell* const cell = length <= end - p ? &cells[p[0] * pageSize + p[length - 1]] : nullptr;
        areKnown = cell != nullptr && isKnown(*cell);
        if (areKnown) {
            put(*cell, out);
            p += length;
        }
    }
    q = out;
    return p;
}

// A branch for each length, which a processor foresees more often than not, and then need not wait for it.
DecodingTable::Found DecodingTable::find(std::string_view text, Utf8Cell* cells) const {
    const auto* p = reinterpret_cast<const unsigned char*>(text.data());
    const unsigned char* const end = p + text.size();
    const Utf8Cell* const table = utf8_.data();
    Utf8Cell* next = cells;
    std::size_t bytes = 0;
    const auto take = [&](const Utf8Cell& cell) {
        std::memcpy(next, &cell, sizeof cell);
        ++next;
        bytes += cell.length;
        return cell.length != 0;
    };
    bool areKnown = true;
    while (areKnown && p < end) {
        if (isPair(*p)) {
            areKnown = end - p > 1 && take(table[p[0] * pageSize + p[1]]);
            p += 2;
        } else {
            areKnown = take(table[*p * pageSize]);
            ++p;
        }
    }
    return {static_cast<std::size_t>(next - cells), areKnown ? bytes : vectors::notWhole};
}

// Each cell is written whole, as long as the characters behind it fill what is too much.
void DecodingTable::join(const Utf8Cell* cells, std::size_t count, char* out) {
    std::size_t i = 0;
    for (; i + 3 < count; ++i) {
        put(cells[i], out);
    }
    for (; i < count; ++i) {
        out[0] = cells[i].bytes[0];
        if (cells[i].length > 1) {
            out[1] = cells[i].bytes[1];
        }
        if (cells[i].length > 2) {
            out[2] = cells[i].bytes[2];
        }
        out += cells[i].length;
    }
}

std::size_t DecodingTable::bytesOf(std::string_view in, std::size_t units) const {
    std::size_t bytes = 0;
    for (; units > 0; --units) {
        bytes += isPair(static_cast<unsigned char>(in[bytes])) ? 2 : 1;
    }
    return bytes;
}

// ---- To bytes ----------------------------------------------------------------------------------------------------

EncodingTable::EncodingTable(Encoding encoding) : codes_(firstSupplementary, noCode) {
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
    for (char16_t unit = 0; unit <= 0xFF; ++unit) {
        keepsAscii_ = keepsAscii_ && (unit >= 0x80 || codeOf(unit) == unit);
        keepsLatin_ = keepsLatin_ && (!isLatin(unit) || codeOf(unit) == unit);
    }
}

void EncodingTable::add(char16_t unit, std::string_view bytes) {
    if (bytes.empty() || bytes.size() > 2) {
        return;
    }
    const std::size_t first = static_cast<unsigned char>(bytes[0]);
    const std::size_t second = bytes.size() == 1 ? 0 : static_cast<unsigned char>(bytes[1]);
    const std::size_t code = first | second << 8;
    // The number would say something else.
    if (bytes.size() == 2 && (second == 0 || code == noCode)) {
        return;
    }
    codes_[unit] = static_cast<std::uint16_t>(code);
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
    // Kept here, since a write of bytes could change the table for all that the compiler knows.
    const std::uint16_t* const codes = codes_.data();
    const bool isWorthACall = keepsAscii_ && count > vectors::shortText;
    std::size_t i = isWorthACall ? vectors::narrowAscii(reinterpret_cast<const char*>(units), count, out) : 0;
    const bool keepsLatin = keepsAscii_ && keepsLatin_;
    for (bool areKnown = true; areKnown && i + block <= count; i += areKnown ? block : 0) {
        if (keepsLatin && areLatin<block>(units + i)) {
            std::copy(units + i, units + i + block, out + i);
            continue;
        }
        unsigned all = 0;
        for (std::size_t place = i; place < i + block; ++place) {
            const std::uint16_t code = codes[units[place]];
            out[place] = static_cast<char>(code);
            all |= code;
        }
        areKnown = all <= 0xFF;
    }
    for (; i < count && codes[units[i]] != noCode; ++i) {
        out[i] = static_cast<char>(codes[units[i]]);
    }
    return {i, i};
}

// A branch for each length here, too.
std::size_t EncodingTable::writeUtf8(std::string_view& in, char* out, std::size_t room) const {
    const std::uint16_t* const codes = codes_.data();
    const unsigned char ascii = keepsAscii_ ? 0x80 : 0; // what is below needs no table
    const char* p = in.data();
    const char* const end = p + in.size();
    char* q = out;
    const char* const outEnd = out + room;
    while (p < end && q < outEnd) {
        const auto lead = static_cast<unsigned char>(*p);
        if (lead < ascii) {
            *q++ = *p++;
            continue;
        }
        std::size_t unit = lead;
        std::ptrdiff_t length = 1;
        if (lead >= 0xE0) {
            length = 3;
            if (lead > 0xEF || end - p < 3 || !isContinuation(p[1]) || !isContinuation(p[2])) {
                break;
            }
            unit = (lead & 0x0FU) << 12 | continuationBits(p[1]) << 6 | continuationBits(p[2]);
            if (unit < 0x800) {
                break;
            }
        } else if (lead >= 0x80) {
            length = 2;
            if (lead < 0xC2 || end - p < 2 || !isContinuation(p[1])) {
                break;
            }
            unit = (lead & 0x1FU) << 6 | continuationBits(p[1]);
        }
        const std::uint16_t code = codes[unit];
        const std::ptrdiff_t bytes = code > 0xFF ? 2 : 1;
        if (code == noCode || outEnd - q < bytes) {
            break;
        }
        q[0] = static_cast<char>(code);
        if (bytes == 2) {
            q[1] = static_cast<char>(code >> 8);
        }
        p += length;
        q += bytes;
    }
    in.remove_prefix(static_cast<std::size_t>(p - in.data()));
    return static_cast<std::size_t>(q - out);
}

// Whether a character has one byte or two is no branch, since texts have both in no order that a processor could
// foresee.
EncodingTable::Written EncodingTable::writePairs(const char16_t* units, std::size_t count, char* out) const {
    constexpr std::size_t block = 16;
    const std::uint16_t* const codes = codes_.data();
    char* q = out;
    std::size_t i = 0;
    while (i < count) {
        if (keepsAscii_ && count - i >= block && areAscii<block>(units + i)) {
            std::copy(units + i, units + i + block, q);
            i += block;
            q += block;
            continue;
        }
        // Two bytes are written for all but the last character, behind which there may be no room.
        const std::size_t stop = std::min(i + block, count - 1);
        for (; i < stop; ++i) {
            const unsigned code = codes[units[i]];
            if (code == noCode) {
                return {i, static_cast<std::size_t>(q - out)};
            }
            const unsigned isPair = (0xFF - code) >> 31;
            q[0] = static_cast<char>(code);
            q[1] = static_cast<char>(code >> 8);
            q += 1 + isPair;
        }
        if (i + 1 == count) {
            const unsigned code = codeOf(units[i]);
            if (code == noCode) {
                break;
            }
            *q++ = static_cast<char>(code);
            if (code > 0xFF) {
                *q++ = static_cast<char>(code >> 8);
            }
            ++i;
        }
    }
    return {i, static_cast<std::size_t>(q - out)};
}

} // namespace kvt::ex::detail
