// The pattern writer: one pass over the format, and a few digits for each flag. Names are English, as in the "C"
// locale.
#include <kvt/datetime/detail/pattern_writer.h>

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/text.h>

#include <algorithm>
#include <array>
#include <cstring>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::array<std::string_view, 12> monthNames = {"January",   "February", "March",    "April",
                                                         "May",       "June",     "July",     "August",
                                                         "September", "October",  "November", "December"};
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
    std::int64_t yearDay; ///< from 0
    std::int64_t weekday; ///< 0 is Sunday
    unsigned hour;
    unsigned minute;
    unsigned second;
    std::uint64_t nanosecond;
};

class PatternWriter {
public:
    PatternWriter(PatternText& out, const NanoCount& count, std::optional<std::int32_t> offsetMinutes)
        : out_(out), count_(count), offsetMinutes_(offsetMinutes), fields_(count) {}

    std::optional<Failure> run(std::string_view format) {
        while (!format.empty()) {
            const std::size_t literal = std::min(format.find('%'), format.size());
            out_.put(format.substr(0, literal));
            format.remove_prefix(literal);
            if (format.size() < 2) {
                out_.put(format);
                break;
            }
            const bool isModified = format[1] == 'E' && format.size() > 2;
            write(format[isModified ? 2 : 1], isModified);
            if (failure_) {
                return *failure_;
            }
            format.remove_prefix(isModified ? 3 : 2);
        }
        if (hasEpoch_ && hasOffset_) {
            return FormatStringBadCombo{"%s", "%z"};
        }
        return std::nullopt;
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
            return number((fields_.yearDay + daysPerWeek - (fields_.weekday + 6) % daysPerWeek) / daysPerWeek,
                          2);
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
            out_.put(flag); // "%%"
        }
    }

    unsigned hourOfHalfDay() const { return fields_.hour % 12 == 0 ? 12 : fields_.hour % 12; }

    void text(std::string_view characters) { out_.put(characters); }

    void number(std::int64_t value, unsigned width) {
        out_.putNumber(static_cast<std::uint64_t>(value), width);
    }

    void secondsWithFraction() {
        out_.putNumber(fields_.second, 2);
        if (fields_.nanosecond != 0) {
            TextBuffer digits;
            digits.putFraction(fields_.nanosecond);
            out_.put(digits.view());
        }
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
        out_.put(digits.view());
    }

    void offset(bool zeroIsZ) {
        if (!offsetMinutes_) {
            failure_ = FormatFlag::OffsetMissing;
            return;
        }
        hasOffset_ = true;
        if (zeroIsZ && *offsetMinutes_ == 0) {
            out_.put('Z');
            return;
        }
        TextBuffer digits;
        writeOffset(digits, *offsetMinutes_);
        out_.put(digits.view());
    }

    PatternText& out_;
    NanoCount count_;
    std::optional<std::int32_t> offsetMinutes_;
    Fields fields_;
    std::optional<FormatFlag> failure_;
    bool hasEpoch_ = false;
    bool hasOffset_ = false;
};

} // namespace

void PatternText::put(std::string_view text) {
    if (long_.empty() && size_ + text.size() <= short_.size()) {
        std::memcpy(short_.data() + size_, text.data(), text.size());
        size_ += text.size();
        return;
    }
    if (long_.empty()) {
        long_.assign(short_.data(), size_);
    }
    long_ += text;
}

void PatternText::putNumber(std::uint64_t number, unsigned width) {
    std::array<char, 20> digits;
    std::size_t first = digits.size();
    do {
        digits[--first] = static_cast<char>('0' + number % 10);
        number /= 10;
    } while (number != 0);
    while (digits.size() - first < width) {
        digits[--first] = '0';
    }
    put({digits.data() + first, digits.size() - first});
}

std::optional<Failure> renderFields(PatternText& out, std::string_view format, const NanoCount& count,
                                    std::optional<std::int32_t> offsetMinutes) {
    return PatternWriter(out, count, offsetMinutes).run(format);
}

} // namespace kvt::ex::datetime::detail
