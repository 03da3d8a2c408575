// A moment of old, beside ObsoleteDate: a date with a time of day, of no particular zone.
//
// The moment is that of Boost.DateTime, a signed count of microseconds of 64 bits, of which three values are special:
// not-a-date-time and two infinities. What is built here has whole seconds. The interface is smaller than that of
// ObsoleteDate and not as regular: the unit of addition is the second, the two comparisons want objects that are not
// const, and the date cannot be asked for. New code uses <kvt/datetime/datetime.h>.
//
// A moment is checked by its date where it is built, and nowhere after that: arithmetic may leave the calendar, and
// then extract() and asString() throw what ObsoleteDate throws for such a date.
//
// An object belongs to one thread at a time, const access included: asString() keeps its text in the object.
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/legacy/obsolete_date.h>

#include <ctime>
#include <memory>
#include <string>

namespace kvt::ex::detail {
struct ObsoleteTimeImpl;
}

class KVT_EXPORT ObsoleteTime {
public:
    /// Now in the zone of the machine, to the whole second. Throws std::runtime_error "could not convert calendar time
    /// to local time" when the system does not know it.
    ObsoleteTime();
    /// The moment of `t`, which is not null: its date as ObsoleteDate(std::tm*) takes and checks it, and `tm_hour`,
    /// `tm_min` and `tm_sec`, which are not checked: they are added to the date. Where one of the three is negative,
    /// their sizes are taken together and subtracted.
    explicit ObsoleteTime(std::tm* t);
    /// Today in the zone of the machine with this time of day, which is not checked: it is added to the date, so that
    /// 25 hours are 01:00 of the next day and 90 minutes are 01:30. Throws as ObsoleteTime() does.
    ObsoleteTime(unsigned int hours, unsigned int minutes, unsigned int seconds);
    /// `date` with this time of day, which is not checked. The date is: where it is special or not one of the
    /// calendar, this throws what its accessors throw.
    ObsoleteTime(const ObsoleteDate& date, unsigned int hours, unsigned int minutes, unsigned int seconds);
    /// Copies the moment and the text of the last asString().
    ObsoleteTime(const ObsoleteTime& other);
    /// Copies the moment and the text of the last asString().
    ObsoleteTime& operator=(const ObsoleteTime& other);
    ~ObsoleteTime();

    /// The hour of the day, 0 to 23.
    unsigned int hour() const;
    /// The minute of the hour, 0 to 59.
    unsigned int minute() const;
    /// The second of the minute, 0 to 59.
    unsigned int second() const;
    /// Fills `t`, which is not null: date, time of day, day of the week and of the year; `tm_isdst` is -1, unknown.
    /// Throws std::out_of_range "tm unable to handle " with the name of the special value for a special one, and what
    /// ObsoleteDate::year() throws outside the calendar; `t` then stays as it was.
    void extract(std::tm* t) const;
    /// Whether this is anything but not-a-date-time. The infinities count as valid.
    bool isValid() const;

    /// The moment `seconds` seconds later, with no text. The low 32 bits of `seconds` are read as a signed number:
    /// 2147483648 and more go backward, 4294967295 by one second. Special values stay.
    ObsoleteTime operator+(unsigned long seconds) const;
    /// The moment `seconds` seconds earlier, with no text. The number is read as for addition. Special values stay.
    ObsoleteTime operator-(unsigned long seconds) const;

    /// Whether this moment is the earlier one, by the counts of microseconds: not-a-date-time stands above every
    /// moment, below the positive infinity.
    bool operator<(const ObsoleteTime& other);
    /// Whether this moment is the later one, by the counts of microseconds.
    bool operator>(const ObsoleteTime& other);

    /// The moment by a zero-terminated `format` of std::strftime, in the narrow encoding of the global C++ locale, with
    /// Boost's additions: "%f" the microseconds, "%F" the same after a point where there are any, "%s" seconds and
    /// microseconds. The special values read "not-a-date-time", "-infinity" and "+infinity" whatever the format. Throws
    /// what ObsoleteDate::year() throws for a moment outside the calendar.
    std::string asString(const char* format) const {
        const char* text = nullptr;
        unsigned long long length = 0;
        asString(format, text, length);
        return std::string(text, length);
    }

private:
    // What the wrapper above stands on, as in ObsoleteDate.
    void asString(const char* format, const char*& out, unsigned long long& length) const;

    std::unique_ptr<kvt::ex::detail::ObsoleteTimeImpl> impl_;
};
