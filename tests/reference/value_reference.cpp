#include "value_reference.h"

#include <algorithm>
#include <cstdlib>
#include <limits>
#include <variant>

namespace kvt::test {

using namespace kvt::ex::datetime;

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
        return naiveYearOutOfRange(at.year);
    }
    const int sign = interval.isNegative ? -1 : 1;
    at.year = static_cast<std::int16_t>(at.year + sign * interval.years); // a year has 16 bits
    if (!isCounted(at.year + sign * interval.months / 12)) {
        return beyond;
    }
    at = monthsLater(at, sign * interval.months);
    const Int128 sum =
        naiveNanoseconds(at) +
        sign * (interval.days * naiveDay + interval.hours * 60 * naiveMinute +
                interval.minutes * naiveMinute + interval.seconds * naiveSecond + interval.nanoseconds);
    if (sum < daysToYear(0) * naiveDay || sum >= daysToYear(10000) * naiveDay) {
        return beyond;
    }
    at = naiveDateTime(sum);
    if (at.year < 1000) {
        return naiveYearOutOfRange(at.year);
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
                return naiveYearOutOfRange(cursor.year);
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
                return naiveYearOutOfRange(cursor.year);
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
    length.interval.days = static_cast<std::int64_t>(rest / naiveDay);
    length.interval.hours = static_cast<std::int64_t>(rest % naiveDay / (60 * naiveMinute));
    length.interval.minutes = static_cast<std::int64_t>(rest / naiveMinute % 60);
    length.interval.seconds = static_cast<std::int64_t>(rest / naiveSecond % 60);
    length.interval.nanoseconds = static_cast<int>(rest % naiveSecond);
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
        return naiveYearOutOfRange(at.year);
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
    if (const auto range = naiveRangeOfTime(at)) {
        return *range;
    }
    if (const auto range = naiveRangeOfDate(at)) {
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
        value.count = value.utc() + (to && isKnown ? to->minutes * naiveMinute : Int128(0));
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
        value.count += carries ? naiveMinute : Int128(0);
    } else if (precision < 9 && at.nanoseconds > 0) {
        Int128 unit = naiveSecond;
        for (int i = 0; i < precision; ++i) {
            unit /= 10;
        }
        const Int128 rounded = (at.nanoseconds + unit / 2) / unit * unit;
        carries = rounded >= naiveSecond;
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
