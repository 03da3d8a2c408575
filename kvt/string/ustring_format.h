// std::format for strings, where the run-time has it.
//
//     std::format("{:>10}", text)
//
// A string is formatted as the UTF-8 text that operator<< writes, with the options of a std::string_view: fill,
// alignment, width, precision. It fails as operator<<. With a run-time that has no <format>, this header is empty.
#pragma once

#include <kvt/string/ustring_output.h>

#if __has_include(<version>)
#include <version>
#endif

#ifdef __cpp_lib_format
#include <cstdint>
#include <format>
#include <string_view>

template <std::uint32_t N>
struct std::formatter<kvt::ex::UString<N>, char> : std::formatter<std::string_view, char> {
    template <typename Context>
    auto format(const kvt::ex::UString<N>& string, Context& context) const {
        return std::formatter<std::string_view, char>::format(kvt::ex::detail::OutputText<N>(string),
                                                              context);
    }
};
#endif
