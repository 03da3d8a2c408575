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

std::optional<DatePartRange> timeOutOfRange(const DateTimeFields& fields, bool lenient) noexcept {
    if (fields.hours < 0 || (!lenient && fields.hours > 23)) {
        return hoursOutOfRange(fields.hours);
    }
    if (fields.minutes < 0 || (!lenient && fields.minutes > 59)) {
        return minutesOutOfRange(fields.minutes);
    }
    if (fields.seconds < 0 || (!lenient && fields.seconds > 59)) {
        return secondsOutOfRange(textOf(fields.seconds).view());
    }
    return std::nullopt;
}

std::optional<DatePartRange> dateOutOfRange(const DateTimeFields& fields, bool lenient) noexcept {
    if (fields.year < lowestYear || fields.year > highestYear) {
        return yearOutOfRange(fields.year);
    }
    if (fields.month == 0 || (!lenient && fields.month > 12)) {
        return monthOutOfRange(fields.month);
    }
    constexpr std::uint64_t inEveryMonth = 28;
    if (fields.day == 0 || (!lenient && fields.day > inEveryMonth)) {
        const unsigned lastDay = lastDayOfMonth(fields.year, static_cast<unsigned>(fields.month));
        if (fields.day == 0 || fields.day > lastDay) {
            return dayOutOfRange(fields.day, lastDay);
        }
    }
    return std::nullopt;
}

TimeCount countOf(const DateTimeFields& fields) noexcept {
    return timeCount(
        daysFromCivil(fields.year, static_cast<unsigned>(fields.month), static_cast<unsigned>(fields.day)),
        nanosecondsOfDay(fields));
}

Outcome<TimeCount> countFromFields(const DateTimeFields& fields, bool lenient) {
    if (const std::optional<DatePartRange> wrong = partOutOfRange(fields, lenient)) {
        return *wrong;
    }
    return countOf(fields);
}

DateTimeFields fieldsFromCount(const TimeCount& count) {
    const CivilDate date = civilFromDays(count.days);
    const auto seconds = static_cast<std::int32_t>(count.nanoseconds / nanosPerSecond);
    constexpr std::int32_t perHour = secondsPerHour;
    constexpr std::int32_t perMinute = secondsPerMinute;
    return {date.year,
            date.month,
            date.day,
            seconds / perHour,
            seconds % perHour / perMinute,
            seconds % perMinute,
            count.nanoseconds % nanosPerSecond};
}

Outcome<TemporalInstant> instantFromParts(const DateTimeParts& parts, bool lenient) {
    return countFromFields({PartsAccess::year(parts), PartsAccess::month(parts), PartsAccess::day(parts),
                            parts.hours(), parts.minutes(), parts.seconds(), parts.nanoseconds()},
                           lenient)
        .andThen([&](const TimeCount& count) {
            // The text of parts is an offset or empty, never a keyword.
            const std::optional<OffsetForm> offset = offsetOfText(viewOf(PartsAccess::offset(parts)));
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
