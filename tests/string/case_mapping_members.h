// What the tests of case mapping share: the nine members, by name, and what each asks of ICU and says of a failure.
#pragma once

#include <support/string_types.h>

#include <array>
#include <cstdint>
#include <functional>
#include <utility>
#include <vector>

namespace kvt::test {

enum Mapping { upper, lower, folded };

inline constexpr std::array utf8Functions = {"ucasemap_utf8ToUpper", "ucasemap_utf8ToLower",
                                             "ucasemap_utf8FoldCase"};
inline constexpr std::array utf16Functions = {"u_strToUpper", "u_strToLower", "u_strFoldCase"};
inline constexpr std::array utf8Prefixes = {"UString<Encoding::Utf8>::toUpperCase() failed on ",
                                            "UString<Encoding::Utf8>::toLowerCase() failed on ",
                                            "UString<Encoding::Utf8>::toFoldedCase() failed on "};
inline constexpr std::array utf16Prefixes = {"UString<Encoding::Utf16>::toUpperCase() failed on ",
                                             "UString<Encoding::Utf16>::toLowerCase() failed on ",
                                             "UString<Encoding::Utf16>::toFoldedCase() failed on "};

/// One of the nine members. `run` leaves the mapped text in the string that it is given.
template <std::uint32_t N>
struct Member {
    Mapping mapping;
    const char* name;
    const char* form;
    bool inPlace;
    std::function<void(kvt::ex::UString<N>&)> run;
};

template <std::uint32_t N>
std::vector<Member<N>> nineMembers() {
    using S = kvt::ex::UString<N>;
    using V = kvt::ex::UStringView<N>;
    return {
        {upper, "toUpperCase", "in place", true, [](S& s) { s.toUpperCase(); }},
        {lower, "toLowerCase", "in place", true, [](S& s) { s.toLowerCase(); }},
        {folded, "toFoldedCase", "in place", true, [](S& s) { s.toFoldedCase(); }},
        {upper, "getAsUpperCase", "const", false, [](S& s) { s = std::as_const(s).getAsUpperCase(); }},
        {lower, "getAsLowerCase", "const", false, [](S& s) { s = std::as_const(s).getAsLowerCase(); }},
        {folded, "getAsFoldedCase", "const", false, [](S& s) { s = std::as_const(s).getAsFoldedCase(); }},
        {upper, "getAsUpperCase", "static", false, [](S& s) { s = S::getAsUpperCase(V(s)); }},
        {lower, "getAsLowerCase", "static", false, [](S& s) { s = S::getAsLowerCase(V(s)); }},
        {folded, "getAsFoldedCase", "static", false, [](S& s) { s = S::getAsFoldedCase(V(s)); }},
    };
}

/// A text for each type, from UTF-8; ASCII where the type takes nothing else.
template <std::uint32_t N>
kvt::ex::UString<N> sample(const char* text, const char* ascii) {
    return kvt::ex::UString<N>(N == kvt::ex::Encoding::UsAscii ? ascii : text);
}

} // namespace kvt::test
