// The zone of the machine through the `date` library, which loads its database once, at the first use of anything
// here, and asks the system anew each time which zone it is in.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/local_zone.h>
#include <kvt/datetime/detail/nano_count.h>

#include <date/tz.h>

#include <chrono>

namespace kvt::ex::datetime {

namespace detail {

std::int32_t localOffsetMinutes(const TemporalInstant& instant) {
    const date::time_zone& zone = *date::locate_zone(date::current_zone()->name());
    // Zones change at whole seconds, and whole seconds are what 64 bits hold for all years.
    const std::chrono::seconds seconds(floorDivide(utcCount(instant), nanosPerSecond).quotient);
    const date::sys_seconds moment =
        instant.offsetMinutes ? date::sys_seconds(seconds) : zone.to_sys(date::local_seconds(seconds));
    return static_cast<std::int32_t>(zone.get_info(moment).offset.count() / secondsPerMinute);
}

} // namespace detail

void setInstallPathWrapper(const std::string& path) {
    try {
        date::set_install(path);
    } catch (...) {
        // Lack of memory. The folder stays what it was, and whoever needs the database says that it is not there.
    }
}

} // namespace kvt::ex::datetime
