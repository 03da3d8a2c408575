#include "format_reference.h"

#include "value_reference.h"

#include <cctype>
#include <functional>
#include <map>

namespace kvt::test {

using namespace kvt::ex::datetime;

bool NaiveMoment::hasDate() const {
    return kind != TemporalType::Time && kind != TemporalType::TimeWithOffset;
}

bool NaiveMoment::hasOffset() const {
    return kind == TemporalType::TimeWithOffset || kind == TemporalType::DatetimeWithOffset;
}

namespace {

std::string padded(std::int64_t number, int width) {
    char text[32];
    std::snprintf(text, sizeof text, "%0*lld", width, static_cast<long long>(number));
    return text;
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
    std::function<bool(const NaiveMoment&)> isAllowed;
    std::function<std::string(const NaiveMoment&)> text;
};

const std::map<std::string, Flag>& flags() {
    const auto any = [](const NaiveMoment&) { return true; };
    const auto dated = [](const NaiveMoment& value) { return value.hasDate(); };
    const auto withOffset = [](const NaiveMoment& value) { return value.hasOffset(); };
    const auto moment = [](const NaiveMoment& value) {
        return value.kind == TemporalType::DatetimeWithOffset;
    };
    const auto local = [](const NaiveMoment& value) { return value.hasDate() && !value.hasOffset(); };
    const auto halfDay = [](const NaiveMoment& value) {
        const int hours = value.at.hours > 12 ? value.at.hours - 12 : value.at.hours;
        return hours == 0 ? 12 : hours;
    };
    const auto seconds = [](const NaiveMoment& value) {
        return padded(value.at.seconds, 2) + naiveFraction(value.at.nanoseconds);
    };
    static const std::map<std::string, Flag> table = {
        {"%%", {any, [](const NaiveMoment&) { return "%"; }}},
        {"%Y", {dated, [](const NaiveMoment& v) { return padded(v.at.year, 4); }}},
        {"%y", {dated, [](const NaiveMoment& v) { return padded(v.at.year, 4).substr(2); }}},
        {"%m", {dated, [](const NaiveMoment& v) { return padded(v.at.month, 2); }}},
        {"%N", {dated, [](const NaiveMoment& v) { return padded(v.at.month, 1); }}},
        {"%d", {dated, [](const NaiveMoment& v) { return padded(v.at.day, 2); }}},
        {"%e", {dated, [](const NaiveMoment& v) { return padded(v.at.day, 1); }}},
        {"%j", {dated, [](const NaiveMoment& v) { return padded(yearDayOf(v.at), 3); }}},
        {"%b",
         {dated, [](const NaiveMoment& v) { return std::string(months[v.at.month - 1]).substr(0, 3); }}},
        {"%B", {dated, [](const NaiveMoment& v) { return months[v.at.month - 1]; }}},
        {"%a",
         {dated, [](const NaiveMoment& v) { return std::string(weekdays[weekdayOf(v.at)]).substr(0, 3); }}},
        {"%A", {dated, [](const NaiveMoment& v) { return weekdays[weekdayOf(v.at)]; }}},
        {"%u",
         {dated, [](const NaiveMoment& v) { return padded(weekdayOf(v.at) == 0 ? 7 : weekdayOf(v.at), 1); }}},
        {"%w", {dated, [](const NaiveMoment& v) { return padded(weekdayOf(v.at), 1); }}},
        {"%U", {dated, [](const NaiveMoment& v) { return padded(weekOf(v.at, 0), 2); }}},
        {"%W", {dated, [](const NaiveMoment& v) { return padded(weekOf(v.at, 1), 2); }}},
        {"%H", {any, [](const NaiveMoment& v) { return padded(v.at.hours, 2); }}},
        {"%k", {any, [](const NaiveMoment& v) { return padded(v.at.hours, 1); }}},
        {"%I", {any, [=](const NaiveMoment& v) { return padded(halfDay(v), 2); }}},
        {"%l", {any, [=](const NaiveMoment& v) { return padded(halfDay(v), 1); }}},
        {"%p", {any, [](const NaiveMoment& v) { return v.at.hours >= 12 ? "PM" : "AM"; }}},
        {"%M", {any, [](const NaiveMoment& v) { return padded(v.at.minutes, 2); }}},
        {"%S", {any, seconds}},
        {"%T",
         {any,
          [=](const NaiveMoment& v) {
              return padded(v.at.hours, 2) + ":" + padded(v.at.minutes, 2) + ":" + seconds(v);
          }}},
        {"%z", {withOffset, [](const NaiveMoment& v) { return naiveOffsetText(v.offsetMinutes); }}},
        {"%Ez",
         {withOffset,
          [](const NaiveMoment& v) {
              return v.offsetMinutes == 0 ? "Z" : naiveOffsetText(v.offsetMinutes);
          }}},
        {"%s",
         {moment,
          [](const NaiveMoment& v) {
              return secondsText(naiveNanoseconds(v.at) - Int128(v.offsetMinutes) * 60 * 1000000000);
          }}},
        {"%Es", {local, [](const NaiveMoment& v) { return secondsText(naiveNanoseconds(v.at)); }}},
    };
    return table;
}

std::string wordOf(TemporalType kind) {
    static const char* const words[] = {"date", "time", "time with UTC offset", "datetime",
                                        "datetime with UTC offset"};
    return words[static_cast<unsigned>(kind)];
}

} // namespace

Answer naiveFormat(const NaiveMoment& value, const std::vector<std::string>& elements) {
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

std::vector<std::string> naiveFlags() {
    std::vector<std::string> names;
    for (const auto& [name, flag] : flags()) {
        names.push_back(name);
    }
    return names;
}

namespace {

// A "%" takes the character behind it, and one more behind an "E", unless that is another "%".
std::vector<std::string> elementsOf(const std::string& pattern) {
    std::vector<std::string> elements;
    for (std::size_t at = 0; at < pattern.size();) {
        std::size_t length = pattern[at] == '%' ? 2 : 1;
        if (pattern.substr(at, 2) == "%E" && pattern.substr(at + 2, 1) != "%") {
            length = 3;
        }
        elements.push_back(pattern.substr(at, length));
        at += length;
    }
    return elements;
}

Answer canonical(const NaiveValue& value) {
    std::string text = value.hasDate ? naiveDateText(value.at()) : "";
    text += value.hasTime ? naiveTimeText(value.at()) : "";
    return success(text + (value.offset ? value.offset->text : ""));
}

const char* isoPatternOf(const NaiveValue& value) {
    if (!value.hasTime) {
        return "%Y-%m-%d";
    }
    if (!value.hasDate) {
        return value.offset ? "%H:%M:%S%Ez" : "%H:%M:%S";
    }
    return value.offset ? "%Y-%m-%dT%H:%M:%S%Ez" : "%Y-%m-%dT%H:%M:%S";
}

} // namespace

Answer naiveFormat(const std::string& text, const std::string& givenFormat) {
    if (naiveTrimmed(text).empty()) {
        return silentFailure();
    }
    std::string format = naiveTrimmed(givenFormat);
    if (format.empty()) {
        return failure(933074);
    }
    const NaiveReading reading = naiveRead(text);
    if (const auto* answer = std::get_if<Answer>(&reading)) {
        return *answer;
    }
    const auto& value = std::get<NaiveValue>(reading);
    for (std::string list = format + "|"; format.find('%') == std::string::npos && !list.empty();
         list.erase(0, list.find('|') + 1)) {
        std::string keyword = naiveTrimmed(list.substr(0, list.find('|')));
        for (char& c : keyword) {
            c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
        }
        if (keyword == "ZQT") {
            return canonical(value);
        }
        if (keyword == "ISO") {
            format = isoPatternOf(value);
        }
    }
    return naiveFormat(NaiveMoment{value.kind(), value.at(), value.offset ? value.offset->minutes : 0},
                       elementsOf(format));
}

} // namespace kvt::test
