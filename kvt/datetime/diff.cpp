// diff, diffAsNumber and compare.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/arithmetic.h>
#include <kvt/datetime/detail/interval.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;
using detail::Outcome;

struct Pair {
    CanonicalRecord first;
    CanonicalRecord second;
};

bool areComparable(TemporalType first, TemporalType second) noexcept {
    return first == second || (first == TemporalType::Date && second == TemporalType::Datetime) ||
           (first == TemporalType::Datetime && second == TemporalType::Date);
}

// Reads both values, the second one first, and hands a pair that can be compared to `use`.
template <typename Value, typename Use>
Outcome<detail::Result<Value>> withPair(const UString<0>& first, const UString<0>& second, Use use) {
    auto secondRecord = detail::parseCanonical(detail::viewOf(second), false);
    if (!secondRecord) {
        return secondRecord.failure();
    }
    auto firstRecord = detail::parseCanonical(detail::viewOf(first), false);
    if (!firstRecord) {
        return firstRecord.failure();
    }
    if (firstRecord->type == TemporalType::Unsupported) {
        return detail::failed<Value>(message_number::valueUnsupported, {detail::viewOf(first)});
    }
    if (secondRecord->type == TemporalType::Unsupported) {
        return detail::failed<Value>(message_number::valueUnsupported, {detail::viewOf(second)});
    }
    if (!areComparable(firstRecord->type, secondRecord->type)) {
        return detail::failed<Value>(message_number::kindsNotComparable,
                                     {detail::viewOf(first), detail::viewOf(second)});
    }
    return use(*firstRecord, *secondRecord);
}

Outcome<double> diffSeconds(const CanonicalRecord& first, const CanonicalRecord& second) {
    const auto firstInstant = detail::instantFromRecord(first, true);
    if (!firstInstant) {
        return firstInstant.failure();
    }
    const auto secondInstant = detail::instantFromRecord(second, true);
    if (!secondInstant) {
        return secondInstant.failure();
    }
    const detail::NanoCount difference = detail::utcCount(*firstInstant) - detail::utcCount(*secondInstant);
    return detail::toDouble(difference) / 1e9;
}

Outcome<double> diffMonths(const CanonicalRecord& first, const CanonicalRecord& second) {
    const auto difference = detail::diffParts(first, second);
    if (!difference) {
        return difference.failure();
    }
    return difference->months;
}

// The divisions are made one by one, so that all builds round alike.
double inUnit(double seconds, UnitType unit) noexcept {
    switch (unit) {
    case UnitType::Weeks:
        return seconds / 60.0 / 60.0 / 24.0 / 7.0;
    case UnitType::Days:
        return seconds / 60.0 / 60.0 / 24.0;
    case UnitType::Hours:
        return seconds / 60.0 / 60.0;
    case UnitType::Minutes:
        return seconds / 60.0;
    default:
        return seconds;
    }
}

Outcome<double> difference(const CanonicalRecord& first, const CanonicalRecord& second, UnitType unit) {
    if (unit > UnitType::Seconds) {
        return detail::Unexpected{};
    }
    Outcome<double> number =
        unit <= UnitType::Months ? diffMonths(first, second) : diffSeconds(first, second);
    if (!number) {
        return number;
    }
    if (unit <= UnitType::Months) {
        return unit == UnitType::Years ? *number / 12.0 : *number;
    }
    return inUnit(*number, unit);
}

} // namespace

TextResult diff(const UString<0>& first, const UString<0>& second) {
    return detail::guarded<UString<0>>([&] {
        return withPair<UString<0>>(
            first, second, [](const CanonicalRecord& left, const CanonicalRecord& right) -> Outcome<TextResult> {
                const auto parts = detail::diffParts(left, right);
                if (!parts) {
                    return parts.failure();
                }
                return detail::makeDateTimeResult(ReturnState::Success, detail::intervalText(parts->parts));
            });
    });
}

NumberResult diffAsNumber(const UString<0>& first, const UString<0>& second, UnitType unit) {
    return detail::guarded<double>([&] {
        return withPair<double>(
            first, second, [&](const CanonicalRecord& left, const CanonicalRecord& right) -> Outcome<NumberResult> {
                const Outcome<double> number = difference(left, right, unit);
                if (!number) {
                    return number.failure();
                }
                return detail::makeDateTimeResult(ReturnState::Success, *number);
            });
    });
}

int compare(const UString<0>& first, const UString<0>& second) {
    const NumberResult result = diffAsNumber(first, second, UnitType::Seconds);
    if (std::get<0>(result) != ReturnState::Success) {
        return -3;
    }
    const double seconds = std::get<1>(result);
    return seconds < 0.0 ? -1 : seconds > 0.0 ? 1 : 0;
}

} // namespace kvt::ex::datetime
