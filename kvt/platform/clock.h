// The system clock.
#pragma once

#include <cstdint>
#include <ctime>

namespace kvt::platform {

inline constexpr std::int64_t nanosecondsPerTick = 100;

/// Ticks of 100 nanoseconds since 1970-01-01T00:00:00 UTC.
std::int64_t clockTicks() noexcept;

/// Fills `now` with the calendar time in the zone of the machine, to the second. False when the system does not know
/// it; `now` then holds nothing of use.
bool localTime(std::tm& now) noexcept;

} // namespace kvt::platform
