// What can be wrong with a value or an interval, as it travels inside: in an Outcome (outcome.h), until a public
// function words it (result.h). Patterns have failures of their own (pattern_failure.h). What is thrown comes from
// outside: lack of memory, conversions, the zone database.
#pragma once

#include <kvt/datetime/detail/outcome.h>
#include <kvt/datetime/detail/text.h>

#include <span>
#include <string_view>
#include <variant>

namespace kvt::ex::datetime::detail {

/// A text that is not a value: 933063. It stays the caller's.
struct ValueUnsupported {
    std::string_view value;
};

/// A text that is not an interval: 933064. It stays the caller's.
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

/// A cast to what a value cannot become: 933052. The words of its message are in a table that lives for ever.
struct CastImpossible {
    std::span<const std::string_view> words;
};

/// An interval with years, months or days, added to a time: 933060. Both texts stay the caller's.
struct DateIntervalOnTime {
    std::string_view value;
    std::string_view interval;
};

/// What nobody has words for; the public function answers with its last resort.
struct Unexpected {};

using Failure = std::variant<Unexpected, ValueUnsupported, IntervalUnreadable, KindsNotComparable,
                             DatePartRange, CastImpossible, DateIntervalOnTime>;

template <typename Value, typename Cause = Failure>
class Outcome;

} // namespace kvt::ex::datetime::detail
