// A set of bytes, and which of many bytes are in it, in vector registers.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace kvt::ex::detail::vectors {

class ByteSet {
public:
    /// The bytes of one question.
    static constexpr std::size_t block = 64;

    void add(std::uint8_t byte) {
        rows_[byte / 128][byte % 16] =
            static_cast<std::uint8_t>(rows_[byte / 128][byte % 16] | 1U << byte / 16 % 8);
    }

    /// Which of the `block` bytes from `bytes` on are in the set: the lowest bit is that of the first.
    std::uint64_t bitsOf(const std::uint8_t* bytes) const;

    /// For the bytes below 128 and for the others: a bit for each upper half, by the lower half.
    using Rows = std::array<std::array<std::uint8_t, 16>, 2>;

private:
    Rows rows_{};
};

} // namespace kvt::ex::detail::vectors
