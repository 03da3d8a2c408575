// The values that the date and time functions share: what kinds of value there are, a value and an interval broken
// into their fields, and how a result and its failure look. The functions stand in datetime.h.
//
// All of these are plain values without checks: a part may hold any number, and whoever reads the parts checks them.
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/foundation/optional.h>
#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <cstdint>
#include <tuple>

namespace kvt::ex::datetime {

namespace detail {
struct PartsAccess;
} // namespace detail

/// The kind of a value, known from the shape of its text. `f` is one to nine digits and never ends in a zero.
enum class TemporalType : std::uint32_t {
    Date = 0,               ///< YYYYMMDD
    Time = 1,               ///< HHMMSS[.f]
    TimeWithOffset = 2,     ///< HHMMSS[.f]+hh:mm
    Datetime = 3,           ///< YYYYMMDDHHMMSS[.f]
    DatetimeWithOffset = 4, ///< YYYYMMDDHHMMSS[.f]+hh:mm
    Unsupported = 5,        ///< anything else
};

/// What cast() makes of a value.
enum class CastToTemporalType : std::uint32_t { Date = 0, Time = 1, Datetime = 2, Unknown = 3 };

/// How DateTimeParts writes itself: 20200102030405, or 2020-01-02T03:04:05.
enum class FormatType : std::uint32_t { Compact = 0, Extended = 1 };

/// How a function went.
enum class ReturnState : std::uint32_t {
    Error = 0,    ///< the request was bad, or something outside failed
    Failure = 1,  ///< the value could not be computed; the result is an empty text, or 0.0
    Repaired = 2, ///< the result is good, but the offset in the value was not in canonical form
    Success = 3,  ///< the result is good
};

/// The unit of diffAsNumber().
enum class UnitType : std::uint32_t { Years = 0, Months = 1, Weeks = 2, Days = 3, Hours = 4, Minutes = 5, Seconds = 6 };

/// What now() gives.
enum class ZoneMode : std::uint32_t {
    LocalWithOffset = 0,    ///< the machine's wall clock, with its offset
    Utc = 1,                ///< UTC, with the offset +00:00
    LocalWithoutOffset = 2, ///< the machine's wall clock
};

/// What timezoneGet() gives.
enum class UTCOffsetType : std::uint32_t { OffsetText = 0, OffsetInMinutes = 1, OffsetInSeconds = 2 };

/// What timezoneSet() keeps.
enum class SetZoneMode : std::uint32_t {
    Automatic = 0, ///< Convert when the value has an offset, else Replace
    Replace = 1,   ///< the wall clock stays, the offset is attached
    Convert = 2,   ///< the instant stays, the wall clock moves to the new offset
};

/// Which message describes a failure, and the texts for its places, in order. The numbers are in message_numbers.h.
struct LogMessageInfo {
    std::uint32_t messageNumber = 0;
    UStringArray<0> parameters;
};

/// A value broken into its fields: 1970-01-01 00:00:00 without offset, of type `Unsupported`, unless told otherwise.
class KVT_EXPORT DateTimeParts {
public:
    DateTimeParts() = default;

    /// Whole seconds and nanoseconds are cut from `seconds`; a negative number and a NaN give zero for both. The
    /// fraction is rounded without a carry, so that 59.9999999999 is 59 seconds and 1,000,000,000 nanoseconds. The
    /// offset is taken as by setOffset(), and the type is `DatetimeWithOffset` if one is stored, else `Datetime`.
    DateTimeParts(std::int64_t year, std::uint64_t month, std::uint64_t day, std::uint64_t hours, std::uint64_t minutes,
                  double seconds, const UString<0>& offset);

    /// The low 32 bits of these three.
    int year() const noexcept { return static_cast<int>(year_); }
    int month() const noexcept { return static_cast<int>(month_); }
    int day() const noexcept { return static_cast<int>(day_); }
    std::int64_t hours() const noexcept { return static_cast<std::int64_t>(hours_); }
    std::int64_t minutes() const noexcept { return static_cast<std::int64_t>(minutes_); }
    std::int64_t seconds() const noexcept { return static_cast<std::int64_t>(seconds_); }
    std::int64_t nanoseconds() const noexcept { return static_cast<std::int64_t>(nanoseconds_); }
    UString<0> offset() const { return offset_; }
    TemporalType type() const noexcept { return type_; }

    /// True for all types but `Time` and `TimeWithOffset`, so also for `Unsupported`.
    bool hasDate() const noexcept { return type_ != TemporalType::Time && type_ != TemporalType::TimeWithOffset; }
    /// True for all types but `Date`.
    bool hasTime() const noexcept { return type_ != TemporalType::Date; }
    /// Whether there is an offset text, whatever the type says.
    bool hasOffset() const noexcept { return !offset_.isEmpty(); }

    void setYear(std::int64_t year) noexcept { year_ = year; }
    void setMonth(std::uint64_t month) noexcept { month_ = month; }
    void setDay(std::uint64_t day) noexcept { day_ = day; }
    void setHours(std::uint64_t hours) noexcept { hours_ = hours; }
    void setMinutes(std::uint64_t minutes) noexcept { minutes_ = minutes; }
    void setSeconds(std::uint64_t seconds) noexcept { seconds_ = seconds; }
    void setNanoseconds(std::uint64_t nanoseconds) noexcept { nanoseconds_ = nanoseconds; }
    void setType(const TemporalType& type) noexcept { type_ = type; }
    /// Stores the canonical form of an offset (see ZQTDateTimeUTCOffset::repairOffset), or the empty text where
    /// `offset` is none. The type stays as it is.
    void setOffset(const UString<0>& offset);

    /// The seconds with their fraction, from two digits up: "05.25", "00", "59.999999999".
    UString<0> secondsFractionalToString() const;
    /// "20200102" or "2020-01-02"; empty for the types without a date.
    UString<0> toDateString(const FormatType& format) const;
    /// "030405.5" or "03:04:05.5", then the offset if asked for and there is one. Any type has a time here.
    UString<0> toTimeString(const FormatType& format, bool withOffset) const;
    /// The two together, with a "T" between them in extended form; the time alone for the types without a date.
    UString<0> toDatetimeString(const FormatType& format, bool withOffset) const;

private:
    friend struct detail::PartsAccess;

    DateTimeParts(std::int64_t year, std::uint64_t month, std::uint64_t day, std::uint64_t hours, std::uint64_t minutes,
                  std::uint64_t seconds, std::uint64_t nanoseconds, const UString<0>& offset);

    std::int64_t year_ = 1970;
    std::uint64_t month_ = 1;
    std::uint64_t day_ = 1;
    std::uint64_t hours_ = 0;
    std::uint64_t minutes_ = 0;
    std::uint64_t seconds_ = 0;
    std::uint64_t nanoseconds_ = 0;
    UString<0> offset_;
    TemporalType type_ = TemporalType::Unsupported;
};

/// An interval broken into its fields. No field is carried into a larger one, and the sign stands apart from them.
class KVT_EXPORT IntervalParts {
public:
    /// Zero, not negative.
    IntervalParts() noexcept = default;
    /// The seconds are cut in two as by DateTimeParts.
    IntervalParts(std::uint64_t years, std::uint64_t months, std::uint64_t days, std::uint64_t hours,
                  std::uint64_t minutes, double seconds, bool negative) noexcept;

    std::int64_t years() const noexcept { return static_cast<std::int64_t>(years_); }
    std::int64_t months() const noexcept { return static_cast<std::int64_t>(months_); }
    std::int64_t days() const noexcept { return static_cast<std::int64_t>(days_); }
    std::int64_t hours() const noexcept { return static_cast<std::int64_t>(hours_); }
    std::int64_t minutes() const noexcept { return static_cast<std::int64_t>(minutes_); }
    std::int64_t seconds() const noexcept { return static_cast<std::int64_t>(seconds_); }
    std::int64_t nanoseconds() const noexcept { return static_cast<std::int64_t>(nanoseconds_); }
    bool negative() const noexcept { return negative_; }

private:
    friend struct detail::PartsAccess;

    std::uint64_t years_ = 0;
    std::uint64_t months_ = 0;
    std::uint64_t days_ = 0;
    std::uint64_t hours_ = 0;
    std::uint64_t minutes_ = 0;
    std::uint64_t seconds_ = 0;
    std::uint64_t nanoseconds_ = 0;
    bool negative_ = false;
};

/// What the functions return: how it went, the value, and a message where there is something to say.
using TextResult = std::tuple<ReturnState, UString<0>, kvt::future::optional<LogMessageInfo>>;
using NumberResult = std::tuple<ReturnState, double, kvt::future::optional<LogMessageInfo>>;
using PartsResult = std::tuple<ReturnState, DateTimeParts, kvt::future::optional<LogMessageInfo>>;

/// The shortest fixed-point text with at most nine decimals: 59.5 gives "59.5", 0.0 gives "0". No zero ends the
/// fraction, and no locale plays a part.
KVT_EXPORT UString<0> secondsFractionalToString(double seconds);

} // namespace kvt::ex::datetime
