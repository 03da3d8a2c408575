// Single bytes of UTF-8 and of ASCII. The command stands on the library's public headers alone, so that it has these of
// its own.
#pragma once

#include <cstddef>
#include <string_view>

namespace host {

constexpr bool isAscii(char byte) noexcept {
    return static_cast<unsigned char>(byte) < 0x80;
}

/// Whether the byte stands within a character of UTF-8, behind its first byte.
constexpr bool isContinuation(char byte) noexcept {
    return (static_cast<unsigned char>(byte) & 0xC0) == 0x80;
}

constexpr bool isDigit(char byte) noexcept {
    return byte >= '0' && byte <= '9';
}

/// One of ASCII.
constexpr bool isLetter(char byte) noexcept {
    return (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z');
}

/// Without spaces and tabs at both ends.
constexpr std::string_view trimmed(std::string_view text) noexcept {
    constexpr std::string_view blanks = " \t";
    const std::size_t first = text.find_first_not_of(blanks);
    return first == std::string_view::npos ? std::string_view()
                                           : text.substr(first, text.find_last_not_of(blanks) + 1 - first);
}

/// All but the letters of ASCII stay as they are, whatever the locale is.
constexpr char asciiLower(char byte) noexcept {
    return byte >= 'A' && byte <= 'Z' ? static_cast<char>(byte - 'A' + 'a') : byte;
}

} // namespace host
