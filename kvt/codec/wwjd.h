// The wwjd text encoding, "zqt-wwjd": any UTF-16 text in pure ASCII, free of the separators, quotes and brackets of
// the usual syntaxes.
//
// The encoded text is literal ASCII with tokens in angle brackets. 25 characters are spelt by name, as `<space>` or
// `<comma>`; each UTF-16 unit beyond ASCII is spelt as `<uXXXX>` with four hexadecimal digits, a supplementary
// character as two of them. `<u>` holds nothing. Something that only looks like a token stands for itself.
//
// Conversion of a UString from or to encoding 29 comes here by itself; these functions are the codec beneath.
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/foundation/string_view.h>

#include <cstdint>
#include <string>
#include <string_view>

namespace kvt::ex {

template <std::uint32_t N>
class UString;

namespace detail {

/// Encodes UTF-16 units. Every unit sequence can be encoded, unpaired surrogates included.
KVT_EXPORT std::string utf16ToWwjd(std::u16string_view text);

/// Decodes to UTF-16. Bytes above 127 outside a token decode to U+FFFD, and the failure comes when all is decoded:
/// UStringBadEncodingException (910002) with the bytes behind the last token, "zqt-wwjd", and the text with its
/// U+FFFD as the lossy conversion. A token of `u` and four characters that do not begin with a hexadecimal number
/// throws std::invalid_argument "invalid stoi argument".
KVT_EXPORT UString<2> wwjdToUtf16(std::string_view text);

/// Replaces the named tokens by their characters and copies everything else, `<uXXXX>` included. Never fails but
/// for lack of memory.
KVT_EXPORT std::string wwjdToBytes(std::string_view text);

/// wwjdToBytes() into storage of the calling thread: `data` and `size` (bytes) are valid until the next call on
/// this thread. Exists for `char`.
template <typename CharT>
void wwjdDecode(kvt::future::basic_string_view<CharT, std::char_traits<CharT>> text, const CharT*& data,
                std::uint64_t& size);

extern template KVT_EXPORT void
wwjdDecode<char>(kvt::future::basic_string_view<char, std::char_traits<char>> text, const char*& data,
                 std::uint64_t& size);

} // namespace detail
} // namespace kvt::ex
