// Moving an instant by an interval, and the interval between two instants.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/record.h>

namespace kvt::ex::datetime::detail {

/// Years and months by the calendar, with the day cut to the length of the month once, then the rest as exact lengths.
/// The offset stays as it is. The sum of the years is kept in 16 bits, as the calendar of the `date` library keeps it.
/// A failure if the year of the instant is out of range; that of the result may be any.
Outcome<TemporalInstant> addInterval(const TemporalInstant& instant, const IntervalParts& interval);

struct Difference {
    IntervalParts parts;
    double months = 0.0; ///< all of it as a number of months, signed
};

/// First minus second, both in UTC where they have an offset. Neither record is `Unsupported`.
Outcome<Difference> diffParts(const CanonicalRecord& first, const CanonicalRecord& second);

} // namespace kvt::ex::datetime::detail
