// What the tests of the old calendar share.
#pragma once

#include <kvt/legacy/obsolete_date.h>
#include <kvt/legacy/obsolete_time.h>

#include <boost/date_time/gregorian/gregorian.hpp>

#include <gtest/gtest.h>

#include <cstdint>
#include <exception>
#include <string>
#include <tuple>

namespace kvt::test {

inline constexpr unsigned int notADate = 0xFFFFFFFE;
inline constexpr unsigned int positiveInfinity = 0xFFFFFFFF;
inline constexpr unsigned int negativeInfinity = 0;

/// The number of 2000-01-01, the Julian day.
inline constexpr unsigned int numberOf2000 = 2451545;

/// The date of a day number, whether the calendar has it or not.
inline ObsoleteDate dateNumbered(unsigned int number) {
    return ObsoleteDate(1, 1, 2000) + (number - numberOf2000);
}

/// The day number of a date that is not special.
inline unsigned int numberOf(const ObsoleteDate& date) {
    return static_cast<unsigned int>(date - ObsoleteDate(1, 1, 2000)) + numberOf2000;
}

/// Year, month, day of the month, day of the year.
using Parts = std::tuple<unsigned int, unsigned int, unsigned int, unsigned int>;

inline Parts partsOf(const ObsoleteDate& date) {
    return {date.year(), date.month(), date.dayOfMonth(), date.day()};
}

/// The class of what `call` throws, by its name, and the text: "bad_month: ...".
template <typename Call>
std::string failureOf(Call call) {
    const auto named = [](const char* name, const std::exception& failure) {
        return std::string(name) + ": " + failure.what();
    };
    try {
        call();
    } catch (const boost::gregorian::bad_day_of_month& failure) {
        return named("bad_day_of_month", failure);
    } catch (const boost::gregorian::bad_month& failure) {
        return named("bad_month", failure);
    } catch (const boost::gregorian::bad_year& failure) {
        return named("bad_year", failure);
    } catch (const boost::gregorian::bad_day_of_year& failure) {
        return named("bad_day_of_year", failure);
    } catch (const std::out_of_range& failure) {
        return named("out_of_range", failure);
    } catch (const std::runtime_error& failure) {
        return named("runtime_error", failure);
    }
    return "none";
}

/// The failures as the calendar words them. The bounds of the years are those of the installed Boost.
inline const std::string badDay = "bad_day_of_month: Day of month value is out of range 1..31";
inline const std::string badDayOfMonth = "bad_day_of_month: Day of month is not valid for year";
inline const std::string badMonth = "bad_month: Month number is out of range 1..12";
inline const std::string badYear =
    "bad_year: Year is out of valid range: 1400.." + std::to_string((boost::gregorian::greg_year::max)());
inline const std::string badDayOfYear = "bad_day_of_year: Day of year value is out of range 1..366";

} // namespace kvt::test
