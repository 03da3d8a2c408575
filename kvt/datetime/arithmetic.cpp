// The steps behind add and diff: calendar steps on years, months and days, exact steps on the count.

#include <kvt/datetime/detail/arithmetic.h>
#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/parts_access.h>

#include <algorithm>

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

// The date with months added; the day is cut to the length of the month reached.
CivilDate plusMonths(const CivilDate& date, std::int64_t months) noexcept {
    const std::int64_t sum = wrappingSum(months, date.month - 1);
    const std::int64_t carry = sum / 12 - (sum % 12 < 0 ? 1 : 0);
    const std::int64_t year = date.year + carry;
    const auto month = static_cast<unsigned>(sum - carry * 12) + 1;
    return {year, month, std::min(date.day, lastDayOfMonth(year, month))};
}

} // namespace

Outcome<TemporalInstant> addInterval(const TemporalInstant& instant, const IntervalParts& interval) {
    const auto signedPart = [&](std::int64_t magnitude) {
        return interval.negative() ? wrappingNegation(magnitude) : magnitude;
    };
    const FloorQuotient days = floorDivide(instant.count, nanosPerDay);
    CivilDate date = civilFromDays(days.quotient);
    const Outcome<std::int64_t> checked = checkCalendarDate(date.year, date.month, date.day, false);
    if (!checked) {
        return checked.failure();
    }
    date.year = static_cast<std::int16_t>(wrappingSum(date.year, signedPart(interval.years())));
    date = plusMonths(date, signedPart(interval.months()));

    const std::int64_t dayNumber =
        wrappingSum(daysFromCivil(date.year, date.month, date.day), signedPart(interval.days()));
    std::int64_t seconds = wrappingSum(wrappingProduct(dayNumber, 24), signedPart(interval.hours()));
    seconds = wrappingProduct(seconds, secondsPerHour);
    seconds = wrappingSum(seconds, wrappingProduct(signedPart(interval.minutes()), secondsPerMinute));
    seconds = wrappingSum(seconds, signedPart(interval.seconds()));
    // The time of day of the instant joins as the nanoseconds that it is.
    return TemporalInstant{nanosOf(seconds, days.remainder) + signedPart(interval.nanoseconds()),
                           instant.offsetMinutes};
}

// ---- Difference

namespace {

struct Walk {
    TemporalInstant at;  ///< how far the steps have come
    std::int64_t steps;  ///< how many of them, without sign
};

// Steps of one unit from `start` towards `target`, `count` or, if those pass it, one fewer.
Outcome<Walk> walkTowards(const TemporalInstant& start, const NanoCount& target, std::int64_t count, bool backwards,
                          std::uint64_t& (*unit)(IntervalParts&)) {
    if (count == 0) {
        return Walk{start, 0};
    }
    IntervalParts step;
    PartsAccess::negative(step) = backwards;
    for (const std::int64_t steps : {count, count - 1}) {
        unit(step) = static_cast<std::uint64_t>(steps);
        const Outcome<TemporalInstant> reached = addInterval(start, step);
        if (!reached) {
            return reached.failure();
        }
        const bool passed = backwards ? reached->count < target : reached->count > target;
        if (!passed || steps == count - 1) {
            return Walk{*reached, steps};
        }
    }
    return Unexpected{};
}

CivilDate dateOf(const NanoCount& count) {
    return civilFromDays(floorDivide(count, nanosPerDay).quotient);
}

// Sets days to nanoseconds.
void setExactParts(IntervalParts& parts, const NanoCount& length) {
    const FloorQuotient days = floorDivide(length, nanosPerDay);
    const auto rest = static_cast<std::uint64_t>(days.remainder);
    const std::uint64_t seconds = rest / nanosPerSecond;
    PartsAccess::days(parts) = static_cast<std::uint64_t>(days.quotient);
    PartsAccess::hours(parts) = seconds / secondsPerHour;
    PartsAccess::minutes(parts) = seconds % secondsPerHour / secondsPerMinute;
    PartsAccess::seconds(parts) = seconds % secondsPerMinute;
    PartsAccess::nanoseconds(parts) = rest % nanosPerSecond;
}

} // namespace

Outcome<Difference> diffParts(const CanonicalRecord& first, const CanonicalRecord& second) {
    const Outcome<TemporalInstant> firstInstant = instantFromRecord(first, true);
    if (!firstInstant) {
        return firstInstant.failure();
    }
    const Outcome<TemporalInstant> secondInstant = instantFromRecord(second, true);
    if (!secondInstant) {
        return secondInstant.failure();
    }
    const NanoCount target = utcCount(*firstInstant);
    TemporalInstant cursor = {utcCount(*secondInstant), std::nullopt};
    Difference difference;
    if (target == cursor.count) {
        return difference;
    }
    const bool backwards = target < cursor.count;
    PartsAccess::negative(difference.parts) = backwards;

    std::int64_t years = 0;
    std::int64_t months = 0;
    const CivilDate targetDate = dateOf(target);
    if (!isTimeKind(second.type)) {
        const std::int64_t yearsApart = targetDate.year - dateOf(cursor.count).year;
        const Outcome<Walk> byYears =
            walkTowards(cursor, target, yearsApart < 0 ? -yearsApart : yearsApart, backwards, PartsAccess::years);
        if (!byYears) {
            return byYears.failure();
        }
        cursor = byYears->at;
        years = byYears->steps;

        const CivilDate cursorDate = dateOf(cursor.count);
        std::int64_t monthsApart = std::int64_t{targetDate.month} - std::int64_t{cursorDate.month};
        if (targetDate.year != cursorDate.year) {
            monthsApart += targetDate.year > cursorDate.year ? 12 : -12;
        }
        const Outcome<Walk> byMonths = walkTowards(cursor, target, monthsApart < 0 ? -monthsApart : monthsApart,
                                                   backwards, PartsAccess::months);
        if (!byMonths) {
            return byMonths.failure();
        }
        cursor = byMonths->at;
        months = byMonths->steps;
    }

    const NanoCount remainder = backwards ? NanoCount(cursor.count - target) : NanoCount(target - cursor.count);
    const CivilDate earlier = backwards ? targetDate : dateOf(cursor.count);
    const auto monthLength = static_cast<double>(lastDayOfMonth(earlier.year, earlier.month));
    difference.months = static_cast<double>(years * 12 + months) +
                        toDouble(remainder) / 1e9 / static_cast<double>(secondsPerDay) / monthLength;
    if (backwards) {
        difference.months = -difference.months;
    }
    PartsAccess::years(difference.parts) = static_cast<std::uint64_t>(years);
    PartsAccess::months(difference.parts) = static_cast<std::uint64_t>(months);
    setExactParts(difference.parts, remainder);
    return difference;
}

} // namespace kvt::ex::datetime::detail
