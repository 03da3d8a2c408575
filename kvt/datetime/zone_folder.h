// Looking a folder of zone files over, before it is used or written.
//
// The zone database is a folder of text files in the language of the zone compiler (zic(8), in the form that tzdata
// releases have): rules, zones, links and leap seconds, a line each. What reads it takes its text on trust. So the
// library looks a folder over, once, before it loads it, and takes none in which it finds a fault; now() and
// timezoneSet() then fail as they do without a folder. These functions are that look, for whoever writes folders or
// wants to know why one is refused.
//
//     if (const auto fault = kvt::ex::datetime::zoneFolderFault("/opt/host/tzdata")) {
//         std::cerr << fault->file << ", line " << fault->line << ": " << fault->reason << "\n";
//     }
//
// A folder is good when
//
// - it has a version, as first word of the file "version" or, where that is not, behind "Release" in "NEWS",
// - each line of each file is a whole Rule, Zone, continuation, Link or Leap line, a comment or empty, with words in
//   full (as "Sun>=8" and "lastSun"), and the last one ends with a line feed,
// - a zone goes on where a line of it ends by an UNTIL, and only there, each line for at least six hours more than the
//   clock is changed by; dates exist, a rule does not end before it begins,
// - each rule that a zone follows is there, with standard time in it; each link leads to a zone or a link; no name
//   stands for two things; there is a zone at all,
// - the files are those of "kvt-checksums", if the folder has that file.
//
// The files may all be missing or empty but for that. Other files, "windowsZones.xml" included, are not looked at.
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/foundation/optional.h>

#include <cstddef>
#include <map>
#include <string>

namespace kvt::ex::datetime {

/// The first thing that is wrong.
struct ZoneFolderFault {
    std::string file;     ///< its name in the folder; empty where it is the folder as a whole
    std::size_t line = 0; ///< from 1; 0 where it is not one line
    std::string reason;   ///< one line, without a full stop
};

/// The texts of files by their names.
using ZoneFiles = std::map<std::string, std::string>;

/// Looks over a folder on the disk; no value where it is good. Reads it anew each time, some 5 ms. Throws
/// std::bad_alloc and nothing else.
KVT_EXPORT kvt::future::optional<ZoneFolderFault> zoneFolderFault(const std::string& folder);

/// Looks over the files of a folder that is yet to be written; the version is not asked for. Throws as above.
KVT_EXPORT kvt::future::optional<ZoneFolderFault> zoneFilesFault(const ZoneFiles& files);

/// The text of "kvt-checksums" for these files: a line for each file that a zone database may have, with its checksum
/// and its bytes, as the command cksum of POSIX prints it. With it in the folder, damage is found that leaves lines as
/// good as before, such as another digit. Throws as above.
KVT_EXPORT std::string zoneChecksums(const ZoneFiles& files);

} // namespace kvt::ex::datetime
