// Which time zone the machine is in, and by which of its files that is known. The order is that in which the library
// looks: the link /etc/localtime, the link /etc/TZ, the first lines of /etc/timezone and /var/db/zoneinfo. The variable
// TZ, which most other programs obey, plays no part in it.
#pragma once

#include <string>

namespace host {

struct MachineZone {
    std::string name;   ///< "Europe/Berlin"; empty where it is not known
    std::string source; ///< how it was found, or why not
};

MachineZone machineZone();

/// The first line of a small file; empty where there is none.
std::string firstLine(const std::string& path);

} // namespace host
