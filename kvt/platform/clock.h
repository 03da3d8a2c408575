// The system clock.
#pragma once

#include <cstdint>

namespace kvt::platform {

inline constexpr std::int64_t nanosecondsPerTick = 100;

/// Ticks of 100 nanoseconds since 1970-01-01T00:00:00 UTC.
std::int64_t clockTicks() noexcept;

} // namespace kvt::platform
