// UTF-8, UTF-16 and UTF-32 in vector registers: how long the well-formed part of a text is, what it will measure in
// another form, and its conversion.
//
// The conversion of a text of any length is two passes. The first finds the longest well-formed prefix and counts what it becomes, so that
// the result can be made in one piece; the second converts that prefix and looks at nothing else. UTF-16 and UTF-32 are
// in the machine's byte order, and their units may lie at any address.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace kvt::ex::detail::vectors {

/// What the well-formed prefix of a text measures.
struct Extent {
    std::size_t taken = 0; ///< code units of the prefix, in its own form
    std::size_t utf8 = 0;  ///< bytes as UTF-8
    std::size_t utf16 = 0; ///< units as UTF-16
    std::size_t utf32 = 0; ///< code points
};

/// The longest prefix of well-formed and complete characters: of bytes, of units of UTF-16, of units of UTF-32.
Extent measureUtf8(const char* text, std::size_t bytes);
Extent measureUtf16(const char* text, std::size_t units);
Extent measureUtf32(const char* text, std::size_t units);

/// Convert well-formed text and return the units written. `out` has room for at least as many units as come out; what
/// lies behind them, up to `room`, may be overwritten.
std::size_t utf8ToUtf16(const char* text, std::size_t bytes, char* out, std::size_t room);
std::size_t utf8ToUtf32(const char* text, std::size_t bytes, char* out, std::size_t room);
std::size_t utf16ToUtf8(const char* text, std::size_t units, char* out, std::size_t room);
std::size_t utf16ToUtf32(const char* text, std::size_t units, char* out, std::size_t room);
std::size_t utf32ToUtf8(const char* text, std::size_t units, char* out, std::size_t room);
std::size_t utf32ToUtf16(const char* text, std::size_t units, char* out, std::size_t room);

/// The longest text for the functions below, in units, and the units of room that each of them needs for its result.
constexpr std::size_t shortText = 128;
constexpr std::size_t shortRoom = 4 * shortText;
/// What they return where nothing was converted.
constexpr std::size_t notWhole = static_cast<std::size_t>(-1);

/// Convert a text that need not be well-formed and return the units written, or `notWhole`: for a text that is not
/// well-formed and complete, and in the last three also for one with characters beyond U+FFFF.
std::size_t shortUtf8ToUtf16(const char* text, std::size_t bytes, char* out);
std::size_t shortUtf8ToUtf32(const char* text, std::size_t bytes, char* out);
std::size_t shortUtf16ToUtf8(const char* text, std::size_t units, char* out);
std::size_t shortUtf16ToUtf32(const char* text, std::size_t units, char* out);
std::size_t shortUtf32ToUtf16(const char* text, std::size_t units, char* out);

/// The bytes before the first that is not ASCII.
std::size_t asciiPrefix(const char* text, std::size_t bytes);
/// Copy those characters from bytes to UTF-16 and from UTF-16 to bytes, and return their number. The output has room
/// for the whole text.
std::size_t widenAscii(const char* text, std::size_t bytes, char* out);
std::size_t narrowAscii(const char* text, std::size_t units, char* out);

} // namespace kvt::ex::detail::vectors
