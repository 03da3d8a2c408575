// The numbers of a value and their place on the time line. The order of the checks between the two is what a user
// sees in the messages: time of day first, then year, month, day.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/calendar.h>
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

/// What is wrong with the time of day, if anything is. Without `lenient`: hours 0 to 23, minutes and seconds 0 to 59;
/// with it, only the lower bounds hold. Nanoseconds are taken as they are. None of the numbers is longer than a value
/// can write it.
std::optional<DatePartRange> timeOutOfRange(const DateTimeFields& fields, bool lenient) noexcept;

/// What is wrong with the date, if anything is. Year 1000 to 9999, month and day from 1; without `lenient` up to the
/// 12th month and the last day of the month, with it up to what daysFromCivil() takes.
std::optional<DatePartRange> dateOutOfRange(const DateTimeFields& fields, bool lenient) noexcept;

/// Whether all numbers are in their ranges in every year, as all are but a 29th of February.
constexpr bool areOfEveryYear(const DateTimeFields& fields) noexcept {
    const auto isBelow = [](std::int64_t number, std::uint64_t end) {
        return static_cast<std::uint64_t>(number) < end;
    };
    return isBelow(fields.year - lowestYear, highestYear - lowestYear + 1) && fields.month - 1 < 12 &&
           fields.day - 1 < shortestMonths[fields.month - 1] && isBelow(fields.hours, 24) &&
           isBelow(fields.minutes, 60) && isBelow(fields.seconds, 60);
}

/// The first number that is out of its range, if one is.
inline std::optional<DatePartRange> partOutOfRange(const DateTimeFields& fields, bool lenient) noexcept {
    if (areOfEveryYear(fields)) {
        return std::nullopt;
    }
    if (std::optional<DatePartRange> wrong = timeOutOfRange(fields, lenient)) {
        return wrong;
    }
    return dateOutOfRange(fields, lenient);
}

/// Of hours, minutes, seconds and nanoseconds that are in their ranges; more than a day where something runs over.
constexpr std::int64_t nanosecondsOfDay(const DateTimeFields& fields) noexcept {
    return (fields.hours * secondsPerHour + fields.minutes * secondsPerMinute + fields.seconds) *
               nanosPerSecond +
           fields.nanoseconds;
}

/// The count of numbers that are in their ranges, with what runs over carried.
TimeCount countOf(const DateTimeFields& fields) noexcept;

/// Checks the numbers and gives their count.
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
