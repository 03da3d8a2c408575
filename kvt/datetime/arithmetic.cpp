// The steps behind add and diff: calendar steps on years, months and days, exact steps on the count.

#include <kvt/datetime/detail/arithmetic.h>
#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/parts_access.h>
#include <kvt/datetime/detail/wall_clock.h>

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
    std::int64_t year = static_cast<std::int16_t>(wrappingSum(date.year, years));
    unsigned month = date.month;
    if (months != 0) {
        const std::int64_t sum = wrappingSum(months, month - 1);
        const std::int64_t carry = sum / 12 - (sum % 12 < 0 ? 1 : 0);
        year += carry;
        month = static_cast<unsigned>(sum - carry * 12) + 1;
    }
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

// The way from one clock to another, in steps of years and then of months, neither of which goes past the end.
struct Walk {
    WallClock at;
    const WallClock& target;
    bool backwards;
};

// A step by the calendar: the date so many years or months after another, before it where they are negative.
using CalendarStep = CivilDate (*)(const CivilDate&, std::int64_t);

CivilDate dateAfterYears(const CivilDate& date, std::int64_t years) noexcept {
    return dateAfter(date, years, 0);
}

CivilDate dateAfterMonths(const CivilDate& date, std::int64_t months) noexcept {
    return dateAfter(date, 0, months);
}

// Goes so many steps of one kind or, if those pass the target, one fewer. How many it were, without their sign; none
// where they would begin in a year that is out of range.
template <CalendarStep stepped>
std::optional<std::int64_t> go(Walk& walk, std::int64_t steps) noexcept {
    if (steps == 0) {
        return 0;
    }
    const CivilDate start = walk.at.date;
    if (!isInRange(start)) {
        return std::nullopt;
    }
    walk.at.date = stepped(start, steps);
    if (walk.backwards ? walk.at < walk.target : walk.target < walk.at) {
        steps += walk.backwards ? 1 : -1;
        walk.at.date = steps == 0 ? start : stepped(start, steps);
    }
    return std::abs(steps);
}

std::optional<std::int64_t> goYears(Walk& walk) noexcept {
    return go<dateAfterYears>(walk, walk.target.date.year - walk.at.date.year);
}

std::optional<std::int64_t> goMonths(Walk& walk) noexcept {
    const CivilDate& from = walk.at.date;
    const CivilDate& to = walk.target.date;
    std::int64_t apart = std::int64_t{to.month} - std::int64_t{from.month};
    if (to.year != from.year) {
        apart += to.year > from.year ? 12 : -12;
    }
    return go<dateAfterMonths>(walk, apart);
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

void setUtcClock(WallClock& clock, const CanonicalRecord& record) noexcept {
    const DateTimeFields& fields = record.fields;
    const std::int32_t offset = hasOffset(record.type) ? record.offset.minutes : 0;
    const std::int64_t nanoseconds = nanosecondsOfDay(fields) - offset * nanosPerMinute;
    if (nanoseconds >= 0 && nanoseconds < nanosPerDay) {
        clock.date = {fields.year, static_cast<unsigned>(fields.month), static_cast<unsigned>(fields.day)};
        clock.nanoseconds = nanoseconds;
    } else {
        const TimeCount count = plusMinutes(countOf(fields), -offset);
        clock.date = civilFromDays(count.days);
        clock.nanoseconds = count.nanoseconds;
    }
}

Outcome<Difference> diffParts(const WallClock& first, const WallClock& second, bool byCalendar) {
    Outcome<Difference> outcome;
    if (first == second) {
        return outcome;
    }
    Difference& difference =
        *outcome; // made in its place: a copy of what was just written has to wait for it
    difference.backwards = first < second;
    Walk walk = {second, first, difference.backwards};
    if (byCalendar) {
        const std::optional<std::int64_t> years = goYears(walk);
        const std::optional<std::int64_t> months = years ? goMonths(walk) : std::nullopt;
        if (!months) {
            outcome = yearOutOfRange(walk.at.date.year);
            return outcome;
        }
        difference.years = *years;
        difference.months = *months;
    }
    difference.rest = difference.backwards ? walk.at - first : first - walk.at;
    difference.earlier = difference.backwards ? first.date : walk.at.date;
    return outcome;
}

} // namespace kvt::ex::datetime::detail
