// The system clock by std::chrono, which counts from 1970 on every system.
#include <kvt/platform/clock.h>

#include <chrono>
#include <ratio>

namespace kvt::platform {

std::int64_t clockTicks() noexcept {
    using Ticks = std::chrono::duration<std::int64_t, std::ratio<nanosecondsPerTick, 1'000'000'000>>;
    return std::chrono::floor<Ticks>(std::chrono::system_clock::now().time_since_epoch()).count();
}

} // namespace kvt::platform
