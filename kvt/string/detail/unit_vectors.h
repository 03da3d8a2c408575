// Search in sequences of code units by vector registers, for the three widths of a unit. The processor's best
// instruction set is chosen at run time; results do not depend on it.
#pragma once

#include <cstddef>
#include <cstdint>

namespace kvt::ex::detail::vectors {

/// Where a search came to its end.
struct Place {
    std::size_t at = 0;    ///< index of the match; the number of places when there is none
    bool isSettled = true; ///< false when it gave up before the index, having found no match so far
};

/// The first of the `places` units from `text` on where the `length` units at `needle` begin. All units of a match can
/// be read: those at `text` number `places + length - 1`. Neither number is 0.
///
/// The first and the last unit of the needle are compared at once, for a whole register of places. The search gives
/// up where both keep standing at places that are not matches, for then another way may be the better one; only the one
/// for bytes does.
Place findSequence(const char* text, std::size_t places, const char* needle, std::size_t length);
Place findSequence(const char16_t* text, std::size_t places, const char16_t* needle, std::size_t length);
Place findSequence(const char32_t* text, std::size_t places, const char32_t* needle, std::size_t length);

/// How many parts the units that equal `delimiter` cut the text into, empty ones counted or not.
std::size_t countParts(const char* text, std::size_t size, char delimiter, bool withEmpty);
std::size_t countParts(const char16_t* text, std::size_t size, char16_t delimiter, bool withEmpty);
std::size_t countParts(const char32_t* text, std::size_t size, char32_t delimiter, bool withEmpty);

/// Writes the index of each unit that equals `unit`, in order, and returns how many there are. There is room for `size`
/// of them.
std::size_t placesOf(const char* text, std::uint32_t size, char unit, std::uint32_t* places);
std::size_t placesOf(const char16_t* text, std::uint32_t size, char16_t unit, std::uint32_t* places);
std::size_t placesOf(const char32_t* text, std::uint32_t size, char32_t unit, std::uint32_t* places);

} // namespace kvt::ex::detail::vectors
