// The steps behind add and diff: calendar steps on years, months and days, exact steps on the count.

#include <kvt/datetime/detail/arithmetic.h>
#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/parts_access.h>

#include <algorithm>
#include <cstdlib>

namespace kvt::ex::datetime::detail {

namespace {

// Sums of 64 bits that may wrap: an interval's seconds can be any number.
constexpr std::int64_t wrappingSum(std::int64_t left, std::int64_t right) noexcept {
    return static_cast<std::int64_t>(static_cast<std::uint64_t>(left) + static_cast<std::uint64_t>(right));
}
constexpr std::int64_t wrappingProduct(std::int64_t left, std::int64_t right) noexcept {
    return static_cast<std::int64_t>(static_cast<std::uint64_t>(left) * static_cast<std::uint64_t>(right));
}
constexpr std::int64_t wrappingNegation(std::int64_t number) noexcept {
    return static_cast<std::int64_t>(0 - static_cast<std::uint64_t>(number));
}

// A calendar step begins in a year that a value can have.
bool isInRange(const CivilDate& date) noexcept {
    return date.year >= lowestYear && date.year <= highestYear;
}

// The date so many years and then months later; its day is cut to the length of the month reached.
CivilDate dateAfter(const CivilDate& date, std::int64_t years, std::int64_t months) noexcept {
    const std::int64_t sum = wrappingSum(months, date.month - 1);
    const std::int64_t carry = sum / 12 - (sum % 12 < 0 ? 1 : 0);
    const std::int64_t year = static_cast<std::int16_t>(wrappingSum(date.year, years)) + carry;
    const auto month = static_cast<unsigned>(sum - carry * 12) + 1;
    const bool isInEveryMonth = date.day <= 28;
    return {year, month, isInEveryMonth ? date.day : std::min(date.day, lastDayOfMonth(year, month))};
}

std::int64_t daysOf(const CivilDate& date) noexcept {
    return daysFromCivil(date.year, date.month, date.day);
}

bool hasExactParts(const IntervalParts& interval) noexcept {
    return (interval.days() | interval.hours() | interval.minutes() | interval.seconds() |
            interval.nanoseconds()) != 0;
}

} // namespace

std::optional<DatePartRange> addInterval(DateTimeFields& fields, const IntervalParts& interval) {
    const CivilDate date = {fields.year, static_cast<unsigned>(fields.month),
                            static_cast<unsigned>(fields.day)};
    if (!isInRange(date)) {
        return yearOutOfRange(date.year);
    }
    const auto signedPart = [&](std::int64_t magnitude) {
        return interval.negative() ? wrappingNegation(magnitude) : magnitude;
    };
    const CivilDate reached = dateAfter(date, signedPart(interval.years()), signedPart(interval.months()));
    if (!hasExactParts(interval)) {
        fields.year = reached.year;
        fields.month = reached.month;
        fields.day = reached.day;
        return std::nullopt;
    }
    const std::int64_t days = wrappingSum(daysOf(reached), signedPart(interval.days()));
    std::int64_t seconds = wrappingSum(wrappingProduct(days, 24), signedPart(interval.hours()));
    seconds = wrappingProduct(seconds, secondsPerHour);
    seconds = wrappingSum(seconds, wrappingProduct(signedPart(interval.minutes()), secondsPerMinute));
    seconds = wrappingSum(seconds, signedPart(interval.seconds()));
    // The time of day joins as the nanoseconds that it is.
    fields = fieldsFromCount(
        timeCountOfSeconds(seconds, nanosecondsOfDay(fields) + signedPart(interval.nanoseconds())));
    return std::nullopt;
}

// ---- Difference

namespace {

// A date and the time of its day.
struct WallClock {
    CivilDate date;
    std::int64_t nanoseconds = 0;

    friend bool operator<(const WallClock& left, const WallClock& right) noexcept {
        const std::int64_t leftDay = ordinalOf(left.date);
        const std::int64_t rightDay = ordinalOf(right.date);
        return leftDay != rightDay ? leftDay < rightDay : left.nanoseconds < right.nanoseconds;
    }

private:
    // Grows with the date, but not by one for each day.
    static constexpr std::int64_t ordinalOf(const CivilDate& date) noexcept {
        return (date.year * 16 + date.month) * 32 + date.day;
    }
};

// How far the steps have come.
struct Walk {
    WallClock at;
    std::int64_t steps = 0; ///< how many of them; negative on the way back
};

// A step by the calendar: the date so many years or months after another, before it where they are negative.
using CalendarStep = CivilDate (*)(const CivilDate&, std::int64_t);

CivilDate dateAfterYears(const CivilDate& date, std::int64_t years) noexcept {
    return dateAfter(date, years, 0);
}

CivilDate dateAfterMonths(const CivilDate& date, std::int64_t months) noexcept {
    return dateAfter(date, 0, months);
}

// Goes so many steps of one kind towards `target` or, if those pass it, one fewer.
Outcome<Walk> walkTowards(const WallClock& start, const WallClock& target, std::int64_t steps,
                          CalendarStep stepped) {
    if (steps == 0) {
        return Walk{start, 0};
    }
    if (!isInRange(start.date)) {
        return yearOutOfRange(start.date.year);
    }
    const bool backwards = target < start;
    Walk walk = {{stepped(start.date, steps), start.nanoseconds}, steps};
    if (backwards ? walk.at < target : target < walk.at) {
        walk.steps += backwards ? 1 : -1;
        walk.at.date = stepped(start.date, walk.steps);
    }
    return walk;
}

Outcome<Walk> walkYears(const WallClock& start, const WallClock& target) {
    return walkTowards(start, target, target.date.year - start.date.year, dateAfterYears);
}

Outcome<Walk> walkMonths(const WallClock& start, const WallClock& target) {
    std::int64_t apart = std::int64_t{target.date.month} - std::int64_t{start.date.month};
    if (target.date.year != start.date.year) {
        apart += target.date.year > start.date.year ? 12 : -12;
    }
    return walkTowards(start, target, apart, dateAfterMonths);
}

} // namespace

IntervalParts Difference::parts() const noexcept {
    const auto nanoseconds = static_cast<std::uint64_t>(rest.nanoseconds);
    const auto seconds = static_cast<std::uint32_t>(nanoseconds / nanosPerSecond);
    constexpr std::uint32_t perHour = secondsPerHour;
    constexpr std::uint32_t perMinute = secondsPerMinute;
    IntervalParts parts;
    PartsAccess::negative(parts) = backwards;
    PartsAccess::years(parts) = static_cast<std::uint64_t>(years);
    PartsAccess::months(parts) = static_cast<std::uint64_t>(months);
    PartsAccess::days(parts) = static_cast<std::uint64_t>(rest.days);
    PartsAccess::hours(parts) = seconds / perHour;
    PartsAccess::minutes(parts) = seconds % perHour / perMinute;
    PartsAccess::seconds(parts) = seconds % perMinute;
    PartsAccess::nanoseconds(parts) = nanoseconds % nanosPerSecond;
    return parts;
}

double Difference::inMonths() const {
    const double magnitude = static_cast<double>(years * 12 + months) +
                             nanosecondsAsDouble(rest) / 1e9 / static_cast<double>(secondsPerDay) /
                                 static_cast<double>(lastDayOfMonth(earlier.year, earlier.month));
    return backwards ? -magnitude : magnitude;
}

Outcome<Difference> diffParts(const TimeCount& first, const TimeCount& second, bool byCalendar) {
    if (first == second) {
        return Difference();
    }
    const bool backwards = first < second;
    const WallClock target = {civilFromDays(first.days), first.nanoseconds};
    const WallClock start = {civilFromDays(second.days), second.nanoseconds};
    if (!byCalendar) {
        return Difference{backwards, 0, 0, backwards ? second - first : first - second,
                          backwards ? target.date : start.date};
    }
    return walkYears(start, target).andThen([&](const Walk& years) {
        return walkMonths(years.at, target).andThen([&](const Walk& months) {
            const TimeCount reached = {daysOf(months.at.date), months.at.nanoseconds};
            return Difference{backwards, std::abs(years.steps), std::abs(months.steps),
                              backwards ? reached - first : first - reached,
                              backwards ? target.date : months.at.date};
        });
    });
}

} // namespace kvt::ex::datetime::detail
