// The numbers by which the date and time functions name their failures, for a host that keeps the texts. Behind each
// stand the parameters that LogMessageInfo carries for it, in order; "the value" is the text as the caller gave it.
#pragma once

#include <cstdint>

namespace kvt::ex::datetime::message_number {

inline constexpr std::uint32_t zoneLookupFailed = 933050;   ///< the text of the failure outside
inline constexpr std::uint32_t castImpossible = 933052;     ///< word of the value's family, words of targets
inline constexpr std::uint32_t kindsNotComparable = 933059; ///< the first value, the second value
inline constexpr std::uint32_t dateIntervalOnTime = 933060; ///< the value, the interval
inline constexpr std::uint32_t valueUnsupported = 933063;   ///< the value
inline constexpr std::uint32_t intervalUnreadable = 933064; ///< the interval
inline constexpr std::uint32_t partOutOfRange = 933065;     ///< the part's value, its name, lowest, highest
inline constexpr std::uint32_t formatMismatch = 933067;     ///< the format up to what failed, and from there
inline constexpr std::uint32_t generic = 933068;            ///< none
inline constexpr std::uint32_t valueHasNoOffset = 933071;   ///< the value; timezoneGet
inline constexpr std::uint32_t nothingToConvertFrom = 933073; ///< the value; timezoneSet
inline constexpr std::uint32_t formatEmpty = 933074;          ///< none
inline constexpr std::uint32_t noKnownKeyword = 933075;       ///< the format
inline constexpr std::uint32_t formatEndsInPercent = 933076;  ///< none
inline constexpr std::uint32_t flagNotForKind = 933078;       ///< the flag with its "%", word of the kind
inline constexpr std::uint32_t unknownFlag = 933079; ///< the flag, "@DateTimeParse()" or "@DateTimeFormat()"

// What parse() finds wrong in the fields as a whole; the parameter is the format.
inline constexpr std::uint32_t ordinalWithoutYear = 933081;
inline constexpr std::uint32_t dateIncomplete = 933082;
inline constexpr std::uint32_t flagsExcludeEachOther = 933083;    ///< the two flags
inline constexpr std::uint32_t formatFailedUnexpectedly = 933084; ///< none; format() only
inline constexpr std::uint32_t offsetWithoutTime = 933085;
inline constexpr std::uint32_t timeIncomplete = 933086;
inline constexpr std::uint32_t nothingGiven = 933087;
inline constexpr std::uint32_t hourNotForMeridiem = 933088;
inline constexpr std::uint32_t ordinalPastYearEnd = 933089;
inline constexpr std::uint32_t noSuchDate = 933090;
inline constexpr std::uint32_t resultYearOutOfRange = 933091;

inline constexpr std::uint32_t zoneEmpty = 933092;           ///< none; timezoneSet
inline constexpr std::uint32_t epochTimeOutOfRange = 933093; ///< the seconds
inline constexpr std::uint32_t localTimeInGap = 933094;      ///< the value without offset
inline constexpr std::uint32_t localTimeAmbiguous = 933095;  ///< the value without offset
inline constexpr std::uint32_t localZoneForTime = 933096;    ///< the value
inline constexpr std::uint32_t noKeywordMatched = 933097;    ///< the value

} // namespace kvt::ex::datetime::message_number
