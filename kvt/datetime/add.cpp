// add and intervalNegate.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/arithmetic.h>
#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/interval.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;
using detail::Outcome;
using detail::ValueAnswer;

bool hasDateParts(const IntervalParts& interval) noexcept {
    return interval.years() > 0 || interval.months() > 0 || interval.days() > 0;
}

bool hasTimeParts(const IntervalParts& interval) noexcept {
    return interval.hours() > 0 || interval.minutes() > 0 || interval.seconds() > 0 ||
           interval.nanoseconds() > 0;
}

// The answer is of the kind of the value, but for a date to which a time is added, which becomes a datetime. A year out
// of range is a failure as long as it fits four digits; beyond them the answer is an empty text.
Outcome<ValueAnswer> addTo(const CanonicalRecord& record, const IntervalParts& interval) {
    Outcome<ValueAnswer> outcome;
    ValueAnswer& answer = *outcome;
    detail::setAnswer(answer, record);
    if (record.type == TemporalType::Date && hasTimeParts(interval)) {
        answer.kind = TemporalType::Datetime;
    }
    if (detail::hasOffset(record.type)) {
        answer.offset = detail::offsetOfMinutes(record.offset.minutes);
    }
    if (record.offsetRepaired) {
        answer.state = ReturnState::Repaired;
    }
    if (const auto wrong = detail::addInterval(answer.fields, interval)) {
        outcome = *wrong;
    } else if (const std::int64_t year = answer.fields.year; year < detail::lowestYear && year >= 0) {
        outcome = detail::yearOutOfRange(year);
    } else if (year < 0 || year > detail::highestYear) {
        answer.kind = TemporalType::Unsupported;
    }
    return outcome;
}

} // namespace

TextResult add(const UString<0>& value, const UString<0>& interval) {
    return detail::guarded<UString<0>>([&] {
        return detail::readValue(detail::viewOf(value)).andThen([&](const CanonicalRecord& record) {
            return detail::readInterval(detail::viewOf(interval))
                .andThen([&](const IntervalParts& parts) -> Outcome<ValueAnswer> {
                    if (detail::isTimeKind(record.type) && hasDateParts(parts)) {
                        return detail::DateIntervalOnTime{detail::viewOf(value), detail::viewOf(interval)};
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
