// FNV-1a, 64 bits: a hash of bytes, with the offset basis and prime that its authors chose.
#pragma once

#include <cstdint>
#include <string_view>

namespace kvt::ex::detail {

constexpr std::uint64_t fnv1a(std::string_view bytes) noexcept {
    std::uint64_t hash = 0xcbf29ce484222325;
    for (const char byte : bytes) {
        hash = (hash ^ static_cast<unsigned char>(byte)) * 0x100000001b3;
    }
    return hash;
}

} // namespace kvt::ex::detail
