// The pattern writer: one pass over the format, and a few digits for each flag. Names are English, as in the "C"
// locale.
#include <kvt/datetime/detail/pattern_writer.h>

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/text.h>

#include <array>
#include <cstdlib>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::array<std::string_view, 12> monthNames = {"January", "February", "March",     "April",
                                                         "May",     "June",     "July",      "August",
                                                         "September", "October", "November", "December"};
constexpr std::array<std::string_view, 7> weekdayNames = {"Sunday",   "Monday", "Tuesday", "Wednesday",
                                                          "Thursday", "Friday", "Saturday"};
constexpr std::size_t shortNameLength = 3;
constexpr std::int64_t daysPerWeek = 7;

/// A wall clock in the numbers that flags show.
struct Fields {
    explicit Fields(const NanoCount& count) {
        const FloorQuotient days = floorDivide(count, nanosPerDay);
        date = civilFromDays(days.quotient);
        yearDay = days.quotient - daysFromCivil(date.year, 1, 1);
        // 1970-01-01 was a Thursday.
        weekday = ((days.quotient + 4) % daysPerWeek + daysPerWeek) % daysPerWeek;
        const std::int64_t seconds = days.remainder / nanosPerSecond;
        nanosecond = static_cast<std::uint64_t>(days.remainder % nanosPerSecond);
        hour = static_cast<unsigned>(seconds / secondsPerHour);
        minute = static_cast<unsigned>(seconds / secondsPerMinute % 60);
        second = static_cast<unsigned>(seconds % secondsPerMinute);
    }

    CivilDate date{};
    std::int64_t yearDay;  ///< from 0
    std::int64_t weekday;  ///< 0 is Sunday
    unsigned hour;
    unsigned minute;
    unsigned second;
    std::uint64_t nanosecond;
};

class PatternWriter {
public:
    PatternWriter(std::string_view format, const NanoCount& count, std::optional<std::int32_t> offsetMinutes)
        : format_(format), count_(count), offsetMinutes_(offsetMinutes), fields_(count) {}

    Outcome<std::string> run() {
        out_.reserve(format_.size() + 32);
        for (std::size_t i = 0; i < format_.size(); ++i) {
            if (format_[i] != '%' || i + 1 == format_.size()) {
                out_ += format_[i];
                continue;
            }
            const bool isModified = format_[++i] == 'E' && i + 1 < format_.size();
            i += isModified ? 1 : 0;
            write(format_[i], isModified);
            if (failure_) {
                return *failure_;
            }
        }
        if (hasEpoch_ && hasOffset_) {
            return FormatStringBadCombo{"%s", "%z"};
        }
        return std::move(out_);
    }

private:
    void write(char flag, bool isModified) {
        const auto month = monthNames[fields_.date.month - 1];
        const auto weekday = weekdayNames[static_cast<std::size_t>(fields_.weekday)];
        switch (flag) {
        case 'Y':
            return number(fields_.date.year, 4);
        case 'y':
            return number(fields_.date.year % 100, 2);
        case 'm':
            return number(fields_.date.month, 2);
        case 'N':
            return number(fields_.date.month, 1);
        case 'b':
            return text(month.substr(0, shortNameLength));
        case 'B':
            return text(month);
        case 'd':
            return number(fields_.date.day, 2);
        case 'e':
            return number(fields_.date.day, 1);
        case 'j':
            return number(fields_.yearDay + 1, 3);
        case 'a':
            return text(weekday.substr(0, shortNameLength));
        case 'A':
            return text(weekday);
        case 'u':
            return number(fields_.weekday == 0 ? daysPerWeek : fields_.weekday, 1);
        case 'w':
            return number(fields_.weekday, 1);
        case 'U':
            return number((fields_.yearDay + daysPerWeek - fields_.weekday) / daysPerWeek, 2);
        case 'W':
            return number((fields_.yearDay + daysPerWeek - (fields_.weekday + 6) % daysPerWeek) / daysPerWeek, 2);
        default:
            return writeTimeFlag(flag, isModified);
        }
    }

    void writeTimeFlag(char flag, bool isModified) {
        switch (flag) {
        case 'H':
            return number(fields_.hour, 2);
        case 'k':
            return number(fields_.hour, 1);
        case 'I':
            return number(hourOfHalfDay(), 2);
        case 'l':
            return number(hourOfHalfDay(), 1);
        case 'p':
            return text(fields_.hour < 12 ? "AM" : "PM");
        case 'M':
            return number(fields_.minute, 2);
        case 'S':
            return secondsWithFraction();
        case 'T':
            number(fields_.hour, 2);
            text(":");
            number(fields_.minute, 2);
            text(":");
            return secondsWithFraction();
        case 's':
            return epochSeconds(isModified);
        case 'z':
            return offset(isModified);
        default:
            out_ += flag; // "%%"
        }
    }

    unsigned hourOfHalfDay() const { return fields_.hour % 12 == 0 ? 12 : fields_.hour % 12; }

    void text(std::string_view characters) { out_ += characters; }

    void number(std::int64_t value, unsigned width) {
        TextBuffer digits;
        digits.putNumber(static_cast<std::uint64_t>(value), width);
        out_ += digits.view();
    }

    void secondsWithFraction() {
        TextBuffer digits;
        digits.putNumber(fields_.second, 2);
        digits.putFraction(fields_.nanosecond);
        out_ += digits.view();
    }

    // From UTC, or with `isLocal` from the wall clock as it stands.
    void epochSeconds(bool isLocal) {
        if (isLocal == offsetMinutes_.has_value()) {
            failure_ = isLocal ? FormatFlag::EpochWithOffset : FormatFlag::EpochWithoutOffset;
            return;
        }
        hasEpoch_ = true;
        NanoCount count = count_ - NanoCount(std::int64_t{offsetMinutes_.value_or(0)} * nanosPerMinute);
        TextBuffer digits;
        if (count < 0) {
            digits.put('-');
            count = -count;
        }
        const FloorQuotient seconds = floorDivide(count, nanosPerSecond);
        digits.putNumber(static_cast<std::uint64_t>(seconds.quotient));
        digits.putFraction(static_cast<std::uint64_t>(seconds.remainder));
        out_ += digits.view();
    }

    void offset(bool zeroIsZ) {
        if (!offsetMinutes_) {
            failure_ = FormatFlag::OffsetMissing;
            return;
        }
        hasOffset_ = true;
        if (zeroIsZ && *offsetMinutes_ == 0) {
            out_ += 'Z';
            return;
        }
        TextBuffer digits;
        writeOffset(digits, *offsetMinutes_);
        out_ += digits.view();
    }

    std::string_view format_;
    NanoCount count_;
    std::optional<std::int32_t> offsetMinutes_;
    Fields fields_;
    std::string out_;
    std::optional<FormatFlag> failure_;
    bool hasEpoch_ = false;
    bool hasOffset_ = false;
};

} // namespace

Outcome<std::string> renderFields(std::string_view format, const NanoCount& count,
                                  std::optional<std::int32_t> offsetMinutes) {
    return PatternWriter(format, count, offsetMinutes).run();
}

} // namespace kvt::ex::datetime::detail
