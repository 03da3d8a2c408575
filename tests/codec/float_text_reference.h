// The text of a floating-point number by the letter of its rules: the digits from std::to_chars, laid out by joining
// strings.
#pragma once

#include <charconv>
#include <cmath>
#include <cstddef>
#include <string>
#include <type_traits>

namespace kvt::test {

struct Spelling {
    const char* infinity;
    const char* nan;
    const char* negativeNan;
};
inline constexpr Spelling plainSpelling = {"inf", "nan", "-nan"};
inline constexpr Spelling xmlSpelling = {"INF", "NaN", "NaN"};

/// The layout of `digits`, which has no zero at its end; the point stands behind the digit number `point`.
inline std::string referenceLayout(const std::string& digits, int point, int limit) {
    const int length = static_cast<int>(digits.size());
    const auto zeros = [](int count) { return std::string(static_cast<std::size_t>(count), '0'); };
    if (length <= point && point <= limit) {
        return digits + zeros(point - length);
    }
    if (0 < point && point <= limit) {
        return digits.substr(0, static_cast<std::size_t>(point)) + '.' +
               digits.substr(static_cast<std::size_t>(point));
    }
    if (-4 < point && point <= 0) {
        return "0." + zeros(-point) + digits;
    }
    return digits.substr(0, 1) + (length > 1 ? '.' + digits.substr(1) : "") + 'e' + (point >= 0 ? '+' : '-') +
           std::to_string(std::abs(point - 1));
}

template <typename Number>
std::string referenceText(Number value, const Spelling& spelling = plainSpelling) {
    const std::string sign = std::signbit(value) ? "-" : "";
    if (std::isnan(value)) {
        return sign.empty() ? spelling.nan : spelling.negativeNan;
    }
    if (std::isinf(value)) {
        return sign + spelling.infinity;
    }
    if (value == 0) {
        return sign + '0';
    }
    char buffer[64];
    const char* const end =
        std::to_chars(buffer, buffer + sizeof buffer, std::abs(value), std::chars_format::scientific).ptr;
    std::string digits;
    const char* position = buffer;
    for (; *position != 'e'; ++position) {
        if (*position != '.') {
            digits += *position;
        }
    }
    digits.resize(digits.find_last_not_of('0') + 1);
    ++position;
    int exponent = 0;
    std::from_chars(*position == '+' ? position + 1 : position, end, exponent);
    return sign + referenceLayout(digits, exponent + 1, std::is_same_v<Number, float> ? 9 : 17);
}

} // namespace kvt::test
