// One line of a zone file, read strictly.
//
// A line is good when the `date` library reads it as the zone compiler would. That library reads with stream operators:
// it stops where a word stops to fit, takes the rest for the next field, and has its own ideas of some words. So a
// field has to be a whole word here, and what the two read differently is refused: shortened or lower-case names, "-"
// for a time, the letters "g" and "z" behind a time, minutes of a negative one, a "#" inside a word, quotes.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// Thrown for a line that is not good, and caught where the file is read.
struct BadZoneLine {
    std::string reason;
};

/// The words of a line, up to a comment.
struct ZoneWords {
    static constexpr std::size_t most = 11; ///< one more than any line has
    std::array<std::string_view, most> word;
    std::size_t count = 0;
};

ZoneWords zoneWords(std::string_view line);

inline constexpr int firstZoneYear = -32767; ///< "min", as the `date` library has it
inline constexpr int lastZoneYear = 32767;   ///< "max"

/// The ON of a rule, the day of an UNTIL: a day of a month, or a day of the week by it.
struct ZoneDay {
    enum class Kind { OfMonth, OnOrAfter, OnOrBefore, Last };
    Kind kind = Kind::OfMonth;
    unsigned month = 1;   ///< 1 to 12
    unsigned day = 1;     ///< 1 to 31; not for `Last`
    unsigned weekday = 0; ///< from Sunday; not for `OfMonth`

    friend bool operator==(const ZoneDay&, const ZoneDay&) = default;
};

/// Days since 1970 of such a day in a year.
std::int64_t daysOf(const ZoneDay& day, int year);

/// Rule NAME FROM TO - IN ON AT SAVE LETTER
struct ZoneRule {
    std::string_view name;
    int from = 0;
    int to = 0;
    ZoneDay on;
    std::int64_t atSeconds = 0; ///< of the clock that is named: of the place, of its standard time, or of UTC
    std::int64_t saveMinutes = 0;
};

/// STDOFF RULES FORMAT [UNTIL], behind "Zone NAME" or in a line of its own.
struct ZoneSpan {
    std::int64_t offsetSeconds = 0;
    std::string_view rule;             ///< empty where there is none, or a fixed saving
    std::optional<std::int64_t> until; ///< seconds since 1970 in UTC, but for the saving at that moment
};

ZoneRule readZoneRule(const ZoneWords& words);
/// The words from the `first` on.
ZoneSpan readZoneSpan(const ZoneWords& words, std::size_t first);
/// Nothing about a leap second is needed, but that it can be read.
void readLeapSecond(const ZoneWords& words);

} // namespace kvt::ex::datetime::detail
