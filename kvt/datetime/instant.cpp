#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/parts_access.h>
#include <kvt/datetime/detail/text.h>

namespace kvt::ex::datetime::detail {

namespace {

DatePartRange outOfRange(std::int64_t value, std::string_view part, std::string_view lowest,
                         std::string_view highest) {
    TextBuffer text;
    text.putSigned(value);
    return {text.toString(), part, lowest, highest};
}

DatePartRange outOfRange(std::uint64_t value, std::string_view part, std::string_view lowest,
                         std::string_view highest) {
    TextBuffer text;
    text.putNumber(value);
    return {text.toString(), part, lowest, highest};
}

} // namespace

Outcome<NanoCount> checkTimeOfDay(std::int64_t hours, std::int64_t minutes, std::int64_t seconds,
                                  std::int64_t nanoseconds, bool lenient) {
    if (hours < 0 || (!lenient && hours > 23)) {
        return outOfRange(hours, "hours", "0", "23");
    }
    if (minutes < 0 || (!lenient && minutes > 59)) {
        return outOfRange(minutes, "minutes", "0", "59");
    }
    if (seconds < 0 || (!lenient && seconds > 59)) {
        return outOfRange(seconds, "seconds", "0", "59.999999999");
    }
    return nanosOf(hours * secondsPerHour + minutes * secondsPerMinute + seconds, nanoseconds);
}

Outcome<std::int64_t> checkCalendarDate(std::int64_t year, std::uint64_t month, std::uint64_t day, bool lenient) {
    if (year < lowestYear || year > highestYear) {
        return outOfRange(year, "year", "1000", "9999");
    }
    if (month == 0 || (!lenient && month > 12)) {
        return outOfRange(month, "month", "1", "12");
    }
    const unsigned lastDay = lastDayOfMonth(year, static_cast<unsigned>(month));
    if (day == 0 || (!lenient && day > lastDay)) {
        return outOfRange(day, "day", "1", lastDayText(lastDay));
    }
    return daysFromCivil(year, static_cast<unsigned>(month), static_cast<unsigned>(day));
}

Outcome<NanoCount> countFromFields(const DateTimeFields& fields, bool lenient) {
    const Outcome<NanoCount> timeOfDay =
        checkTimeOfDay(fields.hours, fields.minutes, fields.seconds, fields.nanoseconds, lenient);
    if (!timeOfDay) {
        return timeOfDay.failure();
    }
    const Outcome<std::int64_t> days = checkCalendarDate(fields.year, fields.month, fields.day, lenient);
    if (!days) {
        return days.failure();
    }
    return NanoCount(NanoCount(*days) * nanosPerDay + *timeOfDay);
}

DateTimeFields fieldsFromCount(const NanoCount& count) {
    const FloorQuotient days = floorDivide(count, nanosPerDay);
    const CivilDate date = civilFromDays(days.quotient);
    const std::int64_t seconds = days.remainder / nanosPerSecond;
    return {date.year,
            date.month,
            date.day,
            seconds / secondsPerHour,
            seconds % secondsPerHour / secondsPerMinute,
            seconds % secondsPerMinute,
            days.remainder % nanosPerSecond};
}

Outcome<TemporalInstant> instantFromParts(const DateTimeParts& parts, bool lenient) {
    const Outcome<NanoCount> count =
        countFromFields({PartsAccess::year(parts), PartsAccess::month(parts), PartsAccess::day(parts), parts.hours(),
                         parts.minutes(), parts.seconds(), parts.nanoseconds()},
                        lenient);
    if (!count) {
        return count.failure();
    }
    // The text of parts is an offset or empty, never a keyword.
    const std::optional<OffsetForm> offset = readOffset(viewOf(PartsAccess::offset(parts)));
    return TemporalInstant{*count, offset ? std::optional<std::int32_t>(offset->minutes) : std::nullopt};
}

DateTimeParts partsFromInstant(const TemporalInstant& instant) {
    const DateTimeFields fields = fieldsFromCount(instant.count);
    TextBuffer offset;
    if (instant.offsetMinutes) {
        writeOffset(offset, *instant.offsetMinutes);
    }
    return PartsAccess::dateTime(fields.year, fields.month, fields.day, static_cast<std::uint64_t>(fields.hours),
                                 static_cast<std::uint64_t>(fields.minutes),
                                 static_cast<std::uint64_t>(fields.seconds),
                                 static_cast<std::uint64_t>(fields.nanoseconds), offset.toString());
}

UString<0> instantText(const TemporalInstant& instant, bool withOffset) {
    return partsFromInstant(instant).toDatetimeString(FormatType::Compact, withOffset);
}

} // namespace kvt::ex::datetime::detail
