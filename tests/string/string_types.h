// The eight string types as a typed suite of GoogleTest, and plain text in the units of each.
//
//     TYPED_TEST_SUITE(UStringSplit, kvt::test::AllStringTypes, kvt::test::StringTypeName);
#pragma once

#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <cstdio>
#include <initializer_list>
#include <string>
#include <string_view>
#include <type_traits>
#include <vector>

namespace kvt::test {

template <std::uint32_t N>
struct StringType {
    static constexpr std::uint32_t number = N;
};

using AllStringTypes = ::testing::Types<StringType<0>, StringType<1>, StringType<2>, StringType<3>,
                                        StringType<27>, StringType<28>, StringType<29>, StringType<30>>;

struct StringTypeName {
    template <typename Type>
    static std::string GetName(int) {
        return "UString" + std::to_string(Type::number);
    }
};

template <std::uint32_t N>
using Unit = typename kvt::ex::UString<N>::value_type;
template <std::uint32_t N>
using Units = std::basic_string<Unit<N>>;

/// ASCII as units.
template <std::uint32_t N>
Units<N> asciiUnits(std::string_view ascii) {
    Units<N> units;
    for (const char c : ascii) {
        units += static_cast<Unit<N>>(c);
    }
    return units;
}

template <std::uint32_t N>
Units<N> unitsOf(const kvt::ex::UString<N>& string) {
    return {string.begin(), string.end()};
}

/// The units as they stand; a UString<30> is labelled.
template <std::uint32_t N>
kvt::ex::UString<N> fromUnits(const Units<N>& units, kvt::ex::Encoding label = kvt::ex::Encoding::Utf8) {
    if constexpr (N == kvt::ex::Encoding::Unknown) {
        return kvt::ex::UString<N>(kvt::ex::UStringView<N>(units), label);
    } else {
        return kvt::ex::UString<N>(kvt::ex::UStringView<N>(units));
    }
}

/// A string of ASCII text.
template <std::uint32_t N>
kvt::ex::UString<N> plain(std::string_view ascii) {
    return fromUnits<N>(asciiUnits<N>(ascii));
}

template <std::uint32_t N>
kvt::ex::UStringArray<N> plainArray(const std::vector<std::string>& texts) {
    kvt::ex::UStringArray<N> array;
    for (const std::string& text : texts) {
        array.push_back(plain<N>(text));
    }
    return array;
}

/// For failure messages and tables: printable ASCII as it is, any other unit as `{hex}`.
template <std::uint32_t N>
std::string shown(const Units<N>& units) {
    std::string text;
    for (const Unit<N> unit : units) {
        const auto value = static_cast<std::uint32_t>(static_cast<std::make_unsigned_t<Unit<N>>>(unit));
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
std::string shown(const kvt::ex::UString<N>& string) {
    return shown<N>(unitsOf(string));
}
template <std::uint32_t N>
std::vector<std::string> shown(const kvt::ex::UStringArray<N>& array) {
    std::vector<std::string> texts;
    for (const auto& element : array) {
        texts.push_back(shown(element));
    }
    return texts;
}

} // namespace kvt::test
