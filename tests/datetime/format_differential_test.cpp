// format() against a second writer, which knows nothing of the first: it counts days year by year, holds a value in
// one number of 128 bits, and has a sentence of its own for every flag. Patterns are flags and characters in random
// order, right ones and wrong ones; what is compared is the whole answer.
#include "answer.h"
#include "naive_calendar.h"

#include <kvt/datetime/datetime.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <functional>
#include <map>
#include <random>
#include <string>
#include <vector>

namespace {

using namespace kvt::ex::datetime;
using namespace kvt::test;

struct Value {
    TemporalType kind;
    NaiveDateTime at; ///< as it is written
    int offsetMinutes = 0;

    bool hasDate() const { return kind != TemporalType::Time && kind != TemporalType::TimeWithOffset; }
    bool hasTime() const { return kind != TemporalType::Date; }
    bool hasOffset() const {
        return kind == TemporalType::TimeWithOffset || kind == TemporalType::DatetimeWithOffset;
    }
};

std::string padded(std::int64_t number, int width) {
    char text[32];
    std::snprintf(text, sizeof text, "%0*lld", width, static_cast<long long>(number));
    return text;
}

std::string offsetText(int minutes) {
    return (minutes < 0 ? "-" : "+") + padded(std::abs(minutes) / 60, 2) + ":" +
           padded(std::abs(minutes) % 60, 2);
}

std::string textOf(const Value& value) {
    return (value.hasDate() ? naiveDateText(value.at) : "") +
           (value.hasTime() ? naiveTimeText(value.at) : "") +
           (value.hasOffset() ? offsetText(value.offsetMinutes) : "");
}

// From Sunday, by stepping from a Sunday that everybody remembers.
int weekdayOf(const NaiveDateTime& at) {
    const std::int64_t sunday = naiveDays(2000, 1, 2);
    return static_cast<int>(((naiveDays(at.year, at.month, at.day) - sunday) % 7 + 7) % 7);
}

int yearDayOf(const NaiveDateTime& at) {
    return static_cast<int>(naiveDays(at.year, at.month, at.day) - naiveDays(at.year, 1, 1)) + 1;
}

// How many weeks that begin on `first` have begun in the year, by looking at each day.
int weekOf(const NaiveDateTime& at, int first) {
    int weeks = 0;
    for (NaiveDateTime day = {at.year, 1, 1}; yearDayOf(day) <= yearDayOf(at);) {
        weeks += weekdayOf(day) == first ? 1 : 0;
        if (day == NaiveDateTime{at.year, at.month, at.day}) {
            break;
        }
        if (++day.day > daysInMonth(day.year, day.month)) {
            day = {day.year, day.month + 1, 1};
        }
    }
    return weeks;
}

// All of a count in one number, which has one sign.
std::string secondsText(Int128 nanoseconds) {
    const bool isNegative = nanoseconds < 0;
    const Int128 magnitude = isNegative ? -nanoseconds : nanoseconds;
    return (isNegative ? "-" : "") + std::to_string(static_cast<std::int64_t>(magnitude / 1000000000)) +
           naiveFraction(static_cast<int>(magnitude % 1000000000));
}

const char* const months[] = {"January", "February", "March",     "April",   "May",      "June",
                              "July",    "August",   "September", "October", "November", "December"};
const char* const weekdays[] = {"Sunday", "Monday", "Tuesday", "Wednesday", "Thursday", "Friday", "Saturday"};

struct Flag {
    std::function<bool(const Value&)> isAllowed;
    std::function<std::string(const Value&)> text;
};

const std::map<std::string, Flag>& flags() {
    const auto any = [](const Value&) { return true; };
    const auto dated = [](const Value& value) { return value.hasDate(); };
    const auto withOffset = [](const Value& value) { return value.hasOffset(); };
    const auto moment = [](const Value& value) { return value.kind == TemporalType::DatetimeWithOffset; };
    const auto local = [](const Value& value) { return value.hasDate() && !value.hasOffset(); };
    const auto halfDay = [](const Value& value) {
        const int hours = value.at.hours > 12 ? value.at.hours - 12 : value.at.hours;
        return hours == 0 ? 12 : hours;
    };
    const auto seconds = [](const Value& value) {
        return padded(value.at.seconds, 2) + naiveFraction(value.at.nanoseconds);
    };
    static const std::map<std::string, Flag> table = {
        {"%%", {any, [](const Value&) { return "%"; }}},
        {"%Y", {dated, [](const Value& v) { return padded(v.at.year, 4); }}},
        {"%y", {dated, [](const Value& v) { return padded(v.at.year, 4).substr(2); }}},
        {"%m", {dated, [](const Value& v) { return padded(v.at.month, 2); }}},
        {"%N", {dated, [](const Value& v) { return padded(v.at.month, 1); }}},
        {"%d", {dated, [](const Value& v) { return padded(v.at.day, 2); }}},
        {"%e", {dated, [](const Value& v) { return padded(v.at.day, 1); }}},
        {"%j", {dated, [](const Value& v) { return padded(yearDayOf(v.at), 3); }}},
        {"%b", {dated, [](const Value& v) { return std::string(months[v.at.month - 1]).substr(0, 3); }}},
        {"%B", {dated, [](const Value& v) { return months[v.at.month - 1]; }}},
        {"%a", {dated, [](const Value& v) { return std::string(weekdays[weekdayOf(v.at)]).substr(0, 3); }}},
        {"%A", {dated, [](const Value& v) { return weekdays[weekdayOf(v.at)]; }}},
        {"%u", {dated, [](const Value& v) { return padded(weekdayOf(v.at) == 0 ? 7 : weekdayOf(v.at), 1); }}},
        {"%w", {dated, [](const Value& v) { return padded(weekdayOf(v.at), 1); }}},
        {"%U", {dated, [](const Value& v) { return padded(weekOf(v.at, 0), 2); }}},
        {"%W", {dated, [](const Value& v) { return padded(weekOf(v.at, 1), 2); }}},
        {"%H", {any, [](const Value& v) { return padded(v.at.hours, 2); }}},
        {"%k", {any, [](const Value& v) { return padded(v.at.hours, 1); }}},
        {"%I", {any, [=](const Value& v) { return padded(halfDay(v), 2); }}},
        {"%l", {any, [=](const Value& v) { return padded(halfDay(v), 1); }}},
        {"%p", {any, [](const Value& v) { return v.at.hours >= 12 ? "PM" : "AM"; }}},
        {"%M", {any, [](const Value& v) { return padded(v.at.minutes, 2); }}},
        {"%S", {any, seconds}},
        {"%T",
         {any,
          [=](const Value& v) {
              return padded(v.at.hours, 2) + ":" + padded(v.at.minutes, 2) + ":" + seconds(v);
          }}},
        {"%z", {withOffset, [](const Value& v) { return offsetText(v.offsetMinutes); }}},
        {"%Ez",
         {withOffset,
          [](const Value& v) { return v.offsetMinutes == 0 ? "Z" : offsetText(v.offsetMinutes); }}},
        {"%s",
         {moment,
          [](const Value& v) {
              return secondsText(naiveNanoseconds(v.at) - Int128(v.offsetMinutes) * 60 * 1000000000);
          }}},
        {"%Es", {local, [](const Value& v) { return secondsText(naiveNanoseconds(v.at)); }}},
    };
    return table;
}

std::string wordOf(TemporalType kind) {
    static const char* const words[] = {"date", "time", "time with UTC offset", "datetime",
                                        "datetime with UTC offset"};
    return words[static_cast<unsigned>(kind)];
}

// `elements` are a pattern in its pieces: flags, and characters.
Answer naiveFormat(const Value& value, const std::vector<std::string>& elements) {
    std::string text;
    bool hasEpoch = false;
    bool hasOffset = false;
    for (const std::string& element : elements) {
        if (element == "%") {
            return failure(933076);
        }
        if (element.front() != '%') {
            text += element;
            continue;
        }
        const auto found = flags().find(element);
        if (found == flags().end()) {
            return failure(933079, {element, "@DateTimeFormat()"});
        }
        if (!found->second.isAllowed(value)) {
            return failure(933078, {element, wordOf(value.kind)});
        }
        text += found->second.text(value);
        hasEpoch = hasEpoch || element.back() == 's';
        hasOffset = hasOffset || element.back() == 'z';
    }
    return hasEpoch && hasOffset ? failure(933083, {"%s", "%z"}) : success(text);
}

class RandomPatterns {
public:
    explicit RandomPatterns(std::uint64_t seed) : random_(seed) {}

    Value value() {
        Value value{static_cast<TemporalType>(below(5)), {1970, 1, 1}, 0};
        NaiveDateTime& at = value.at;
        if (value.hasDate()) {
            at.year = 1000 + below(9000);
            at.month = 1 + below(12);
            at.day = 1 + below(daysInMonth(at.year, at.month));
        }
        if (value.hasTime()) {
            at.hours = below(24);
            at.minutes = below(60);
            at.seconds = below(60);
            static constexpr int units[] = {1, 1000, 1000000, 100000000, 1000000000};
            const int unit = units[below(5)];
            at.nanoseconds = below(1000000000 / unit) * unit;
        }
        if (value.hasOffset()) {
            value.offsetMinutes = below(4) == 0 ? 0 : below(2 * 1439 + 1) - 1439;
        }
        return value;
    }

    // With a flag in front, so that it is not taken for keywords; a wrong one is rare.
    std::vector<std::string> pattern() {
        std::vector<std::string> elements = {flag()};
        for (int count = below(8); count > 0; --count) {
            static const char* const literals[] = {"-", ":", "T", "x", "*", "?", "$", "E", "\xC3\xA4", " "};
            elements.emplace_back(below(2) == 0 ? flag() : literals[below(10)]);
        }
        while (elements.back() == " ") {
            elements.pop_back(); // white space at the end does not count
        }
        if (below(100) == 0) {
            elements.emplace_back("%");
        }
        return elements;
    }

private:
    int below(int bound) { return static_cast<int>(random_() % static_cast<unsigned>(bound)); }

    std::string flag() {
        if (below(50) == 0) {
            static const char* const wrong[] = {"%x", "%$", "%EY", "%q", "%\xC3\xA4", "%E\xE2\x82\xAC",
                                                "%EE"};
            return wrong[below(7)];
        }
        return std::next(flags().begin(), below(static_cast<int>(flags().size())))->first;
    }

    std::mt19937_64 random_;
};

TEST(FormatDifferential, AnswersAsTheNaiveWriter) {
    RandomPatterns random(20261122);
    int written = 0;
    for (int round = 0; round < 60'000; ++round) {
        const Value value = random.value();
        const std::vector<std::string> elements = random.pattern();
        std::string pattern;
        for (const std::string& element : elements) {
            pattern += element;
        }
        const Answer expected = naiveFormat(value, elements);
        ASSERT_EQ(answerOf(format(kvt::ex::UString<0>(textOf(value).c_str()),
                                  kvt::ex::UString<0>(pattern.c_str()))),
                  expected)
            << textOf(value) << " by " << pattern;
        written += expected.message == 0 ? 1 : 0;
    }
    EXPECT_GT(written, 10'000); // the patterns are not mostly wrong ones
}

} // namespace
