// Single bytes of UTF-8 and of ASCII. The command stands on the library's public headers alone, so that it has these of
// its own.
#pragma once

namespace host {

constexpr bool isAscii(char byte) noexcept {
    return static_cast<unsigned char>(byte) < 0x80;
}

/// Whether the byte stands within a character of UTF-8, behind its first byte.
constexpr bool isContinuation(char byte) noexcept {
    return (static_cast<unsigned char>(byte) & 0xC0) == 0x80;
}

/// All but the letters of ASCII stay as they are, whatever the locale is.
constexpr char asciiLower(char byte) noexcept {
    return byte >= 'A' && byte <= 'Z' ? static_cast<char>(byte - 'A' + 'a') : byte;
}

} // namespace host
