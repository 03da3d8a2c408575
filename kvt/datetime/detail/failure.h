// How a failure travels inside: as a value. A step that can fail returns an Outcome, which holds what was asked for or a
// Failure, and each caller passes the failure on until a public function words it (result.h). No exception is thrown on
// the way of a value; what does get thrown comes from outside: lack of memory, conversions, the zone database.
//
//     Outcome<TemporalInstant> instant = instantFromParts(parts, false);
//     if (!instant) {
//         return instant.failure();
//     }
#pragma once

#include <kvt/string/ustring.h>

#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <variant>

namespace kvt::ex::datetime::detail {

/// A part of a value is out of its range: 933065. All but the value itself are texts that live for ever.
struct DatePartRange {
    UString<0> value;
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

using Failure = std::variant<Unexpected, DatePartRange, ParseMismatch, ParseUnknownFlag, ParseEpochTimeRange,
                             ParseValidation, FormatStringBadCombo, FormatFlag>;

/// A value, or why there is none. Made from either; the two are never the same type.
template <typename Value>
class [[nodiscard]] Outcome {
public:
    Outcome(Value value) : state_(std::in_place_index<0>, std::move(value)) {}
    template <typename Cause, std::enable_if_t<std::is_constructible_v<Failure, Cause&&> &&
                                                   !std::is_convertible_v<Cause&&, Value> &&
                                                   !std::is_same_v<std::remove_cvref_t<Cause>, Outcome>,
                                               int> = 0>
    Outcome(Cause&& cause) : state_(std::in_place_index<1>, std::forward<Cause>(cause)) {}

    explicit operator bool() const noexcept { return state_.index() == 0; }

    /// Only with a value.
    Value& operator*() noexcept { return *std::get_if<0>(&state_); }
    const Value& operator*() const noexcept { return *std::get_if<0>(&state_); }
    Value* operator->() noexcept { return std::get_if<0>(&state_); }
    const Value* operator->() const noexcept { return std::get_if<0>(&state_); }

    /// Only without one.
    Failure& failure() noexcept { return *std::get_if<1>(&state_); }
    const Failure& failure() const noexcept { return *std::get_if<1>(&state_); }

private:
    std::variant<Value, Failure> state_;
};

} // namespace kvt::ex::datetime::detail
