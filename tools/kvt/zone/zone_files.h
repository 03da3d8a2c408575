// Zone rules from the disk, and the folder of zone files onto it.
#pragma once

#include "zone/zone_database.h"

#include <string>

namespace host {

/// The system's file with the rules of all zones.
inline constexpr const char* systemZoneRules = "/usr/share/zoneinfo/tzdata.zi";

/// The text of a file that is not large. Throws Failure.
std::string contentsOf(const std::string& path);

/// The database that the rules in `file` make, with the leap seconds beside it, or else the system's. Throws Failure
/// where something cannot be read, or is not what the library would take.
ZoneDatabase readZoneRules(const std::string& file);

/// Writes its files into `folder`, each whole or not at all. Throws Failure.
void writeZoneFiles(const ZoneDatabase& database, const std::string& folder);

} // namespace host
