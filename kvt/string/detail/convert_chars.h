// The rules of conversion between two encodings that are known at run time, on bytes.
//
// UString brings its units here as bytes. The result goes straight into the storage of the target, whose unit is the
// one of the target encoding, or a byte. After a failure `out` holds what was converted, with substitutions.
#pragma once

#include <kvt/encoding/encoding.h>

#include <string>
#include <string_view>

namespace kvt::ex::detail {

/// Replaces `out` by the bytes; an incomplete last unit is dropped.
template <typename CharOut>
void copyBytes(std::string_view bytes, std::basic_string<CharOut>& out);

/// By ICU, or without it where that comes to the same. Fails as ICUTranscoder and its transcode().
template <typename CharOut>
void transcodeBytes(Encoding from, Encoding to, std::string_view bytes, std::basic_string<CharOut>& out);

/// From ASCII, which is trusted: copied where the target keeps ASCII as it is, transcoded otherwise.
template <typename CharOut>
void fromAscii(Encoding to, std::string_view bytes, std::basic_string<CharOut>& out);

/// To ASCII. Each character that is not ASCII becomes one SUB (26) where `from` is UTF-8 or a single-byte
/// encoding that keeps ASCII; other encodings are transcoded. Throws UStringBadEncodingException (910002) for
/// malformed UTF-8, else UStringTranscodingException (910003).
template <typename CharOut>
void toAsciiChecked(Encoding from, std::string_view bytes, std::basic_string<CharOut>& out);

/// UTF-16 units to `to`, which is neither `Binary` nor `Wwjd`.
template <typename CharOut>
void fromUtf16(Encoding to, std::u16string_view units, std::basic_string<CharOut>& out);

/// Bytes without a text meaning cannot become text: throws UStringBinaryTranscodingException (910004).
[[noreturn]] void throwBinary(std::string_view bytes);

/// The rules for any two encodings; the choice among the functions above.
template <typename CharOut>
void convertChars(Encoding from, Encoding to, std::string_view bytes, std::basic_string<CharOut>& out);

} // namespace kvt::ex::detail
