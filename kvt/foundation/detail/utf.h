// How UTF-8 and UTF-16 lay out a code point (RFC 3629 and RFC 2781): the arithmetic alone, for a single character.
// Whole texts are converted by encoding/.
#pragma once

#include <cstddef>

namespace kvt::ex::detail {

constexpr char32_t lastCodePoint = 0x10FFFF;
/// The first code point that takes two units of UTF-16.
constexpr char32_t firstSupplementary = 0x10000;

// ---- UTF-8

/// Whether the byte stands within a character, behind its first byte.
constexpr bool isContinuation(char byte) noexcept {
    return (static_cast<unsigned char>(byte) & 0xC0) == 0x80;
}

/// The six bits of the code point that such a byte holds.
constexpr char32_t continuationBits(char byte) noexcept {
    return static_cast<unsigned char>(byte) & 0x3F;
}

/// The byte that holds the lowest six bits of `bits`.
constexpr char continuationByte(char32_t bits) noexcept {
    return static_cast<char>(0x80 | (bits & 0x3F));
}

constexpr std::size_t longestUtf8 = 4; // bytes

/// The bytes of a character that begins with this one, if it is well-formed.
constexpr std::size_t utf8Length(char first) noexcept {
    const auto lead = static_cast<unsigned char>(first);
    return lead < 0xC0 ? 1 : lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
}

/// Writes a code point and returns the number of bytes, 1 to 4. A surrogate is written like any other number of its
/// size.
constexpr std::size_t encodeUtf8(char32_t codePoint, char* out) noexcept {
    if (codePoint < 0x80) {
        out[0] = static_cast<char>(codePoint);
        return 1;
    }
    if (codePoint < 0x800) {
        out[0] = static_cast<char>(0xC0 | codePoint >> 6);
        out[1] = continuationByte(codePoint);
        return 2;
    }
    if (codePoint < firstSupplementary) {
        out[0] = static_cast<char>(0xE0 | codePoint >> 12);
        out[1] = continuationByte(codePoint >> 6);
        out[2] = continuationByte(codePoint);
        return 3;
    }
    out[0] = static_cast<char>(0xF0 | codePoint >> 18);
    out[1] = continuationByte(codePoint >> 12);
    out[2] = continuationByte(codePoint >> 6);
    out[3] = continuationByte(codePoint);
    return 4;
}

// ---- UTF-16

constexpr bool isSurrogate(char32_t codePoint) noexcept {
    return (codePoint & 0xFFFFF800) == 0xD800;
}

constexpr bool isHighSurrogate(char32_t unit) noexcept {
    return (unit & 0xFFFFFC00) == 0xD800;
}

constexpr bool isLowSurrogate(char32_t unit) noexcept {
    return (unit & 0xFFFFFC00) == 0xDC00;
}

/// The two units of a code point from `firstSupplementary` on.
constexpr char16_t highSurrogate(char32_t codePoint) noexcept {
    return static_cast<char16_t>(0xD800 - (firstSupplementary >> 10) + (codePoint >> 10));
}
constexpr char16_t lowSurrogate(char32_t codePoint) noexcept {
    return static_cast<char16_t>(0xDC00 | (codePoint & 0x3FF));
}

/// The code point of which these are the two units.
constexpr char32_t codePointOf(char16_t high, char16_t low) noexcept {
    return firstSupplementary + ((high & 0x3FFU) << 10 | (low & 0x3FFU));
}

} // namespace kvt::ex::detail
