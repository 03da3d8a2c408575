// create and intervalCreate: from fields to text.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/interval.h>
#include <kvt/datetime/detail/parts_access.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>

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
    const auto hours = static_cast<std::uint64_t>(parts.hours());
    const auto minutes = static_cast<std::uint64_t>(parts.minutes());
    if (year < detail::lowestYear || year > detail::highestYear) {
        return detail::yearOutOfRange(year);
    }
    if (month == 0 || month > highestTwoDigits) {
        return detail::monthOutOfRange(month);
    }
    if (day == 0 || day > highestTwoDigits) {
        return detail::dayOutOfRange(day, detail::lastDayOfMonth(year, static_cast<unsigned>(month)));
    }
    if (hours > highestTwoDigits) {
        return detail::hoursOutOfRange(parts.hours());
    }
    if (minutes > highestTwoDigits) {
        return detail::minutesOutOfRange(parts.minutes());
    }
    if (static_cast<std::uint64_t>(parts.seconds()) > highestTwoDigits ||
        static_cast<std::uint64_t>(parts.nanoseconds()) > highestNanosecond) {
        return detail::secondsOutOfRange(detail::viewOf(parts.secondsFractionalToString()));
    }
    return std::nullopt;
}

} // namespace

TextResult create(const DateTimeParts& parts) {
    return detail::guarded<UString<0>>(
        [&]() -> Outcome<detail::ValueAnswer> {
            if (std::optional<DatePartRange> unwritable = unwritablePart(parts)) {
                return *unwritable;
            }
            return detail::instantFromParts(parts, false).andThen([](const detail::TemporalInstant& instant) {
                return detail::answerOf(TemporalType::Datetime, instant);
            });
        },
        detail::LastResort::Silence);
}

TextResult intervalCreate(const IntervalParts& parts) {
    return detail::guarded<UString<0>>([&]() -> Outcome<TextResult> {
        return detail::makeDateTimeResult(ReturnState::Success, detail::intervalText(parts));
    });
}

} // namespace kvt::ex::datetime
