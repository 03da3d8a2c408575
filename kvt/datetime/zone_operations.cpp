// now, timezoneGet, timezoneSet, timezoneRemove: values and their offsets.
//
// The zone database speaks in exceptions, and here they end: now() tells what went wrong, timezoneSet() tells of wall
// clocks that do not exist or exist twice and is silent about all else.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/local_zone.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>
#include <kvt/datetime/utc_offset.h>
#include <kvt/platform/clock.h>

#include <date/tz.h>

#include <stdexcept>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;
using detail::Outcome;
using detail::TemporalInstant;

constexpr const char* localKeyword = "local";

Outcome<TextResult> succeeded(Outcome<UString<0>> text) {
    if (!text) {
        return text.failure();
    }
    return detail::makeDateTimeResult(ReturnState::Success, std::move(*text));
}

Outcome<TextResult> failedFor(const UString<0>& value, std::uint32_t number) {
    return detail::failed<UString<0>>(number, {detail::viewOf(value)});
}

constexpr bool hasOffset(TemporalType type) noexcept {
    return type == TemporalType::TimeWithOffset || type == TemporalType::DatetimeWithOffset;
}

// What timezoneRemove() gives for a record that is a value.
Outcome<UString<0>> withoutOffset(const UString<0>& value, const CanonicalRecord& record) {
    if (!hasOffset(record.type)) {
        return UString<0>(value);
    }
    return detail::isTimeKind(record.type) ? detail::timeText(record, false) : detail::datetimeText(record, false);
}

Outcome<TextResult> offsetOf(const UString<0>& value, UTCOffsetType type) {
    const auto record = detail::parseCanonical(detail::viewOf(value), false);
    if (!record) {
        return record.failure();
    }
    if (!hasOffset(record->type)) {
        return failedFor(value, message_number::valueHasNoOffset);
    }
    const auto offset = ZQTDateTimeUTCOffset::repairOffset(record->offsetText);
    if (!offset) {
        return detail::Unexpected();
    }
    switch (type) {
    case UTCOffsetType::OffsetText:
        return succeeded(UString<0>(offset->text()));
    case UTCOffsetType::OffsetInMinutes:
        return succeeded(UString<0>::fromNumber(offset->offsetMinutes()));
    case UTCOffsetType::OffsetInSeconds:
        return succeeded(UString<0>::fromNumber(offset->offsetMinutes() * detail::secondsPerMinute));
    }
    return detail::Unexpected();
}

Outcome<TextResult> removed(const UString<0>& value) {
    const auto record = detail::parseCanonical(detail::viewOf(value), false);
    if (!record) {
        return record.failure();
    }
    if (record->type == TemporalType::Unsupported) {
        return failedFor(value, message_number::valueUnsupported);
    }
    return succeeded(withoutOffset(value, *record));
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

Outcome<TextResult> zoneApplied(const UString<0>& value, const CanonicalRecord& record, std::string_view zone,
                                SetZoneMode mode) {
    auto instant = detail::instantFromRecord(record, true);
    if (!instant) {
        return instant.failure();
    }
    if (const std::uint32_t number = applyZone(*instant, zone, mode)) {
        const auto wallClock = withoutOffset(value, record);
        if (!wallClock) {
            return wallClock.failure();
        }
        return failedFor(*wallClock, number);
    }
    if (detail::isTimeKind(record.type)) {
        return succeeded(detail::partsFromInstant(*instant).toTimeString(FormatType::Compact, true));
    }
    return succeeded(detail::instantText(*instant, true));
}

Outcome<TextResult> zoned(const UString<0>& value, std::string_view zone, SetZoneMode mode) {
    const auto record = detail::parseCanonical(detail::viewOf(value), false);
    if (!record) {
        return record.failure();
    }
    if (record->type == TemporalType::Unsupported) {
        return failedFor(value, message_number::valueUnsupported);
    }
    // Without a date there is no telling which rule of the zone holds.
    if (detail::isTimeKind(record->type) &&
        UString<0>(UStringView<0>(zone)).compare(localKeyword, UString<0>::case_insensitive) == 0) {
        return failedFor(value, message_number::localZoneForTime);
    }
    if (mode == SetZoneMode::Convert && !hasOffset(record->type)) {
        return failedFor(value, message_number::nothingToConvertFrom);
    }
    if (zone.empty()) {
        return detail::failed<UString<0>>(message_number::zoneEmpty);
    }
    return zoneApplied(value, *record, zone, mode);
}

// The machine's wall clock at an instant in UTC.
Outcome<TextResult> localNow(TemporalInstant instant, bool withOffset) {
    try {
        instant.offsetMinutes = detail::localOffsetMinutes(instant);
    } catch (const std::runtime_error& failure) {
        return detail::makeDateTimeResult(ReturnState::Error, UString<0>(),
                                          detail::message(message_number::zoneLookupFailed, {failure.what()}));
    }
    instant.count += detail::NanoCount(*instant.offsetMinutes * detail::nanosPerMinute);
    return succeeded(detail::instantText(instant, withOffset));
}

} // namespace

TextResult now(ZoneMode mode) {
    return detail::guarded<UString<0>>([&]() -> Outcome<TextResult> {
        const TemporalInstant instant = {detail::NanoCount(platform::clockTicks()) * platform::nanosecondsPerTick, 0};
        switch (mode) {
        case ZoneMode::LocalWithOffset:
            return localNow(instant, true);
        case ZoneMode::Utc:
            return succeeded(detail::instantText(instant, true));
        case ZoneMode::LocalWithoutOffset:
            return localNow(instant, false);
        }
        return detail::makeDateTimeResult(ReturnState::Error, UString<0>());
    });
}

TextResult timezoneGet(const UString<0>& value, UTCOffsetType type) {
    return detail::guarded<UString<0>>([&] { return offsetOf(value, type); }, detail::LastResort::Silence);
}

TextResult timezoneSet(const UString<0>& value, const UString<0>& zone, const SetZoneMode& mode) {
    return detail::guarded<UString<0>>([&] { return zoned(value, detail::trimmed(detail::viewOf(zone)), mode); },
                                       detail::LastResort::Silence);
}

TextResult timezoneRemove(const UString<0>& value) {
    return detail::guarded<UString<0>>([&] { return removed(value); }, detail::LastResort::Silence);
}

} // namespace kvt::ex::datetime
