// Why a value was not read by a pattern. A failure refers to the pattern and the value and holds no text of
// its own, so that one that nobody words, as of a keyword that is passed over, costs nothing. parse() words it, while
// both texts are there.
#pragma once

#include <cstddef>
#include <string_view>
#include <variant>

namespace kvt::ex::datetime::detail {

/// A value does not match its pattern: 933067.
struct ParseMismatch {
    std::size_t place; ///< where the element that failed begins in the pattern
};

/// 933079 of parse().
struct ParseUnknownFlag {
    std::string_view flag;
};

/// 933093.
struct ParseEpochTimeRange {
    std::string_view seconds;
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
};

/// Two flags that exclude each other: 933083.
struct FormatStringBadCombo {
    std::string_view first;
    std::string_view second;
};

using PatternFailure =
    std::variant<ParseMismatch, ParseUnknownFlag, ParseEpochTimeRange, ParseValidation, FormatStringBadCombo>;

} // namespace kvt::ex::datetime::detail
