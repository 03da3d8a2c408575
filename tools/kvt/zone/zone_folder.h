// Which folder of zone files the command uses.
//
// One that is named; else the one where the library looks by itself, if it is there; else one that the command keeps in
// the user's cache, made from the system's rules when it is first needed, anew for each version of these.
#pragma once

#include <string>

namespace host {

struct ZoneFolder {
    enum class Origin { Named, Usual, Cached };
    std::string path;
    Origin origin;
};

/// `named` is empty where no folder was named. The usual one comes back when there is no folder and none can be made.
ZoneFolder zoneFolder(const std::string& named);

} // namespace host
