// Giving a moment another offset. There are three ways to name one: the machine's zone, UTC, and an offset itself. Any
// other text takes the offset away.
#include <kvt/datetime/detail/apply_offset.h>

#include <kvt/datetime/detail/local_zone.h>
#include <kvt/datetime/detail/offset.h>
#include <kvt/foundation/detail/ascii.h>

namespace kvt::ex::datetime::detail {

namespace {

using ex::detail::equalsIgnoringAsciiCase;

std::optional<std::int32_t> offsetOfZone(const TemporalInstant& instant, std::string_view zone) {
    if (isLocalZone(zone)) {
        return localOffsetMinutes(instant);
    }
    if (equalsIgnoringAsciiCase(zone, "utc")) {
        return 0;
    }
    const std::optional<OffsetForm> offset = offsetOfText(zone);
    return offset ? std::optional(offset->minutes) : std::nullopt;
}

} // namespace

bool isLocalZone(std::string_view zone) noexcept {
    return equalsIgnoringAsciiCase(zone, "local");
}

void applyOffsetText(TemporalInstant& instant, std::string_view zone, SetZoneMode mode) {
    if (mode == SetZoneMode::Automatic) {
        mode = instant.offsetMinutes ? SetZoneMode::Convert : SetZoneMode::Replace;
    }
    // What "local" is asked about: a wall clock, or a moment in UTC. A wall clock is what has no offset, so the zero of
    // UTC matters: without it the zone would take the moment for its own wall clock.
    if (mode == SetZoneMode::Replace) {
        instant.offsetMinutes.reset();
    } else if (instant.offsetMinutes) {
        instant = {utcCount(instant), 0};
    }
    instant.offsetMinutes = offsetOfZone(instant, zone);
    if (mode == SetZoneMode::Convert && instant.offsetMinutes) {
        instant.count = plusMinutes(instant.count, *instant.offsetMinutes);
    }
}

} // namespace kvt::ex::datetime::detail
