// The encoding names behind the code page numbers that a system's locale can have.
#pragma once

#include <cstdint>
#include <string_view>

namespace kvt::ex::detail {

/// The name for a code page, empty for a page that is not in the table. Some entries are not what the page's own
/// family of encodings would say (1200 and 1201 give "ISO-8859-1", 50220 gives "Shift_JIS"): a locale must name an
/// encoding of bytes that can hold any of its text in a file name.
std::string_view codePageName(std::uint32_t codePage);

} // namespace kvt::ex::detail
