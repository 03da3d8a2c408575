// The zone of the machine, as a test wants it.
//
// The machine's zone is the place that the link /etc/localtime leads to. The program that holds machine_zone.cpp
// answers the system's calls for that one path itself, for the library as well, so that a test needs no rights and
// touches nothing.
#pragma once

#include <string>

namespace kvt::test {

/// From now on /etc/localtime leads to the file of this zone.
void setMachineZone(const std::string& zone);

/// From now on /etc/localtime leads to this path.
void setMachineZonePath(const std::string& path);

} // namespace kvt::test
