// Days and dates, for any year of 64 bits that a sum may reach.
#include <kvt/datetime/detail/calendar.h>

#include <date/date.h>

#include <iterator>

namespace kvt::ex::datetime::detail {

namespace {

// The calendar repeats itself after 400 years. The `date` library holds a year in 16 bits and days in 32, which
// suffice for all that the library writes but not for every sum; whole cycles are taken out first.
constexpr std::int64_t yearsPerCycle = 400;
constexpr std::int64_t daysPerCycle = 146'097;

constexpr std::int64_t floorOf(std::int64_t number, std::int64_t divisor) noexcept {
    return number / divisor - (number % divisor < 0 ? 1 : 0);
}

} // namespace

std::int64_t daysFromCivil(std::int64_t year, unsigned month, unsigned day) noexcept {
    const std::int64_t cycles = floorOf(year, yearsPerCycle);
    const date::year_month_day date(date::year(static_cast<int>(year - cycles * yearsPerCycle)),
                                    date::month(month), date::day(day));
    return date::sys_days(date).time_since_epoch().count() + cycles * daysPerCycle;
}

CivilDate civilFromDays(std::int64_t days) noexcept {
    const std::int64_t cycles = floorOf(days, daysPerCycle);
    const date::year_month_day date(
        date::sys_days(date::days(static_cast<int>(days - cycles * daysPerCycle))));
    return {static_cast<int>(date.year()) + cycles * yearsPerCycle, static_cast<unsigned>(date.month()),
            static_cast<unsigned>(date.day())};
}

unsigned lastDayOfMonth(std::int64_t year, unsigned month) noexcept {
    constexpr unsigned lengths[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    if (month - 1 >= std::size(lengths)) {
        return 29;
    }
    const auto inCycle = static_cast<int>(year - floorOf(year, yearsPerCycle) * yearsPerCycle);
    return month == 2 && date::year(inCycle).is_leap() ? 29 : lengths[month - 1];
}

std::string_view lastDayText(unsigned lastDay) noexcept {
    constexpr std::string_view texts[] = {"28", "29", "30", "31"};
    return texts[lastDay - 28];
}

} // namespace kvt::ex::datetime::detail
