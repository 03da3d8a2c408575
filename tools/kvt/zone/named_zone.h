// A zone of the zone database by its name, which is more than the library has: it knows the zone of the machine alone.
#pragma once

#include <chrono>
#include <optional>
#include <string>

namespace date {
class time_zone;
}

namespace host {

class NamedZone {
public:
    /// Looks `name` up in the database in `folder`. Throws Failure where the folder is not good, or has no such zone;
    /// the failure suggests the nearest. One process reads one folder: the first.
    NamedZone(const std::string& name, const std::string& folder);

    const std::string& name() const { return name_; }

    /// The offset from UTC at a moment in whole minutes, toward zero as the library has it.
    int minutesAt(std::chrono::sys_seconds moment) const;

    enum class Clock { Once, Never, Twice };
    struct AtWallClock {
        Clock clock;
        int minutes; ///< where the wall clock shows that time once
    };
    /// The same for what the zone's clocks show.
    AtWallClock atWallClock(std::chrono::seconds sinceEpoch) const;

private:
    std::string name_;
    const date::time_zone* zone_;
};

} // namespace host
