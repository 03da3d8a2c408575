// The proleptic Gregorian calendar: days since 1970-01-01 to year, month and day, and back. The arithmetic is that of
// the `date` library; this is its only door.
#pragma once

#include <cstdint>
#include <iterator>
#include <string_view>

namespace kvt::ex::datetime::detail {

inline constexpr std::int64_t lowestYear = 1000;
inline constexpr std::int64_t highestYear = 9999;

struct CivilDate {
    std::int64_t year;
    unsigned month; ///< 1 to 12
    unsigned day;   ///< 1 to 31
};

/// Days since 1970-01-01. Month and day, up to 255 each, may be beyond their bounds and run through the formula as
/// they are: surplus days count on, month 13 is January and 14 February of the next year, but from 15 on the
/// formula's months, which count from March in spans of 30.6 days, drift from the calendar's.
std::int64_t daysFromCivil(std::int64_t year, unsigned month, unsigned day) noexcept;

/// The date so many days after 1970-01-01.
CivilDate civilFromDays(std::int64_t days) noexcept;

/// How long the months are in a year that is not a leap year.
inline constexpr std::uint8_t shortestMonths[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};

bool isLeapYear(std::int64_t year) noexcept;

/// 28 to 31; 29 for a month beyond the twelve.
inline unsigned lastDayOfMonth(std::int64_t year, unsigned month) noexcept {
    if (month - 1 >= std::size(shortestMonths)) {
        return 29;
    }
    return month == 2 && isLeapYear(year) ? 29 : shortestMonths[month - 1];
}

/// "28" to "31", for messages.
std::string_view lastDayText(unsigned lastDay) noexcept;

} // namespace kvt::ex::datetime::detail
