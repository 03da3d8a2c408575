// Days and dates, for any year of 64 bits that a sum may reach.
#include <kvt/datetime/detail/calendar.h>

#include <date/date.h>

namespace kvt::ex::datetime::detail {

namespace {

// The `date` library holds a year in 16 bits and days in 32, which suffice for all that the library writes but not for
// every sum. The calendar repeats itself after 400 years, so whole cycles are taken out of what goes beyond.
constexpr std::int64_t yearsPerCycle = 400;
constexpr std::int64_t daysPerCycle = 146'097;

constexpr bool isYearOfDate(std::int64_t year) noexcept {
    return year > -32'000 && year < 32'000;
}
constexpr bool areDaysOfDate(std::int64_t days) noexcept {
    return days > -11'000'000 && days < 11'000'000;
}

constexpr std::int64_t floorOf(std::int64_t number, std::int64_t divisor) noexcept {
    return number / divisor - (number % divisor < 0 ? 1 : 0);
}

std::int64_t daysOf(int year, unsigned month, unsigned day) noexcept {
    const date::year_month_day date{date::year(year), date::month(month), date::day(day)};
    return date::sys_days(date).time_since_epoch().count();
}

CivilDate dateOf(int days) noexcept {
    const date::year_month_day date{date::sys_days(date::days(days))};
    return {static_cast<int>(date.year()), static_cast<unsigned>(date.month()),
            static_cast<unsigned>(date.day())};
}

} // namespace

std::int64_t daysFromCivil(std::int64_t year, unsigned month, unsigned day) noexcept {
    if (isYearOfDate(year)) {
        return daysOf(static_cast<int>(year), month, day);
    }
    const std::int64_t cycles = floorOf(year, yearsPerCycle);
    return daysOf(static_cast<int>(year - cycles * yearsPerCycle), month, day) + cycles * daysPerCycle;
}

CivilDate civilFromDays(std::int64_t days) noexcept {
    if (areDaysOfDate(days)) {
        return dateOf(static_cast<int>(days));
    }
    const std::int64_t cycles = floorOf(days, daysPerCycle);
    CivilDate date = dateOf(static_cast<int>(days - cycles * daysPerCycle));
    date.year += cycles * yearsPerCycle;
    return date;
}

bool isLeapYear(std::int64_t year) noexcept {
    return date::year(static_cast<int>(year - floorOf(year, yearsPerCycle) * yearsPerCycle)).is_leap();
}

std::string_view lastDayText(unsigned lastDay) noexcept {
    static constexpr std::string_view texts[] = {"28", "29", "30", "31"};
    return texts[lastDay - 28];
}

} // namespace kvt::ex::datetime::detail
