// The checks of a value's numbers, and the way between them and their count.
#include <kvt/datetime/detail/instant.h>

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/parts_access.h>
#include <kvt/datetime/detail/text.h>

namespace kvt::ex::datetime::detail {

namespace {

ShortText textOf(std::int64_t number) noexcept {
    TextBuffer text;
    text.putSigned(number);
    return ShortText(text.view());
}

ShortText textOf(std::uint64_t number) noexcept {
    TextBuffer text;
    text.putNumber(number);
    return ShortText(text.view());
}

} // namespace

DatePartRange yearOutOfRange(std::int64_t year) noexcept {
    return {textOf(year), "year", "1000", "9999"};
}

DatePartRange monthOutOfRange(std::uint64_t month) noexcept {
    return {textOf(month), "month", "1", "12"};
}

DatePartRange dayOutOfRange(std::uint64_t day, unsigned lastDay) noexcept {
    return {textOf(day), "day", "1", lastDayText(lastDay)};
}

DatePartRange hoursOutOfRange(std::int64_t hours) noexcept {
    return {textOf(hours), "hours", "0", "23"};
}

DatePartRange minutesOutOfRange(std::int64_t minutes) noexcept {
    return {textOf(minutes), "minutes", "0", "59"};
}

DatePartRange secondsOutOfRange(std::string_view seconds) noexcept {
    return {ShortText(seconds), "seconds", "0", "59.999999999"};
}

Outcome<std::int64_t> checkTimeOfDay(std::int64_t hours, std::int64_t minutes, std::int64_t seconds,
                                     std::int64_t nanoseconds, bool lenient) {
    if (hours < 0 || (!lenient && hours > 23)) {
        return hoursOutOfRange(hours);
    }
    if (minutes < 0 || (!lenient && minutes > 59)) {
        return minutesOutOfRange(minutes);
    }
    if (seconds < 0 || (!lenient && seconds > 59)) {
        return secondsOutOfRange(textOf(seconds).view());
    }
    return (hours * secondsPerHour + minutes * secondsPerMinute + seconds) * nanosPerSecond + nanoseconds;
}

Outcome<std::int64_t> checkCalendarDate(std::int64_t year, std::uint64_t month, std::uint64_t day,
                                        bool lenient) {
    if (year < lowestYear || year > highestYear) {
        return yearOutOfRange(year);
    }
    if (month == 0 || (!lenient && month > 12)) {
        return monthOutOfRange(month);
    }
    constexpr std::uint64_t inEveryMonth = 28;
    if (day == 0 || (!lenient && day > inEveryMonth)) {
        const unsigned lastDay = lastDayOfMonth(year, static_cast<unsigned>(month));
        if (day == 0 || day > lastDay) {
            return dayOutOfRange(day, lastDay);
        }
    }
    return daysFromCivil(year, static_cast<unsigned>(month), static_cast<unsigned>(day));
}

Outcome<TimeCount> countFromFields(const DateTimeFields& fields, bool lenient) {
    return checkTimeOfDay(fields.hours, fields.minutes, fields.seconds, fields.nanoseconds, lenient)
        .andThen([&](std::int64_t timeOfDay) {
            return checkCalendarDate(fields.year, fields.month, fields.day, lenient)
                .andThen([&](std::int64_t days) { return timeCount(days, timeOfDay); });
        });
}

DateTimeFields fieldsFromCount(const TimeCount& count) {
    const CivilDate date = civilFromDays(count.days);
    const std::int64_t seconds = count.nanoseconds / nanosPerSecond;
    return {date.year,
            date.month,
            date.day,
            seconds / secondsPerHour,
            seconds % secondsPerHour / secondsPerMinute,
            seconds % secondsPerMinute,
            count.nanoseconds % nanosPerSecond};
}

Outcome<TemporalInstant> instantFromParts(const DateTimeParts& parts, bool lenient) {
    return countFromFields({PartsAccess::year(parts), PartsAccess::month(parts), PartsAccess::day(parts),
                            parts.hours(), parts.minutes(), parts.seconds(), parts.nanoseconds()},
                           lenient)
        .andThen([&](const TimeCount& count) {
            // The text of parts is an offset or empty, never a keyword.
            const std::optional<OffsetForm> offset = readOffset(viewOf(PartsAccess::offset(parts)));
            return TemporalInstant{count, offset ? std::optional(offset->minutes) : std::nullopt};
        });
}

DateTimeParts partsOf(TemporalType type, const DateTimeFields& fields, std::string_view offset) {
    return PartsAccess::make(fields.year, fields.month, fields.day, static_cast<std::uint64_t>(fields.hours),
                             static_cast<std::uint64_t>(fields.minutes),
                             static_cast<std::uint64_t>(fields.seconds),
                             static_cast<std::uint64_t>(fields.nanoseconds), offset, type);
}

DateTimeParts partsFromInstant(const TemporalInstant& instant) {
    const std::optional<OffsetForm> offset =
        instant.offsetMinutes ? offsetOfMinutes(*instant.offsetMinutes) : std::nullopt;
    return partsOf(offset ? TemporalType::DatetimeWithOffset : TemporalType::Datetime,
                   fieldsFromCount(instant.count), offset ? offset->view() : std::string_view());
}

} // namespace kvt::ex::datetime::detail
