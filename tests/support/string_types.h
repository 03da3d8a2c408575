// The eight string types as typed suites of GoogleTest, and text for them that is written once, as ASCII or as numbers
// of units.
//
//     TYPED_TEST_SUITE(UStringFind, StringTypes, StringTypeNames);
//     TYPED_TEST(UStringFind, ...) { auto s = this->make("abc"); s.find(this->make("b")); }
#pragma once

#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <cstdio>
#include <initializer_list>
#include <limits>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

namespace kvt::test {

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringArray;
using kvt::ex::UStringView;

template <std::uint32_t N>
using StringType = std::integral_constant<std::uint32_t, N>;
using StringTypes = testing::Types<StringType<0>, StringType<1>, StringType<2>, StringType<3>, StringType<27>,
                                   StringType<28>, StringType<29>, StringType<30>>;
/// Those that can be compared and searched without regard to case.
using FoldingStringTypes = testing::Types<StringType<0>, StringType<1>, StringType<2>, StringType<3>,
                                          StringType<27>, StringType<29>>;

/// Names a test's instance after its type.
struct StringTypeNames {
    template <typename Number>
    static std::string GetName(int) {
        return std::to_string(Number::value);
    }
};

inline constexpr std::uint64_t npos = std::numeric_limits<std::uint64_t>::max();

template <std::uint32_t N>
using Unit = typename UString<N>::value_type;
template <std::uint32_t N>
using Units = std::basic_string<Unit<N>>;

/// ASCII as units; of a wide type, bytes from 128 up give the units of that value.
template <std::uint32_t N>
Units<N> asciiUnits(std::string_view ascii) {
    Units<N> units;
    for (const char c : ascii) {
        units += static_cast<Unit<N>>(static_cast<unsigned char>(c));
    }
    return units;
}

template <std::uint32_t N>
Units<N> unitsOf(const UString<N>& string) {
    return {string.begin(), string.end()};
}

/// The units as they stand; a UString<30> is labelled.
template <std::uint32_t N>
UString<N> fromUnits(const Units<N>& units, Encoding label = Encoding::Utf8) {
    if constexpr (N == Encoding::Unknown) {
        return UString<N>(UStringView<N>(units), label);
    } else {
        return UString<N>(UStringView<N>(units));
    }
}

/// A string of ASCII text.
template <std::uint32_t N>
UString<N> plain(std::string_view ascii) {
    return fromUnits<N>(asciiUnits<N>(ascii));
}

template <std::uint32_t N>
UStringArray<N> plainArray(const std::vector<std::string>& texts) {
    UStringArray<N> array;
    for (const std::string& text : texts) {
        array.push_back(plain<N>(text));
    }
    return array;
}

/// For failure messages and tables: printable ASCII as it is, any other unit as `{hex}`.
template <typename Unit>
std::string shown(const std::basic_string<Unit>& units) {
    std::string text;
    for (const Unit unit : units) {
        const auto value = static_cast<std::uint32_t>(static_cast<std::make_unsigned_t<Unit>>(unit));
        if (value >= 32 && value < 127) {
            text += static_cast<char>(value);
        } else {
            char hex[16];
            std::snprintf(hex, sizeof hex, "{%X}", value);
            text += hex;
        }
    }
    return text;
}
template <std::uint32_t N>
std::string shown(const Units<N>& units) {
    return shown(std::basic_string<Unit<N>>(units));
}
template <std::uint32_t N>
std::string shown(const UString<N>& string) {
    return shown<N>(unitsOf(string));
}
template <std::uint32_t N>
std::vector<std::string> shown(const UStringArray<N>& array) {
    std::vector<std::string> texts;
    for (const auto& element : array) {
        texts.push_back(shown(element));
    }
    return texts;
}

/// Of one type: its names, and how to make and look at its strings.
template <typename Number>
class StringTest : public testing::Test {
public:
    static constexpr std::uint32_t number = Number::value;
    using String = UString<number>;
    using View = UStringView<number>;
    using Unit = typename String::value_type;
    using Units = std::basic_string<Unit>;
    using Set = kvt::ex::vector<Unit>;
    using Array = UStringArray<number>;

    /// Whether the unit is a byte, and whether the type can fold its text at all.
    static constexpr bool narrow = sizeof(Unit) == 1;
    static constexpr bool folds = number != Encoding::Binary && number != Encoding::Unknown;
    /// The largest unit. As a signed number it would be the smallest one.
    static constexpr Unit highest = static_cast<Unit>(~std::make_unsigned_t<Unit>{0});

    static Unit unit(char c) { return static_cast<Unit>(static_cast<unsigned char>(c)); }
    static Units units(std::string_view text) { return asciiUnits<number>(text); }
    /// From UTF-8, converted into the string's encoding; a UString<28> and a UString<30> take the bytes.
    static String converted(std::string_view text) {
        return String(text.data(), text.size(), Encoding::Utf8);
    }

    static String make(const Units& text, Encoding label = Encoding::Windows1252) {
        return fromUnits<number>(text, label);
    }
    static String make(const char* text) { return make(units(text)); }
    static Units textOf(const String& string) { return unitsOf(string); }
    static Units textOf(View view) { return Units(view.begin(), view.end()); }

    static Set set(const Units& text) { return Set(text.begin(), text.end()); }
    static Set set(const char* text) { return set(units(text)); }
    static Array array(std::initializer_list<const char*> texts) {
        Array result;
        for (const char* const text : texts) {
            result.push_back(make(text));
        }
        return result;
    }

    /// The text, and what must be true of each string: a zero unit behind the last one and, where the encoding is held
    /// at run time, the one that make() gave.
    static void expectText(const String& string, const Units& text) {
        EXPECT_EQ(shown(textOf(string)), shown(text));
        EXPECT_EQ(string.rawData()[string.size()], Unit{0}) << "no zero at the end";
        const Encoding label = Encoding::Windows1252;
        EXPECT_EQ(string.encoding().id(), number == Encoding::Unknown ? label.id() : number);
    }
    static void expectText(const String& string, const char* text) { expectText(string, units(text)); }
};

} // namespace kvt::test
