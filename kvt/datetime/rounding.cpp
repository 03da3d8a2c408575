// parseZQTDateTime: a value as fields, rounded. Rounding works on the fields; only where it runs over, the fields go
// through an instant and come back carried.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;
using detail::Outcome;

constexpr std::int16_t toMinutes = -1;
constexpr std::int16_t toNanoseconds = 9;
constexpr std::int64_t halfSecond = 500'000'000;

std::int64_t roundedNanoseconds(std::int64_t nanoseconds, std::int16_t decimals) noexcept {
    std::int64_t scale = 1;
    for (std::int16_t i = decimals; i < toNanoseconds; ++i) {
        scale *= 10;
    }
    return (nanoseconds + scale / 2) / scale * scale;
}

// Whether a field has run over its bound or may have.
bool roundFields(detail::DateTimeFields& fields, std::int16_t precision) noexcept {
    if (precision == toMinutes) {
        const bool up = fields.seconds >= 30;
        fields.minutes += up ? 1 : 0;
        return up;
    }
    const std::int64_t nanoseconds = fields.nanoseconds;
    if (precision == toNanoseconds || nanoseconds == 0) {
        return false;
    }
    if (precision == 0) {
        const bool up = nanoseconds >= halfSecond;
        fields.nanoseconds = 0;
        fields.seconds += up ? 1 : 0;
        return up;
    }
    fields.nanoseconds = roundedNanoseconds(nanoseconds, precision);
    return fields.nanoseconds >= detail::nanosPerSecond;
}

// The parts of a value, rounded. Where a field has run over, the parts are those of a moment: of a datetime.
Outcome<DateTimeParts> roundedParts(const CanonicalRecord& record, std::int16_t precision) {
    detail::DateTimeFields fields = record.fields;
    if (!roundFields(fields, precision)) {
        return detail::partsOf(record.type, fields, record.offsetText());
    }
    return detail::countFromFields(fields, true).andThen([&](const detail::TimeCount& count) {
        return detail::partsFromInstant({count, detail::instantWithOffset(record).offsetMinutes});
    });
}

} // namespace

PartsResult parseZQTDateTime(const UString<0>& value, std::int16_t precision) {
    return detail::guarded<DateTimeParts>([&]() -> Outcome<PartsResult> {
        if (precision < toMinutes || precision > toNanoseconds) {
            return detail::Unexpected{};
        }
        return detail::readValue(detail::viewOf(value))
            .andThen([&](const CanonicalRecord& record) { return roundedParts(record, precision); })
            .andThen([](DateTimeParts& parts) {
                return detail::makeDateTimeResult(ReturnState::Success, std::move(parts));
            });
    });
}

} // namespace kvt::ex::datetime
