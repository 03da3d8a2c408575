// The zone of the machine: the one link to real time zones.
#pragma once

#include <kvt/datetime/detail/instant.h>

#include <cstdint>

namespace kvt::ex::datetime::detail {

/// The offset of the machine's zone at an instant, in minutes: at the moment that an instant with offset stands for,
/// or at the wall clock of one without. Lets the exceptions of the `date` library through: std::runtime_error where
/// the database is missing or damaged or has no such zone, date::nonexistent_local_time and
/// date::ambiguous_local_time for a wall clock.
std::int32_t localOffsetMinutes(const TemporalInstant& instant);

} // namespace kvt::ex::datetime::detail
