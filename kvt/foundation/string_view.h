// The view type of the public signatures: the standard one under the library's own name.
#pragma once

#include <cstddef>
#include <limits>
#include <string_view>

namespace kvt::future {

/// A pointer and a count of code units; it owns nothing and is not zero-terminated in general.
template <typename CharT, typename Traits = std::char_traits<CharT>>
using basic_string_view = std::basic_string_view<CharT, Traits>;

/// The form for text in 8-bit units.
using string_view = basic_string_view<char>;

namespace detail {

/// Constants shared by the views of all unit types.
struct basic_string_view_constants {
    /// Not found, or up to the end: the largest size.
    static constexpr std::size_t npos = std::numeric_limits<std::size_t>::max();
};

} // namespace detail
} // namespace kvt::future
