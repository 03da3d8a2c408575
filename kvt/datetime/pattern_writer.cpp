// The pattern writer: one pass over the format, in which each flag is checked and written by its row in the table.
// Names are English, as in the "C" locale.
#include <kvt/datetime/detail/pattern_writer.h>

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/nano_count.h>
#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/pattern_table.h>
#include <kvt/datetime/detail/text.h>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::int64_t daysPerWeek = 7;

class PatternWriter {
public:
    PatternWriter(TextBuffer& out, TemporalType kind, const DateTimeFields& fields,
                  std::int32_t offsetMinutes)
        : out_(out), kind_(kind), fields_(fields), offsetMinutes_(offsetMinutes) {}

    WrittenPattern run(std::string_view format) {
        const char* next = format.data();
        const char* const end = next + format.size();
        while (next != end) {
            if (*next != '%') {
                out_.put(*next++);
                continue;
            }
            const bool isModified = end - next > 1 && next[1] == 'E';
            const std::ptrdiff_t length = isModified ? 3 : 2;
            const PatternRow* const row =
                end - next >= length ? rowOfFlag(next[length - 1], isModified) : nullptr;
            if (row == nullptr || row->writes.writing == Writing::Unknown || !row->writes.kinds.has(kind_)) {
                return WrittenPattern::WrongFlag;
            }
            write(row->writes);
            next += length;
        }
        return hasEpoch_ && hasOffset_ ? WrittenPattern::EpochBesideOffset : WrittenPattern::Whole;
    }

private:
    void write(const WriteRule& rule) {
        switch (rule.writing) {
        case Writing::Year:
            return number(fields_.year, rule.width);
        case Writing::YearOfCentury:
            return number(fields_.year % 100, rule.width);
        case Writing::Month:
            return number(fields_.month, rule.width);
        case Writing::ShortMonth:
            return out_.put(monthName().substr(0, shortNameLength));
        case Writing::FullMonth:
            return out_.put(monthName());
        case Writing::Day:
            return number(fields_.day, rule.width);
        case Writing::YearDay:
            return number(yearDay() + 1, rule.width);
        case Writing::ShortWeekday:
            return out_.put(weekdayName().substr(0, shortNameLength));
        case Writing::FullWeekday:
            return out_.put(weekdayName());
        case Writing::WeekdayFromMonday:
            return number(weekday() == 0 ? daysPerWeek : weekday(), rule.width);
        case Writing::WeekdayFromSunday:
            return number(weekday(), rule.width);
        case Writing::WeekFromSunday:
            return number((yearDay() + daysPerWeek - weekday()) / daysPerWeek, rule.width);
        case Writing::WeekFromMonday:
            return number((yearDay() + daysPerWeek - (weekday() + 6) % daysPerWeek) / daysPerWeek,
                          rule.width);
        default:
            return writeOfTime(rule);
        }
    }

    void writeOfTime(const WriteRule& rule) {
        switch (rule.writing) {
        case Writing::Hour:
            return number(fields_.hours, rule.width);
        case Writing::HalfDayHour:
            return number(fields_.hours % 12 == 0 ? 12 : fields_.hours % 12, rule.width);
        case Writing::Meridiem:
            return out_.put(fields_.hours < 12 ? "AM" : "PM");
        case Writing::Minute:
            return number(fields_.minutes, rule.width);
        case Writing::Seconds:
            number(fields_.seconds, rule.width);
            return out_.putFraction(static_cast<std::uint64_t>(fields_.nanoseconds));
        case Writing::Time:
            return time();
        case Writing::EpochSeconds:
            return epochSeconds(offsetMinutes_);
        case Writing::LocalEpochSeconds:
            return epochSeconds(0);
        case Writing::Offset:
            return offset(false);
        case Writing::OffsetOrZ:
            return offset(true);
        default:
            out_.put('%');
        }
    }

    // ---- Of the date

    std::int64_t days() const {
        return daysFromCivil(fields_.year, static_cast<unsigned>(fields_.month),
                             static_cast<unsigned>(fields_.day));
    }
    // From 0.
    std::int64_t yearDay() const { return days() - daysFromCivil(fields_.year, 1, 1); }
    // From Sunday, which is 0; 1970-01-01 was a Thursday.
    std::int64_t weekday() const { return ((days() + 4) % daysPerWeek + daysPerWeek) % daysPerWeek; }
    std::string_view monthName() const { return monthNames[fields_.month - 1]; }
    std::string_view weekdayName() const { return weekdayNames[static_cast<std::size_t>(weekday())]; }

    // ---- Of the time

    // As `timeExpansion` says.
    void time() {
        out_.putPair(static_cast<unsigned>(fields_.hours));
        out_.put(':');
        out_.putPair(static_cast<unsigned>(fields_.minutes));
        out_.put(':');
        out_.putPair(static_cast<unsigned>(fields_.seconds));
        out_.putFraction(static_cast<std::uint64_t>(fields_.nanoseconds));
    }

    // The seconds and nanoseconds are of one sign in the text.
    void epochSeconds(std::int64_t offsetMinutes) {
        hasEpoch_ = true;
        std::int64_t seconds = days() * secondsPerDay + fields_.hours * secondsPerHour +
                               (fields_.minutes - offsetMinutes) * secondsPerMinute + fields_.seconds;
        std::int64_t nanoseconds = fields_.nanoseconds;
        if (seconds < 0) {
            out_.put('-');
            seconds = -seconds - (nanoseconds != 0 ? 1 : 0);
            nanoseconds = nanoseconds != 0 ? nanosPerSecond - nanoseconds : 0;
        }
        out_.putNumber(static_cast<std::uint64_t>(seconds));
        out_.putFraction(static_cast<std::uint64_t>(nanoseconds));
    }

    void offset(bool zeroIsZ) {
        hasOffset_ = true;
        if (zeroIsZ && offsetMinutes_ == 0) {
            return out_.put('Z');
        }
        out_.put(offsetOfMinutes(offsetMinutes_)->view());
    }

    void number(std::uint64_t value, unsigned width) {
        width == 2 ? out_.putPair(static_cast<unsigned>(value)) : out_.putNumber(value, width);
    }
    void number(std::int64_t value, unsigned width) { number(static_cast<std::uint64_t>(value), width); }

    TextBuffer& out_;
    TemporalType kind_;
    const DateTimeFields& fields_;
    std::int32_t offsetMinutes_;
    bool hasEpoch_ = false;
    bool hasOffset_ = false;
};

} // namespace

WrittenPattern renderFields(TextBuffer& out, std::string_view format, TemporalType kind,
                            const DateTimeFields& fields, std::int32_t offsetMinutes) {
    return PatternWriter(out, kind, fields, offsetMinutes).run(format);
}

} // namespace kvt::ex::datetime::detail
