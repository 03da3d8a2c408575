// Unicode texts as bytes, written from the definitions of the encodings and not with the library under test.
#pragma once

#include <string>
#include <string_view>

namespace kvt::test {

inline std::string utf8Of(std::u32string_view text) {
    std::string out;
    const auto add = [&](char32_t byte) { out += static_cast<char>(byte); };
    for (const char32_t c : text) {
        if (c < 0x80) {
            add(c);
            continue;
        }
        if (c < 0x800) {
            add(0xC0 | c >> 6);
        } else {
            if (c < 0x10000) {
                add(0xE0 | c >> 12);
            } else {
                add(0xF0 | c >> 18);
                add(0x80 | (c >> 12 & 0x3F));
            }
            add(0x80 | (c >> 6 & 0x3F));
        }
        add(0x80 | (c & 0x3F));
    }
    return out;
}

inline std::string unitBytes(char32_t unit, int width, bool bigEndian) {
    std::string out;
    for (int index = 0; index < width; ++index) {
        const int shift = 8 * (bigEndian ? width - 1 - index : index);
        out += static_cast<char>(unit >> shift & 0xFF);
    }
    return out;
}

inline std::string utf16Of(std::u32string_view text, bool bigEndian) {
    std::string out;
    for (const char32_t c : text) {
        if (c < 0x10000) {
            out += unitBytes(c, 2, bigEndian);
        } else {
            out += unitBytes(0xD800 + ((c - 0x10000) >> 10), 2, bigEndian);
            out += unitBytes(0xDC00 + ((c - 0x10000) & 0x3FF), 2, bigEndian);
        }
    }
    return out;
}

inline std::string utf32Of(std::u32string_view text, bool bigEndian) {
    std::string out;
    for (const char32_t c : text) {
        out += unitBytes(c, 4, bigEndian);
    }
    return out;
}

} // namespace kvt::test
