// The system clock by std::chrono, which counts from 1970 on every system, and the calendar time by POSIX.
#include <kvt/platform/clock.h>

#include <chrono>
#include <ratio>

namespace kvt::platform {

std::int64_t clockTicks() noexcept {
    using Ticks = std::chrono::duration<std::int64_t, std::ratio<nanosecondsPerTick, 1'000'000'000>>;
    return std::chrono::floor<Ticks>(std::chrono::system_clock::now().time_since_epoch()).count();
}

bool localTime(std::tm& now) noexcept {
    const std::time_t seconds = std::time(nullptr);
    return ::localtime_r(&seconds, &now) != nullptr;
}

} // namespace kvt::platform
