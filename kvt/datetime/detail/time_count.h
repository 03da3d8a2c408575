// A place on the time line, or a length of time, in 64 bits: whole days, and the nanoseconds of the last one. The nine
// thousand years of the library are some 2.9e20 nanoseconds, which one number of 64 bits does not hold; where such a
// number is wanted there is NanoCount.
#pragma once

#include <kvt/datetime/detail/nano_count.h>

#include <compare>
#include <cstdint>

namespace kvt::ex::datetime::detail {

/// Since 1970-01-01T00:00:00, or from one such count to another.
struct TimeCount {
    std::int64_t days = 0;
    std::int64_t nanoseconds = 0; ///< of the day: 0 and above, below nanosPerDay

    friend constexpr auto operator<=>(const TimeCount&, const TimeCount&) noexcept = default;
};

/// The count of days and any number of nanoseconds, carried.
constexpr TimeCount timeCount(std::int64_t days, std::int64_t nanoseconds) noexcept {
    if (nanoseconds >= 0 && nanoseconds < nanosPerDay) {
        return {days, nanoseconds}; // as nearly always
    }
    std::int64_t carry = nanoseconds / nanosPerDay;
    carry -= nanoseconds % nanosPerDay < 0 ? 1 : 0;
    return {days + carry, nanoseconds - carry * nanosPerDay};
}

/// The count of any number of seconds, and of nanoseconds between -10^18 and 10^18.
constexpr TimeCount timeCountOfSeconds(std::int64_t seconds, std::int64_t nanoseconds) noexcept {
    return timeCount(seconds / secondsPerDay, seconds % secondsPerDay * nanosPerSecond + nanoseconds);
}

constexpr TimeCount operator-(const TimeCount& left, const TimeCount& right) noexcept {
    return timeCount(left.days - right.days, left.nanoseconds - right.nanoseconds);
}

/// The count so many minutes later, or earlier where they are negative.
constexpr TimeCount plusMinutes(const TimeCount& count, std::int32_t minutes) noexcept {
    return timeCount(count.days, count.nanoseconds + minutes * nanosPerMinute);
}

/// Whole seconds, towards minus infinity. For every year that there is a text for.
constexpr std::int64_t wholeSeconds(const TimeCount& count) noexcept {
    return count.days * secondsPerDay + count.nanoseconds / nanosPerSecond;
}

/// All of it in nanoseconds, as the nearest double.
inline double nanosecondsAsDouble(const TimeCount& count) {
    constexpr std::int64_t daysIn64Bits = 106'000; // some 290 years
    if (count.days > -daysIn64Bits && count.days < daysIn64Bits) {
        return static_cast<double>(count.days * nanosPerDay + count.nanoseconds);
    }
    return toDouble(NanoCount(count.days) * nanosPerDay + count.nanoseconds);
}

} // namespace kvt::ex::datetime::detail
