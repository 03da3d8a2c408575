// Conversion to ASCII without ICU, where everything that is not ASCII becomes the control character SUB.
#pragma once

#include <kvt/encoding/encoding.h>

#include <string>
#include <string_view>

namespace kvt::ex::detail {

/// Replaces `out` by the UTF-8 text with one SUB in place of each character beyond ASCII, and of each byte that
/// cannot stand where it stands. Throws UStringBadEncodingException (910002) when the text is malformed, else
/// UStringTranscodingException (910003) when anything was replaced; `out` then holds the result.
///
/// The check is of structure only: a lead byte announces one to four trailing bytes, and those take up whatever
/// follows. Over-long forms and surrogates count as characters, since all of them are lost alike.
void utf8ToAscii(std::string_view bytes, std::string& out);

/// The same for an encoding of single bytes that keeps ASCII, where each byte above 127 is one character. Throws
/// UStringTranscodingException (910003) when there is one.
void singleByteToAscii(Encoding from, std::string_view bytes, std::string& out);

} // namespace kvt::ex::detail
