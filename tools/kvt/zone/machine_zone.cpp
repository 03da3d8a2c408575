#include "zone/machine_zone.h"

#include "base/text.h"

#include <filesystem>
#include <fstream>
#include <system_error>

namespace host {

namespace {

namespace fs = std::filesystem;

constexpr const char* localtimeLink = "/etc/localtime";
constexpr const char* embeddedLink = "/etc/TZ";

bool isLink(const char* path) {
    std::error_code error;
    return fs::is_symlink(fs::symlink_status(path, error));
}

// What stands behind the last folder "zoneinfo...", or nothing.
std::string zonePart(const std::string& path) {
    const std::size_t folder = path.rfind("zoneinfo");
    const std::size_t slash = folder == std::string::npos ? folder : path.find('/', folder);
    return slash == std::string::npos ? std::string() : path.substr(slash + 1);
}

MachineZone zoneByLink(const char* link) {
    std::error_code error;
    const fs::path direct = fs::read_symlink(link, error);
    const fs::path target = fs::canonical(link, error);
    const std::string shown = std::string("the link ") + link + " to " + printable(direct.string());
    if (error) {
        return {"", shown + ", which leads nowhere"};
    }
    // One name stands for "as configured", and then the link as it is written counts.
    std::string name = zonePart(target.string());
    if (name == "posixrules") {
        name = zonePart(direct.string());
    }
    return name.empty() ? MachineZone{"", shown + ", which is in no folder \"zoneinfo\""}
                        : MachineZone{name, shown};
}

} // namespace

std::string firstLine(const std::string& path) {
    std::ifstream file(path);
    std::string line;
    std::getline(file, line);
    return line;
}

MachineZone machineZone() {
    for (const char* link : {localtimeLink, embeddedLink}) {
        if (isLink(link)) {
            return zoneByLink(link);
        }
    }
    for (const char* file : {"/etc/timezone", "/var/db/zoneinfo"}) {
        const std::string name = firstLine(file);
        if (!name.empty()) {
            return {name, std::string("the first line of ") + file};
        }
    }
    return {"", "neither a link /etc/localtime nor a file /etc/timezone"};
}

} // namespace host
