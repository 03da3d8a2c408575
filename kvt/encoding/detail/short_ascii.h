// Short texts of ASCII, for which a call into vector code costs more than the text.
#pragma once

#include <kvt/foundation/detail/append_in_place.h>

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

namespace kvt::ex::detail {

/// Whether all units are ASCII.
template <typename Unit>
bool isAscii(const char* text, std::size_t units) {
    constexpr std::uint64_t beyond = sizeof(Unit) == 1   ? 0x8080808080808080U
                                     : sizeof(Unit) == 2 ? 0xFF80FF80FF80FF80U
                                                         : 0xFFFFFF80FFFFFF80U;
    const std::size_t bytes = units * sizeof(Unit);
    std::uint64_t all = 0;
    std::uint64_t word = 0;
    if (bytes < sizeof word) {
        if (bytes != 0) { // no text may be a null pointer
            std::memcpy(&word, text, bytes);
        }
        return (word & beyond) == 0;
    }
    for (std::size_t i = 0; i + sizeof word < bytes; i += sizeof word) {
        std::memcpy(&word, text + i, sizeof word);
        all |= word;
    }
    // The last word overlaps the one before.
    std::memcpy(&word, text + bytes - sizeof word, sizeof word);
    return ((all | word) & beyond) == 0;
}

/// The bytes of a text that are not ASCII.
inline std::size_t countBeyondAscii(std::string_view text) {
    constexpr std::uint64_t ones = 0x0101010101010101U;
    std::uint64_t word = 0;
    std::size_t count = 0;
    std::size_t i = 0;
    for (; text.size() - i >= sizeof word; i += sizeof word) {
        std::memcpy(&word, text.data() + i, sizeof word);
        count += (word >> 7 & ones) * ones >> 56;
    }
    for (; i < text.size(); ++i) {
        count += static_cast<unsigned char>(text[i]) >> 7;
    }
    return count;
}

/// Copies ASCII text to units of another size.
template <typename From, typename To>
void copyAscii(const char* from, char* to, std::size_t units) {
    // A register of the wider units. From array to array, compilers see that nothing overlaps.
    constexpr std::size_t block = 16 / (sizeof(From) > sizeof(To) ? sizeof(From) : sizeof(To));
    const auto copyBlock = [=](std::size_t begin) {
        From read[block];
        To written[block];
        std::memcpy(read, from + begin * sizeof(From), sizeof read);
        for (std::size_t i = 0; i < block; ++i) {
            written[i] = static_cast<To>(read[i]);
        }
        std::memcpy(to + begin * sizeof(To), written, sizeof written);
    };
    if (units < block) {
        for (std::size_t i = 0; i < units; ++i) {
            From unit;
            std::memcpy(&unit, from + i * sizeof unit, sizeof unit);
            const auto same = static_cast<To>(unit);
            std::memcpy(to + i * sizeof same, &same, sizeof same);
        }
        return;
    }
    for (std::size_t i = 0; i + block < units; i += block) {
        copyBlock(i);
    }
    copyBlock(units - block); // overlaps the one before
}

/// Appends ASCII text of units of one size to `out` in units of another, which are those of `out` or are bytes there.
template <typename From, typename To, typename CharOut>
void appendAscii(const char* text, std::size_t units, std::basic_string<CharOut>& out) {
    static_assert(sizeof(CharOut) == 1 || sizeof(CharOut) == sizeof(To));
    const std::size_t written = units * sizeof(To) / sizeof(CharOut);
    appendInPlace(out, written, [&](CharOut* place) {
        copyAscii<From, To>(text, reinterpret_cast<char*>(place), units);
        return written;
    });
}

} // namespace kvt::ex::detail
