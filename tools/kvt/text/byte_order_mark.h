// The mark U+FEFF at the start of a text: which bytes it is in which encoding, and what to do about it.
#pragma once

#include <kvt/encoding/encoding.h>

#include <cstddef>
#include <string>
#include <string_view>

namespace host {

enum class MarkPolicy {
    Keep,  ///< it is a character like any other
    Strip, ///< every file's mark is dropped
    Add,   ///< every file's mark is dropped, and the output begins with one
};

/// The bytes of the mark. Empty for encodings that have none.
std::string_view byteOrderMark(kvt::ex::Encoding encoding);

/// The length of the longest mark.
inline constexpr std::size_t longestMark = 4;

/// Whether U+FEFF exists in the encoding but not as bytes that could be cut off: they melt with those behind.
bool hasInseparableMark(kvt::ex::Encoding encoding);

} // namespace host
