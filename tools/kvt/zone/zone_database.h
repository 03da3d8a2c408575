// The zone database that the library reads, made from the one that the system has.
//
// Systems carry all rules in one file of the zone compiler's language, tzdata.zi, with every word cut to the fewest
// letters that tell it apart. The library reads a folder of files in the same language with all words in full. Here one
// becomes the other, in memory: what a line means is not looked at, so that nothing about any zone can change. Whether
// the library would take the result is another question, and the library's own reader answers it.
//
// The reader joins all files of the folder, whichever line stands where. Zones are laid out by the first part of their
// names all the same, and each rule beside the first zone that follows it, for whoever looks something up by hand.
#pragma once

#include <cstddef>
#include <map>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// The input is not in the language of the zone compiler; the text says which line and why.
class ZoneDatabaseError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

struct ZoneDatabase {
    std::string version;
    std::size_t zones = 0;
    std::size_t links = 0;
    std::size_t rules = 0; ///< lines
    std::size_t leapSeconds = 0;
    /// By the names of the files; all that the reader opens are there, some of them empty, and their checksums.
    std::map<std::string, std::string> files;
    /// Where each line of a file comes from, for messages.
    std::map<std::string, std::vector<std::string>> origins;
};

/// `zoneinfo` is the text of tzdata.zi or of any file like it, words in full included. `leapSeconds` is either of the
/// two forms in which systems list them, leapseconds or leap-seconds.list, or empty. Throws ZoneDatabaseError.
ZoneDatabase makeZoneDatabase(std::string_view zoneinfo, std::string_view leapSeconds);

/// Throws ZoneDatabaseError where the library would refuse the folder: for lines that mean nothing, such as a day that
/// there is not, and for what is missing.
void requireGood(const ZoneDatabase& database);

} // namespace host
