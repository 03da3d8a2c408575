// Texts for the tests of storage and conversion: the eight string types in the order of their table, raw
// bytes into strings and back, and for each type texts that convert, texts that lose something and units that
// are not text.
#pragma once

#include <kvt/string/ustring.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <tuple>
#include <vector>

namespace kvt::test {

using kvt::ex::Encoding;
using kvt::ex::UString;

template <std::uint32_t... Ns>
struct Numbers {};

/// The template arguments, in the order of rows and columns.
using AllTypes = Numbers<0, 1, 2, 3, 27, 28, 29, 30>;
inline constexpr std::uint32_t allTypes[] = {0, 1, 2, 3, 27, 28, 29, 30};

/// Calls `visit.template operator()<N>()` for each type.
template <typename Visit, std::uint32_t... Ns>
void forEachTypeOf(Numbers<Ns...>, Visit& visit) {
    (visit.template operator()<Ns>(), ...);
}
template <typename Visit>
void forEachType(Visit visit) {
    forEachTypeOf(AllTypes{}, visit);
}

inline Encoding encodingOf(std::uint32_t number) {
    return static_cast<Encoding::Type>(number);
}

/// The units as bytes in memory order.
template <std::uint32_t N>
std::string bytesOf(const UString<N>& string) {
    return {reinterpret_cast<const char*>(string.rawData()),
            string.size() * sizeof(typename UString<N>::value_type)};
}

/// Units from bytes, as they stand; a UString<30> is labelled `label`.
template <std::uint32_t N>
UString<N> stringOf(std::string_view bytes, Encoding label = encodingOf(N)) {
    if constexpr (N == Encoding::Unknown) {
        return UString<N>(bytes.data(), bytes.size(), label);
    } else {
        return UString<N>(bytes.data(), bytes.size(), encodingOf(N));
    }
}

/// Opens the protected initialisers.
template <std::uint32_t N>
class Probe : public UString<N> {
public:
    using UString<N>::UString;
    using UString<N>::init;
};

inline std::string utf16Bytes(const std::u16string& text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * sizeof(char16_t)};
}
inline std::string utf32Bytes(const std::u32string& text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * sizeof(char32_t)};
}

/// Texts in `encoding`, as bytes; for types without a list of their own those of UTF-8.
inline std::vector<std::string> samplesOf(std::uint32_t encoding) {
    using namespace std::string_literals;
    const std::string punctuation = " <>\"&\\/'$@,()[]{};\n\r\t\a\b\v\f\x01\x7F";
    switch (encoding) {
    case Encoding::UsAscii:
        return {"", "abc", "a\0b"s, punctuation, "caf\xE9", "\x80\xFF", "<u00e9>"};
    case Encoding::Utf16LE:
        return {"",
                utf16Bytes(u"abc"),
                utf16Bytes(u"a\0b"s),
                utf16Bytes(u"caf\u00e9 \u20ac <x>"),
                utf16Bytes(u"\U0001F600\U0010FFFF"),
                utf16Bytes(u"\uFFFD"),
                utf16Bytes({0xD800}),
                utf16Bytes({u'a', 0xDC00, u'b'}),
                utf16Bytes({0xDC00, 0xD800, u'\u00e9'}),
                utf16Bytes({0xD83D, 0xD83D, 0xDE00}),
                utf16Bytes(std::u16string(5000, u'\u3042') + u"x")};
    case Encoding::Utf32LE:
        return {"",
                utf32Bytes(U"abc"),
                utf32Bytes(U"a\0b"s),
                utf32Bytes(U"caf\u00e9 \u20ac <x>"),
                utf32Bytes(U"\U0001F600\U0010FFFF"),
                utf32Bytes(U"\uFFFD"),
                utf32Bytes({0xD800}),
                utf32Bytes({U'a', 0xDFFF, U'b'}),
                utf32Bytes({0x110000, U'\u00e9'}),
                utf32Bytes({0xFFFFFFFF}),
                utf32Bytes(std::u32string(5000, U'\u3042') + U"x")};
    case Encoding::Binary:
        return {"", "abc", "a\x01\xE9\0\\"s, std::string(300, '\xFF')};
    case Encoding::Wwjd:
        return {"",        "abc",       "a<space>b<comma>", "<u00e9><u20ac>",  "<ud83d><ude00>",
                "<ud800>", "x<udc00>y", "<ufffd>",          "<unknown>",       "<lt",
                "<<lt>>",  "a\0b"s,     "x\xE9y",           "<lt>\xFF<ud800>", "<u>",
                "<uzzzz>"};
    default:
        return {"",
                "abc",
                "a\0b"s,
                punctuation,
                "caf\u00e9",
                "\u20ac\U0001F600\U0010FFFF",
                "\uFFFD",
                "\uFEFFx",
                "\xFF",
                "a\xC3",
                "\xC3(",
                "\xE2\x82",
                "\xE2\x82(",
                "\xF0\x9F\x98",
                "\xED\xA0\x80",
                "\xC0\x80",
                "\xF8\x88\x80\x80\x80",
                "\xF4\x90\x80\x80",
                "\x80\xBFz",
                "\u00e9\xFF",
                "\uFFFD\xFF",
                std::string(5000, 'x') + "\u00e9" + std::string(5000, 'y')};
    }
}

} // namespace kvt::test
