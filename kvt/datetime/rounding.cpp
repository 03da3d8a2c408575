// parseZQTDateTime: a value as fields, rounded. Rounding works on the fields; only where it runs over, the fields go
// through an instant and come back carried.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>

namespace kvt::ex::datetime {

namespace {

using detail::Outcome;

constexpr std::int16_t toMinutes = -1;
constexpr std::int16_t toNanoseconds = 9;
constexpr std::uint64_t halfSecond = 500'000'000;
constexpr std::uint64_t highestNanosecond = 999'999'999;

std::uint64_t roundedNanoseconds(std::uint64_t nanoseconds, std::int16_t decimals) noexcept {
    std::uint64_t scale = 1;
    for (std::int16_t i = decimals; i < toNanoseconds; ++i) {
        scale *= 10;
    }
    return (nanoseconds + scale / 2) / scale * scale;
}

// Whether a field has run over its bound or may have.
bool roundFields(DateTimeParts& parts, std::int16_t precision) noexcept {
    if (precision == toMinutes) {
        if (parts.seconds() < 30) {
            return false;
        }
        parts.setMinutes(static_cast<std::uint64_t>(parts.minutes()) + 1);
        return true;
    }
    const auto nanoseconds = static_cast<std::uint64_t>(parts.nanoseconds());
    if (precision == toNanoseconds || nanoseconds == 0) {
        return false;
    }
    if (precision == 0) {
        parts.setNanoseconds(0);
        if (nanoseconds < halfSecond) {
            return false;
        }
        parts.setSeconds(static_cast<std::uint64_t>(parts.seconds()) + 1);
        return true;
    }
    const std::uint64_t rounded = roundedNanoseconds(nanoseconds, precision);
    parts.setNanoseconds(rounded);
    return rounded > highestNanosecond;
}

} // namespace

PartsResult parseZQTDateTime(const UString<0>& value, std::int16_t precision) {
    return detail::guarded<DateTimeParts>([&]() -> Outcome<PartsResult> {
        if (precision < toMinutes || precision > toNanoseconds) {
            return detail::Unexpected{};
        }
        const auto record = detail::parseCanonical(detail::viewOf(value), false);
        if (!record) {
            return record.failure();
        }
        if (record->type == TemporalType::Unsupported) {
            return detail::failed<DateTimeParts>(message_number::valueUnsupported, {detail::viewOf(value)});
        }
        Outcome<DateTimeParts> parts = detail::partsFromRecord(*record, true);
        if (!parts) {
            return parts.failure();
        }
        if (roundFields(*parts, precision)) {
            const auto instant = detail::instantFromParts(*parts, true);
            if (!instant) {
                return instant.failure();
            }
            *parts = detail::partsFromInstant(*instant);
        }
        return detail::makeDateTimeResult(ReturnState::Success, std::move(*parts));
    });
}

} // namespace kvt::ex::datetime
