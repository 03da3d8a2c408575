// The numbers of a value and their place on the time line. The order of the checks between the two is what a user
// sees in the messages: time of day first, then year, month, day.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/time_count.h>

#include <cstdint>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

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

/// A value on the time line. Without an offset, a wall clock with no link to UTC. With one, the count is still that of
/// the wall clock; whoever wants UTC takes utcCount().
struct TemporalInstant {
    TimeCount count;
    std::optional<std::int32_t> offsetMinutes;
};

constexpr TimeCount utcCount(const TemporalInstant& instant) noexcept {
    return plusMinutes(instant.count, -instant.offsetMinutes.value_or(0));
}

// The failures of the parts, with the bounds that the messages name: they stand for values without `lenient`.
DatePartRange yearOutOfRange(std::int64_t year) noexcept;
DatePartRange monthOutOfRange(std::uint64_t month) noexcept;
DatePartRange dayOutOfRange(std::uint64_t day, unsigned lastDay) noexcept;
DatePartRange hoursOutOfRange(std::int64_t hours) noexcept;
DatePartRange minutesOutOfRange(std::int64_t minutes) noexcept;
DatePartRange secondsOutOfRange(std::string_view seconds) noexcept;

/// The nanoseconds since midnight. Without `lenient`: hours 0 to 23, minutes and seconds 0 to 59; with it, only the
/// lower bounds hold. Nanoseconds are taken as they are. None of the numbers is longer than a value can write it.
Outcome<std::int64_t> checkTimeOfDay(std::int64_t hours, std::int64_t minutes, std::int64_t seconds,
                                     std::int64_t nanoseconds, bool lenient);

/// The days since 1970-01-01. Year 1000 to 9999, month and day from 1; without `lenient` up to the 12th month and the
/// last day of the month, with it up to what daysFromCivil() takes.
Outcome<std::int64_t> checkCalendarDate(std::int64_t year, std::uint64_t month, std::uint64_t day,
                                        bool lenient);

/// Checks the numbers and gives their count, with what runs over carried.
Outcome<TimeCount> countFromFields(const DateTimeFields& fields, bool lenient);

/// The numbers of a count. The year may be any; the others are within their bounds.
DateTimeFields fieldsFromCount(const TimeCount& count);

/// The parts of a kind with these numbers. `offset` is canonical or empty.
DateTimeParts partsOf(TemporalType type, const DateTimeFields& fields, std::string_view offset);

/// Checks the fields and gives their instant, with the offset of the parts. The type of the parts plays no part.
Outcome<TemporalInstant> instantFromParts(const DateTimeParts& parts, bool lenient);

/// The fields of an instant, of type `Datetime` or `DatetimeWithOffset`. Its year may be any.
DateTimeParts partsFromInstant(const TemporalInstant& instant);

} // namespace kvt::ex::datetime::detail
