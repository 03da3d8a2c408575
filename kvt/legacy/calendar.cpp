// Dates from parts and from the clock, for both classes of the old calendar.
#include <kvt/legacy/detail/calendar.h>
#include <kvt/platform/clock.h>

#include <stdexcept>

namespace kvt::ex::detail {

std::tm localNow() {
    std::tm now{};
    if (!platform::localTime(now)) {
        throw std::runtime_error("could not convert calendar time to local time");
    }
    return now;
}

boost::gregorian::date dateOf(unsigned int day, unsigned int month, unsigned int year) {
    // One by one, so that the order in which they are checked is not the compiler's choice.
    const boost::gregorian::greg_day ofMonth(static_cast<unsigned short>(day));
    const boost::gregorian::greg_month ofYear(static_cast<unsigned short>(month));
    const boost::gregorian::greg_year inCalendar(static_cast<unsigned short>(year));
    return {inCalendar, ofYear, ofMonth};
}

boost::gregorian::date dateOf(const std::tm& time) {
    // As Boost's date_from_tm, whose additions overflow at the largest `int`; these wrap, to the same 16 bits.
    return dateOf(static_cast<unsigned int>(time.tm_mday), static_cast<unsigned int>(time.tm_mon) + 1U,
                  static_cast<unsigned int>(time.tm_year) + 1900U);
}

} // namespace kvt::ex::detail
