// The language of patterns: one row for each element, with what parse() reads for it and what format() writes. Reader,
// writer, the checks of both functions, the trace and all documents are made from these rows.
//
// The words of a row describe it to users. How a rule is carried out stands in the reader and the writer, which choose
// by `Reading` and `Writing`; the numbers that they need are the row's.
#pragma once

#include <kvt/datetime/datetime_parts.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// How parse() reads an element.
enum class Reading : std::uint8_t {
    Unknown, ///< parse() has no such flag
    End,
    Word,
    AnyCharacter,
    Itself, ///< the character behind the "%"
    Number,
    Seconds, ///< a number and a fraction
    Time,    ///< what `timeExpansion` reads
    ShortMonth,
    FullMonth,
    Meridiem,
    EpochSeconds,
    Offset,
};

/// Whether a number right behind it has to take its whole width.
constexpr bool isNumeric(Reading reading) noexcept {
    return reading == Reading::Number || reading == Reading::Seconds || reading == Reading::Time ||
           reading == Reading::EpochSeconds || reading == Reading::Offset;
}

/// The field that a number goes to.
enum class Field : std::uint8_t { Year, Month, Day, Ordinal, Hours, Minutes, Seconds };
inline constexpr std::size_t fieldCount = 7;

/// What an element gives to a value that is read; combined with "|".
enum Parts : std::uint8_t { noPart = 0, datePart = 1, timePart = 2, offsetPart = 4 };
constexpr Parts operator|(Parts left, Parts right) noexcept {
    return static_cast<Parts>(static_cast<unsigned>(left) | static_cast<unsigned>(right));
}

struct ReadRule {
    Reading reading = Reading::Unknown;
    std::string_view what = {};
    Parts gives = noPart;
    // For numbers only.
    Field field = Field::Year;
    std::uint8_t width = 0; ///< the most digits
    std::int16_t lowest = 0;
    std::int16_t highest = 0;
    bool lenientLifts = false; ///< the highest
    bool isExactInRow = true;  ///< right behind another number it takes its whole width
};

/// How format() writes an element.
enum class Writing : std::uint8_t {
    Unknown, ///< format() has no such flag
    Itself,
    Year,
    YearOfCentury,
    Month,
    ShortMonth,
    FullMonth,
    Day,
    YearDay,
    ShortWeekday,
    FullWeekday,
    WeekdayFromMonday,
    WeekdayFromSunday,
    WeekFromSunday,
    WeekFromMonday,
    Hour,
    HalfDayHour,
    Meridiem,
    Minute,
    Seconds,
    Time,
    EpochSeconds,
    LocalEpochSeconds,
    Offset,
    OffsetOrZ,
};

/// The kinds of value that have what an element asks for.
struct Kinds {
    std::uint8_t set; ///< a bit for each TemporalType
    std::string_view words;

    constexpr bool has(TemporalType kind) const noexcept {
        return (set >> static_cast<unsigned>(kind) & 1) != 0;
    }
};

inline constexpr Kinds anyKind = {0b11111, ""};
inline constexpr Kinds datedKinds = {0b11001, "not on a time"};
inline constexpr Kinds offsetKinds = {0b10100, "needs an offset"};
inline constexpr Kinds epochKinds = {0b10000, "needs a date and an offset"};
inline constexpr Kinds localEpochKinds = {0b01001, "needs a date and no offset"};

struct WriteRule {
    Writing writing = Writing::Unknown;
    std::string_view what = {};
    std::uint8_t width = 0; ///< of a number, with leading zeros
    Kinds kinds = anyKind;
};

struct PatternRow {
    std::string_view element;
    ReadRule reads = {};
    WriteRule writes = {};
};

namespace table {

constexpr ReadRule number(std::string_view what, Field field, Parts gives, std::uint8_t width,
                          std::int16_t lowest, std::int16_t highest, bool lenientLifts) {
    return {Reading::Number, what, gives, field, width, lowest, highest, lenientLifts, true};
}
// The day of the year never asks for its whole width.
constexpr ReadRule ordinal(std::string_view what) {
    return {Reading::Number, what, datePart, Field::Ordinal, 3, 1, 366, true, false};
}
constexpr ReadRule seconds(std::string_view what) {
    return {Reading::Seconds, what, timePart, Field::Seconds, 2, 0, 59, true, true};
}

constexpr bool lifted = true;
constexpr bool kept = false;

} // namespace table

/// What "%T" stands for.
inline constexpr std::string_view timeExpansion = "%H:%M:%S";

// %k and %l give no part: a pattern that has no other flag of a time gives a date, and the hour is dropped.
inline constexpr std::array patternRows = {
    PatternRow{
        "$", {Reading::End, "the end of the value, as the end of the format"}, {Writing::Itself, "itself"}},
    PatternRow{"*", {Reading::Word, "one word, up to a blank"}, {Writing::Itself, "itself"}},
    PatternRow{"?", {Reading::AnyCharacter, "any one character"}, {Writing::Itself, "itself"}},
    PatternRow{"%$", {Reading::Itself, "the character itself"}},
    PatternRow{"%%", {Reading::Itself, "the character itself"}, {Writing::Itself, "a percent sign"}},
    PatternRow{"%*", {Reading::Itself, "the character itself"}},
    PatternRow{"%?", {Reading::Itself, "the character itself"}},
    PatternRow{"%Y",
               table::number("year", Field::Year, datePart, 4, 1000, 9999, table::kept),
               {Writing::Year, "year, 4 digits", 4, datedKinds}},
    PatternRow{"%m",
               table::number("month", Field::Month, datePart, 2, 1, 12, table::lifted),
               {Writing::Month, "month, 2 digits", 2, datedKinds}},
    PatternRow{"%N",
               table::number("month", Field::Month, datePart, 2, 1, 12, table::lifted),
               {Writing::Month, "month, without padding", 1, datedKinds}},
    PatternRow{"%d",
               table::number("day of the month", Field::Day, datePart, 2, 1, 31, table::lifted),
               {Writing::Day, "day of the month, 2 digits", 2, datedKinds}},
    PatternRow{"%e",
               table::number("day of the month", Field::Day, datePart, 2, 1, 31, table::lifted),
               {Writing::Day, "day of the month, without padding", 1, datedKinds}},
    PatternRow{"%j",
               table::ordinal("day of the year"),
               {Writing::YearDay, "day of the year, 3 digits", 3, datedKinds}},
    PatternRow{"%H",
               table::number("hour", Field::Hours, timePart, 2, 0, 23, table::lifted),
               {Writing::Hour, "hour, 2 digits", 2}},
    PatternRow{"%k",
               table::number("hour", Field::Hours, noPart, 2, 0, 23, table::lifted),
               {Writing::Hour, "hour, without padding", 1}},
    PatternRow{"%I",
               table::number("hour", Field::Hours, timePart, 2, 1, 12, table::kept),
               {Writing::HalfDayHour, "hour of a 12-hour clock, 2 digits", 2}},
    PatternRow{"%l",
               table::number("hour", Field::Hours, noPart, 2, 1, 12, table::kept),
               {Writing::HalfDayHour, "hour of a 12-hour clock, without padding", 1}},
    PatternRow{"%M",
               table::number("minute", Field::Minutes, timePart, 2, 0, 59, table::lifted),
               {Writing::Minute, "minute, 2 digits", 2}},
    PatternRow{"%S",
               table::seconds("second"),
               {Writing::Seconds, "second, 2 digits, and a fraction if there is one", 2}},
    PatternRow{"%T", {Reading::Time, "time, as %H:%M:%S", timePart}, {Writing::Time, "time, as %H:%M:%S"}},
    PatternRow{"%b",
               {Reading::ShortMonth, "month by three letters; an unknown one leaves it open", datePart},
               {Writing::ShortMonth, "month by three letters", 0, datedKinds}},
    PatternRow{"%B",
               {Reading::FullMonth, "month by its whole name", datePart},
               {Writing::FullMonth, "month by its whole name", 0, datedKinds}},
    PatternRow{"%p", {Reading::Meridiem, "am or pm", timePart}, {Writing::Meridiem, "AM or PM"}},
    PatternRow{"%s",
               {Reading::EpochSeconds, "seconds since 1970 in UTC", datePart | timePart | offsetPart},
               {Writing::EpochSeconds, "seconds since 1970 in UTC, and a fraction", 0, epochKinds}},
    PatternRow{"%Es",
               {Reading::EpochSeconds, "seconds since 1970 as a local time", datePart | timePart},
               {Writing::LocalEpochSeconds, "local seconds since 1970, and a fraction", 0, localEpochKinds}},
    PatternRow{"%z",
               {Reading::Offset, "offset: Z, +hh, +hhmm or +hh:mm", offsetPart},
               {Writing::Offset, "offset, +hh:mm", 0, offsetKinds}},
    PatternRow{"%Ez",
               {Reading::Offset, "offset: Z, +hh, +hhmm or +hh:mm", offsetPart},
               {Writing::OffsetOrZ, "offset, +hh:mm, or Z for zero", 0, offsetKinds}},
    PatternRow{"%y", {}, {Writing::YearOfCentury, "year, its last 2 digits", 2, datedKinds}},
    PatternRow{"%a", {}, {Writing::ShortWeekday, "day of the week by three letters", 0, datedKinds}},
    PatternRow{"%A", {}, {Writing::FullWeekday, "day of the week by its whole name", 0, datedKinds}},
    PatternRow{"%u", {}, {Writing::WeekdayFromMonday, "day of the week, 1 to 7 from Monday", 1, datedKinds}},
    PatternRow{"%w", {}, {Writing::WeekdayFromSunday, "day of the week, 0 to 6 from Sunday", 1, datedKinds}},
    PatternRow{"%U", {}, {Writing::WeekFromSunday, "week of the year, from Sunday, 2 digits", 2, datedKinds}},
    PatternRow{"%W", {}, {Writing::WeekFromMonday, "week of the year, from Monday, 2 digits", 2, datedKinds}},
};

namespace table {

/// For each character the row of what ends in it: the character alone, behind "%", and behind "%E".
class RowIndex {
public:
    constexpr RowIndex() {
        for (auto& places : places_) {
            places.fill(none);
        }
        for (std::size_t i = 0; i < patternRows.size(); ++i) {
            const std::string_view element = patternRows[i].element;
            places_[element.size() - 1][static_cast<unsigned char>(element.back())] =
                static_cast<std::uint8_t>(i);
        }
    }
    constexpr const PatternRow* find(std::size_t length, char last) const noexcept {
        const std::uint8_t place = places_[length - 1][static_cast<unsigned char>(last)];
        return place == none ? nullptr : &patternRows[place];
    }

private:
    static constexpr std::uint8_t none = 0xFF;
    std::array<std::array<std::uint8_t, 256>, 3> places_{};
};
inline constexpr RowIndex rowIndex;

} // namespace table

/// The row of a flag, given without its "%" and its modifier, or null.
constexpr const PatternRow* rowOfFlag(char flag, bool isModified) noexcept {
    return table::rowIndex.find(isModified ? 3 : 2, flag);
}

/// The row of a character that is not part of a flag; null for one that stands for itself.
constexpr const PatternRow* rowOfCharacter(char c) noexcept {
    return table::rowIndex.find(1, c);
}

/// The row of an element, or null: one character that stands for itself, or a flag that there is not.
constexpr const PatternRow* rowOfElement(std::string_view element) noexcept {
    if (element.front() != '%') {
        return rowOfCharacter(element.front());
    }
    const bool isModified = element.size() > 1 && element[1] == 'E';
    return element.size() == (isModified ? 3 : 2) ? rowOfFlag(element.back(), isModified) : nullptr;
}

inline constexpr std::size_t shortNameLength = 3;
inline constexpr std::array<std::string_view, 12> monthNames = {
    "January", "February", "March",     "April",   "May",      "June",
    "July",    "August",   "September", "October", "November", "December"};
inline constexpr std::array<std::string_view, 7> weekdayNames = {"Sunday",   "Monday", "Tuesday", "Wednesday",
                                                                 "Thursday", "Friday", "Saturday"};

/// The form of ISO 8601 for a kind of value, "Unsupported" excepted. parse() puts a "$" behind it.
inline constexpr std::array<std::string_view, 5> isoPatterns = {
    "%Y-%m-%d$", "%H:%M:%S$", "%H:%M:%S%Ez$", "%Y-%m-%dT%H:%M:%S$", "%Y-%m-%dT%H:%M:%S%Ez$",
};
/// The kinds in the order in which parse() tries their forms.
inline constexpr std::array isoOrder = {TemporalType::Date, TemporalType::Datetime,
                                        TemporalType::DatetimeWithOffset, TemporalType::Time,
                                        TemporalType::TimeWithOffset};

/// To be read, which takes the whole value.
constexpr std::string_view isoReadPattern(TemporalType kind) noexcept {
    return isoPatterns[static_cast<std::size_t>(kind)];
}
/// To be written: without the "$" at the end.
constexpr std::string_view isoWritePattern(TemporalType kind) noexcept {
    return isoReadPattern(kind).substr(0, isoReadPattern(kind).size() - 1);
}

} // namespace kvt::ex::datetime::detail
