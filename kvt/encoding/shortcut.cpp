// The shorter ways around ICU (see detail/shortcut.h).
//
// A form is a small class that knows how its units lie in bytes and how to read and write one character. One loop,
// convertRun(), is compiled for each pair of forms: it moves blocks of ASCII without a look at single characters,
// and other characters one by one. It stops where its input is not well-formed, is cut off, or is more than the
// target's form can say, and ICU sees the text from there on. So this code decides nothing about substitutions.
// The single-byte encodings share two forms; what sets them apart is a table.
//
// What ICU does with the text that is taken here, and so must hold for these ways to be the same ones:
//
// - U+FEFF, also at the start, is a character like others in the forms with a stated byte order; none is added.
// - Noncharacters, U+FFFD and NUL pass. Surrogates (alone in UTF-16, encoded in UTF-8 and UTF-32), over-long UTF-8
//   and everything above U+10FFFF are ill-formed.
// - ASCII characters convert one by one, whatever follows. Some ICU tables hold sequences of characters that become
//   one, but none that begins with an ASCII character, and none of bytes that does; a test looks through them all.
#include <kvt/encoding/detail/shortcut.h>

#include <kvt/encoding/detail/single_byte_table.h>
#include <kvt/foundation/detail/utf.h>

#include <array>
#include <bit>
#include <cstring>
#include <utility>

namespace kvt::ex::detail {
namespace {

constexpr std::size_t chunkBytes = 8192;
constexpr std::size_t blockLength = 16;     // characters; a multiple of what a vector register holds
constexpr std::size_t longestCharacter = 4; // bytes, in every form, as in UTF-8
static_assert(longestCharacter == longestUtf8);
constexpr std::size_t blockBytes = blockLength * longestCharacter;

constexpr bool swappedIfLittle = std::endian::native != std::endian::little;
constexpr bool swappedIfBig = std::endian::native != std::endian::big;

/// A code point and the bytes that it took; none where there is no well-formed character.
struct Character {
    char32_t codePoint;
    std::size_t length;
};
constexpr Character noCharacter{0, 0};

/// How units of type `Unit` lie in memory. Text comes as bytes of any alignment.
template <typename U, bool Swapped>
struct Units {
    using Unit = U;
    /// Whether each ASCII character is one unit with its own number.
    static constexpr bool keepsAscii = true;

    static Unit load(const char* p) {
        Unit unit;
        std::memcpy(&unit, p, sizeof unit);
        return swap(unit);
    }
    static void store(char* p, Unit unit) {
        unit = swap(unit);
        std::memcpy(p, &unit, sizeof unit);
    }

private:
    static constexpr Unit swap(Unit unit) {
        if constexpr (!Swapped) {
            return unit;
        } else if constexpr (sizeof(Unit) == 2) {
            return __builtin_bswap16(unit);
        } else {
            return __builtin_bswap32(unit);
        }
    }
};

// A form is made from the table of its side, which most have no use for. Its write() returns the bytes written, 0 where
// the form lacks the character.

struct Ascii : Units<std::uint8_t, false> {
    explicit Ascii(SingleByteTable*) {}

    static bool isAscii(char byte) { return load(&byte) < 0x80; }

    static Character read(const char* p, const char*) {
        return isAscii(*p) ? Character{load(p), 1} : noCharacter;
    }
    static std::size_t write(char* p, char32_t c) {
        if (c >= 0x80) {
            return 0;
        }
        store(p, static_cast<Unit>(c));
        return 1;
    }
};

template <bool KeepsAscii>
class SingleByte : public Units<std::uint8_t, false> {
public:
    static constexpr bool keepsAscii = KeepsAscii;

    /// The pointers are kept, since a write of bytes could change the table for all that the compiler knows.
    explicit SingleByte(SingleByteTable* table)
        : units_(table->tables().units.data()), utf8_(table->tables().utf8.data()),
          pageOf_(table->tables().pageOf.data()), pages_(table->tables().pages.data()) {}

    Character read(const char* p, const char*) const {
        const char32_t unit = units_[load(p)];
        return unit != SingleByteTable::noUnit ? Character{unit, 1} : noCharacter;
    }
    std::size_t write(char* p, char32_t c) const {
        constexpr auto pageSize = static_cast<char32_t>(SingleByteTable::pageSize);
        return c < 0x10000 ? writeFrom(c / pageSize, c % pageSize, p) : 0;
    }
    /// The same for the unit at a place in a page, the first six bits of which are left out.
    std::size_t writeFrom(char32_t page, char32_t place, char* p) const {
        const unsigned entry = pages_[pageOf_[page] + place];
        store(p, static_cast<Unit>(entry));
        return entry >> 8;
    }
    /// The character as UTF-8, for which the output has room for four bytes; 0 where read() would find none.
    std::size_t copyUtf8(const char* p, char* q) const {
        const SingleByteTable::Utf8 character = utf8_[load(p)];
        std::memcpy(q, &character, sizeof character);
        return character.length;
    }

private:
    const char16_t* units_;
    const SingleByteTable::Utf8* utf8_;
    const std::uint16_t* pageOf_;
    const std::uint16_t* pages_;
};

struct Utf8 : Units<std::uint8_t, false> {
    explicit Utf8(SingleByteTable*) {}

    static Character read(const char* p, const char* end) {
        const char32_t lead = load(p);
        if (lead < 0x80) {
            return {lead, 1};
        }
        if (lead < 0xC2) {
            return noCharacter;
        }
        const auto available = static_cast<std::size_t>(end - p);
        if (lead < 0xE0) {
            if (available < 2 || !isContinuation(p[1])) {
                return noCharacter;
            }
            return {(lead & 0x1F) << 6 | continuationBits(p[1]), 2};
        }
        if (lead < 0xF0) {
            if (available < 3 || !isContinuation(p[1]) || !isContinuation(p[2])) {
                return noCharacter;
            }
            const char32_t c = (lead & 0x0F) << 12 | continuationBits(p[1]) << 6 | continuationBits(p[2]);
            return c >= 0x800 && !isSurrogate(c) ? Character{c, 3} : noCharacter;
        }
        if (lead > 0xF4 || available < 4 || !isContinuation(p[1]) || !isContinuation(p[2]) ||
            !isContinuation(p[3])) {
            return noCharacter;
        }
        const char32_t c = (lead & 0x07) << 18 | continuationBits(p[1]) << 12 | continuationBits(p[2]) << 6 |
                           continuationBits(p[3]);
        return c >= firstSupplementary && c <= lastCodePoint ? Character{c, 4} : noCharacter;
    }

    static std::size_t write(char* p, char32_t c) { return encodeUtf8(c, p); }

    /// Whether a well-formed character of two bytes begins at `p`, where two bytes can be read.
    static bool hasTwoBytes(const char* p) {
        const auto lead = static_cast<unsigned char>(p[0]);
        return lead >= 0xC2 && lead < 0xE0 && isContinuation(p[1]);
    }
};

template <bool Swapped>
struct Utf16 : Units<std::uint16_t, Swapped> {
    using Base = Units<std::uint16_t, Swapped>;
    using typename Base::Unit;

    explicit Utf16(SingleByteTable*) {}

    static Character read(const char* p, const char* end) {
        const auto available = static_cast<std::size_t>(end - p);
        if (available < 2) {
            return noCharacter;
        }
        const char32_t unit = Base::load(p);
        if (!isSurrogate(unit)) {
            return {unit, 2};
        }
        if (isLowSurrogate(unit) || available < 4) {
            return noCharacter;
        }
        const Unit low = Base::load(p + 2);
        if (!isLowSurrogate(low)) {
            return noCharacter;
        }
        return {codePointOf(static_cast<char16_t>(unit), low), 4};
    }

    static std::size_t write(char* p, char32_t c) {
        if (c < firstSupplementary) {
            Base::store(p, static_cast<Unit>(c));
            return 2;
        }
        Base::store(p, highSurrogate(c));
        Base::store(p + 2, lowSurrogate(c));
        return 4;
    }
};

template <bool Swapped>
struct Utf32 : Units<std::uint32_t, Swapped> {
    using Base = Units<std::uint32_t, Swapped>;

    explicit Utf32(SingleByteTable*) {}

    static Character read(const char* p, const char* end) {
        if (end - p < 4) {
            return noCharacter;
        }
        const char32_t c = Base::load(p);
        return c <= lastCodePoint && !isSurrogate(c) ? Character{c, 4} : noCharacter;
    }
    static std::size_t write(char* p, char32_t c) {
        Base::store(p, c);
        return 4;
    }
};

/// Fixed trip counts and no early exit: the compiler makes vector code of these two.
template <typename From>
bool isAsciiBlock(const char* p) {
    typename From::Unit all = 0;
    for (std::size_t i = 0; i < blockLength; ++i) {
        all = static_cast<typename From::Unit>(all | From::load(p + i * sizeof all));
    }
    return all < 0x80;
}

template <typename From, typename To>
void copyAsciiBlock(const char* p, char* q) {
    for (std::size_t i = 0; i < blockLength; ++i) {
        To::store(q + i * sizeof(typename To::Unit),
                  static_cast<typename To::Unit>(From::load(p + i * sizeof(typename From::Unit))));
    }
}

/// Where a run ended, and whether it ended because there was nothing more to take.
struct Run {
    const char* p;
    char* q;
    bool ended;
};

/// Moves one character; returns whether there was one to take. `end` is that of the input or a nearer place behind the
/// character: where it is a fixed distance away, no comparisons with it are left in the code.
template <typename From, typename To>
bool moveCharacter(const From& from, const To& to, const char*& p, const char* end, char*& q) {
    const Character character = from.read(p, end);
    if (character.length == 0) {
        return false;
    }
    const std::size_t written = to.write(q, character.codePoint);
    if (written == 0) {
        return false;
    }
    p += character.length;
    q += written;
    return true;
}

/// From single bytes to UTF-8 a character is copied out of the table, without a branch for its length.
template <bool KeepsAscii>
bool moveCharacter(const SingleByte<KeepsAscii>& from, const Utf8&, const char*& p, const char*, char*& q) {
    const std::size_t length = from.copyUtf8(p, q);
    p += length != 0 ? 1 : 0;
    q += length;
    return length != 0;
}

/// Moves characters of which the input has `blockBytes` bytes and the output has room for as many.
template <typename From, typename To>
Run moveBlock(const From& from, const To& to, const char* p, char* q) {
    for (std::size_t i = 0; i < blockLength; ++i) {
        if (!moveCharacter(from, to, p, p + longestCharacter, q)) {
            return {p, q, true};
        }
    }
    return {p, q, false};
}

/// How many of the first seven bytes of eight stand before one that is not ASCII.
unsigned leadingAscii(const char* p) {
    std::uint64_t bytes;
    std::memcpy(&bytes, p, sizeof bytes);
    constexpr bool isLittle = std::endian::native == std::endian::little;
    // The mark at the eighth byte is there so that the count needs no case for none.
    const std::uint64_t others = (bytes & 0x8080808080808080) | (isLittle ? std::uint64_t{1} << 63 : 0x80);
    return static_cast<unsigned>(isLittle ? std::countr_zero(others) : std::countl_zero(others)) / 8;
}

/// From UTF-8 to single bytes: ASCII between other characters goes by words, and the two bytes of most other characters
/// are the place in the tables as they stand.
Run moveBlock(const Utf8& from, const SingleByte<true>& to, const char* p, char* q) {
    constexpr std::size_t wordBytes = sizeof(std::uint64_t);
    const char* const last = p + blockBytes - wordBytes;
    while (p <= last) {
        std::memcpy(q, p, wordBytes);
        const unsigned ascii = leadingAscii(p);
        p += ascii;
        q += ascii;
        while (p <= last && !Ascii::isAscii(*p)) {
            if (!Utf8::hasTwoBytes(p)) {
                if (!moveCharacter(from, to, p, p + longestCharacter, q)) {
                    return {p, q, true};
                }
                continue;
            }
            if (to.writeFrom(p[0] & 0x1F, p[1] & 0x3F, q) == 0) {
                return {p, q, true};
            }
            p += 2;
            ++q;
        }
    }
    return {p, q, false};
}

/// Converts from `p` on until the input ends, the output has no room for another block, or ICU has to look.
template <typename From, typename To>
Run convertRun(SingleByteTable* fromTable, SingleByteTable* toTable, const char* p, const char* end, char* q,
               const char* outEnd) {
    constexpr std::size_t fromBlock = blockLength * sizeof(typename From::Unit);
    constexpr std::size_t toBlock = blockLength * sizeof(typename To::Unit);
    constexpr bool keepAscii = From::keepsAscii && To::keepsAscii;
    const From from(fromTable);
    const To to(toTable);
    while (static_cast<std::size_t>(outEnd - q) >= blockBytes) {
        const auto left = static_cast<std::size_t>(end - p);
        if (keepAscii && left >= fromBlock && isAsciiBlock<From>(p)) {
            copyAsciiBlock<From, To>(p, q);
            p += fromBlock;
            q += toBlock;
        } else if (left >= blockBytes) {
            const Run run = moveBlock(from, to, p, q);
            if (run.ended) {
                return run;
            }
            p = run.p;
            q = run.q;
        } else {
            for (std::size_t i = 0; i < blockLength; ++i) {
                if (p == end || !moveCharacter(from, to, p, end, q)) {
                    return {p, q, true};
                }
            }
        }
    }
    return {p, q, false};
}

using RunFunction = Run (*)(SingleByteTable*, SingleByteTable*, const char*, const char*, char*, const char*);

/// The forms with a way of their own, in the order of Form from asciiCompatible on, as sources and as targets.
template <typename... Forms>
struct FormList {
    static constexpr std::size_t size = sizeof...(Forms);

    template <typename From>
    static constexpr std::array<RunFunction, size> row = {&convertRun<From, Forms>...};

    static constexpr std::array<std::array<RunFunction, size>, size> table = {row<Forms>...};
};
using AllForms = FormList<Ascii, SingleByte<true>, SingleByte<false>, Utf8, Utf16<swappedIfLittle>,
                          Utf16<swappedIfBig>, Utf32<swappedIfLittle>, Utf32<swappedIfBig>>;
static_assert(static_cast<std::size_t>(Form::utf32be) == AllForms::size, "a row for each form but `other`");

std::size_t unitBytes(Form form) {
    switch (form) {
    case Form::utf16le:
    case Form::utf16be:
        return 2;
    case Form::utf32le:
    case Form::utf32be:
        return 4;
    default:
        return 1;
    }
}

/// ASCII to ASCII needs no other buffer than the input itself.
std::size_t asciiLength(std::string_view in) {
    const char* p = in.data();
    const char* const end = p + in.size();
    while (static_cast<std::size_t>(end - p) >= blockLength && isAsciiBlock<Ascii>(p)) {
        p += blockLength;
    }
    while (p != end && Ascii::isAscii(*p)) {
        ++p;
    }
    return static_cast<std::size_t>(p - in.data());
}

bool keepsAscii(Form form) {
    return form != Form::other && form != Form::singleByte;
}

/// Whether ASCII text of the two forms is the same bytes.
bool isAsciiBytes(Form form) {
    return keepsAscii(form) && unitBytes(form) == 1;
}

/// A side in which only ASCII can be read and written, and no table is needed for it.
Side asciiOnly(Side side) {
    return side.form == Form::asciiSingleByte ? Side{Form::asciiCompatible, nullptr} : side;
}

bool lacksTable(Side side) {
    const bool needsOne = side.form == Form::asciiSingleByte || side.form == Form::singleByte;
    return needsOne && !side.table->isBuilt();
}

template <typename CharOut>
std::size_t convertBy(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    const RunFunction convert =
        AllForms::table[static_cast<std::size_t>(from.form) - 1][static_cast<std::size_t>(to.form) - 1];
    const char* p = in.data();
    const char* const end = p + in.size();
    CharOut chunk[chunkBytes / sizeof(CharOut)];
    char* const start = reinterpret_cast<char*>(chunk);
    for (bool ended = false; !ended;) {
        const Run run = convert(from.table, to.table, p, end, start, start + chunkBytes);
        out.append(chunk, static_cast<std::size_t>(run.q - start) / sizeof(CharOut));
        p = run.p;
        ended = run.ended;
    }
    return static_cast<std::size_t>(p - in.data());
}

} // namespace

template <typename CharOut>
std::size_t convertPrefix(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out) {
    if (from.form == Form::other || to.form == Form::other ||
        (sizeof(CharOut) != 1 && sizeof(CharOut) != unitBytes(to.form))) {
        return 0;
    }
    std::size_t taken = 0;
    if constexpr (sizeof(CharOut) == 1) {
        if (isAsciiBytes(from.form) && isAsciiBytes(to.form)) {
            taken = asciiLength(in);
            out.append(in.data(), taken);
            if (taken == in.size() || from.form == Form::asciiCompatible ||
                to.form == Form::asciiCompatible) {
                return taken;
            }
        }
    }
    // A thread that meets nothing but ASCII in an encoding never builds the table.
    if (taken == 0 && (lacksTable(from) || lacksTable(to)) && keepsAscii(from.form) && keepsAscii(to.form)) {
        taken = convertBy(asciiOnly(from), asciiOnly(to), in, out);
    }
    return taken == in.size() ? taken : taken + convertBy(from, to, in.substr(taken), out);
}

template std::size_t convertPrefix<char>(Side, Side, std::string_view, std::basic_string<char>&);
template std::size_t convertPrefix<char16_t>(Side, Side, std::string_view, std::basic_string<char16_t>&);
template std::size_t convertPrefix<char32_t>(Side, Side, std::string_view, std::basic_string<char32_t>&);

} // namespace kvt::ex::detail
