// Search and editing as slowly and plainly as they can be said, for comparison with the library: one unit at a time,
// nothing but indexes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <type_traits>
#include <vector>

namespace kvt::test::naive {

inline constexpr std::uint64_t npos = std::numeric_limits<std::uint64_t>::max();

template <typename Unit>
using Text = std::basic_string<Unit>;

/// Every text of up to `longest` units over the alphabet, the short ones first.
template <typename Unit>
std::vector<Text<Unit>> textsUpTo(std::size_t longest, const Text<Unit>& alphabet) {
    std::vector<Text<Unit>> texts{Text<Unit>()};
    for (std::size_t begin = 0, length = 1; length <= longest; ++length) {
        const std::size_t end = texts.size();
        for (; begin < end; ++begin) {
            for (const Unit unit : alphabet) {
                texts.push_back(texts[begin] + unit);
            }
        }
    }
    return texts;
}

template <typename Unit>
std::make_unsigned_t<Unit> numberOf(Unit unit) {
    return static_cast<std::make_unsigned_t<Unit>>(unit);
}

/// -1, 0 or 1.
template <typename Unit>
int compare(const Text<Unit>& left, const Text<Unit>& right) {
    for (std::size_t i = 0; i < left.size() && i < right.size(); ++i) {
        if (left[i] != right[i]) {
            return numberOf(left[i]) < numberOf(right[i]) ? -1 : 1;
        }
    }
    return left.size() < right.size() ? -1 : left.size() > right.size() ? 1 : 0;
}

template <typename Unit>
bool standsAt(const Text<Unit>& text, std::size_t pos, const Text<Unit>& needle) {
    if (needle.size() > text.size() || pos > text.size() - needle.size()) {
        return false;
    }
    for (std::size_t i = 0; i < needle.size(); ++i) {
        if (text[pos + i] != needle[i]) {
            return false;
        }
    }
    return true;
}

template <typename Unit>
std::uint64_t find(const Text<Unit>& text, const Text<Unit>& needle, std::uint64_t pos) {
    for (std::uint64_t i = pos; i <= text.size(); ++i) {
        if (standsAt(text, i, needle)) {
            return i;
        }
    }
    return npos;
}

template <typename Unit>
std::uint64_t rfind(const Text<Unit>& text, const Text<Unit>& needle, std::uint64_t pos) {
    std::uint64_t found = npos;
    for (std::uint64_t i = 0; i <= text.size() && i <= pos; ++i) {
        if (standsAt(text, i, needle)) {
            found = i;
        }
    }
    return found;
}

template <typename Unit>
bool isIn(const Text<Unit>& set, Unit unit) {
    for (const Unit member : set) {
        if (member == unit) {
            return true;
        }
    }
    return false;
}

template <typename Unit>
std::uint64_t findFirstOf(const Text<Unit>& text, const Text<Unit>& set, std::uint64_t pos) {
    for (std::uint64_t i = pos; i < text.size(); ++i) {
        if (isIn(set, text[i])) {
            return i;
        }
    }
    return npos;
}

/// `pos` itself is looked at.
template <typename Unit>
std::uint64_t findLastOf(const Text<Unit>& text, const Text<Unit>& set, std::uint64_t pos) {
    std::uint64_t found = npos;
    for (std::uint64_t i = 0; i < text.size() && i <= pos; ++i) {
        if (isIn(set, text[i])) {
            found = i;
        }
    }
    return found;
}

template <typename Unit>
bool anyStandsAt(const Text<Unit>& text, std::size_t pos, const std::vector<Text<Unit>>& needles) {
    for (const Text<Unit>& needle : needles) {
        if (standsAt(text, pos, needle)) {
            return true;
        }
    }
    return false;
}

template <typename Unit>
std::uint64_t findFirstOf(const Text<Unit>& text, const std::vector<Text<Unit>>& needles, std::uint64_t pos) {
    for (std::uint64_t i = pos; i < text.size(); ++i) {
        if (anyStandsAt(text, i, needles)) {
            return i;
        }
    }
    return npos;
}

/// `pos` itself is not looked at.
template <typename Unit>
std::uint64_t findLastOf(const Text<Unit>& text, const std::vector<Text<Unit>>& needles, std::uint64_t pos) {
    std::uint64_t found = npos;
    for (std::uint64_t i = 0; i < text.size() && i < pos; ++i) {
        if (anyStandsAt(text, i, needles)) {
            found = i;
        }
    }
    return found;
}

/// 64-bit FNV-1a over the bytes of each unit, the low one first.
template <typename Unit>
std::uint64_t hash(const Text<Unit>& text) {
    std::uint64_t hash = 14695981039346656037u;
    for (const Unit unit : text) {
        for (std::size_t byte = 0; byte < sizeof(Unit); ++byte) {
            hash ^= (numberOf(unit) >> (8 * byte)) & 0xFF;
            hash *= 1099511628211u;
        }
    }
    return hash;
}

/// Nothing where the position is beyond the end.
template <typename Unit>
std::optional<Text<Unit>> replace(const Text<Unit>& text, std::uint64_t pos, std::uint64_t count,
                                  const Text<Unit>& with) {
    if (pos > text.size()) {
        return {};
    }
    Text<Unit> result;
    for (std::uint64_t i = 0; i < pos; ++i) {
        result += text[i];
    }
    result += with;
    for (std::uint64_t i = pos; i < text.size(); ++i) {
        if (i - pos >= count) {
            result += text[i];
        }
    }
    return result;
}

/// In place, one replacement after the other; `find(text, pos)` finds the next one. Nothing where a position that it
/// gives is beyond the end. `from` must not be empty.
template <typename Unit, typename Find>
std::optional<Text<Unit>> replaceAll(Text<Unit> text, const Text<Unit>& from, const Text<Unit>& to,
                                     Find find) {
    for (std::uint64_t pos = 0; pos < text.size();) {
        const std::uint64_t found = find(text, pos);
        if (found == npos) {
            break;
        }
        const std::optional<Text<Unit>> replaced = replace(text, found, from.size(), to);
        if (!replaced) {
            return {};
        }
        text = *replaced;
        pos = found + to.size();
    }
    return text;
}

template <typename Unit>
Text<Unit> replaceUnits(Text<Unit> text, const Text<Unit>& set, Unit to) {
    for (Unit& unit : text) {
        if (isIn(set, unit)) {
            unit = to;
        }
    }
    return text;
}

template <typename Unit>
Text<Unit> removeAll(const Text<Unit>& text, Unit dropped) {
    Text<Unit> result;
    for (const Unit unit : text) {
        if (unit != dropped) {
            result += unit;
        }
    }
    return result;
}

template <typename Unit>
Text<Unit> strip(Text<Unit> text, const Text<Unit>& set) {
    while (!text.empty() && isIn(set, text[0])) {
        text.erase(0, 1);
    }
    return text;
}

template <typename Unit>
Text<Unit> rstrip(Text<Unit> text, const Text<Unit>& set) {
    while (!text.empty() && isIn(set, text[text.size() - 1])) {
        text.pop_back();
    }
    return text;
}

} // namespace kvt::test::naive
