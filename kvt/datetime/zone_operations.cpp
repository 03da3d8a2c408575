// now, timezoneGet, timezoneSet, timezoneRemove: values and their offsets.
//
// The zone database speaks in exceptions, and here they end: now() reports what went wrong; timezoneSet()
// reports wall clocks that do not exist or exist twice, and is silent about all else.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/apply_offset.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>
#include <kvt/platform/clock.h>

#include <date/tz.h>

#include <stdexcept>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;
using detail::Outcome;
using detail::TemporalInstant;

TextResult succeeded(UString<0> text) {
    return detail::makeDateTimeResult(ReturnState::Success, std::move(text));
}

TextResult failedFor(const UString<0>& value, std::uint32_t number) {
    return detail::failed<UString<0>>(number, {detail::viewOf(value)});
}

// What timezoneRemove() gives for a value.
UString<0> withoutOffset(const UString<0>& value, const CanonicalRecord& record) {
    if (!detail::hasOffset(record.type)) {
        return value;
    }
    detail::ValueAnswer answer = detail::answerOf(record);
    answer.offset.reset();
    return detail::canonicalText(answer);
}

Outcome<TextResult> offsetOf(const detail::OffsetForm& offset, UTCOffsetType type) {
    switch (type) {
    case UTCOffsetType::OffsetText:
        return succeeded(UString<0>(UStringView<0>(offset.view())));
    case UTCOffsetType::OffsetInMinutes:
        return succeeded(UString<0>::fromNumber(offset.minutes));
    case UTCOffsetType::OffsetInSeconds:
        return succeeded(UString<0>::fromNumber(offset.minutes * detail::secondsPerMinute));
    }
    return detail::Unexpected();
}

// applyOffsetText() with the two failures that are about the value as such: the number of the message, or 0.
std::uint32_t applyZone(TemporalInstant& instant, std::string_view zone, SetZoneMode mode) {
    try {
        detail::applyOffsetText(instant, zone, mode);
    } catch (const date::nonexistent_local_time&) {
        return message_number::localTimeInGap;
    } catch (const date::ambiguous_local_time&) {
        return message_number::localTimeAmbiguous;
    }
    return 0;
}

TextResult zoneApplied(const UString<0>& value, const CanonicalRecord& record, std::string_view zone,
                       SetZoneMode mode) {
    TemporalInstant instant = detail::instantWithOffset(record);
    if (const std::uint32_t number = applyZone(instant, zone, mode)) {
        return failedFor(withoutOffset(value, record), number);
    }
    const bool isTime = detail::isTimeKind(record.type);
    return detail::resultOf(detail::answerOf(isTime ? TemporalType::Time : TemporalType::Datetime, instant));
}

TextResult zoned(const UString<0>& value, const CanonicalRecord& record, std::string_view zone,
                 SetZoneMode mode) {
    // Without a date nothing says which rule of the zone holds.
    if (detail::isTimeKind(record.type) && detail::isLocalZone(zone)) {
        return failedFor(value, message_number::localZoneForTime);
    }
    if (mode == SetZoneMode::Convert && !detail::hasOffset(record.type)) {
        return failedFor(value, message_number::nothingToConvertFrom);
    }
    if (zone.empty()) {
        return detail::failed<UString<0>>(message_number::zoneEmpty);
    }
    return zoneApplied(value, record, zone, mode);
}

// The machine's wall clock at an instant in UTC.
TextResult localNow(TemporalInstant instant, bool withOffset) {
    try {
        detail::applyOffsetText(instant, "local", SetZoneMode::Convert);
    } catch (const std::runtime_error& failure) {
        return detail::makeDateTimeResult(
            ReturnState::Error, UString<0>(),
            detail::message(message_number::zoneLookupFailed, {failure.what()}));
    }
    if (!withOffset) {
        instant.offsetMinutes.reset();
    }
    return detail::resultOf(detail::answerOf(TemporalType::Datetime, instant));
}

} // namespace

TextResult now(ZoneMode mode) {
    return detail::guarded<UString<0>>([&]() -> Outcome<TextResult> {
        constexpr std::int64_t ticksPerSecond = detail::nanosPerSecond / platform::nanosecondsPerTick;
        const std::int64_t ticks = platform::clockTicks();
        const TemporalInstant instant = {
            detail::timeCountOfSeconds(ticks / ticksPerSecond,
                                       ticks % ticksPerSecond * platform::nanosecondsPerTick),
            0};
        switch (mode) {
        case ZoneMode::LocalWithOffset:
            return localNow(instant, true);
        case ZoneMode::Utc:
            return detail::resultOf(detail::answerOf(TemporalType::Datetime, instant));
        case ZoneMode::LocalWithoutOffset:
            return localNow(instant, false);
        }
        return detail::makeDateTimeResult(ReturnState::Error, UString<0>());
    });
}

TextResult timezoneGet(const UString<0>& value, UTCOffsetType type) {
    return detail::guarded<UString<0>>(
        [&] {
            return detail::parseCanonical(detail::viewOf(value), false)
                .andThen([&](const CanonicalRecord& record) -> Outcome<TextResult> {
                    return detail::hasOffset(record.type)
                               ? offsetOf(record.offset, type)
                               : failedFor(value, message_number::valueHasNoOffset);
                });
        },
        detail::LastResort::Silence);
}

TextResult timezoneSet(const UString<0>& value, const UString<0>& zone, const SetZoneMode& mode) {
    return detail::guarded<UString<0>>(
        [&] {
            return detail::readValue(detail::viewOf(value)).andThen([&](const CanonicalRecord& record) {
                return zoned(value, record, detail::trimmed(detail::viewOf(zone)), mode);
            });
        },
        detail::LastResort::Silence);
}

TextResult timezoneRemove(const UString<0>& value) {
    return detail::guarded<UString<0>>(
        [&] {
            return detail::readValue(detail::viewOf(value)).andThen([&](const CanonicalRecord& record) {
                return succeeded(withoutOffset(value, record));
            });
        },
        detail::LastResort::Silence);
}

} // namespace kvt::ex::datetime
