// add and intervalNegate.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/arithmetic.h>
#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/interval.h>
#include <kvt/datetime/detail/parts_access.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;
using detail::Outcome;

bool hasDateParts(const IntervalParts& interval) noexcept {
    return interval.years() > 0 || interval.months() > 0 || interval.days() > 0;
}

bool hasTimeParts(const IntervalParts& interval) noexcept {
    return interval.hours() > 0 || interval.minutes() > 0 || interval.seconds() > 0 || interval.nanoseconds() > 0;
}

// The text of a sum, of the kind of the value that it began with. What is beyond the years of a value is a part out of
// range as long as it could be written in four digits, and else no text at all.
Outcome<UString<0>> sumText(const detail::TemporalInstant& sum, TemporalType type) {
    const DateTimeParts parts = detail::partsFromInstant(sum);
    const std::int64_t year = detail::PartsAccess::year(parts);
    if (year < 0 || year > detail::highestYear) {
        return UString<0>();
    }
    if (year < detail::lowestYear) {
        return detail::DatePartRange{UString<0>::fromNumber(year), "year", "1000", "9999"};
    }
    if (type == TemporalType::Date) {
        return parts.toDateString(FormatType::Compact);
    }
    return detail::isTimeKind(type) ? parts.toTimeString(FormatType::Compact, true)
                                    : parts.toDatetimeString(FormatType::Compact, true);
}

Outcome<TextResult> addTo(const UString<0>& value, const UString<0>& intervalText) {
    auto record = detail::parseCanonical(detail::viewOf(value), false);
    if (!record) {
        return record.failure();
    }
    if (record->type == TemporalType::Unsupported) {
        return detail::failed<UString<0>>(message_number::valueUnsupported, {detail::viewOf(value)});
    }
    const auto interval = detail::parseInterval(detail::viewOf(intervalText));
    if (!interval) {
        return interval.failure();
    }
    if (!*interval) {
        return detail::failed<UString<0>>(message_number::intervalUnreadable, {detail::viewOf(intervalText)});
    }
    if (detail::isTimeKind(record->type) && hasDateParts(**interval)) {
        return detail::failed<UString<0>>(message_number::dateIntervalOnTime,
                                          {detail::viewOf(value), detail::viewOf(intervalText)});
    }
    if (record->type == TemporalType::Date && hasTimeParts(**interval)) {
        record->type = TemporalType::Datetime;
        record->timeText = UString<0>("000000");
    }
    const auto instant = detail::instantFromRecord(*record, true);
    if (!instant) {
        return instant.failure();
    }
    const auto sum = detail::addInterval(*instant, **interval);
    if (!sum) {
        return sum.failure();
    }
    Outcome<UString<0>> text = sumText(*sum, record->type);
    if (!text) {
        return text.failure();
    }
    return detail::makeDateTimeResult(record->offsetRepaired ? ReturnState::Repaired : ReturnState::Success,
                                      std::move(*text));
}

} // namespace

TextResult add(const UString<0>& value, const UString<0>& interval) {
    return detail::guarded<UString<0>>([&] { return addTo(value, interval); });
}

TextResult intervalNegate(const UString<0>& interval) {
    return detail::guarded<UString<0>>([&]() -> Outcome<TextResult> {
        const auto parts = detail::parseInterval(detail::viewOf(interval));
        if (!parts) {
            return parts.failure();
        }
        if (!*parts) {
            return detail::failed<UString<0>>(message_number::intervalUnreadable, {detail::viewOf(interval)});
        }
        UString<0> negated(interval);
        if ((*parts)->negative()) {
            negated.erase(0, 1);
        } else {
            negated.insert(0, '-');
        }
        return detail::makeDateTimeResult(ReturnState::Success, std::move(negated));
    });
}

} // namespace kvt::ex::datetime
