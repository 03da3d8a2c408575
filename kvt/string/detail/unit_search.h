// Search in sequences of code units. Nothing here knows an encoding: a position is an index of a unit, and units are
// equal when their numbers are.
//
// Where the C library has a primitive for the unit's width it does the work; the others are loops over whole blocks
// that compilers turn into vector code.
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <cwchar>
#include <limits>
#include <string_view>

namespace kvt::ex::detail {

/// A sequence of units, and the result "not found".
template <typename Unit>
using Units = std::basic_string_view<Unit>;
inline constexpr std::size_t notFound = std::numeric_limits<std::size_t>::max();

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
        constexpr std::ptrdiff_t block = 32;
        for (; last - first >= block; first += block) {
            bool found = false;
            for (std::ptrdiff_t i = 0; i < block; ++i) {
                found |= first[i] == unit;
            }
            if (found) {
                break;
            }
        }
        first = std::find(first, last, unit);
        return first != last ? first : nullptr;
    }
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
    const Unit* first = text.data() + pos;
    if constexpr (sizeof(Unit) == 1) {
        const void* const found = memmem(first, text.size() - pos, needle.data(), needle.size());
        return found != nullptr ? static_cast<std::size_t>(static_cast<const Unit*>(found) - text.data()) : notFound;
    } else {
        // No match begins behind the last place that has room for it.
        const Unit* const last = text.data() + (text.size() - needle.size() + 1);
        while ((first = findUnit(first, last, needle.front())) != nullptr) {
            if (std::memcmp(first, needle.data(), needle.size() * sizeof(Unit)) == 0) {
                return static_cast<std::size_t>(first - text.data());
            }
            ++first;
        }
        return notFound;
    }
}

/// The last position at or before `pos` where `needle` stands.
template <typename Unit>
std::size_t rfindUnits(Units<Unit> text, Units<Unit> needle, std::size_t pos) {
    return text.rfind(needle, pos);
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
    return text.rfind(unit, pos);
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
