// Search in sequences of code units. Nothing here knows an encoding: a position is an index of a unit, and units are
// equal when their numbers are.
//
// Where the C library has a primitive for the unit's width it does the work; sequences are sought by vector registers
// (unit_vectors.h), and the rest are loops over whole blocks that compilers turn into vector code.
#pragma once

#include <kvt/string/detail/unit_vectors.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <cwchar>
#include <limits>
#include <string_view>
#include <type_traits>

namespace kvt::ex::detail {

/// A sequence of units, and the result "not found".
template <typename Unit>
using Units = std::basic_string_view<Unit>;
inline constexpr std::size_t notFound = std::numeric_limits<std::size_t>::max();

/// As many units as are looked at in one step where the C library does not do the work.
inline constexpr std::ptrdiff_t unitBlock = 32;

/// Whether the `count` units at `left` and `right` are the same ones.
template <typename Unit>
bool sameUnits(const Unit* left, const Unit* right, std::size_t count) {
    return count == 0 || std::memcmp(left, right, count * sizeof(Unit)) == 0;
}

template <typename Unit>
bool sameUnits(Units<Unit> left, Units<Unit> right) {
    return left.size() == right.size() && sameUnits(left.data(), right.data(), left.size());
}

/// Whether the block that begins at `block` holds `front` with `back` standing `distance` units behind it.
template <typename Unit>
bool blockHas(const Unit* block, Unit front, std::ptrdiff_t distance, Unit back) {
    // No early exit and nothing wider than a unit, so that the loop becomes a handful of vector instructions.
    using Number = std::make_unsigned_t<Unit>;
    Number found = 0;
    for (std::ptrdiff_t i = 0; i < unitBlock; ++i) {
        const auto differences = static_cast<Number>((block[i] ^ front) | (block[i + distance] ^ back));
        found = static_cast<Number>(found | static_cast<Number>(differences != 0 ? 0 : -1));
    }
    return found != 0;
}

/// The last place in the range where `front` stands, with `back` standing `distance` units behind it; or null.
template <typename Unit>
const Unit* rfindPair(const Unit* first, const Unit* last, Unit front, std::ptrdiff_t distance, Unit back) {
    while (last - first >= unitBlock && !blockHas(last - unitBlock, front, distance, back)) {
        last -= unitBlock;
    }
    while (last != first) {
        --last;
        if (*last == front && last[distance] == back) {
            return last;
        }
    }
    return nullptr;
}

/// The first unit equal to `unit`, or null.
template <typename Unit>
const Unit* findUnit(const Unit* first, const Unit* last, Unit unit) {
    const auto count = static_cast<std::size_t>(last - first);
    if (count == 0) {
        return nullptr;
    }
    if constexpr (sizeof(Unit) == 1) {
        return static_cast<const Unit*>(std::memchr(first, static_cast<unsigned char>(unit), count));
    } else if constexpr (sizeof(Unit) == sizeof(wchar_t)) {
        const auto* const wide = reinterpret_cast<const wchar_t*>(first);
        return reinterpret_cast<const Unit*>(std::wmemchr(wide, static_cast<wchar_t>(unit), count));
    } else {
        const vectors::Place place = vectors::findSequence(first, count, &unit, 1);
        return place.at < count ? first + place.at : nullptr;
    }
}

/// The last unit equal to `unit`, or null.
template <typename Unit>
const Unit* rfindUnit(const Unit* first, const Unit* last, Unit unit) {
    if (first == last) {
        return nullptr;
    }
    if constexpr (sizeof(Unit) == 1) {
        const auto count = static_cast<std::size_t>(last - first);
        return static_cast<const Unit*>(memrchr(first, static_cast<unsigned char>(unit), count));
    } else {
        return rfindPair(first, last, unit, 0, unit);
    }
}

/// Whether a search with the C library's primitive has met the first unit of its needle so often in vain, over
/// `distance` units, that looking for that unit alone does not pay.
inline bool oftenInVain(std::ptrdiff_t inVain, std::ptrdiff_t distance) {
    return inVain * 32 > distance + 256;
}

/// The first position at or after `pos` where `needle` stands. An empty needle stands everywhere up to the end.
template <typename Unit>
std::size_t findUnits(Units<Unit> text, Units<Unit> needle, std::size_t pos) {
    if (needle.empty()) {
        return pos <= text.size() ? pos : notFound;
    }
    if (pos >= text.size() || needle.size() > text.size() - pos) {
        return notFound;
    }
    // No match begins behind the last place that has room for it.
    const Unit* const last = text.data() + (text.size() - needle.size() + 1);
    const Unit* first = text.data() + pos;
    if constexpr (sizeof(Unit) == 1) {
        // Often the first unit is not there at all, which the C library sees faster than anything else.
        first = findUnit(first, last, needle.front());
        if (first == nullptr) {
            return notFound;
        }
    }
    const auto places = static_cast<std::size_t>(last - first);
    const vectors::Place place = vectors::findSequence(first, places, needle.data(), needle.size());
    first += place.at;
    if constexpr (sizeof(Unit) == 1) {
        if (!place.isSettled) {
            // The C library's search, whose time does not grow with the length of the needle, does the rest.
            const auto rest = static_cast<std::size_t>(text.data() + text.size() - first);
            first = static_cast<const Unit*>(memmem(first, rest, needle.data(), needle.size()));
            return first != nullptr ? static_cast<std::size_t>(first - text.data()) : notFound;
        }
    }
    return first != last ? static_cast<std::size_t>(first - text.data()) : notFound;
}

/// The last position at or before `pos` where `needle` stands.
template <typename Unit>
std::size_t rfindUnits(Units<Unit> text, Units<Unit> needle, std::size_t pos) {
    if (needle.size() > text.size()) {
        return notFound;
    }
    pos = std::min(pos, text.size() - needle.size());
    if (needle.empty()) {
        return pos;
    }
    const Unit* const first = text.data();
    const Unit* const start = first + pos + 1;
    const auto distance = static_cast<std::ptrdiff_t>(needle.size() - 1);
    const Unit* place = start;
    for (std::ptrdiff_t inVain = 0;; ++inVain) {
        place = sizeof(Unit) == 1 && !oftenInVain(inVain, start - place)
                    ? rfindUnit(first, place, needle.front())
                    : rfindPair(first, place, needle.front(), distance, needle.back());
        if (place == nullptr) {
            return notFound;
        }
        if (sameUnits(place, needle.data(), needle.size())) {
            return static_cast<std::size_t>(place - first);
        }
    }
}

template <typename Unit>
std::size_t findUnit(Units<Unit> text, Unit unit, std::size_t pos) {
    if (pos >= text.size()) {
        return notFound;
    }
    const Unit* const found = findUnit(text.data() + pos, text.data() + text.size(), unit);
    return found != nullptr ? static_cast<std::size_t>(found - text.data()) : notFound;
}

template <typename Unit>
std::size_t rfindUnit(Units<Unit> text, Unit unit, std::size_t pos) {
    if (text.empty()) {
        return notFound;
    }
    const Unit* const found = rfindUnit(text.data(), text.data() + std::min(pos, text.size() - 1) + 1, unit);
    return found != nullptr ? static_cast<std::size_t>(found - text.data()) : notFound;
}

/// A set of units, made for many questions: one look at a table settles most of them.
template <typename Unit>
class UnitSet {
public:
    /// Refers to the `count` units at `units`.
    UnitSet(const Unit* units, std::size_t count) : units_(units, count) {
        for (const Unit unit : units_) {
            lowByte_[static_cast<std::uint8_t>(unit)] = true;
        }
    }

    bool contains(Unit unit) const {
        return lowByte_[static_cast<std::uint8_t>(unit)] &&
               (sizeof(Unit) == 1 || findUnit(units_.data(), units_.data() + units_.size(), unit) != nullptr);
    }

    /// The first position at or after `pos` whose unit is, or is not, in the set.
    std::size_t findFirst(Units<Unit> text, std::size_t pos, bool wanted = true) const {
        for (; pos < text.size(); ++pos) {
            if (contains(text[pos]) == wanted) {
                return pos;
            }
        }
        return notFound;
    }

    /// The last position at or before `pos` whose unit is, or is not, in the set.
    std::size_t findLast(Units<Unit> text, std::size_t pos, bool wanted = true) const {
        for (std::size_t i = text.empty() ? 0 : std::min(pos, text.size() - 1) + 1; i > 0; --i) {
            if (contains(text[i - 1]) == wanted) {
                return i - 1;
            }
        }
        return notFound;
    }

private:
    Units<Unit> units_;
    std::array<bool, 256> lowByte_{};
};

} // namespace kvt::ex::detail
