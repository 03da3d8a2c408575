#include "value_reading.h"

#include <cmath>
#include <cstdlib>

namespace kvt::test {

using namespace kvt::ex::datetime;

std::optional<NaiveOffset> naiveOffset(const std::string& text) {
    if (text.empty() || (text[0] != '+' && text[0] != '-')) {
        return std::nullopt;
    }
    std::string digits = text.substr(1);
    if (digits.size() == 2) {
        digits += "00";
    } else if (digits.size() == 5 && digits[2] == ':') {
        digits.erase(2, 1);
    } else if (digits.size() != 4) {
        return std::nullopt;
    }
    if (digits.find_first_not_of("0123456789") != std::string::npos || std::stoi(digits) > 9959) {
        return std::nullopt;
    }
    const int minutes = std::stoi(digits.substr(0, 2)) * 60 + std::stoi(digits.substr(2));
    return NaiveOffset{text[0] == '-' ? -minutes : minutes,
                       text[0] + digits.substr(0, 2) + ":" + digits.substr(2)};
}

std::string naiveOffsetText(int minutes) {
    char text[16];
    std::snprintf(text, sizeof text, "%c%02d:%02d", minutes < 0 ? '-' : '+', std::abs(minutes) / 60,
                  std::abs(minutes) % 60);
    return text;
}

std::string naiveTrimmed(const std::string& text) {
    constexpr const char* blanks = " \t\r\n\f\v";
    const std::size_t first = text.find_first_not_of(blanks);
    return first == std::string::npos ? "" : text.substr(first, text.find_last_not_of(blanks) + 1 - first);
}

Int128 NaiveValue::utc() const {
    return offset ? count - offset->minutes * naiveMinute : count;
}

TemporalType NaiveValue::kind() const {
    if (!hasTime) {
        return TemporalType::Date;
    }
    if (!hasDate) {
        return offset ? TemporalType::TimeWithOffset : TemporalType::Time;
    }
    return offset ? TemporalType::DatetimeWithOffset : TemporalType::Datetime;
}

std::optional<Answer> naiveRangeOfTime(const NaiveDateTime& at) {
    if (at.hours > 23) {
        return outOfRange(std::to_string(at.hours), "hours", "0", "23");
    }
    if (at.minutes > 59) {
        return outOfRange(std::to_string(at.minutes), "minutes", "0", "59");
    }
    if (at.seconds > 59) {
        return outOfRange(std::to_string(at.seconds), "seconds", "0", "59.999999999");
    }
    return std::nullopt;
}

Answer naiveYearOutOfRange(std::int64_t year) {
    return outOfRange(std::to_string(year), "year", "1000", "9999");
}

std::optional<Answer> naiveRangeOfDate(const NaiveDateTime& at) {
    if (at.year < 1000 || at.year > 9999) {
        return naiveYearOutOfRange(at.year);
    }
    if (at.month < 1 || at.month > 12) {
        return outOfRange(std::to_string(at.month), "month", "1", "12");
    }
    const int last = daysInMonth(at.year, at.month);
    if (at.day < 1 || at.day > last) {
        return outOfRange(std::to_string(at.day), "day", "1", std::to_string(last));
    }
    return std::nullopt;
}

namespace {

// The nearest double of the digits, times a thousand million, half of one rounded up.
int nanosecondsOf(const std::string& digits) {
    return static_cast<int>(std::strtod(("0." + digits).c_str(), nullptr) * 1e9 + 0.5);
}

} // namespace

NaiveReading naiveRead(const std::string& given) {
    const Answer unsupported = failure(933063, {given});
    std::string text = naiveTrimmed(given);
    NaiveValue value;
    if (const std::size_t sign = text.find_first_of("+-"); sign != std::string::npos) {
        const std::string raw = text.substr(sign);
        value.offset = naiveOffset(raw);
        if (!value.offset) {
            return unsupported;
        }
        value.wasRepaired = value.offset->text != raw;
        text.erase(sign);
    }
    std::string fraction;
    const std::size_t point = text.find('.');
    if (point != std::string::npos) {
        fraction = text.substr(point + 1);
        text.erase(point);
    }
    if ((text + fraction).find_first_not_of("0123456789") != std::string::npos) {
        return unsupported;
    }
    value.hasDate = text.size() == 8 || text.size() == 14;
    value.hasTime = text.size() == 6 || text.size() == 14;
    if (!value.hasDate && !value.hasTime) {
        return unsupported;
    }
    if (!value.hasTime && (value.offset || point != std::string::npos)) {
        return unsupported;
    }
    NaiveDateTime at{1970, 1, 1};
    if (value.hasDate) {
        at.year = std::stoi(text.substr(0, 4));
        at.month = std::stoi(text.substr(4, 2));
        at.day = std::stoi(text.substr(6, 2));
    }
    if (value.hasTime) {
        const std::string time = text.substr(text.size() - 6);
        at.hours = std::stoi(time.substr(0, 2));
        at.minutes = std::stoi(time.substr(2, 2));
        at.seconds = std::stoi(time.substr(4, 2));
        at.nanoseconds = nanosecondsOf(fraction);
    }
    if (const auto range = naiveRangeOfTime(at)) {
        return *range;
    }
    if (const auto range = naiveRangeOfDate(at)) {
        return *range;
    }
    value.given = at;
    value.count = naiveNanoseconds(at);
    return value;
}

std::string NaiveInterval::text() const {
    std::string text = isNegative ? "-P" : "P";
    const auto put = [&](std::int64_t number, const char* name) {
        text += number > 0 ? std::to_string(number) + name : "";
    };
    put(years, "Y");
    put(months, "M");
    put(days, "D");
    text += hasTime() ? "T" : "";
    put(hours, "H");
    put(minutes, "M");
    if (seconds > 0 || nanoseconds > 0) {
        text += std::to_string(seconds) + naiveFraction(nanoseconds) + "S";
    }
    return hasDate() || hasTime() ? text : "PT0S";
}

std::optional<std::variant<NaiveInterval, Answer>> naiveInterval(const std::string& given) {
    using Result = std::variant<NaiveInterval, Answer>;
    const Result none = failure(933064, {given});
    std::string rest = naiveTrimmed(given);
    NaiveInterval interval;
    if (rest.size() < 3) {
        return none;
    }
    if (rest[0] == '-') {
        interval.isNegative = true;
        rest.erase(0, 1);
    }
    if (rest[0] != 'P') {
        return none;
    }
    rest.erase(0, 1);
    std::string allowed = "YMDT"; // what may still stand as a designator
    const auto isTime = [&] { return allowed.find('T') == std::string::npos; };
    while (!rest.empty()) {
        if (rest[0] == 'T' && !isTime()) {
            allowed = "HMS";
            rest.erase(0, 1);
            continue;
        }
        std::size_t end = rest.find_first_not_of("0123456789");
        const bool isFraction = end != 0 && end != std::string::npos && rest[end] == '.';
        if (isFraction) {
            end = rest.find_first_not_of("0123456789", end + 1);
        }
        end = std::min(end, rest.size());
        if (end == 0) {
            return none;
        }
        const double number = std::strtod(rest.substr(0, end).c_str(), nullptr);
        if (isFraction ? std::isinf(number) : number > std::numeric_limits<std::int32_t>::max()) {
            return genericFailure();
        }
        const std::size_t which = end == rest.size() ? std::string::npos : allowed.find(rest[end]);
        if (which == std::string::npos || rest[end] == 'T') {
            return none;
        }
        if (isFraction && rest[end] != 'S') {
            return genericFailure();
        }
        if (number > 1e15) {
            return std::nullopt;
        }
        const auto whole = static_cast<std::int64_t>(number);
        switch (rest[end]) {
        case 'Y':
            interval.years = whole;
            break;
        case 'M':
            (isTime() ? interval.minutes : interval.months) = whole;
            break;
        case 'D':
            interval.days = whole;
            break;
        case 'H':
            interval.hours = whole;
            break;
        default:
            interval.seconds = whole;
            interval.nanoseconds = static_cast<int>((number - static_cast<double>(whole)) * 1e9 + 0.5);
            break;
        }
        allowed.erase(0, which + 1);
        rest.erase(0, end + 1);
    }
    return interval;
}

} // namespace kvt::test
