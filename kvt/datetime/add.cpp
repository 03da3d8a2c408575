// add and intervalNegate.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/arithmetic.h>
#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/interval.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;
using detail::Outcome;
using detail::TemporalInstant;

bool hasDateParts(const IntervalParts& interval) noexcept {
    return interval.years() > 0 || interval.months() > 0 || interval.days() > 0;
}

bool hasTimeParts(const IntervalParts& interval) noexcept {
    return interval.hours() > 0 || interval.minutes() > 0 || interval.seconds() > 0 ||
           interval.nanoseconds() > 0;
}

// A sum as the answer, of the kind of the value that it began with. A year out of range is a failure
// as long as it fits four digits; beyond them the answer is an empty text.
Outcome<TextResult> answerOf(TemporalType kind, const TemporalInstant& sum, ReturnState state) {
    static const std::int64_t firstDay = detail::daysFromCivil(detail::lowestYear, 1, 1);
    static const std::int64_t endDay = detail::daysFromCivil(detail::highestYear + 1, 1, 1);
    if (sum.count.days >= firstDay && sum.count.days < endDay) {
        return TextResult(state, detail::canonicalText(kind, sum), std::nullopt);
    }
    const std::int64_t year = detail::civilFromDays(sum.count.days).year;
    if (year >= 0 && year < detail::lowestYear) {
        return detail::yearOutOfRange(year);
    }
    return TextResult(state, UString<0>(), std::nullopt);
}

Outcome<TextResult> addTo(const CanonicalRecord& record, const IntervalParts& interval) {
    // A date to which a time is added becomes a datetime.
    const bool gainsTime = record.type == TemporalType::Date && hasTimeParts(interval);
    const TemporalType kind = gainsTime ? TemporalType::Datetime : record.type;
    TemporalInstant instant = detail::instantWithOffset(record);
    return detail::addInterval(instant.count, interval).andThen([&](const detail::TimeCount& sum) {
        instant.count = sum;
        return answerOf(kind, instant, record.offsetRepaired ? ReturnState::Repaired : ReturnState::Success);
    });
}

} // namespace

TextResult add(const UString<0>& value, const UString<0>& interval) {
    return detail::guarded<UString<0>>([&] {
        return detail::readValue(detail::viewOf(value)).andThen([&](const CanonicalRecord& record) {
            return detail::readInterval(detail::viewOf(interval))
                .andThen([&](const IntervalParts& parts) -> Outcome<TextResult> {
                    if (detail::isTimeKind(record.type) && hasDateParts(parts)) {
                        return detail::failed<UString<0>>(message_number::dateIntervalOnTime,
                                                          {detail::viewOf(value), detail::viewOf(interval)});
                    }
                    return addTo(record, parts);
                });
        });
    });
}

TextResult intervalNegate(const UString<0>& interval) {
    return detail::guarded<UString<0>>([&] {
        return detail::readInterval(detail::viewOf(interval)).andThen([&](const IntervalParts& parts) {
            UString<0> negated(interval);
            if (parts.negative()) {
                negated.erase(0, 1);
            } else {
                negated.insert(0, '-');
            }
            return detail::makeDateTimeResult(ReturnState::Success, std::move(negated));
        });
    });
}

} // namespace kvt::ex::datetime
