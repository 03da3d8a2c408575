// A second implementation of the functions on values, which knows nothing of the first: it cuts texts up by searching,
// counts days year by year, steps months one by one, and holds all nanoseconds in one number of 128 bits. Each function
// gives the whole answer: state, text or number, and message.
#pragma once

#include <datetime/answer.h>
#include <datetime/naive_calendar.h>

#include <kvt/datetime/datetime.h>

#include <optional>
#include <string>
#include <variant>

namespace kvt::test {

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

/// Nothing where naiveInterval() gives nothing.
std::optional<Answer> naiveAdd(const std::string& value, const std::string& interval);
std::optional<Answer> naiveNegate(const std::string& interval);

Answer naiveCast(const std::string& value, kvt::ex::datetime::CastToTemporalType target);
Answer naiveCreate(const NaiveDateTime& at, const std::string& offset);

struct NaiveDifference {
    Answer interval;
    Answer months;
    Answer seconds;
    int order = -3;

    /// The answer of diffAsNumber().
    Answer inUnit(kvt::ex::datetime::UnitType unit) const;
};
NaiveDifference naiveDiff(const std::string& first, const std::string& other);

/// There is no zone database, so that "local" fails.
Answer naiveTimezoneSet(const std::string& value, const std::string& zone,
                        kvt::ex::datetime::SetZoneMode mode);
Answer naiveTimezoneGet(const std::string& value, kvt::ex::datetime::UTCOffsetType type);
Answer naiveTimezoneRemove(const std::string& value);

/// Of parseZQTDateTime(): as text the fields that naiveFields() shows.
Answer naiveParts(const std::string& value, int precision);
std::string naiveFields(const NaiveDateTime& at, const std::string& offset,
                        kvt::ex::datetime::TemporalType kind);

/// Without the six kinds of white space at both ends.
std::string naiveTrimmed(const std::string& text);

} // namespace kvt::test
