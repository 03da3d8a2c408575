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
using detail::DateTimeFields;
using detail::Outcome;
using detail::ValueAnswer;

bool hasDateParts(const IntervalParts& interval) noexcept {
    return interval.years() > 0 || interval.months() > 0 || interval.days() > 0;
}

bool hasTimeParts(const IntervalParts& interval) noexcept {
    return interval.hours() > 0 || interval.minutes() > 0 || interval.seconds() > 0 ||
           interval.nanoseconds() > 0;
}

// A sum as the answer, of the kind of the value that it began with. A year out of range is a failure as long as it fits
// four digits; beyond them the answer is an empty text.
Outcome<ValueAnswer> answerOfSum(ValueAnswer answer, const DateTimeFields& sum) {
    answer.fields = sum;
    if (sum.year < detail::lowestYear || sum.year > detail::highestYear) {
        if (sum.year >= 0 && sum.year < detail::lowestYear) {
            return detail::yearOutOfRange(sum.year);
        }
        answer.kind = TemporalType::Unsupported;
    }
    return answer;
}

Outcome<ValueAnswer> addTo(const CanonicalRecord& record, const IntervalParts& interval) {
    ValueAnswer answer = detail::answerOf(record);
    // A date to which a time is added becomes a datetime.
    if (record.type == TemporalType::Date && hasTimeParts(interval)) {
        answer.kind = TemporalType::Datetime;
    }
    if (detail::hasOffset(record.type)) {
        answer.offset = detail::offsetOfMinutes(record.offset.minutes);
    }
    if (record.offsetRepaired) {
        answer.state = ReturnState::Repaired;
    }
    return detail::addInterval(answer.fields, interval).andThen([&](const DateTimeFields& sum) {
        return answerOfSum(answer, sum);
    });
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
