// FNV-1a, 64 bits: a hash of bytes, with the offset basis and prime that its authors chose.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace kvt::ex::detail {

/// What the hash becomes with one more byte.
constexpr std::uint64_t fnv1aStep(std::uint64_t hash, char byte) noexcept {
    return (hash ^ static_cast<unsigned char>(byte)) * 0x100000001b3;
}

constexpr std::uint64_t fnv1a(std::string_view bytes) noexcept {
    std::uint64_t hash = 0xcbf29ce484222325;
    // By eight, so that a text costs little more than the products, each of which waits for the one before.
    for (; bytes.size() >= 8; bytes.remove_prefix(8)) {
        for (std::size_t i = 0; i < 8; ++i) {
            hash = fnv1aStep(hash, bytes[i]);
        }
    }
    for (const char byte : bytes) {
        hash = fnv1aStep(hash, byte);
    }
    return hash;
}

} // namespace kvt::ex::detail
