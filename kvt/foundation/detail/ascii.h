// ASCII, and the letters in it: independent of the locale, with all other bytes left alone.
#pragma once

#include <algorithm>
#include <string_view>

namespace kvt::ex::detail {

constexpr bool isAscii(char byte) noexcept {
    return static_cast<unsigned char>(byte) < 0x80;
}

constexpr bool isAllAscii(std::string_view bytes) noexcept {
    return std::all_of(bytes.begin(), bytes.end(), isAscii);
}

constexpr char asciiLower(char byte) noexcept {
    return byte >= 'A' && byte <= 'Z' ? static_cast<char>(byte + ('a' - 'A')) : byte;
}

constexpr char asciiUpper(char byte) noexcept {
    return byte >= 'a' && byte <= 'z' ? static_cast<char>(byte - ('a' - 'A')) : byte;
}

constexpr bool isAsciiLetter(char byte) noexcept {
    return asciiLower(byte) >= 'a' && asciiLower(byte) <= 'z';
}

/// Whether the texts are the same but for the case of ASCII letters.
constexpr bool equalsIgnoringAsciiCase(std::string_view left, std::string_view right) noexcept {
    return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                      [](char a, char b) { return asciiLower(a) == asciiLower(b); });
}

} // namespace kvt::ex::detail
