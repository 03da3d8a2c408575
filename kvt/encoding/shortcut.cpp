// The shorter ways around ICU (see detail/shortcut.h).
//
// A form is a small class that knows how its units lie in bytes and how to read and write one character. One loop,
// convertRun(), is compiled for each pair of forms: it moves blocks of ASCII without a look at single characters,
// and other characters one by one. It stops where its input is not well-formed, is cut off, or is more than the
// target's form can say, and ICU sees the text from there on. So this code decides nothing about substitutions.
//
// What ICU does with the text that is taken here, and so must hold for these ways to be the same ones:
//
// - U+FEFF, also at the start, is a character like others in the forms with a stated byte order; none is added.
// - Noncharacters, U+FFFD and NUL pass. Surrogates (alone in UTF-16, encoded in UTF-8 and UTF-32), over-long UTF-8
//   and everything above U+10FFFF are ill-formed.
// - ASCII characters convert one by one, whatever follows. Some ICU tables hold sequences of characters that become
//   one, but none that begins with an ASCII character, and none of bytes that does; a test looks through them all.
#include <kvt/encoding/detail/shortcut.h>

#include <array>
#include <bit>
#include <cstring>
#include <utility>

namespace kvt::ex::detail {
namespace {

constexpr std::size_t chunkBytes = 8192;
constexpr std::size_t blockLength = 16;     // characters; a multiple of what a vector register holds
constexpr std::size_t longestCharacter = 4; // bytes, in every form

constexpr bool swappedIfLittle = std::endian::native != std::endian::little;
constexpr bool swappedIfBig = std::endian::native != std::endian::big;

/// A code point and the bytes that it took; none where there is no well-formed character.
struct Character {
    char32_t codePoint;
    std::size_t length;
};
constexpr Character noCharacter{0, 0};

constexpr bool isSurrogate(char32_t c) {
    return (c & 0xFFFFF800) == 0xD800;
}

/// How units of type `Unit` lie in memory. Text comes as bytes of any alignment.
template <typename U, bool Swapped>
struct Units {
    using Unit = U;

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

struct Ascii : Units<std::uint8_t, false> {
    static constexpr char32_t last = 0x7F;

    static Character read(const char* p, const char*) {
        const Unit unit = load(p);
        return unit <= last ? Character{unit, 1} : noCharacter;
    }
    static std::size_t write(char* p, char32_t c) {
        store(p, static_cast<Unit>(c));
        return 1;
    }
};

struct Utf8 : Units<std::uint8_t, false> {
    static constexpr char32_t last = 0x10FFFF;

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
            if (available < 2 || !isTrail(p[1])) {
                return noCharacter;
            }
            return {(lead & 0x1F) << 6 | bits(p[1]), 2};
        }
        if (lead < 0xF0) {
            if (available < 3 || !isTrail(p[1]) || !isTrail(p[2])) {
                return noCharacter;
            }
            const char32_t c = (lead & 0x0F) << 12 | bits(p[1]) << 6 | bits(p[2]);
            return c >= 0x800 && !isSurrogate(c) ? Character{c, 3} : noCharacter;
        }
        if (lead > 0xF4 || available < 4 || !isTrail(p[1]) || !isTrail(p[2]) || !isTrail(p[3])) {
            return noCharacter;
        }
        const char32_t c = (lead & 0x07) << 18 | bits(p[1]) << 12 | bits(p[2]) << 6 | bits(p[3]);
        return c >= 0x10000 && c <= last ? Character{c, 4} : noCharacter;
    }

    static std::size_t write(char* p, char32_t c) {
        if (c < 0x80) {
            p[0] = static_cast<char>(c);
            return 1;
        }
        if (c < 0x800) {
            p[0] = static_cast<char>(0xC0 | c >> 6);
            p[1] = trail(c);
            return 2;
        }
        if (c < 0x10000) {
            p[0] = static_cast<char>(0xE0 | c >> 12);
            p[1] = trail(c >> 6);
            p[2] = trail(c);
            return 3;
        }
        p[0] = static_cast<char>(0xF0 | c >> 18);
        p[1] = trail(c >> 12);
        p[2] = trail(c >> 6);
        p[3] = trail(c);
        return 4;
    }

private:
    static bool isTrail(char byte) { return (static_cast<unsigned char>(byte) & 0xC0) == 0x80; }
    static char32_t bits(char byte) { return static_cast<unsigned char>(byte) & 0x3F; }
    static char trail(char32_t c) { return static_cast<char>(0x80 | (c & 0x3F)); }
};

template <bool Swapped>
struct Utf16 : Units<std::uint16_t, Swapped> {
    using Base = Units<std::uint16_t, Swapped>;
    using typename Base::Unit;
    static constexpr char32_t last = 0x10FFFF;

    static Character read(const char* p, const char* end) {
        const auto available = static_cast<std::size_t>(end - p);
        if (available < 2) {
            return noCharacter;
        }
        const char32_t unit = Base::load(p);
        if (!isSurrogate(unit)) {
            return {unit, 2};
        }
        if (unit >= 0xDC00 || available < 4) {
            return noCharacter;
        }
        const char32_t low = Base::load(p + 2);
        if ((low & 0xFC00) != 0xDC00) {
            return noCharacter;
        }
        return {0x10000 + ((unit & 0x3FF) << 10 | (low & 0x3FF)), 4};
    }

    static std::size_t write(char* p, char32_t c) {
        if (c < 0x10000) {
            Base::store(p, static_cast<Unit>(c));
            return 2;
        }
        Base::store(p, static_cast<Unit>(0xD7C0 + (c >> 10)));
        Base::store(p + 2, static_cast<Unit>(0xDC00 | (c & 0x3FF)));
        return 4;
    }
};

template <bool Swapped>
struct Utf32 : Units<std::uint32_t, Swapped> {
    using Base = Units<std::uint32_t, Swapped>;
    static constexpr char32_t last = 0x10FFFF;

    static Character read(const char* p, const char* end) {
        if (end - p < 4) {
            return noCharacter;
        }
        const char32_t c = Base::load(p);
        return c <= last && !isSurrogate(c) ? Character{c, 4} : noCharacter;
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

/// Moves one character; says whether there was one to take. `end` is that of the input or a nearer place behind the
/// character: where it is a fixed distance away, no comparisons with it are left in the code.
template <typename From, typename To>
bool moveCharacter(const char*& p, const char* end, char*& q) {
    const Character character = From::read(p, end);
    if (character.length == 0) {
        return false;
    }
    if constexpr (To::last < From::last) {
        if (character.codePoint > To::last) {
            return false;
        }
    }
    p += character.length;
    q += To::write(q, character.codePoint);
    return true;
}

/// Converts from `p` on until the input ends, the output has no room for another block, or ICU has to look.
template <typename From, typename To>
Run convertRun(const char* p, const char* end, char* q, const char* outEnd) {
    constexpr std::size_t fromBlock = blockLength * sizeof(typename From::Unit);
    constexpr std::size_t toBlock = blockLength * sizeof(typename To::Unit);
    constexpr std::size_t room = blockLength * longestCharacter;
    while (static_cast<std::size_t>(outEnd - q) >= room) {
        const auto left = static_cast<std::size_t>(end - p);
        if (left >= fromBlock && isAsciiBlock<From>(p)) {
            copyAsciiBlock<From, To>(p, q);
            p += fromBlock;
            q += toBlock;
        } else if (left >= room) {
            for (std::size_t i = 0; i < blockLength; ++i) {
                if (!moveCharacter<From, To>(p, p + longestCharacter, q)) {
                    return {p, q, true};
                }
            }
        } else {
            for (std::size_t i = 0; i < blockLength; ++i) {
                if (p == end || !moveCharacter<From, To>(p, end, q)) {
                    return {p, q, true};
                }
            }
        }
    }
    return {p, q, false};
}

using RunFunction = Run (*)(const char*, const char*, char*, const char*);

/// The forms with a way of their own, in the order of Form from asciiCompatible on, as sources and as targets.
template <typename... Forms>
struct FormList {
    static constexpr std::size_t size = sizeof...(Forms);

    template <typename From>
    static constexpr std::array<RunFunction, size> row = {&convertRun<From, Forms>...};

    static constexpr std::array<std::array<RunFunction, size>, size> table = {row<Forms>...};
};
using AllForms = FormList<Ascii, Utf8, Utf16<swappedIfLittle>, Utf16<swappedIfBig>, Utf32<swappedIfLittle>,
                          Utf32<swappedIfBig>>;
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
    while (p != end && Ascii::load(p) <= Ascii::last) {
        ++p;
    }
    return static_cast<std::size_t>(p - in.data());
}

} // namespace

template <typename CharOut>
std::size_t convertPrefix(Form from, Form to, std::string_view in, std::basic_string<CharOut>& out) {
    if (from == Form::other || to == Form::other ||
        (sizeof(CharOut) != 1 && sizeof(CharOut) != unitBytes(to))) {
        return 0;
    }
    if constexpr (sizeof(CharOut) == 1) {
        const bool bothBytes = unitBytes(from) == 1 && unitBytes(to) == 1;
        if (bothBytes && (from == Form::asciiCompatible || to == Form::asciiCompatible)) {
            const std::size_t length = asciiLength(in);
            out.append(in.data(), length);
            return length;
        }
    }
    const RunFunction convert =
        AllForms::table[static_cast<std::size_t>(from) - 1][static_cast<std::size_t>(to) - 1];
    const char* p = in.data();
    const char* const end = p + in.size();
    CharOut chunk[chunkBytes / sizeof(CharOut)];
    char* const start = reinterpret_cast<char*>(chunk);
    for (bool ended = false; !ended;) {
        const Run run = convert(p, end, start, start + chunkBytes);
        out.append(chunk, static_cast<std::size_t>(run.q - start) / sizeof(CharOut));
        p = run.p;
        ended = run.ended;
    }
    return static_cast<std::size_t>(p - in.data());
}

template std::size_t convertPrefix<char>(Form, Form, std::string_view, std::basic_string<char>&);
template std::size_t convertPrefix<char16_t>(Form, Form, std::string_view, std::basic_string<char16_t>&);
template std::size_t convertPrefix<char32_t>(Form, Form, std::string_view, std::basic_string<char32_t>&);

} // namespace kvt::ex::detail
