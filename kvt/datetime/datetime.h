// Dates, times and intervals that are carried as compact text.
//
// A value is a text of one of five shapes, and its shape is its kind (TemporalType in datetime_parts.h):
//
//     20200102                      a date
//     030405.25   030405+01:00      a time of day, without and with an offset from UTC
//     20200102030405.25             both
//     20200102030405.25+01:00       both, with an offset
//
// Years run from 1000 to 9999 in the Gregorian calendar, also before it was in use; a fraction of a second has at
// most nine digits; there are no leap seconds and no zone names. Blanks around a value do not matter. Offsets are
// read as "+hh", "+hhmm" and "+hh:mm" and always written as the last of these.
//
// An interval is `[-]P[nY][nM][nD][T[nH][nM][nS]]`, in this order, each at most once; only the seconds may have a
// fraction. The zero interval is written "PT0S".
//
//     using namespace kvt::ex::datetime;
//     auto [state, text, message] = add("20200131", "P1M");     // Success, "20200229"
//
// No function throws. Each gives a tuple of the state, the value and a message: with `Success` or `Repaired` the
// value is good and there is no message; else the value is an empty text (or 0.0) and the message, if any, says by
// number and parameters what was wrong (message_numbers.h). Three answers are common to nearly all functions and not
// repeated below: a value of no known shape is 933063, a part out of its range (a month of 13) is 933065, and what
// nobody foresaw, lack of memory included, is the message 933068 without parameters.
//
// The functions keep no state and may be called from any thread; the zone database behind "local" is loaded once.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/foundation/export.h>
#include <kvt/string/ustring.h>

#include <cstdint>
#include <string>

namespace kvt::ex::datetime {

// ---- Fields and text

/// Reads a value into its fields, rounded: to the minute for a precision of -1, else to so many decimals of the
/// second, 0 to 9. Rounding carries up to the year where it has to; the type is then that of a datetime. With -1 the
/// minute is right and the seconds stay as they were. On failure the parts are the default ones. 933068 for another
/// precision.
KVT_EXPORT PartsResult parseZQTDateTime(const UString<0>& value, std::int16_t precision);

/// The datetime of the fields, always with a date and a time and with an offset if there is one; the type of the
/// parts is not looked at. A part that is out of range is 933065: those that do not fit into two digits are met
/// first, in the order from year to seconds, then hours, minutes, seconds, year, month and day. What nobody foresaw
/// has no message.
KVT_EXPORT TextResult create(const DateTimeParts& parts);

/// The interval text of the fields, as they are: 90 minutes stay "PT90M". The zero interval never has a sign.
KVT_EXPORT TextResult intervalCreate(const IntervalParts& parts);

/// The value as another kind. A date gets midnight for its time; a datetime loses its date or its time and offset. A
/// value is normalised where it is of the target's kind already, and the state is `Repaired` where its offset was not
/// canonical and is in the result. A time cannot become what has a date: 933052, as for the target `Unknown`.
KVT_EXPORT TextResult cast(const UString<0>& value, CastToTemporalType target);

// ---- Arithmetic

/// The value moved by an interval: years and months first, the day then cut to the length of the month reached, then
/// days and less as exact lengths of time. A date to which a time is added becomes a datetime; a time wraps at
/// midnight and takes no years, months or days above zero (933060). The offset takes no part and stays; the state is
/// `Repaired` if it was not canonical. 933064 for an interval that cannot be read, 933068 if a number in it is too
/// large or has a fraction where it must not. A result with a year of 0 to 999 is 933065, one further off an empty
/// text.
KVT_EXPORT TextResult add(const UString<0>& value, const UString<0>& interval);

/// The interval `first` minus `second`: whole years and months counted from `second` towards `first`, then the rest
/// as days and less. Offsets count. The kinds have to be the same, but a date goes with a datetime without offset, as
/// its midnight; else 933059. The parts of `second` are checked before those of `first`.
KVT_EXPORT TextResult diff(const UString<0>& first, const UString<0>& second);

/// The same difference as one number. Years and months are whole months plus the rest as a part of the month in which
/// the earlier end of that rest lies; all others are exact lengths of time. 933068 for an unknown unit.
KVT_EXPORT NumberResult diffAsNumber(const UString<0>& first, const UString<0>& second, UnitType unit);

/// -1, 0 or 1 as `first` is earlier than, the same moment as or later than `second`; -3 where diff() would fail.
KVT_EXPORT int compare(const UString<0>& first, const UString<0>& second);

/// The interval text with its sign turned, otherwise as given: also "PT0S" becomes "-PT0S". 933064 for no interval.
KVT_EXPORT TextResult intervalNegate(const UString<0>& interval);

// ---- Other forms of text

/// Reads a value that is written in any form, and gives it in canonical form.
///
/// `format` without a "%" is a list of keywords, in any case, with "|" between them; the first that fits is taken,
/// and an unknown one is passed over. 933075 if none was known, 933097 if none fitted.
///
///     ZQT    the canonical form itself, which is normalised
///     ISO    2020-01-02, 03:04:05, 2020-01-02T03:04:05, the last two also with an offset, "Z" included
///
/// Any other format is a pattern. What is not in the following list stands for itself, byte for byte, in the system's
/// encoding; so do blanks. Numbers take as many digits as there are up to their width, but a number right behind
/// another one takes the whole width, all but %j. Where a bound is in brackets, `lenient` lifts it.
///
///     $    the end of the value, as the end of the format
///     *    one word, up to a blank
///     ?    any one character
///     %$   the character itself
///     %%   the character itself
///     %*   the character itself
///     %?   the character itself
///     %Y   year: up to 4 digits, 1000 to 9999
///     %m   month: up to 2 digits, 1 to (12)
///     %N   month: up to 2 digits, 1 to (12)
///     %d   day of the month: up to 2 digits, 1 to (31)
///     %e   day of the month: up to 2 digits, 1 to (31)
///     %j   day of the year: up to 3 digits, 1 to (366)
///     %H   hour: up to 2 digits, 0 to (23)
///     %k   hour: up to 2 digits, 0 to (23)
///     %I   hour: up to 2 digits, 1 to 12
///     %l   hour: up to 2 digits, 1 to 12
///     %M   minute: up to 2 digits, 0 to (59)
///     %S   second: up to 2 digits, 0 to (59), and a fraction
///     %T   time, as %H:%M:%S
///     %b   month by three letters; an unknown one leaves it open
///     %B   month by its whole name
///     %p   am or pm
///     %s   seconds since 1970 in UTC
///     %Es  seconds since 1970 as a local time
///     %z   offset: Z, +hh, +hhmm or +hh:mm
///     %Ez  offset: Z, +hh, +hhmm or +hh:mm
///
/// Names, "am" and "pm" are read in any case, and %B fails by an unknown one. A fraction is taken where there is one.
/// %j needs %Y. The result of %s has the offset +00:00, that of %Es none. The word of "*" has to end in what stands
/// behind the "*" up to a blank or "$". Without a "$" at the end of the format the rest of the value is not looked at.
///
/// A format without any of %T %H %I %p %M %S %s %Es gives a date, so that %k and %l alone are read and dropped; one
/// without any of %Y %m %N %b %B %d %e %j %s %Es gives a time; all others give a datetime. A date is
/// asked for as a whole, by year, month and day or by year and %j; a time from the hour on, where the seconds, or the
/// minutes and the seconds, may be left out and are 0. Anything else is one of the failures below.
///
/// With `lenient`, what exceeds a bound in brackets runs over into the next larger part: 30 February is 1 or 2 March.
///
/// An empty value fails without a message, an empty format is 933074. A pattern fails by 933067 at the element that
/// did not match, by 933079 for an unknown flag, 933083 for %s and %z together, 933093 for seconds since 1970 out of
/// range, and by 933081, 933082 and 933085 to 933091 if the parts do not make up a value.
KVT_EXPORT TextResult parse(const UString<0>& value, const UString<0>& format, bool lenient);

/// Writes a canonical value in another form.
///
/// `format` without a "%" is a list of keywords, as for parse(): "ZQT" for the canonical form, "ISO" for that of ISO
/// 8601. Where no keyword is known the format itself comes out. Any other format is a pattern:
///
///     $    itself
///     *    itself
///     ?    itself
///     %%   a percent sign
///     %Y   year, 4 digits; not on a time
///     %m   month, 2 digits; not on a time
///     %N   month, without padding; not on a time
///     %d   day of the month, 2 digits; not on a time
///     %e   day of the month, without padding; not on a time
///     %j   day of the year, 3 digits; not on a time
///     %H   hour, 2 digits
///     %k   hour, without padding
///     %I   hour of a 12-hour clock, 2 digits
///     %l   hour of a 12-hour clock, without padding
///     %M   minute, 2 digits
///     %S   second, 2 digits, and a fraction if there is one
///     %T   time, as %H:%M:%S
///     %b   month by three letters; not on a time
///     %B   month by its whole name; not on a time
///     %p   AM or PM
///     %s   seconds since 1970 in UTC, and a fraction; needs a date and an offset
///     %Es  local seconds since 1970, and a fraction; needs a date and no offset
///     %z   offset, +hh:mm; needs an offset
///     %Ez  offset, +hh:mm, or Z for zero; needs an offset
///     %y   year, its last 2 digits; not on a time
///     %a   day of the week by three letters; not on a time
///     %A   day of the week by its whole name; not on a time
///     %u   day of the week, 1 to 7 from Monday; not on a time
///     %w   day of the week, 0 to 6 from Sunday; not on a time
///     %U   week of the year, from Sunday, 2 digits; not on a time
///     %W   week of the year, from Monday, 2 digits; not on a time
///
/// Names are English. %T has the fraction of %S.
///
/// On a date the time reads as midnight, but there is no offset to ask for; on a time no part of a date can be asked
/// for. Such a flag is 933078, an unknown one 933079, a "%" at the end 933076, %s beside %z 933083. An empty value
/// fails without a message, an empty format is 933074. What nobody foresaw is 933084.
KVT_EXPORT TextResult format(const UString<0>& value, const UString<0>& format);

// ---- Offsets and the zone of the machine

/// The present moment. `Error` with 933050 and the cause where the zone of the machine cannot be found; `Error`
/// without a message for an unknown mode. `Utc` needs no zone database.
KVT_EXPORT TextResult now(ZoneMode mode);

/// The offset of a value, as text or as a signed number. 933071 for all that has none, unreadable values included;
/// no message for an unknown type.
KVT_EXPORT TextResult timezoneGet(const UString<0>& value, UTCOffsetType type);

/// The value with another offset: a text such as "+01:00", "utc", or "local" for that of the machine's zone at that
/// moment, in any case. Any other text is not refused: it takes the offset away, and the state is `Success`; Convert
/// then leaves the wall clock of UTC. A date comes back as a datetime. In order: 933096 for "local" on a time, 933073
/// where Convert has no offset to start from, 933092 for an empty zone; then 933094 and 933095 for a wall clock that
/// the machine's zone skips or repeats. A missing zone database has no message.
KVT_EXPORT TextResult timezoneSet(const UString<0>& value, const UString<0>& zone, const SetZoneMode& mode);

/// The value without its offset; its wall clock stays. A value that has none comes back as it was given.
KVT_EXPORT TextResult timezoneRemove(const UString<0>& value);

/// Names the folder of the zone database. To be called before anything that needs the zone of the machine: the database
/// is loaded once, at its first use. A folder in which zoneFolderFault() finds something (zone_folder.h) is not loaded.
KVT_EXPORT void setInstallPathWrapper(const std::string& path);

} // namespace kvt::ex::datetime
