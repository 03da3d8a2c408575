// A date and the time of its day: a place on the time line for work by the calendar. To compare two of them, or to
// move one within its day, takes no count of days.
#pragma once

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/time_count.h>

#include <cstdint>

namespace kvt::ex::datetime::detail {

struct WallClock {
    CivilDate date;
    std::int64_t nanoseconds = 0; ///< of the day: 0 and above, below nanosPerDay

    friend constexpr bool operator==(const WallClock& left, const WallClock& right) noexcept {
        return left.nanoseconds == right.nanoseconds && ordinalOf(left.date) == ordinalOf(right.date);
    }
    friend constexpr bool operator<(const WallClock& left, const WallClock& right) noexcept {
        const std::int64_t leftDay = ordinalOf(left.date);
        const std::int64_t rightDay = ordinalOf(right.date);
        return leftDay != rightDay ? leftDay < rightDay : left.nanoseconds < right.nanoseconds;
    }
    /// How long it is from `right` to `left`.
    friend TimeCount operator-(const WallClock& left, const WallClock& right) noexcept {
        return timeCount(daysBetween(right.date, left.date), left.nanoseconds - right.nanoseconds);
    }

private:
    // Grows with the date, but not by one for each day.
    static constexpr std::int64_t ordinalOf(const CivilDate& date) noexcept {
        return (date.year * 16 + date.month) * 32 + date.day;
    }
    static std::int64_t daysBetween(const CivilDate& from, const CivilDate& to) noexcept {
        const std::int64_t months = (to.year - from.year) * 12 + to.month - from.month;
        const std::int64_t days = std::int64_t{to.day} - std::int64_t{from.day};
        if (months == 0) {
            return days;
        }
        if (months == 1) { // as most often where whole months were taken before
            return days + lastDayOfMonth(from.year, from.month);
        }
        return daysFromCivil(to.year, to.month, to.day) - daysFromCivil(from.year, from.month, from.day);
    }
};

/// Makes the clock that of a record that was read without `lenient`: in UTC where it has an offset, else as it is
/// written. In its place, since a copy of what was just written has to wait for it.
void setUtcClock(WallClock& clock, const CanonicalRecord& record) noexcept;

} // namespace kvt::ex::datetime::detail
