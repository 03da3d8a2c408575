// Moving a count by an interval, and the interval between two clocks.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/time_count.h>
#include <kvt/datetime/detail/wall_clock.h>

namespace kvt::ex::datetime::detail {

/// Years and months by the calendar, with the day cut to the length of the month once, then the rest as exact
/// lengths. The sum of the years is kept in 16 bits, as the calendar of the `date` library keeps it. The numbers are
/// within their bounds. A failure if their year is out of range, and nothing is added then; that of the sum may be any.
std::optional<DatePartRange> addInterval(DateTimeFields& fields, const IntervalParts& interval);

/// A length of time: years and months by the calendar, and what is left behind them.
struct Difference {
    // Not defaulted: that would clear all of it before it is written.
    Difference() noexcept {} // NOLINT(modernize-use-equals-default)

    bool backwards = false;
    std::int64_t years = 0;
    std::int64_t months = 0;
    TimeCount rest;
    CivilDate earlier = {1970, 1, 1}; ///< the date at which the rest begins

    IntervalParts parts() const noexcept;
    /// All of it as a number of months, signed.
    double inMonths() const;
};

/// First minus second; years and months only `byCalendar`, which values without a date have none of. A failure if the
/// way leads over a year that is out of range.
Outcome<Difference> diffParts(const WallClock& first, const WallClock& second, bool byCalendar);

} // namespace kvt::ex::datetime::detail
