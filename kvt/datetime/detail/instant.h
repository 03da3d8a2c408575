// A value on the time line, and the way between it and the fields of a value. The order of the checks on that way is
// what a user sees in the messages: time of day first, then year, month, day.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/nano_count.h>

#include <cstdint>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// Without an offset, a wall clock with no link to UTC. With one, the count is still that of the wall clock; whoever
/// wants UTC takes utcCount().
struct TemporalInstant {
    NanoCount count;
    std::optional<std::int32_t> offsetMinutes;
};

inline NanoCount utcCount(const TemporalInstant& instant) {
    return instant.count - NanoCount(std::int64_t{instant.offsetMinutes.value_or(0)} * nanosPerMinute);
}

/// The nanoseconds since midnight. Without `lenient`: hours 0 to 23, minutes and seconds 0 to 59; with it, only the
/// lower bounds hold. Nanoseconds are taken as they are.
Outcome<NanoCount> checkTimeOfDay(std::int64_t hours, std::int64_t minutes, std::int64_t seconds,
                                  std::int64_t nanoseconds, bool lenient);

/// The days since 1970-01-01. Year 1000 to 9999, month and day from 1; without `lenient` up to the 12th month and the
/// last day of the month, with it up to what daysFromCivil() takes.
Outcome<std::int64_t> checkCalendarDate(std::int64_t year, std::uint64_t month, std::uint64_t day, bool lenient);

/// The numbers of a value alone, with the defaults of DateTimeParts.
struct DateTimeFields {
    std::int64_t year = 1970;
    std::uint64_t month = 1;
    std::uint64_t day = 1;
    std::int64_t hours = 0;
    std::int64_t minutes = 0;
    std::int64_t seconds = 0;
    std::int64_t nanoseconds = 0;
};

/// Checks the numbers and gives their count.
Outcome<NanoCount> countFromFields(const DateTimeFields& fields, bool lenient);

/// The numbers of a count. The year may be any; the others are within their bounds.
DateTimeFields fieldsFromCount(const NanoCount& count);

/// Checks the fields and gives their instant, with the offset of the parts. The type of the parts plays no part.
Outcome<TemporalInstant> instantFromParts(const DateTimeParts& parts, bool lenient);

/// The fields of an instant, of type `Datetime` or `DatetimeWithOffset`. Its year may be any.
DateTimeParts partsFromInstant(const TemporalInstant& instant);

/// Changes the offset of an instant. `Replace` keeps the count, `Convert` the moment. "local" and "utc" are read in any
/// case; the empty text, and a text that is no offset, take the offset away. Lets the exceptions of the zone database
/// through, for "local" only.
void applyOffsetText(TemporalInstant& instant, std::string_view text, SetZoneMode mode);

/// The compact datetime text of an instant.
UString<0> instantText(const TemporalInstant& instant, bool withOffset);

} // namespace kvt::ex::datetime::detail
