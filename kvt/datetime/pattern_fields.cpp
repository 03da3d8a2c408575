// Putting fields together. The order of the checks decides which message comes.
#include <kvt/datetime/detail/pattern_fields.h>

#include <kvt/datetime/detail/calendar.h>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::int32_t monthsPerYear = 12;
constexpr std::uint64_t shortestMonth = 28;

using Problem = std::optional<ParseValidation>;

constexpr unsigned bitOf(Field field) {
    return 1u << static_cast<unsigned>(field);
}

constexpr Problem incompleteness(unsigned given, bool wantsOffset) {
    const auto has = [given](Field field) { return (given & bitOf(field)) != 0; };
    const bool hasOrdinal = has(Field::Ordinal);
    if (hasOrdinal && !has(Field::Year)) {
        return ParseValidation::OrdinalWithoutYear;
    }
    const bool anyOfDate = has(Field::Year) || has(Field::Month) || has(Field::Day);
    if (!hasOrdinal && anyOfDate && !(has(Field::Year) && has(Field::Month) && has(Field::Day))) {
        return ParseValidation::DateIncomplete;
    }
    const bool hasHours = has(Field::Hours);
    if (hasHours ? has(Field::Seconds) && !has(Field::Minutes) : has(Field::Minutes) || has(Field::Seconds)) {
        return ParseValidation::TimeIncomplete;
    }
    if (!hasHours && wantsOffset) {
        return ParseValidation::OffsetWithoutTime;
    }
    if (!anyOfDate && !hasOrdinal && !hasHours) {
        return ParseValidation::NothingGiven;
    }
    return std::nullopt;
}

// For each set of fields whether it makes up a value, with an offset at [1].
constexpr auto isComplete = [] {
    std::array<std::array<bool, 1u << fieldCount>, 2> complete{};
    for (unsigned given = 0; given < complete[0].size(); ++given) {
        complete[0][given] = !incompleteness(given, false);
        complete[1][given] = !incompleteness(given, true);
    }
    return complete;
}();

// With the time of day of `time`, which may run over.
DateTimeFields fieldsOn(std::int64_t days, const DateTimeFields& time) {
    const std::int64_t seconds = time.hours * secondsPerHour + time.minutes * secondsPerMinute + time.seconds;
    return fieldsFromCount(timeCountOfSeconds(days * secondsPerDay + seconds, time.nanoseconds));
}

// The fraction alone may reach the next second, when it was rounded.
bool runsOver(const DateTimeFields& time) {
    return time.hours > 23 || time.minutes > 59 || time.seconds > 59 || time.nanoseconds >= nanosPerSecond;
}

bool isOfCalendar(const DateTimeFields& date) {
    return date.month <= monthsPerYear &&
           (date.day <= shortestMonth ||
            date.day <= lastDayOfMonth(date.year, static_cast<unsigned>(date.month)));
}

// The fields with all that runs over carried on, if the date is one.
Problem carryOverDate(DateTimeFields& fields, bool lenient) {
    if (isOfCalendar(fields)) {
        if (!runsOver(fields)) {
            return std::nullopt; // as nearly always: the fields are those of the value
        }
    } else if (!lenient) {
        return ParseValidation::NoSuchDate;
    }
    const std::uint64_t months = fields.month - 1;
    const std::int64_t days =
        daysFromCivil(fields.year + static_cast<std::int64_t>(months / monthsPerYear),
                      static_cast<unsigned>(months % monthsPerYear + 1), static_cast<unsigned>(fields.day));
    fields = fieldsOn(days, fields);
    return std::nullopt;
}

Problem carryOverOrdinal(DateTimeFields& fields, std::int64_t ordinal, bool lenient) {
    const std::int64_t year = fields.year;
    fields = fieldsOn(daysFromCivil(year, 1, 1) + ordinal - 1, fields);
    return !lenient && fields.year != year ? Problem(ParseValidation::OrdinalPastYearEnd) : std::nullopt;
}

} // namespace

std::optional<PatternFailure> makeUp(PatternReading& reading, const PatternFields& fields, bool lenient) {
    if (fields.isEpoch() && fields.hasOffset) {
        return FormatStringBadCombo{fields.epochFlag, "%z"};
    }
    if (!fields.isEpoch()) {
        const bool wantsOffset = (reading.parts & offsetPart) != 0;
        if (!isComplete[wantsOffset ? 1 : 0][fields.given()]) {
            return *incompleteness(fields.given(), wantsOffset);
        }
    }
    std::int32_t hours = fields.get(Field::Hours);
    if (fields.meridiem != '\0') {
        if (hours < 1 || hours > 12) {
            return ParseValidation::HourNotForMeridiem;
        }
        hours = hours % 12 + (fields.meridiem == 'p' ? 12 : 0);
    }
    reading.offsetMinutes = fields.offsetMinutes;
    DateTimeFields& numbers = reading.fields;
    if (fields.isEpoch()) {
        // Seconds since 1970 were checked against the range of years as they were read.
        numbers = fieldsFromCount(timeCountOfSeconds(fields.epochSeconds, fields.nanoseconds));
        return std::nullopt;
    }
    numbers.year = fields.get(Field::Year);
    numbers.month = static_cast<std::uint64_t>(fields.get(Field::Month));
    numbers.day = static_cast<std::uint64_t>(fields.get(Field::Day));
    numbers.hours = hours;
    numbers.minutes = fields.get(Field::Minutes);
    numbers.seconds = fields.get(Field::Seconds);
    numbers.nanoseconds = fields.nanoseconds;
    if (const Problem problem = fields.has(Field::Ordinal)
                                    ? carryOverOrdinal(numbers, fields.get(Field::Ordinal), lenient)
                                    : carryOverDate(numbers, lenient)) {
        return *problem;
    }
    if (numbers.year < lowestYear || numbers.year > highestYear) {
        return ParseValidation::ResultYearOutOfRange;
    }
    return std::nullopt;
}

} // namespace kvt::ex::datetime::detail
