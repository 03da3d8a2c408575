// Small ways of showing bytes and characters to a person. All results are UTF-8.
#pragma once

#include <kvt/encoding/encoding.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

/// "C5 81".
std::string hexBytes(std::string_view bytes);

/// "U+0141", "U+1F600".
std::string codePointName(char32_t character);

/// The text as it stands, but with control characters and bytes that are not UTF-8 as `\xHH`, so that it is one
/// harmless line on a terminal.
std::string printable(std::string_view utf8);
std::string printable(std::u32string_view text);

/// Throws Failure where the text of the argument `what` is not UTF-8; it names the argument and the place.
void requireUtf8(const std::string& what, std::string_view text);

/// Whole texts, substitutions in place of what does not convert.
std::string toUtf8(std::u32string_view text);
std::u32string toUtf32(std::string_view bytes, kvt::ex::Encoding from);

/// `text` as it reads after it was in `encoding`.
std::u32string through(std::u32string_view text, kvt::ex::Encoding encoding);

/// "1 loss", "2 losses".
std::string counted(std::uint64_t count, const std::string& one, const std::string& many);

} // namespace host
