// Copying some bytes.
#pragma once

#include <cstddef>
#include <cstring>

namespace kvt::ex::detail {

/// Copies by moves of a fixed size, which overlap, for a call of memcpy() costs more than the text.
inline void copyShort(const void* source, std::size_t bytes, void* target) {
    const auto* const from = static_cast<const char*>(source);
    auto* const to = static_cast<char*>(target);
    if (bytes >= 16) {
        for (std::size_t i = 0; i + 16 < bytes; i += 16) {
            std::memcpy(to + i, from + i, 16);
        }
        std::memcpy(to + bytes - 16, from + bytes - 16, 16);
    } else if (bytes >= 8) {
        std::memcpy(to, from, 8);
        std::memcpy(to + bytes - 8, from + bytes - 8, 8);
    } else if (bytes >= 4) {
        std::memcpy(to, from, 4);
        std::memcpy(to + bytes - 4, from + bytes - 4, 4);
    } else {
        for (std::size_t i = 0; i < bytes; ++i) {
            to[i] = from[i];
        }
    }
}

} // namespace kvt::ex::detail
