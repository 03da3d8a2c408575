// What is to be known of an encoding to convert its text without ICU.
#pragma once

#include <kvt/encoding/encoding.h>

#include <bit>
#include <cstddef>
#include <cstdint>

namespace kvt::ex::detail {

/// How the bytes of an encoding can be read and written without ICU.
enum class Form : std::uint8_t {
    other,             ///< only by ICU
    asciiCompatible,   ///< stateless, and a byte below 128 where a character begins is that ASCII character
    asciiSingleByte,   ///< the same, with tables; all characters have one byte
    asciiSeveralBytes, ///< the same, with tables
    singleByte, ///< stateless, with tables; all characters have one byte, and ASCII has other ones than in ASCII
    severalBytes, ///< the same, but for the number of bytes
    utf8,
    utf16le,
    utf16be,
    utf32le,
    utf32be,
};

/// The form of UTF-8, UTF-16 and UTF-32 with a stated byte order, which their numbers tell; `other` for all encodings
/// whose converter has to be asked. The number is an evaluated one.
constexpr Form unicodeForm(std::uint32_t id) {
    switch (id) {
    case Encoding::Utf8:
        return Form::utf8;
    case Encoding::Utf16LE:
        return Form::utf16le;
    case Encoding::Utf16BE:
        return Form::utf16be;
    case Encoding::Utf32LE:
        return Form::utf32le;
    case Encoding::Utf32BE:
        return Form::utf32be;
    default:
        return Form::other;
    }
}
inline Form unicodeForm(Encoding encoding) {
    return unicodeForm(encoding.evaluate());
}

inline constexpr bool isLittle = std::endian::native == std::endian::little;
/// In the machine's byte order.
inline constexpr Form nativeUtf16 = isLittle ? Form::utf16le : Form::utf16be;
inline constexpr Form nativeUtf32 = isLittle ? Form::utf32le : Form::utf32be;

/// The bytes of a code unit.
inline std::size_t unitBytes(Form form) {
    switch (form) {
    case Form::utf16le:
    case Form::utf16be:
        return 2;
    case Form::utf32le:
    case Form::utf32be:
        return 4;
    default:
        return 1;
    }
}

inline bool hasTables(Form form) {
    return form >= Form::asciiSingleByte && form <= Form::severalBytes;
}

inline bool isUtf16(Form form) {
    return form == Form::utf16le || form == Form::utf16be;
}

inline bool isUtf32(Form form) {
    return form == Form::utf32le || form == Form::utf32be;
}

/// Whether ASCII characters are the units of their numbers.
inline bool keepsAscii(Form form) {
    return form != Form::other && form != Form::singleByte && form != Form::severalBytes;
}

/// Whether ASCII text of the two forms is the same bytes.
inline bool isAsciiBytes(Form form) {
    return keepsAscii(form) && unitBytes(form) == 1;
}

/// Whether the target can say every character.
inline bool isUnicode(Form form) {
    return form >= Form::utf8;
}

} // namespace kvt::ex::detail
