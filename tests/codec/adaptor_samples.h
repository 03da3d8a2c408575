// Strings of all eight types for the tests of what a host sees: the same short texts in the units of each.
#pragma once

#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>
#include <type_traits>

namespace kvt::test {

template <std::uint32_t N>
using Number = std::integral_constant<std::uint32_t, N>;

/// The eight types, for typed tests.
using EightTypes = testing::Types<Number<0>, Number<1>, Number<2>, Number<3>, Number<27>, Number<28>,
                                  Number<29>, Number<30>>;

/// ASCII characters, zeros among them, as units of type N.
template <std::uint32_t N>
std::basic_string<kvt::ex::detail::CodeUnit<N>> unitsOf(std::string_view ascii) {
    return {ascii.begin(), ascii.end()};
}

/// The string of these units, which a UString<30> holds in windows-1252.
template <std::uint32_t N>
kvt::ex::UString<N> stringOfUnits(std::string_view ascii) {
    const auto units = unitsOf<N>(ascii);
    const kvt::ex::UStringView<N> view(units);
    if constexpr (N == kvt::ex::Encoding::Unknown) {
        return {view, kvt::ex::Encoding::Windows1252};
    } else {
        return kvt::ex::UString<N>(view);
    }
}

template <std::uint32_t N>
kvt::ex::UStringArray<N> arrayOf(std::initializer_list<std::string_view> texts) {
    kvt::ex::UStringArray<N> array;
    for (const std::string_view text : texts) {
        array.push_back(stringOfUnits<N>(text));
    }
    return array;
}

/// The units of each element, to be compared and printed at once: ASCII as it is, other units as numbers.
template <std::uint32_t N>
std::string shown(const kvt::ex::UString<N>& string) {
    std::string text;
    for (const auto unit : string) {
        const auto number =
            static_cast<std::uint32_t>(static_cast<std::make_unsigned_t<decltype(unit + 0)>>(unit));
        if (number >= 32 && number < 127) {
            text += static_cast<char>(number);
        } else {
            text += "{" + std::to_string(sizeof unit == 1 ? number & 0xFF : number) + "}";
        }
    }
    return text;
}

template <std::uint32_t N>
std::string shown(const kvt::ex::UStringArray<N>& array) {
    std::string text;
    for (const auto& element : array) {
        text += "[" + shown(element) + "]";
    }
    return text;
}

/// The function in a slot, counted from 1: on this platform an object begins with the address of its table, and the
/// table has the functions in the order of their declaration, the destructor twice.
template <typename Function>
Function* slotOf(const void* object, int number) {
    void* const* const table = *static_cast<void* const* const*>(object);
    return reinterpret_cast<Function*>(table[number - 1]);
}

} // namespace kvt::test
