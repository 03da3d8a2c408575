// What the tests of string operations share: one fixture for all eight string types, and text for them that is
// written once, as ASCII or as numbers of units.
//
//     TYPED_TEST_SUITE(UStringFind, StringTypes, StringTypeNames);
//     TYPED_TEST(UStringFind, ...) { auto s = this->make("abc"); s.find(this->view("b")); }
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

inline constexpr std::uint64_t npos = std::numeric_limits<std::uint64_t>::max();

/// The units as numbers, and as text where they are printable: what a failing row prints.
template <typename Unit>
std::string show(std::basic_string_view<Unit> text) {
    std::string shown = "\"";
    for (const Unit unit : text) {
        const auto number = static_cast<std::uint32_t>(static_cast<std::make_unsigned_t<Unit>>(unit));
        char hex[16];
        std::snprintf(hex, sizeof hex, "\\x%X", number);
        shown += number >= 32 && number < 127 ? std::string(1, static_cast<char>(number)) : std::string(hex);
    }
    return shown + '"';
}
template <typename Unit>
std::string show(const std::basic_string<Unit>& text) {
    return show(std::basic_string_view<Unit>(text));
}

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
    static Units units(std::string_view text) {
        Units result;
        for (const char c : text) {
            result += unit(c);
        }
        return result;
    }
    /// From UTF-8, converted into the string's encoding; a UString<28> and a UString<30> take the bytes.
    static String converted(std::string_view text) {
        return String(text.data(), text.size(), Encoding::Utf8);
    }

    static String make(const Units& text, [[maybe_unused]] Encoding label = Encoding::Windows1252) {
        if constexpr (number == Encoding::Unknown) {
            return String(View(text), label);
        } else {
            return String(View(text));
        }
    }
    static String make(const char* text) { return make(units(text)); }
    static Units textOf(const String& string) { return Units(string.begin(), string.end()); }
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
        EXPECT_EQ(show(textOf(string)), show(text));
        EXPECT_EQ(string.rawData()[string.size()], Unit{0}) << "no zero at the end";
        const Encoding label = Encoding::Windows1252;
        EXPECT_EQ(string.encoding().id(), number == Encoding::Unknown ? label.id() : number);
    }
    static void expectText(const String& string, const char* text) { expectText(string, units(text)); }
};

/// Names a test's instance after its type.
struct StringTypeNames {
    template <typename Number>
    static std::string GetName(int) {
        return std::to_string(Number::value);
    }
};

template <std::uint32_t N>
using StringType = std::integral_constant<std::uint32_t, N>;
using StringTypes = testing::Types<StringType<0>, StringType<1>, StringType<2>, StringType<3>, StringType<27>,
                                   StringType<28>, StringType<29>, StringType<30>>;

} // namespace kvt::test
