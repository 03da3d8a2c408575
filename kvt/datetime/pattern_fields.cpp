// Putting fields together. The order of the checks decides which message comes.
#include <kvt/datetime/detail/pattern_fields.h>

#include <kvt/datetime/detail/calendar.h>

#include <string>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::int64_t defaultYear = 1970;
constexpr std::int64_t monthsPerYear = 12;

std::optional<ParseValidation> incompleteness(const PatternFields& fields, bool wantsOffset) {
    if (fields.ordinal && !fields.year) {
        return ParseValidation::OrdinalWithoutYear;
    }
    const bool anyOfDate = fields.year || fields.month || fields.day;
    if (!fields.ordinal && anyOfDate && !(fields.year && fields.month && fields.day)) {
        return ParseValidation::DateIncomplete;
    }
    if (fields.hours ? fields.hasSeconds && !fields.minutes : fields.minutes || fields.hasSeconds) {
        return ParseValidation::TimeIncomplete;
    }
    if (!fields.hours && wantsOffset) {
        return ParseValidation::OffsetWithoutTime;
    }
    if (!anyOfDate && !fields.ordinal && !fields.hours) {
        return ParseValidation::NothingGiven;
    }
    return std::nullopt;
}

// Hours of a 12-hour clock to those of the day.
std::optional<ParseValidation> applyMeridiem(PatternFields& fields) {
    const std::int64_t hours = fields.hours.value_or(0);
    if (hours < 1 || hours > 12) {
        return ParseValidation::HourNotForMeridiem;
    }
    fields.hours = hours % 12 + (fields.meridiem == 'p' ? 12 : 0);
    return std::nullopt;
}

// The fraction alone may reach the next second, when it was rounded.
NanoCount countOn(const PatternFields& fields, std::int64_t days) {
    const std::int64_t minutes = fields.hours.value_or(0) * 60 + fields.minutes.value_or(0);
    return nanosOf(days * secondsPerDay + minutes * secondsPerMinute + fields.seconds, fields.nanoseconds);
}

std::int64_t yearOf(const NanoCount& count) {
    return civilFromDays(floorDivide(count, nanosPerDay).quotient).year;
}

Outcome<NanoCount> countOnOrdinal(const PatternFields& fields, std::int64_t year, bool lenient) {
    const NanoCount count = countOn(fields, daysFromCivil(year, 1, 1) + *fields.ordinal - 1);
    if (!lenient && yearOf(count) != year) {
        return Failure(ParseValidation::OrdinalPastYearEnd);
    }
    return count;
}

Outcome<NanoCount> countOnDate(const PatternFields& fields, std::int64_t year, bool lenient) {
    std::int64_t month = fields.month.value_or(1);
    const auto day = static_cast<unsigned>(fields.day.value_or(1));
    if (month > monthsPerYear || day > lastDayOfMonth(year, static_cast<unsigned>(month))) {
        if (!lenient) {
            return Failure(ParseValidation::NoSuchDate);
        }
        year += (month - 1) / monthsPerYear;
        month = (month - 1) % monthsPerYear + 1;
    }
    return countOn(fields, daysFromCivil(year, static_cast<unsigned>(month), day));
}

} // namespace

Outcome<PatternReading> instantOfFields(PatternFields fields, bool wantsOffset, bool lenient) {
    const bool isEpoch = !fields.epochFlag.empty();
    if (isEpoch && fields.hasOffset) {
        return FormatStringBadCombo{std::string(fields.epochFlag), "%z"};
    }
    if (const auto problem = isEpoch ? std::nullopt : incompleteness(fields, wantsOffset)) {
        return *problem;
    }
    if (const auto problem = fields.meridiem == '\0' ? std::nullopt : applyMeridiem(fields)) {
        return *problem;
    }
    if (isEpoch) {
        // Seconds since 1970 were checked against the range of years as they were read.
        return PatternReading{nanosOf(fields.seconds, fields.nanoseconds), fields.offsetMinutes};
    }
    const std::int64_t year = fields.year.value_or(defaultYear);
    const Outcome<NanoCount> count =
        fields.ordinal ? countOnOrdinal(fields, year, lenient) : countOnDate(fields, year, lenient);
    if (!count) {
        return count.failure();
    }
    const std::int64_t reached = yearOf(*count);
    if (reached < lowestYear || reached > highestYear) {
        return ParseValidation::ResultYearOutOfRange;
    }
    return PatternReading{*count, fields.offsetMinutes};
}

} // namespace kvt::ex::datetime::detail
