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

// The day after so many years and then months; it is cut to the length of the month reached.
std::int64_t daysAfter(const CivilDate& date, std::int64_t years, std::int64_t months) noexcept {
    const std::int64_t sum = wrappingSum(months, date.month - 1);
    const std::int64_t carry = sum / 12 - (sum % 12 < 0 ? 1 : 0);
    const std::int64_t year = static_cast<std::int16_t>(wrappingSum(date.year, years)) + carry;
    const auto month = static_cast<unsigned>(sum - carry * 12) + 1;
    return daysFromCivil(year, month, std::min(date.day, lastDayOfMonth(year, month)));
}

} // namespace

Outcome<TimeCount> addInterval(const TimeCount& count, const IntervalParts& interval) {
    const CivilDate date = civilFromDays(count.days);
    if (!isInRange(date)) {
        return yearOutOfRange(date.year);
    }
    const auto signedPart = [&](std::int64_t magnitude) {
        return interval.negative() ? wrappingNegation(magnitude) : magnitude;
    };
    const std::int64_t days =
        wrappingSum(daysAfter(date, signedPart(interval.years()), signedPart(interval.months())),
                    signedPart(interval.days()));
    std::int64_t seconds = wrappingSum(wrappingProduct(days, 24), signedPart(interval.hours()));
    seconds = wrappingProduct(seconds, secondsPerHour);
    seconds = wrappingSum(seconds, wrappingProduct(signedPart(interval.minutes()), secondsPerMinute));
    seconds = wrappingSum(seconds, signedPart(interval.seconds()));
    // The time of day joins as the nanoseconds that it is.
    return timeCountOfSeconds(seconds, count.nanoseconds + signedPart(interval.nanoseconds()));
}

// ---- Difference

namespace {

/// Years or months: how a date looks after so many of them, which are negative on the way back.
using CalendarStep = std::int64_t (*)(const CivilDate&, std::int64_t);

std::int64_t daysAfterYears(const CivilDate& date, std::int64_t years) noexcept {
    return daysAfter(date, years, 0);
}

std::int64_t daysAfterMonths(const CivilDate& date, std::int64_t months) noexcept {
    return daysAfter(date, 0, months);
}

struct Walk {
    TimeCount at;       ///< how far the steps have come
    std::int64_t steps; ///< how many of them; negative on the way back
};

// So many steps of one kind from `start`, whose date is `date`, towards `target` or, if those pass it, one fewer.
Outcome<Walk> walkTowards(const TimeCount& start, const CivilDate& date, const TimeCount& target,
                          std::int64_t steps, CalendarStep daysAfterSteps) {
    if (steps == 0) {
        return Walk{start, 0};
    }
    if (!isInRange(date)) {
        return yearOutOfRange(date.year);
    }
    const bool backwards = target < start;
    TimeCount reached = {daysAfterSteps(date, steps), start.nanoseconds};
    if (backwards ? reached < target : reached > target) {
        steps += backwards ? 1 : -1;
        reached.days = daysAfterSteps(date, steps);
    }
    return Walk{reached, steps};
}

Outcome<Walk> walkYears(const TimeCount& start, const TimeCount& target, const CivilDate& to) {
    const CivilDate from = civilFromDays(start.days);
    return walkTowards(start, from, target, to.year - from.year, daysAfterYears);
}

Outcome<Walk> walkMonths(const TimeCount& start, const TimeCount& target, const CivilDate& to) {
    const CivilDate from = civilFromDays(start.days);
    std::int64_t apart = std::int64_t{to.month} - std::int64_t{from.month};
    if (to.year != from.year) {
        apart += to.year > from.year ? 12 : -12;
    }
    return walkTowards(start, from, target, apart, daysAfterMonths);
}

// Sets days to nanoseconds.
void setExactParts(IntervalParts& parts, const TimeCount& length) {
    const auto rest = static_cast<std::uint64_t>(length.nanoseconds);
    const std::uint64_t seconds = rest / nanosPerSecond;
    PartsAccess::days(parts) = static_cast<std::uint64_t>(length.days);
    PartsAccess::hours(parts) = seconds / secondsPerHour;
    PartsAccess::minutes(parts) = seconds % secondsPerHour / secondsPerMinute;
    PartsAccess::seconds(parts) = seconds % secondsPerMinute;
    PartsAccess::nanoseconds(parts) = rest % nanosPerSecond;
}

Difference differenceOf(std::int64_t years, std::int64_t months, const TimeCount& cursor,
                        const TimeCount& target, bool backwards) {
    const TimeCount remainder = backwards ? cursor - target : target - cursor;
    const CivilDate earlier = civilFromDays(backwards ? target.days : cursor.days);
    const auto monthLength = static_cast<double>(lastDayOfMonth(earlier.year, earlier.month));
    Difference difference;
    difference.months = static_cast<double>(years * 12 + months) + nanosecondsAsDouble(remainder) / 1e9 /
                                                                       static_cast<double>(secondsPerDay) /
                                                                       monthLength;
    if (backwards) {
        difference.months = -difference.months;
    }
    PartsAccess::negative(difference.parts) = backwards;
    PartsAccess::years(difference.parts) = static_cast<std::uint64_t>(years);
    PartsAccess::months(difference.parts) = static_cast<std::uint64_t>(months);
    setExactParts(difference.parts, remainder);
    return difference;
}

} // namespace

Outcome<Difference> diffParts(const TimeCount& first, const TimeCount& second, bool byCalendar) {
    const bool backwards = first < second;
    if (first == second) {
        return Difference();
    }
    if (!byCalendar) {
        return differenceOf(0, 0, second, first, backwards);
    }
    const CivilDate to = civilFromDays(first.days);
    return walkYears(second, first, to).andThen([&](const Walk& years) {
        return walkMonths(years.at, first, to).andThen([&](const Walk& months) {
            return differenceOf(std::abs(years.steps), std::abs(months.steps), months.at, first, backwards);
        });
    });
}

} // namespace kvt::ex::datetime::detail
