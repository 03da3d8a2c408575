// A second reader of values, offsets and intervals, which cuts texts up by searching.
#pragma once

#include <datetime/answer.h>
#include <datetime/naive_calendar.h>

#include <kvt/datetime/datetime.h>

#include <optional>
#include <string>
#include <variant>

namespace kvt::test {

constexpr Int128 naiveSecond = 1'000'000'000; ///< in nanoseconds
constexpr Int128 naiveMinute = 60 * naiveSecond;
constexpr Int128 naiveDay = 1440 * naiveMinute;

struct NaiveOffset {
    int minutes = 0;
    std::string text; ///< canonical
};

/// None where a text is no offset; the empty one is not asked for.
std::optional<NaiveOffset> naiveOffset(const std::string& text);

/// "+hh:mm"
std::string naiveOffsetText(int minutes);

struct NaiveValue {
    bool hasDate = false;
    bool hasTime = false;
    std::optional<NaiveOffset> offset;
    bool wasRepaired = false;
    NaiveDateTime given{1970, 1, 1}; ///< a fraction that is rounded up is a thousand million nanoseconds
    Int128 count = 0;                ///< of the wall clock

    Int128 utc() const;
    NaiveDateTime at() const { return naiveDateTime(count); }
    kvt::ex::datetime::TemporalType kind() const;
};

/// A value, or what any function answers that is handed the text.
using NaiveReading = std::variant<NaiveValue, Answer>;
NaiveReading naiveRead(const std::string& given);

struct NaiveInterval {
    bool isNegative = false;
    std::int64_t years = 0, months = 0, days = 0, hours = 0, minutes = 0, seconds = 0;
    int nanoseconds = 0;

    bool hasDate() const { return years > 0 || months > 0 || days > 0; }
    bool hasTime() const { return hours > 0 || minutes > 0 || seconds > 0 || nanoseconds > 0; }
    std::string text() const;
};

/// An interval, or what add() and intervalNegate() answer; nothing where the seconds are beyond what is counted here.
std::optional<std::variant<NaiveInterval, Answer>> naiveInterval(const std::string& given);

/// What a function answers to a time or a date that there is not; nothing to one that there is.
std::optional<Answer> naiveRangeOfTime(const NaiveDateTime& at);
std::optional<Answer> naiveRangeOfDate(const NaiveDateTime& at);
Answer naiveYearOutOfRange(std::int64_t year);

/// Without the six kinds of white space at both ends.
std::string naiveTrimmed(const std::string& text);

} // namespace kvt::test
