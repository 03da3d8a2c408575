// Whole values against a second implementation, which knows nothing of the first: it cuts texts up by searching, counts
// days year by year, steps months one by one, and holds all nanoseconds in one number of 128 bits. What is compared is
// the whole answer: state, text and message.
#include "answer.h"
#include "naive_calendar.h"

#include <kvt/datetime/datetime.h>

#include <gtest/gtest.h>

#include <optional>
#include <random>
#include <string>
#include <variant>

namespace {

using namespace kvt::ex::datetime;
using namespace kvt::test;

constexpr Int128 second = 1'000'000'000;
constexpr Int128 minute = 60 * second;
constexpr Int128 day = 1440 * minute;

// ---- Reading

struct Offset {
    int minutes = 0;
    std::string text;
};

std::optional<Offset> naiveOffset(const std::string& text) {
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
    return Offset{text[0] == '-' ? -minutes : minutes,
                  text[0] + digits.substr(0, 2) + ":" + digits.substr(2)};
}

std::string offsetText(int minutes) {
    char text[16];
    std::snprintf(text, sizeof text, "%c%02d:%02d", minutes < 0 ? '-' : '+', std::abs(minutes) / 60,
                  std::abs(minutes) % 60);
    return text;
}

struct Value {
    bool hasDate = false;
    bool hasTime = false;
    std::optional<Offset> offset;
    bool wasRepaired = false;
    Int128 count = 0; ///< of the wall clock

    Int128 utc() const { return offset ? count - offset->minutes * minute : count; }
    NaiveDateTime at() const { return naiveDateTime(count); }
};

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

// A value, or what any function answers that is handed the text.
using Reading = std::variant<Value, Answer>;

Reading naiveRead(const std::string& given) {
    const Answer unsupported = failure(933063, {given});
    const std::size_t first = given.find_first_not_of(" \t");
    if (first == std::string::npos) {
        return unsupported;
    }
    std::string text = given.substr(first, given.find_last_not_of(" \t") + 1 - first);
    Value value;
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
        const bool isUp = fraction.size() > 9 && fraction[9] >= '5';
        at.nanoseconds = std::stoi((fraction + "000000000").substr(0, 9)) + (isUp ? 1 : 0);
    }
    if (const auto range = rangeOfTime(at)) {
        return *range;
    }
    if (const auto range = rangeOfDate(at)) {
        return *range;
    }
    value.count = naiveNanoseconds(at);
    return value;
}

// ---- The functions

struct Interval {
    bool isNegative = false;
    std::int64_t years = 0, months = 0, days = 0, hours = 0, minutes = 0, seconds = 0;
    int nanoseconds = 0;

    bool hasDate() const { return years > 0 || months > 0 || days > 0; }
    bool hasTime() const { return hours > 0 || minutes > 0 || seconds > 0 || nanoseconds > 0; }
    std::string text() const {
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
};

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

std::string textOf(const Value& kind, const NaiveDateTime& at, const std::string& offset) {
    return (kind.hasDate ? naiveDateText(at) : "") + (kind.hasTime ? naiveTimeText(at) : "") + offset;
}

// The years that the calendar here has counted; beyond them nothing has a text anyway.
bool isCounted(std::int64_t year) {
    return year > -150 && year < 10900;
}

Answer naiveAdd(const std::string& text, const Interval& interval) {
    const Reading reading = naiveRead(text);
    if (const auto* answer = std::get_if<Answer>(&reading)) {
        return *answer;
    }
    Value value = std::get<Value>(reading);
    if (!value.hasDate && interval.hasDate()) {
        return failure(933060, {text, interval.text()});
    }
    value.hasTime = value.hasTime || interval.hasTime();
    const ReturnState state = value.wasRepaired ? ReturnState::Repaired : ReturnState::Success;
    const Answer beyond{state, "", 0.0, 0, {}};
    NaiveDateTime at = value.at();
    if (at.year > 9999) {
        return yearOutOfRange(at.year);
    }
    const int sign = interval.isNegative ? -1 : 1;
    at.year += sign * interval.years;
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
    return {state, textOf(value, at, value.offset ? offsetText(value.offset->minutes) : ""), 0.0, 0, {}};
}

Answer naiveCast(const std::string& text, CastToTemporalType target) {
    const Reading reading = naiveRead(text);
    if (const auto* answer = std::get_if<Answer>(&reading)) {
        return *answer;
    }
    Value value = std::get<Value>(reading);
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

struct Length {
    Interval interval;
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

struct Answers {
    Answer diff;
    Answer months;
    Answer seconds;
    int compare = -3;
};

Answers naiveDiff(const std::string& first, const std::string& other) {
    const Reading left = naiveRead(first);
    const Reading right = naiveRead(other);
    const auto all = [](const Answer& answer) { return Answers{answer, answer, answer, -3}; };
    const auto* leftAnswer = std::get_if<Answer>(&left);
    const auto* rightAnswer = std::get_if<Answer>(&right);
    if (rightAnswer && (rightAnswer->message == 933065 || !leftAnswer)) {
        return all(*rightAnswer);
    }
    if (leftAnswer) {
        return all(*leftAnswer);
    }
    const Value& a = std::get<Value>(left);
    const Value& b = std::get<Value>(right);
    if (a.hasDate != b.hasDate || a.offset.has_value() != b.offset.has_value()) {
        return all(failure(933059, {first, other}));
    }
    const Int128 apart = a.utc() - b.utc();
    Answers answers;
    answers.seconds = success(static_cast<double>(apart) / 1e9);
    answers.compare = apart < 0 ? -1 : apart > 0 ? 1 : 0;
    const Walked walked = naiveLength(a.utc(), b.utc(), a.hasDate);
    if (const auto* answer = std::get_if<Answer>(&walked)) {
        answers.diff = answers.months = *answer;
        return answers;
    }
    answers.diff = success(std::get<Length>(walked).interval.text());
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
    const std::optional<Offset> read = naiveOffset(offset);
    return success(naiveText(at) + (read ? offsetText(read->minutes) : ""));
}

Answer naiveTimezoneSet(const std::string& text, const std::string& zone, SetZoneMode mode) {
    const Reading reading = naiveRead(text);
    if (const auto* answer = std::get_if<Answer>(&reading)) {
        return *answer;
    }
    Value value = std::get<Value>(reading);
    if (mode == SetZoneMode::Convert && !value.offset) {
        return failure(933073, {text});
    }
    if (zone.empty()) {
        return failure(933092);
    }
    const bool converts = mode != SetZoneMode::Replace && value.offset;
    const std::optional<Offset> to = zone == "utc" ? Offset{0, ""} : naiveOffset(zone);
    if (converts) {
        value.count = value.utc() + (to ? to->minutes * minute : Int128(0));
    }
    value.hasTime = true;
    return success(textOf(value, value.at(), to ? offsetText(to->minutes) : ""));
}

// ---- Inputs

class Inputs {
public:
    int below(int bound) { return static_cast<int>(random_() % static_cast<unsigned>(bound)); }
    bool once(int in) { return below(in) == 0; }
    std::string pad(int number, int width) {
        char text[16];
        std::snprintf(text, sizeof text, "%0*d", width, number);
        return text;
    }

    // Years at both ends and leap years often; now and then a number that is none.
    std::string date() {
        static const int years[] = {1000, 1001, 1600, 1900, 1969, 1970, 2000, 2020, 9998, 9999};
        const int year = once(3) ? years[below(10)] : once(40) ? below(1000) : 1000 + below(9000);
        int month = once(4) ? 1 + 11 * below(2) : once(4) ? 2 : 1 + below(12);
        int dayOfMonth = once(3) ? 28 + below(4) : 1 + below(28);
        if (!once(12)) {
            dayOfMonth = std::min(dayOfMonth, daysInMonth(year, month));
        }
        month = once(60) ? below(100) : month;
        return pad(year, 4) + pad(month, 2) + pad(once(80) ? below(100) : dayOfMonth, 2);
    }
    std::string time() {
        static const char* const edges[] = {
            "000000",  "235959",    "000000.000000001", "235959.999999999", "235959.9999999999",
            "120000.", "120000.500"};
        if (once(4)) {
            return edges[below(7)];
        }
        std::string text = once(40) ? pad(below(100), 2) + pad(below(100), 2) + pad(below(100), 2)
                                    : pad(below(24), 2) + pad(below(60), 2) + pad(below(60), 2);
        if (once(2)) {
            text += ".";
            for (int digits = below(10); digits > 0; --digits) {
                text += static_cast<char>('0' + below(10));
            }
        }
        return text;
    }
    std::string offset() {
        static const char* const edges[] = {"+00:00", "-00:00", "+99:59", "-99:59", "+1075",
                                            "-98:99", "+05",    "-0330",  "+9960",  "+1"};
        return once(3) ? edges[below(once(4) ? 10 : 8)]
                       : (once(2) ? "+" : "-") + pad(below(15), 2) + ":" + pad(below(60), 2);
    }
    std::string value(int kind) {
        std::string text = kind == 0 ? date() : kind <= 2 ? time() : date() + time();
        text += kind == 2 || kind == 4 ? offset() : "";
        if (once(100)) {
            text[static_cast<std::size_t>(below(static_cast<int>(text.size())))] = "x.+- 0"[below(6)];
        }
        return once(30) ? " \t" + text + " " : text;
    }
    Interval interval(bool withDate) {
        Interval made;
        made.isNegative = once(2);
        const bool isLong = once(8);
        if (withDate && !once(4)) {
            made.years = once(2) ? below(isLong ? 9999 : 40) : 0;
            made.months = once(2) ? below(isLong ? 2000 : 30) : 0;
            made.days = once(2) ? below(isLong ? 4'000'000 : 800) : 0;
        }
        if (once(2)) {
            made.hours = once(2) ? below(isLong ? 2'000'000 : 100) : 0;
            made.minutes = once(2) ? below(isLong ? 2'000'000'000 : 2000) : 0;
            made.seconds = once(2) ? below(isLong ? 2'000'000'000 : 100'000) : 0;
            // Seconds with a fraction are read as one double, which holds both exactly up to here.
            made.nanoseconds = made.seconds < 100'000 && once(2) ? below(1'000'000'000) : 0;
        }
        return made;
    }

private:
    std::mt19937_64 random_{20260607};
};

constexpr int rounds = 20'000;

TEST(ValuesAgainstNaiveOnes, AreAddedAndCastAlike) {
    Inputs inputs;
    for (int i = 0; i < rounds; ++i) {
        const int kind = i % 5;
        const std::string value = inputs.value(kind);
        const Interval interval = inputs.interval(kind == 0 || kind > 2 || inputs.once(20));
        ASSERT_EQ(answerOf(add(ustring(value), ustring(interval.text()))), naiveAdd(value, interval))
            << "[" << value << "] " << interval.text();
        const auto target = static_cast<CastToTemporalType>(inputs.below(3));
        ASSERT_EQ(answerOf(cast(ustring(value), target)), naiveCast(value, target))
            << "[" << value << "] " << static_cast<int>(target);
    }
}

TEST(ValuesAgainstNaiveOnes, AreComparedAlike) {
    Inputs inputs;
    for (int i = 0; i < rounds; ++i) {
        const int kind = i % 5;
        const int other = inputs.once(10) ? inputs.below(5) : kind;
        const std::string a = inputs.value(kind);
        const std::string b = inputs.once(20) ? a : inputs.value(other);
        const Answers naive = naiveDiff(a, b);
        const auto where = "[" + a + "] [" + b + "]";
        ASSERT_EQ(answerOf(diff(ustring(a), ustring(b))), naive.diff) << where;
        ASSERT_EQ(answerOf(diffAsNumber(ustring(a), ustring(b), UnitType::Months)), naive.months) << where;
        ASSERT_EQ(answerOf(diffAsNumber(ustring(a), ustring(b), UnitType::Seconds)), naive.seconds) << where;
        ASSERT_EQ(compare(ustring(a), ustring(b)), naive.compare) << where;
    }
}

TEST(ValuesAgainstNaiveOnes, GetZonesAlike) {
    Inputs inputs;
    for (int i = 0; i < rounds; ++i) {
        const std::string value = inputs.value(i % 5);
        const std::string zone = inputs.once(20)   ? "utc"
                                 : inputs.once(40) ? "x"
                                 : inputs.once(40) ? ""
                                                   : inputs.offset();
        const auto mode = static_cast<SetZoneMode>(inputs.below(3));
        ASSERT_EQ(answerOf(timezoneSet(ustring(value), ustring(zone), mode)),
                  naiveTimezoneSet(value, zone, mode))
            << "[" << value << "] [" << zone << "] " << static_cast<int>(mode);
    }
}

TEST(ValuesAgainstNaiveOnes, AreCreatedAlike) {
    Inputs inputs;
    const auto number = [&](int bound) { return inputs.once(30) ? inputs.below(120) : inputs.below(bound); };
    for (int i = 0; i < rounds; ++i) {
        NaiveDateTime at{
            1000 + inputs.below(9000), number(12) + 1, number(28) + 1, number(24), number(60), number(60)};
        at.year = inputs.once(40) ? inputs.below(12'000) : at.year;
        at.nanoseconds = inputs.once(50) ? 1'000'000'000 : inputs.once(2) ? inputs.below(1'000'000'000) : 0;
        const std::string offset = inputs.once(2) ? inputs.offset() : "";
        DateTimeParts parts(at.year, static_cast<std::uint64_t>(at.month), static_cast<std::uint64_t>(at.day),
                            static_cast<std::uint64_t>(at.hours), static_cast<std::uint64_t>(at.minutes), 0.0,
                            ustring(offset));
        parts.setSeconds(static_cast<std::uint64_t>(at.seconds));
        parts.setNanoseconds(static_cast<std::uint64_t>(at.nanoseconds));
        ASSERT_EQ(answerOf(create(parts)), naiveCreate(at, offset)) << naiveText(at) << offset;
    }
}

} // namespace
