#include "value_reference.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <limits>
#include <variant>

namespace kvt::test {

using namespace kvt::ex::datetime;

namespace {

constexpr Int128 second = 1'000'000'000;
constexpr Int128 minute = 60 * second;
constexpr Int128 day = 1440 * minute;

} // namespace

// ---- Reading

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
    return offset ? count - offset->minutes * minute : count;
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

namespace {

std::optional<Answer> rangeOfTime(const NaiveDateTime& at) {
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

Answer yearOutOfRange(std::int64_t year) {
    return outOfRange(std::to_string(year), "year", "1000", "9999");
}

std::optional<Answer> rangeOfDate(const NaiveDateTime& at) {
    if (at.year < 1000 || at.year > 9999) {
        return yearOutOfRange(at.year);
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
    if (const auto range = rangeOfTime(at)) {
        return *range;
    }
    if (const auto range = rangeOfDate(at)) {
        return *range;
    }
    value.given = at;
    value.count = naiveNanoseconds(at);
    return value;
}

// ---- The functions

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

std::optional<Answer> naiveNegate(const std::string& given) {
    const auto read = naiveInterval(given);
    if (!read) {
        return std::nullopt;
    }
    if (const auto* answer = std::get_if<Answer>(&*read)) {
        return *answer;
    }
    return success(std::get<NaiveInterval>(*read).isNegative ? given.substr(1) : "-" + given);
}

namespace {

// So many months later, one by one; the day is cut to the month that is reached.
NaiveDateTime monthsLater(NaiveDateTime at, std::int64_t months) {
    for (; months > 0; --months) {
        at.year += at.month == 12 ? 1 : 0;
        at.month = at.month == 12 ? 1 : at.month + 1;
    }
    for (; months < 0; ++months) {
        at.year -= at.month == 1 ? 1 : 0;
        at.month = at.month == 1 ? 12 : at.month - 1;
    }
    at.day = std::min(at.day, daysInMonth(at.year, at.month));
    return at;
}

std::string textOf(const NaiveValue& kind, const NaiveDateTime& at, const std::string& offset) {
    return (kind.hasDate ? naiveDateText(at) : "") + (kind.hasTime ? naiveTimeText(at) : "") + offset;
}

// The years that the calendar here has counted; beyond them nothing has a text anyway.
bool isCounted(std::int64_t year) {
    return year > -150 && year < 10900;
}

} // namespace

std::optional<Answer> naiveAdd(const std::string& text, const std::string& intervalText) {
    const NaiveReading reading = naiveRead(text);
    if (const auto* answer = std::get_if<Answer>(&reading)) {
        return *answer;
    }
    NaiveValue value = std::get<NaiveValue>(reading);
    const auto read = naiveInterval(intervalText);
    if (!read) {
        return std::nullopt;
    }
    if (const auto* answer = std::get_if<Answer>(&*read)) {
        return *answer;
    }
    const auto& interval = std::get<NaiveInterval>(*read);
    if (!value.hasDate && interval.hasDate()) {
        return failure(933060, {text, intervalText});
    }
    value.hasTime = value.hasTime || interval.hasTime();
    const ReturnState state = value.wasRepaired ? ReturnState::Repaired : ReturnState::Success;
    const Answer beyond{state, "", 0.0, 0, {}};
    NaiveDateTime at = value.at();
    if (at.year > 9999) {
        return yearOutOfRange(at.year);
    }
    const int sign = interval.isNegative ? -1 : 1;
    at.year = static_cast<std::int16_t>(at.year + sign * interval.years); // a year has 16 bits
    if (!isCounted(at.year + sign * interval.months / 12)) {
        return beyond;
    }
    at = monthsLater(at, sign * interval.months);
    const Int128 sum = naiveNanoseconds(at) +
                       sign * (interval.days * day + interval.hours * 60 * minute +
                               interval.minutes * minute + interval.seconds * second + interval.nanoseconds);
    if (sum < daysToYear(0) * day || sum >= daysToYear(10000) * day) {
        return beyond;
    }
    at = naiveDateTime(sum);
    if (at.year < 1000) {
        return yearOutOfRange(at.year);
    }
    const std::string offset = value.offset ? naiveOffsetText(value.offset->minutes) : "";
    return Answer{state, textOf(value, at, offset), 0.0, 0, {}};
}

Answer naiveCast(const std::string& text, CastToTemporalType target) {
    const NaiveReading reading = naiveRead(text);
    if (const auto* answer = std::get_if<Answer>(&reading)) {
        return *answer;
    }
    NaiveValue value = std::get<NaiveValue>(reading);
    const char* family = !value.hasDate ? "time" : value.hasTime ? "datetime" : "date";
    if (target > CastToTemporalType::Unknown) {
        return failure(933052, {family});
    }
    if (target == CastToTemporalType::Unknown) {
        return failure(933052, {family, "unknown"});
    }
    if (!value.hasDate && target == CastToTemporalType::Date) {
        return failure(933052, {"time", "date", "datetime", "unknown"});
    }
    if (!value.hasDate && target == CastToTemporalType::Datetime) {
        return failure(933052, {"time", "datetime", "unknown"});
    }
    value.hasDate = target != CastToTemporalType::Time;
    value.hasTime = target != CastToTemporalType::Date;
    if (!value.hasTime) {
        return success(textOf(value, value.at(), ""));
    }
    const std::string cast = textOf(value, value.at(), value.offset ? value.offset->text : "");
    return value.wasRepaired ? repaired(cast) : success(cast);
}

namespace {

struct Length {
    NaiveInterval interval;
    double months = 0.0;
};

using Walked = std::variant<Length, Answer>;

// The largest number of steps of so many months each that does not pass the target, found by going on from `steps`.
std::int64_t stepsTowards(const NaiveDateTime& from, Int128 target, int months, std::int64_t steps) {
    const auto isPassed = [&](std::int64_t count) {
        const Int128 reached = naiveNanoseconds(monthsLater(from, count * months));
        return months > 0 ? reached > target : reached < target;
    };
    while (!isPassed(steps + 1)) {
        ++steps;
    }
    return steps;
}

Walked naiveLength(Int128 first, Int128 other, bool hasDate) {
    Length length;
    const bool isBack = first < other;
    const int sign = isBack ? -1 : 1;
    NaiveDateTime cursor = naiveDateTime(other);
    if (hasDate && first != other) {
        const NaiveDateTime target = naiveDateTime(first);
        const auto inRange = [&] { return cursor.year >= 1000 && cursor.year <= 9999; };
        if (const std::int64_t apart = std::abs(target.year - cursor.year); apart != 0) {
            if (!inRange()) {
                return yearOutOfRange(cursor.year);
            }
            NaiveDateTime near = cursor;
            near.year += sign * (apart - 1);
            length.interval.years = apart - 1;
            near.day = std::min(near.day, daysInMonth(near.year, near.month));
            NaiveDateTime whole = cursor;
            whole.year += sign * apart;
            whole.day = std::min(whole.day, daysInMonth(whole.year, whole.month));
            const Int128 reached = naiveNanoseconds(whole);
            const bool fits = isBack ? reached >= first : reached <= first;
            cursor = fits ? whole : near;
            length.interval.years += fits ? 1 : 0;
        }
        if (target.year != cursor.year || target.month != cursor.month) {
            if (!inRange()) {
                return yearOutOfRange(cursor.year);
            }
            length.interval.months = stepsTowards(cursor, first, sign, 0);
            cursor = monthsLater(cursor, sign * length.interval.months);
        }
    }
    const Int128 at = naiveNanoseconds(cursor);
    const Int128 rest = isBack ? at - first : first - at;
    const NaiveDateTime earlier = naiveDateTime(isBack ? first : at);
    length.months = static_cast<double>(length.interval.years * 12 + length.interval.months) +
                    static_cast<double>(rest) / 1e9 / 86400.0 / daysInMonth(earlier.year, earlier.month);
    length.months = isBack ? -length.months : length.months;
    length.interval.isNegative = isBack;
    length.interval.days = static_cast<std::int64_t>(rest / day);
    length.interval.hours = static_cast<std::int64_t>(rest % day / (60 * minute));
    length.interval.minutes = static_cast<std::int64_t>(rest / minute % 60);
    length.interval.seconds = static_cast<std::int64_t>(rest / second % 60);
    length.interval.nanoseconds = static_cast<int>(rest % second);
    return length;
}

} // namespace

Answer NaiveDifference::inUnit(UnitType unit) const {
    if (seconds.state != ReturnState::Success) {
        return seconds;
    }
    if (unit > UnitType::Seconds) {
        return genericFailure();
    }
    if (unit <= UnitType::Months) {
        return months.state != ReturnState::Success || unit == UnitType::Months
                   ? months
                   : success(months.number / 12.0);
    }
    double number = seconds.number;
    const double ladder[] = {60.0, 60.0, 24.0, 7.0}; // of which so many steps lead up to a unit
    for (int step = 0; step < static_cast<int>(UnitType::Seconds) - static_cast<int>(unit); ++step) {
        number /= ladder[step];
    }
    return success(number);
}

NaiveDifference naiveDiff(const std::string& first, const std::string& other) {
    const NaiveReading left = naiveRead(first);
    const NaiveReading right = naiveRead(other);
    const auto all = [](const Answer& answer) { return NaiveDifference{answer, answer, answer, -3}; };
    const auto* leftAnswer = std::get_if<Answer>(&left);
    const auto* rightAnswer = std::get_if<Answer>(&right);
    if (rightAnswer && (rightAnswer->message == 933065 || !leftAnswer)) {
        return all(*rightAnswer);
    }
    if (leftAnswer) {
        return all(*leftAnswer);
    }
    const NaiveValue& a = std::get<NaiveValue>(left);
    const NaiveValue& b = std::get<NaiveValue>(right);
    if (a.hasDate != b.hasDate || a.offset.has_value() != b.offset.has_value()) {
        return all(failure(933059, {first, other}));
    }
    const Int128 apart = a.utc() - b.utc();
    NaiveDifference answers;
    answers.seconds = success(static_cast<double>(apart) / 1e9);
    answers.order = apart < 0 ? -1 : apart > 0 ? 1 : 0;
    const Walked walked = naiveLength(a.utc(), b.utc(), a.hasDate);
    if (const auto* answer = std::get_if<Answer>(&walked)) {
        answers.interval = answers.months = *answer;
        return answers;
    }
    answers.interval = success(std::get<Length>(walked).interval.text());
    answers.months = success(std::get<Length>(walked).months);
    return answers;
}

Answer naiveCreate(const NaiveDateTime& at, const std::string& offset) {
    // What needs more than two digits is refused before the bounds are looked at. A month that is none has 29 days
    // here.
    if (at.year < 1000 || at.year > 9999) {
        return yearOutOfRange(at.year);
    }
    if (at.month < 1 || at.month > 99) {
        return outOfRange(std::to_string(at.month), "month", "1", "12");
    }
    if (at.day < 1 || at.day > 99) {
        const int last = at.month > 12 ? 29 : daysInMonth(at.year, at.month);
        return outOfRange(std::to_string(at.day), "day", "1", std::to_string(last));
    }
    if (at.hours > 99) {
        return outOfRange(std::to_string(at.hours), "hours", "0", "23");
    }
    if (at.minutes > 99) {
        return outOfRange(std::to_string(at.minutes), "minutes", "0", "59");
    }
    if (at.seconds > 99 || at.nanoseconds > 999'999'999) {
        const int whole = at.seconds + at.nanoseconds / 1'000'000'000;
        return outOfRange((at.seconds < 10 ? "0" : "") + std::to_string(whole) +
                              naiveFraction(at.nanoseconds % 1'000'000'000),
                          "seconds", "0", "59.999999999");
    }
    if (const auto range = rangeOfTime(at)) {
        return *range;
    }
    if (const auto range = rangeOfDate(at)) {
        return *range;
    }
    const std::optional<NaiveOffset> read = naiveOffset(offset);
    return success(naiveText(at) + (read ? naiveOffsetText(read->minutes) : ""));
}

Answer naiveTimezoneSet(const std::string& text, const std::string& givenZone, SetZoneMode mode) {
    const NaiveReading reading = naiveRead(text);
    if (const auto* answer = std::get_if<Answer>(&reading)) {
        return *answer;
    }
    NaiveValue value = std::get<NaiveValue>(reading);
    std::string zone = naiveTrimmed(givenZone);
    for (char& c : zone) {
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    }
    if (!value.hasDate && zone == "local") {
        return failure(933096, {text});
    }
    if (mode == SetZoneMode::Convert && !value.offset) {
        return failure(933073, {text});
    }
    if (zone.empty()) {
        return failure(933092);
    }
    if (zone == "local") {
        return silentFailure();
    }
    // A mode that is none takes the way to UTC and does not come back.
    const bool isKnown = mode <= SetZoneMode::Convert;
    const std::optional<NaiveOffset> to = zone == "utc" ? NaiveOffset{0, ""} : naiveOffset(zone);
    if (mode != SetZoneMode::Replace && value.offset) {
        value.count = value.utc() + (to && isKnown ? to->minutes * minute : Int128(0));
    }
    value.hasTime = true;
    return success(textOf(value, value.at(), to ? naiveOffsetText(to->minutes) : ""));
}

Answer naiveTimezoneGet(const std::string& text, UTCOffsetType type) {
    const NaiveReading reading = naiveRead(text);
    const auto* answer = std::get_if<Answer>(&reading);
    if (answer && answer->message == 933065) {
        return *answer;
    }
    if (answer || !std::get<NaiveValue>(reading).offset) {
        return failure(933071, {text});
    }
    const NaiveOffset offset = *std::get<NaiveValue>(reading).offset;
    switch (type) {
    case UTCOffsetType::OffsetText:
        return success(offset.text);
    case UTCOffsetType::OffsetInMinutes:
        return success(std::to_string(offset.minutes));
    case UTCOffsetType::OffsetInSeconds:
        return success(std::to_string(offset.minutes * 60));
    }
    return silentFailure();
}

Answer naiveTimezoneRemove(const std::string& text) {
    const NaiveReading reading = naiveRead(text);
    if (const auto* answer = std::get_if<Answer>(&reading)) {
        return *answer;
    }
    const NaiveValue& value = std::get<NaiveValue>(reading);
    return success(value.offset ? textOf(value, value.at(), "") : text);
}

std::string naiveFields(const NaiveDateTime& at, const std::string& offset, TemporalType kind) {
    std::string text;
    for (const std::int64_t field :
         {at.year, std::int64_t{at.month}, std::int64_t{at.day}, std::int64_t{at.hours},
          std::int64_t{at.minutes}, std::int64_t{at.seconds}, std::int64_t{at.nanoseconds}}) {
        text += std::to_string(field) + " ";
    }
    return text + offset + " " + std::to_string(static_cast<int>(kind));
}

Answer naiveParts(const std::string& text, int precision) {
    if (precision < -1 || precision > 9) {
        return genericFailure();
    }
    const NaiveReading reading = naiveRead(text);
    if (const auto* answer = std::get_if<Answer>(&reading)) {
        return *answer;
    }
    NaiveValue value = std::get<NaiveValue>(reading);
    NaiveDateTime at = value.given;
    const int seconds = at.seconds;
    bool carries = false;
    if (precision == -1) {
        carries = seconds >= 30;
        value.count += carries ? minute : Int128(0);
    } else if (precision < 9 && at.nanoseconds > 0) {
        Int128 unit = second;
        for (int i = 0; i < precision; ++i) {
            unit /= 10;
        }
        const Int128 rounded = (at.nanoseconds + unit / 2) / unit * unit;
        carries = rounded >= second;
        value.count += rounded - at.nanoseconds;
        at.nanoseconds = static_cast<int>(rounded);
    }
    if (carries) {
        at = value.at();
        value.hasDate = value.hasTime = true;
    }
    const std::string offset = !value.offset ? ""
                               : carries     ? naiveOffsetText(value.offset->minutes)
                                             : value.offset->text;
    return success(naiveFields(at, offset, value.kind()));
}

} // namespace kvt::test
