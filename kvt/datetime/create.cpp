// create and intervalCreate: from fields to text.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/interval.h>
#include <kvt/datetime/detail/parts_access.h>
#include <kvt/datetime/detail/result.h>

#include <optional>

namespace kvt::ex::datetime {

namespace {

using detail::DatePartRange;
using detail::Outcome;
using detail::PartsAccess;

// The first pass only turns away what does not fit into two digits; the message names the true bounds all the same.
constexpr std::uint64_t highestTwoDigits = 99;
constexpr std::uint64_t highestNanosecond = 999'999'999;

std::optional<DatePartRange> unwritablePart(const DateTimeParts& parts) {
    const std::int64_t year = PartsAccess::year(parts);
    const std::uint64_t month = PartsAccess::month(parts);
    const std::uint64_t day = PartsAccess::day(parts);
    if (year < detail::lowestYear || year > detail::highestYear) {
        return DatePartRange{UString<0>::fromNumber(year), "year", "1000", "9999"};
    }
    if (month == 0 || month > highestTwoDigits) {
        return DatePartRange{UString<0>::fromNumber(month), "month", "1", "12"};
    }
    if (day == 0 || day > highestTwoDigits) {
        const unsigned last = detail::lastDayOfMonth(year, static_cast<unsigned>(month));
        return DatePartRange{UString<0>::fromNumber(day), "day", "1", detail::lastDayText(last)};
    }
    if (static_cast<std::uint64_t>(parts.hours()) > highestTwoDigits) {
        return DatePartRange{UString<0>::fromNumber(parts.hours()), "hours", "0", "23"};
    }
    if (static_cast<std::uint64_t>(parts.minutes()) > highestTwoDigits) {
        return DatePartRange{UString<0>::fromNumber(parts.minutes()), "minutes", "0", "59"};
    }
    if (static_cast<std::uint64_t>(parts.seconds()) > highestTwoDigits ||
        static_cast<std::uint64_t>(parts.nanoseconds()) > highestNanosecond) {
        return DatePartRange{parts.secondsFractionalToString(), "seconds", "0", "59.999999999"};
    }
    return std::nullopt;
}

} // namespace

TextResult create(const DateTimeParts& parts) {
    return detail::guarded<UString<0>>(
        [&]() -> Outcome<TextResult> {
            if (std::optional<DatePartRange> unwritable = unwritablePart(parts)) {
                return std::move(*unwritable);
            }
            const auto instant = detail::instantFromParts(parts, false);
            if (!instant) {
                return instant.failure();
            }
            return detail::makeDateTimeResult(ReturnState::Success, detail::instantText(*instant, true));
        },
        detail::LastResort::Silence, detail::messageOf);
}

TextResult intervalCreate(const IntervalParts& parts) {
    return detail::guarded<UString<0>>([&]() -> Outcome<TextResult> {
        return detail::makeDateTimeResult(ReturnState::Success, detail::intervalText(parts));
    });
}

} // namespace kvt::ex::datetime
