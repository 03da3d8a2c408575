// A calendar date of old, for hosts that still use it.
//
// The calendar is that of Boost.DateTime, whose date this class holds: the proleptic Gregorian one from the year 1400
// on, counted in days, with three special values beside the dates: not-a-date-time and two infinities. Bounds and
// words of failures are those of the Boost that the library was built with. New code uses <kvt/datetime/datetime.h>.
//
// A date is checked where it is built from parts, and nowhere after that. Arithmetic is on the bare day number, an
// unsigned number of 32 bits that wraps: it may leave the calendar, and then year(), month(), dayOfMonth(), day() and
// asString() fail, with bad_year unless it is tens of thousands of years away, where a number may even look like a
// date. Arithmetic may also end at one of the special numbers, which nothing else reaches: 0xFFFFFFFE is
// not-a-date-time, 0xFFFFFFFF the positive infinity and 0 the negative one. A special value stays what it is under all
// arithmetic, and has no year, month or day: asking for them throws bad_year.
//
// Failures are the classes of <boost/date_time/gregorian/greg_{day,month,year,day_of_year}.hpp>, each derived from
// std::out_of_range; a host needs those headers only to distinguish the classes.
//
// An object belongs to one thread at a time, const access included: asString() keeps its text in the object.
#pragma once

#include <kvt/foundation/export.h>

#include <ctime>
#include <memory>
#include <string>

namespace kvt::ex::detail {
struct ObsoleteDateImpl;
}

class KVT_EXPORT ObsoleteDate {
public:
    /// Today in the zone of the machine. Throws std::runtime_error "could not convert calendar time to local time"
    /// when the system does not know it.
    ObsoleteDate();
    /// The date of `t`, which is not null: `tm_year` + 1900, `tm_mon` + 1 and `tm_mday`, each taken and checked as
    /// the three parts below are. The other fields are not looked at.
    explicit ObsoleteDate(std::tm* t);
    /// The day of a year, from 1. Of `year` the low 16 bits count. Throws boost::gregorian::bad_year for a year
    /// outside the calendar, bad_month when the year has fewer days, bad_day_of_month for day 0.
    ObsoleteDate(unsigned int dayOfYear, unsigned int year);
    /// Day, month and year, in this order. Of each the low 16 bits count: day 65537 is day 1. Throws, checking in the
    /// order of the parameters, boost::gregorian::bad_day_of_month for a day outside 1 to 31, bad_month for a month
    /// outside 1 to 12, bad_year for a year outside the calendar; then bad_day_of_month for a day that the month does
    /// not have.
    ObsoleteDate(unsigned int day, unsigned int month, unsigned int year);
    /// Copies the date and the text of the last asString().
    ObsoleteDate(const ObsoleteDate& other);
    /// Copies the date and the text of the last asString().
    ObsoleteDate& operator=(const ObsoleteDate& other);
    ~ObsoleteDate();

    /// The year. Throws boost::gregorian::bad_year, bad_month or bad_day_of_month where the day number is not one of
    /// the calendar.
    unsigned int year() const;
    /// The month, from 1. Fails as year() does.
    unsigned int month() const;
    /// The day of the month, from 1. Fails as year() does.
    unsigned int dayOfMonth() const;
    /// The day of the year, from 1, and not the day of the month. Fails as year() does, and with
    /// boost::gregorian::bad_day_of_year for a day number far beyond the calendar that looks like a date all the same.
    unsigned int day() const;
    /// Whether this is anything but not-a-date-time. The infinities count as valid, and so do day numbers that the
    /// calendar does not have.
    bool isValid() const;

    /// The date `days` days later, with no text. Of `days` the low 32 bits count, and the sum wraps at 32 bits, so
    /// that 4294967295 is one day back. Special values stay.
    ObsoleteDate operator+(unsigned long days) const;
    /// The days from `other` to this date, as an unsigned number of 32 bits: where this date is the earlier one, it
    /// is 4294967296 less their distance. Where one of the two is special, so is the difference, which comes out as
    /// the day number of that special value.
    unsigned long operator-(const ObsoleteDate& other) const;
    /// Moves this date to the next day and returns it. Special values stay. The text stays.
    ObsoleteDate& operator++();
    /// Moves this date to the day before and returns it. Special values stay. The text stays.
    ObsoleteDate& operator--();
    /// Moves this date to the next day and returns a copy of what it was. Special values stay. The text stays.
    ObsoleteDate operator++(int);
    /// Moves this date to the day before and returns a copy of what it was. Special values stay. The text stays.
    ObsoleteDate operator--(int);

    /// The comparisons are those of the day numbers: not-a-date-time equals itself and stands above every date, below
    /// the positive infinity; the negative infinity stands below every date.
    bool operator==(const ObsoleteDate& other) const;
    /// By day number, as all of them.
    bool operator<(const ObsoleteDate& other) const;
    /// By day number, as all of them.
    bool operator<=(const ObsoleteDate& other) const;
    /// By day number, as all of them.
    bool operator>(const ObsoleteDate& other) const;
    /// By day number, as all of them.
    bool operator>=(const ObsoleteDate& other) const;

    /// The date as the global C++ locale writes dates: asString("%x").
    std::string asString() const {
        const char* text = nullptr;
        unsigned long long length = 0;
        asString(text, length);
        return std::string(text, length);
    }
    /// The date by a zero-terminated `format` of std::strftime, in the narrow encoding of the global C++ locale. The
    /// special values read "not-a-date-time", "-infinity" and "+infinity" whatever the format. Fails as year() does.
    std::string asString(const char* format) const {
        const char* text = nullptr;
        unsigned long long length = 0;
        asString(format, text, length);
        return std::string(text, length);
    }

private:
    // The two that the wrappers above stand on. `out` gets the text, which this object keeps until its next text or
    // its end, and `length` the chars in it without the terminating zero. Where they throw, all stays as it was.
    void asString(const char*& out, unsigned long long& length) const;
    void asString(const char* format, const char*& out, unsigned long long& length) const;

    std::unique_ptr<kvt::ex::detail::ObsoleteDateImpl> impl_;
};
