// What is sorted: a key, by whose bytes the order is made, and what goes with it. Here are its form in memory and
// on disk, and how keys compare.
//
// A record is written as
//     varint  size of the key * 2, and 1 more when the fields of the next line are there
//     varint  size of the payload and 1 more, 0 where there is none; varint count; varint place
//     the key, the payload
// where a varint has seven bits in each byte, lowest first, and the top bit set in all but the last.
#pragma once

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <optional>
#include <string_view>

namespace host {

class Workspace;

struct LineRecord {
    std::string_view key;
    std::optional<std::string_view> payload =
        {};                  ///< what is written in place of the key, where that is not the line
    std::uint64_t count = 1; ///< how many equal ones it stands for
    std::uint64_t place = 0; ///< where it stood among all, where that matters

    std::string_view line() const { return payload.value_or(key); }
};

/// The most bytes that a record has before its key.
constexpr std::size_t mostHeaderBytes = 40;

/// Bytes of the record as it is written.
std::uint64_t encodedSize(const LineRecord& record);
/// Writes what comes before the key; gives where it ends.
char* encodeHeader(char* out, const LineRecord& record);
/// Reads a record, whose texts are views of where it stands; gives where it ends.
const char* decode(const char* in, LineRecord& record);

/// Seven bytes of the key from `depth` on, filled up with zeros, and in the lowest byte how many bytes there are, 8
/// standing for more. Two of these compare as the keys do, unless they are equal and end in 8. `depth` is not
/// beyond the end.
inline std::uint64_t prefixOf(std::string_view key, std::size_t depth = 0) {
    static_assert(std::endian::native == std::endian::little);
    const std::size_t length = key.size() - depth;
    std::uint64_t bytes = 0;
    if (length >= 8) {
        std::memcpy(&bytes, key.data() + depth, 8);
        return (__builtin_bswap64(bytes) & ~std::uint64_t{0xFF}) | 8;
    }
    for (std::size_t index = 0; index < length; ++index) {
        bytes |= std::uint64_t{static_cast<unsigned char>(key[depth + index])} << (56 - 8 * index);
    }
    return bytes | length;
}

/// Whether equal prefixes leave the order open.
inline bool isOpen(std::uint64_t prefix) {
    return (prefix & 0xFF) == 8;
}

/// The order of two keys behind their first `depth` bytes, which are the same: below, at or above 0. Of long keys,
/// what lies in the workspace does not stay in memory.
int compareFrom(std::string_view left, std::string_view right, std::size_t depth, const Workspace& workspace);

} // namespace host
