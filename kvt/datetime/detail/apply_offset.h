// Changing the offset of an instant, as timezoneSet() does: apart from offset.h, because here an offset may depend on
// the zone of the machine.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/instant.h>

#include <string_view>

namespace kvt::ex::datetime::detail {

/// Whether a zone is "local", the zone of the machine, in any case.
bool isLocalZone(std::string_view zone) noexcept;

/// Gives the instant the offset that `zone` names: "local", "utc", both in any case, or an offset. Any
/// other text, the empty one too, takes the offset away. `Replace` keeps the wall clock, `Convert` the moment; an
/// instant without offset counts as one in UTC for the latter. Lets the exceptions of the zone database through, for
/// "local" only.
void applyOffsetText(TemporalInstant& instant, std::string_view zone, SetZoneMode mode);

} // namespace kvt::ex::datetime::detail
