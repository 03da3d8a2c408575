#include <reference/plain_unicode.h>

namespace kvt::test {

Decoded decodeUtf8(std::string_view bytes) {
    Decoded decoded;
    while (decoded.taken < bytes.size()) {
        const auto byte = [&](std::size_t i) -> char32_t {
            return decoded.taken + i < bytes.size() ? static_cast<unsigned char>(bytes[decoded.taken + i])
                                                    : 0;
        };
        const char32_t lead = byte(0);
        const std::size_t length = lead < 0x80             ? 1
                                   : (lead & 0xE0) == 0xC0 ? 2
                                   : (lead & 0xF0) == 0xE0 ? 3
                                   : (lead & 0xF8) == 0xF0 ? 4
                                                           : 0;
        if (length == 0) {
            break;
        }
        char32_t c = length == 1 ? lead : lead & (0x7FU >> length);
        bool isGood = true;
        for (std::size_t i = 1; i < length; ++i) {
            isGood = isGood && (byte(i) & 0xC0) == 0x80;
            c = c << 6 | (byte(i) & 0x3F);
        }
        const char32_t least[] = {0, 0, 0x80, 0x800, 0x10000};
        if (!isGood || c < least[length] || c > 0x10FFFF || (c >= 0xD800 && c < 0xE000)) {
            break;
        }
        decoded.text += c;
        decoded.taken += length;
    }
    return decoded;
}

Decoded decodeUtf16(std::u16string_view units) {
    Decoded decoded;
    while (decoded.taken < units.size()) {
        const char16_t unit = units[decoded.taken];
        if (unit < 0xD800 || unit >= 0xE000) {
            decoded.text += unit;
            ++decoded.taken;
            continue;
        }
        if (unit >= 0xDC00 || decoded.taken + 1 == units.size() || units[decoded.taken + 1] < 0xDC00 ||
            units[decoded.taken + 1] >= 0xE000) {
            break;
        }
        decoded.text += 0x10000 + (unit - 0xD800U) * 0x400 + (units[decoded.taken + 1] - 0xDC00U);
        decoded.taken += 2;
    }
    return decoded;
}

Decoded decodeUtf32(std::u32string_view units) {
    Decoded decoded;
    for (const char32_t c : units) {
        if (c > 0x10FFFF || (c >= 0xD800 && c < 0xE000)) {
            break;
        }
        decoded.text += c;
        ++decoded.taken;
    }
    return decoded;
}

std::string encodeUtf8(std::u32string_view text) {
    std::string bytes;
    for (const char32_t c : text) {
        const auto put = [&](char32_t byte) { bytes += static_cast<char>(byte); };
        if (c < 0x80) {
            put(c);
        } else if (c < 0x800) {
            put(0xC0 + c / 64);
            put(0x80 + c % 64);
        } else if (c < 0x10000) {
            put(0xE0 + c / 4096);
            put(0x80 + c / 64 % 64);
            put(0x80 + c % 64);
        } else {
            put(0xF0 + c / 262144);
            put(0x80 + c / 4096 % 64);
            put(0x80 + c / 64 % 64);
            put(0x80 + c % 64);
        }
    }
    return bytes;
}

std::u16string encodeUtf16(std::u32string_view text) {
    std::u16string units;
    for (const char32_t c : text) {
        if (c < 0x10000) {
            units += static_cast<char16_t>(c);
        } else {
            units += static_cast<char16_t>(0xD800 + (c - 0x10000) / 0x400);
            units += static_cast<char16_t>(0xDC00 + (c - 0x10000) % 0x400);
        }
    }
    return units;
}

} // namespace kvt::test
