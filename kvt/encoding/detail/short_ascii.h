// Short texts of ASCII, for which a call into vector code costs more than the text.
#pragma once

#include <kvt/foundation/detail/append_in_place.h>

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>

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

/// Copies ASCII text to units of another size.
template <typename From, typename To>
void copyAscii(const char* from, char* to, std::size_t units) {
    constexpr std::size_t block = 8;
    const auto copy = [=](std::size_t begin, std::size_t count) {
        for (std::size_t i = begin; i < begin + count; ++i) {
            From unit;
            std::memcpy(&unit, from + i * sizeof unit, sizeof unit);
            const auto same = static_cast<To>(unit);
            std::memcpy(to + i * sizeof same, &same, sizeof same);
        }
    };
    if (units < block) {
        copy(0, units);
        return;
    }
    for (std::size_t i = 0; i + block < units; i += block) {
        copy(i, block);
    }
    copy(units - block, block);
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
