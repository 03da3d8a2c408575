// Moving a count by an interval, and the interval between two counts.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/time_count.h>

namespace kvt::ex::datetime::detail {

/// Years and months by the calendar, with the day cut to the length of the month once, then the rest as exact
/// lengths. The sum of the years is kept in 16 bits, as the calendar of the `date` library keeps it. A failure if the
/// year of the count is out of range; that of the result may be any.
Outcome<TimeCount> addInterval(const TimeCount& count, const IntervalParts& interval);

struct Difference {
    IntervalParts parts;
    double months = 0.0; ///< all of it as a number of months, signed
};

/// First minus second; years and months only `byCalendar`, which values without a date have none of. A failure if the
/// way leads over a year that is out of range.
Outcome<Difference> diffParts(const TimeCount& first, const TimeCount& second, bool byCalendar);

} // namespace kvt::ex::datetime::detail
