// The calendar by counting: no formula, so that it can stand against one.
#pragma once

#include <cstdint>
#include <cstdio>
#include <string>
#include <vector>

namespace kvt::test {

inline bool isLeapYear(std::int64_t year) {
    return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
}

inline int daysInMonth(std::int64_t year, int month) {
    static const int days[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    return month == 2 && isLeapYear(year) ? 29 : days[month - 1];
}

/// Days from 1970-01-01 to 1 January of a year from -200 to 11000, added up year by year.
inline std::int64_t daysToYear(std::int64_t year) {
    constexpr std::int64_t lowest = -200;
    static const std::vector<std::int64_t> table = [] {
        std::vector<std::int64_t> sums;
        std::int64_t days = 0;
        std::int64_t epoch = 0;
        for (std::int64_t y = lowest; y <= 11000; ++y) {
            epoch = y == 1970 ? days : epoch;
            sums.push_back(days);
            days += isLeapYear(y) ? 366 : 365;
        }
        for (std::int64_t& sum : sums) {
            sum -= epoch;
        }
        return sums;
    }();
    return table[static_cast<std::size_t>(year - lowest)];
}

struct NaiveDateTime {
    std::int64_t year;
    int month;
    int day;
    int hours = 0;
    int minutes = 0;
    int seconds = 0;
    int nanoseconds = 0;

    friend bool operator==(const NaiveDateTime&, const NaiveDateTime&) = default;
};

inline std::int64_t naiveDays(std::int64_t year, int month, int day) {
    std::int64_t days = daysToYear(year);
    for (int m = 1; m < month; ++m) {
        days += daysInMonth(year, m);
    }
    return days + day - 1;
}

__extension__ using Int128 = __int128;

inline Int128 naiveNanoseconds(const NaiveDateTime& at) {
    const std::int64_t days = naiveDays(at.year, at.month, at.day);
    const std::int64_t seconds = days * 86400 + at.hours * 3600 + at.minutes * 60 + at.seconds;
    return static_cast<Int128>(seconds) * 1000000000 + at.nanoseconds;
}

/// By walking: years, then months, then days.
inline NaiveDateTime naiveDateTime(Int128 nanoseconds) {
    constexpr Int128 perDay = static_cast<Int128>(86400) * 1000000000;
    Int128 rest = nanoseconds % perDay;
    rest += rest < 0 ? perDay : Int128(0);
    auto days = static_cast<std::int64_t>((nanoseconds - rest) / perDay);
    NaiveDateTime at{1970 + days / 365, 1, 1};
    while (daysToYear(at.year) > days) {
        --at.year;
    }
    while (daysToYear(at.year + 1) <= days) {
        ++at.year;
    }
    days -= daysToYear(at.year);
    while (days >= daysInMonth(at.year, at.month)) {
        days -= daysInMonth(at.year, at.month);
        ++at.month;
    }
    at.day = static_cast<int>(days) + 1;
    at.nanoseconds = static_cast<int>(rest % 1000000000);
    rest /= 1000000000;
    at.seconds = static_cast<int>(rest % 60);
    at.minutes = static_cast<int>(rest / 60 % 60);
    at.hours = static_cast<int>(rest / 3600);
    return at;
}

inline std::string naiveFraction(int nanoseconds) {
    if (nanoseconds == 0) {
        return "";
    }
    char digits[16];
    std::snprintf(digits, sizeof digits, ".%09d", nanoseconds);
    std::string text = digits;
    text.erase(text.find_last_not_of('0') + 1);
    return text;
}

inline std::string naiveDateText(const NaiveDateTime& at) {
    char text[64];
    std::snprintf(text, sizeof text, "%04lld%02d%02d", static_cast<long long>(at.year), at.month, at.day);
    return text;
}

inline std::string naiveTimeText(const NaiveDateTime& at) {
    char text[64];
    std::snprintf(text, sizeof text, "%02d%02d%02d", at.hours, at.minutes, at.seconds);
    return text + naiveFraction(at.nanoseconds);
}

inline std::string naiveText(const NaiveDateTime& at) {
    return naiveDateText(at) + naiveTimeText(at);
}

} // namespace kvt::test
