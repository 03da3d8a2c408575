// Bytes made printable.
#pragma once

#include <string>
#include <string_view>

namespace kvt::ex::detail {

/// Control bytes and bytes from 128 up as `\xHH` in upper case, every other byte (a backslash, too) as it is.
inline std::string escapeBytes(std::string_view bytes) {
    constexpr std::string_view digits = "0123456789ABCDEF";
    std::string escaped;
    escaped.reserve(bytes.size());
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte < 32 || byte >= 128) {
            escaped += {'\\', 'x', digits[byte >> 4], digits[byte & 15]};
        } else {
            escaped += c;
        }
    }
    return escaped;
}

} // namespace kvt::ex::detail
