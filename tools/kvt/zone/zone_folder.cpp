#include "zone/zone_folder.h"

#include "zone/machine_zone.h"
#include "zone/zone_files.h"

#include <kvt/datetime/zone_folder.h>

#include <cstdlib>
#include <filesystem>
#include <pwd.h>
#include <stdexcept>
#include <system_error>
#include <unistd.h>

namespace host {

namespace {

namespace fs = std::filesystem;

std::string variable(const char* name) {
    const char* value = std::getenv(name);
    return value == nullptr ? std::string() : std::string(value);
}

fs::path homeFolder() {
    const std::string home = variable("HOME");
    if (!home.empty()) {
        return home;
    }
    const passwd* user = ::getpwuid(::getuid());
    return user == nullptr ? "" : user->pw_dir;
}

// By the rules of the XDG base directories: a relative path counts for nothing.
fs::path cacheFolder() {
    const fs::path set = variable("XDG_CACHE_HOME");
    return (set.is_absolute() ? set : homeFolder() / ".cache") / "kvt";
}

std::string systemVersion() {
    const std::string head = firstLine(systemZoneRules);
    const std::string lead = "# version ";
    const std::string version = head.starts_with(lead) ? head.substr(lead.size()) : "unknown";
    return version.find('/') == std::string::npos ? version : "unknown";
}

// Other processes may be about the same. Each makes a folder of its own, and the first to give it the name wins.
void makeFolder(const fs::path& folder) {
    const ZoneDatabase database = readZoneRules(systemZoneRules);
    fs::create_directories(folder.parent_path());
    std::string draft = folder.string() + ".XXXXXX";
    if (::mkdtemp(draft.data()) == nullptr) {
        throw std::runtime_error("no folder");
    }
    std::error_code taken;
    try {
        writeZoneFiles(database, draft);
        fs::rename(draft, folder, taken);
    } catch (...) {
        taken = std::make_error_code(std::errc::io_error);
    }
    if (taken) {
        fs::remove_all(draft, taken);
    }
}

bool isGood(const fs::path& folder) {
    std::error_code error;
    return fs::is_directory(folder, error) && !kvt::ex::datetime::zoneFolderFault(folder.string());
}

} // namespace

ZoneFolder zoneFolder(const std::string& named) {
    if (!named.empty()) {
        return {named, ZoneFolder::Origin::Named};
    }
    const fs::path usual = homeFolder() / "Downloads" / "tzdata";
    std::error_code error;
    if (fs::is_directory(usual, error)) {
        return {usual.string(), ZoneFolder::Origin::Usual};
    }
    const fs::path cached = cacheFolder() / ("tzdata-" + systemVersion());
    try {
        if (!isGood(cached)) {
            fs::remove_all(cached);
            makeFolder(cached);
        }
    } catch (const std::exception&) {
        // No rules to make it of, or no room to keep it. Whatever needs the database reports that there is none.
    }
    return isGood(cached) ? ZoneFolder{cached.string(), ZoneFolder::Origin::Cached}
                          : ZoneFolder{usual.string(), ZoneFolder::Origin::Usual};
}

} // namespace host
