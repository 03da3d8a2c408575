// {fmt} for strings. The one header that needs that library's own; <kvt/kvt.h> leaves it out, and a program that
// includes it links to {fmt} by itself.
//
//     fmt::print("{:>10}", text)
//
// A string is formatted as the UTF-8 text that operator<< writes, with the options of a string view: fill,
// alignment, width, precision. It fails as operator<<.
#pragma once

#include <kvt/string/ustring_output.h>

#include <cstdint>

#include <fmt/format.h>

namespace kvt::ex::detail {

template <std::uint32_t N>
struct FmtFormatter : fmt::formatter<fmt::string_view> {
    template <typename Context>
    auto format(const UString<N>& string, Context& context) const {
        const OutputText<N> text(string);
        const std::string_view view = text;
        return fmt::formatter<fmt::string_view>::format(fmt::string_view(view.data(), view.size()), context);
    }
};

} // namespace kvt::ex::detail

// One by one: a specialisation for all N would compete with that of <fmt/ranges.h>, as a string is a range, too.
/// \cond the reference pages have no place for members of fmt
// clang-format off
template <> struct fmt::formatter<kvt::ex::UString<0>> : kvt::ex::detail::FmtFormatter<0> {};
template <> struct fmt::formatter<kvt::ex::UString<1>> : kvt::ex::detail::FmtFormatter<1> {};
template <> struct fmt::formatter<kvt::ex::UString<2>> : kvt::ex::detail::FmtFormatter<2> {};
template <> struct fmt::formatter<kvt::ex::UString<3>> : kvt::ex::detail::FmtFormatter<3> {};
template <> struct fmt::formatter<kvt::ex::UString<27>> : kvt::ex::detail::FmtFormatter<27> {};
template <> struct fmt::formatter<kvt::ex::UString<28>> : kvt::ex::detail::FmtFormatter<28> {};
template <> struct fmt::formatter<kvt::ex::UString<29>> : kvt::ex::detail::FmtFormatter<29> {};
template <> struct fmt::formatter<kvt::ex::UString<30>> : kvt::ex::detail::FmtFormatter<30> {};
// clang-format on
/// \endcond
