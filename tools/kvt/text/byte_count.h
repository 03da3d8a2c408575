// How many bytes of a text are such and such.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace host {

/// For how many of the indexes below `size` something is so. A sum of a byte for so many at a time lets a register hold
/// many of the sums, and a loop of a known length is all done in registers.
template <typename IsSo>
constexpr std::size_t countWhere(std::size_t size, IsSo isSo) {
    constexpr std::size_t step = 128;
    std::size_t count = 0;
    std::size_t index = 0;
    for (; size - index >= step; index += step) {
        std::uint8_t sum = 0;
        for (std::size_t i = 0; i < step; ++i) {
            sum = static_cast<std::uint8_t>(sum + (isSo(index + i) ? 1 : 0));
        }
        count += sum;
    }
    for (; index < size; ++index) {
        count += isSo(index) ? 1 : 0;
    }
    return count;
}

/// How often a byte stands in a text.
constexpr std::size_t countOf(std::string_view text, char byte) noexcept {
    return countWhere(text.size(), [text, byte](std::size_t index) { return text[index] == byte; });
}

} // namespace host
