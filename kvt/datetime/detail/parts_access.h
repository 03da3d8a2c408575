// The fields of the public values at their full width, for the library's own sources.
#pragma once

#include <kvt/datetime/datetime_parts.h>

#include <cstdint>
#include <string_view>

namespace kvt::ex::datetime::detail {

struct PartsAccess {
    /// The offset is a text that is known to be canonical or empty.
    static DateTimeParts make(std::int64_t year, std::uint64_t month, std::uint64_t day, std::uint64_t hours,
                              std::uint64_t minutes, std::uint64_t seconds, std::uint64_t nanoseconds,
                              std::string_view offset, TemporalType type) {
        DateTimeParts parts;
        parts.year_ = year;
        parts.month_ = month;
        parts.day_ = day;
        parts.hours_ = hours;
        parts.minutes_ = minutes;
        parts.seconds_ = seconds;
        parts.nanoseconds_ = nanoseconds;
        parts.offset_ = UString<0>(UStringView<0>(offset));
        parts.type_ = type;
        return parts;
    }
    static std::int64_t year(const DateTimeParts& parts) noexcept { return parts.year_; }
    static std::uint64_t month(const DateTimeParts& parts) noexcept { return parts.month_; }
    static std::uint64_t day(const DateTimeParts& parts) noexcept { return parts.day_; }
    static const UString<0>& offset(const DateTimeParts& parts) noexcept { return parts.offset_; }

    static std::uint64_t& years(IntervalParts& parts) noexcept { return parts.years_; }
    static std::uint64_t& months(IntervalParts& parts) noexcept { return parts.months_; }
    static std::uint64_t& days(IntervalParts& parts) noexcept { return parts.days_; }
    static std::uint64_t& hours(IntervalParts& parts) noexcept { return parts.hours_; }
    static std::uint64_t& minutes(IntervalParts& parts) noexcept { return parts.minutes_; }
    static std::uint64_t& seconds(IntervalParts& parts) noexcept { return parts.seconds_; }
    static std::uint64_t& nanoseconds(IntervalParts& parts) noexcept { return parts.nanoseconds_; }
    static bool& negative(IntervalParts& parts) noexcept { return parts.negative_; }
};

} // namespace kvt::ex::datetime::detail
