// What can be wrong with a value, a pattern or an interval, as it travels inside: in an Outcome (outcome.h), until a
// public function words it (result.h). What does get thrown comes from outside: lack of memory, conversions, the zone
// database.
#pragma once

#include <kvt/datetime/detail/outcome.h>
#include <kvt/datetime/detail/text.h>

#include <string>
#include <string_view>
#include <variant>

namespace kvt::ex::datetime::detail {

/// A text that is no value: 933063. It stays the caller's.
struct ValueUnsupported {
    std::string_view value;
};

/// A text that is no interval: 933064. It stays the caller's.
struct IntervalUnreadable {
    std::string_view interval;
};

/// Two values of kinds that are not compared: 933059. They stay the caller's.
struct KindsNotComparable {
    std::string_view first;
    std::string_view second;
};

/// A part of a value is out of its range: 933065. All but the value itself are texts that live for ever.
struct DatePartRange {
    ShortText value;
    std::string_view part;
    std::string_view lowest;
    std::string_view highest;
};

/// A value does not match its pattern: 933067.
struct ParseMismatch {
    std::string matched; ///< the format up to the element that failed
    std::string rest;    ///< the format from there on
};

/// 933079 of parse().
struct ParseUnknownFlag {
    std::string flag;
};

/// 933093.
struct ParseEpochTimeRange {
    std::string seconds;
};

/// What is wrong with the fields that a pattern has read, taken together.
enum class ParseValidation {
    OrdinalWithoutYear = 0,   ///< 933081
    DateIncomplete = 1,       ///< 933082
    OffsetWithoutTime = 2,    ///< 933085
    TimeIncomplete = 3,       ///< 933086
    NothingGiven = 4,         ///< 933087
    HourNotForMeridiem = 5,   ///< 933088
    OrdinalPastYearEnd = 6,   ///< 933089
    NoSuchDate = 7,           ///< 933090
    ResultYearOutOfRange = 8, ///< 933091
    Unreadable = 9,           ///< no number of its own
};

/// Two flags that exclude each other: 933083.
struct FormatStringBadCombo {
    std::string first;
    std::string second;
};

/// A flag that the value has nothing for: 933078.
enum class FormatFlag {
    EpochWithoutOffset = 0, ///< %s
    EpochWithOffset = 1,    ///< %Es
    OffsetMissing = 2,      ///< %z
    AbbreviationMissing = 3 ///< %Z
};

/// What nobody has words for; the public function answers with its last resort.
struct Unexpected {};

using Failure = std::variant<Unexpected, ValueUnsupported, IntervalUnreadable, KindsNotComparable,
                             DatePartRange, ParseMismatch, ParseUnknownFlag, ParseEpochTimeRange,
                             ParseValidation, FormatStringBadCombo, FormatFlag>;

template <typename Value, typename Cause = Failure>
class Outcome;

} // namespace kvt::ex::datetime::detail
