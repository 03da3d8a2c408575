// The `date` library reads the database here, in the same form and by the same look at the folder before it as within
// libkvt, which has a copy of its own and shows nothing of it.

#include "zone/named_zone.h"

#include "base/failure.h"
#include "base/text.h"
#include "cli/suggest.h"

#include <kvt/datetime/zone_folder.h>

#include <date/tz.h>

#include <vector>

namespace host {

namespace {

const date::tzdb& database(const std::string& folder) {
    if (const auto fault = kvt::ex::datetime::zoneFolderFault(folder)) {
        std::string place = folder;
        if (!fault->file.empty()) {
            place += "/" + fault->file + (fault->line == 0 ? "" : ", line " + std::to_string(fault->line));
        }
        throw Failure("the zone database cannot be used: " + printable(place) + ": " +
                      printable(fault->reason) + " ('kvt doctor' says more)");
    }
    date::set_install(folder);
    return date::get_tzdb();
}

const date::time_zone* find(const date::tzdb& zones, const std::string& name) {
    try {
        return zones.locate_zone(name);
    } catch (const std::runtime_error&) {
        return nullptr;
    }
}

std::vector<std::string> namesOf(const date::tzdb& zones) {
    std::vector<std::string> names = {"utc", "local"};
    for (const date::time_zone& zone : zones.zones) {
        names.push_back(zone.name());
    }
    for (const date::time_zone_link& link : zones.links) {
        names.push_back(link.name());
    }
    return names;
}

int inMinutes(const date::sys_info& info) {
    return static_cast<int>(info.offset.count() / 60);
}

} // namespace

NamedZone::NamedZone(const std::string& name, const std::string& folder) : name_(name), zone_(nullptr) {
    const date::tzdb& zones = database(folder);
    zone_ = find(zones, name);
    if (zone_ == nullptr) {
        throw Failure("'" + printable(name) +
                      "' is neither an offset such as +01:00 nor 'utc', 'local' or the name of a zone." +
                      didYouMean(name, namesOf(zones)));
    }
}

int NamedZone::minutesAt(std::chrono::sys_seconds moment) const {
    return inMinutes(zone_->get_info(moment));
}

NamedZone::AtWallClock NamedZone::atWallClock(std::chrono::seconds sinceEpoch) const {
    const date::local_info info = zone_->get_info(date::local_seconds(sinceEpoch));
    const Clock clock = info.result == date::local_info::unique        ? Clock::Once
                        : info.result == date::local_info::nonexistent ? Clock::Never
                                                                       : Clock::Twice;
    return {clock, inMinutes(info.first)};
}

} // namespace host
