// What the formatters have to write, for both libraries: rows of format options and the result.
#pragma once

#include <kvt/string/ustring.h>

#include <string>
#include <string_view>

namespace kvt::test {

struct FormatRow {
    const char* options;
    const char* ofText; ///< for "caf\u00e9 <"
    const char* why;
};

/// Specifications of text; all eight types write one text alike.
inline constexpr FormatRow formatRows[] = {
    {"{}", "caf\u00e9 <", "as it is"},
    {"{:s}", "caf\u00e9 <", "the presentation of strings"},
    {"{:>10}", "    caf\u00e9 <", "a width counts characters, not bytes"},
    {"{:<10}|", "caf\u00e9 <    |", "to the left"},
    {"{:^10}|", "  caf\u00e9 <  |", "in the middle"},
    {"{:*^10}", "**caf\u00e9 <**", "with a fill"},
    {"{:.4}", "caf\u00e9", "a precision counts characters, not bytes"},
    {"{:.0}", "", "nothing at all"},
    {"{:-<6.3}", "caf---", "all together"},
    {"{:2}", "caf\u00e9 <", "a width that is too small"},
};

/// The text of the rows in each type that holds text.
template <std::uint32_t N>
kvt::ex::UString<N> rowText() {
    if constexpr (N == kvt::ex::Encoding::Unknown) {
        return {"caf\xE9 <", 6, kvt::ex::Encoding::Windows1252};
    } else {
        return kvt::ex::UString<N>("caf\u00e9 <");
    }
}

} // namespace kvt::test
