// The folder with the zone database that the library reads, made from the system's own by the writer of `kvt tzdata`.
#pragma once

#include <zone/zone_database.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string>
#include <unistd.h>

namespace kvt::test {

inline constexpr const char* systemZones = "/usr/share/zoneinfo/";

inline std::string contentsOf(const std::filesystem::path& path) {
    std::ifstream file(path, std::ios::binary);
    if (!file) {
        throw std::runtime_error("cannot read " + path.string() + "; is the package tzdata installed?");
    }
    return {std::istreambuf_iterator<char>(file), {}};
}

inline host::ZoneDatabase databaseOfTheSystem() {
    const std::filesystem::path system = systemZones;
    return host::makeZoneDatabase(contentsOf(system / "tzdata.zi"), contentsOf(system / "leap-seconds.list"));
}

/// Written when it is made, gone when it goes.
class ZoneFolder {
public:
    explicit ZoneFolder(const host::ZoneDatabase& database) {
        std::string name = (std::filesystem::temp_directory_path() / "kvt-zones-XXXXXX").string();
        if (::mkdtemp(name.data()) == nullptr) {
            throw std::runtime_error("cannot make a temporary folder");
        }
        path_ = name;
        for (const auto& [file, text] : database.files) {
            std::ofstream(path_ / file, std::ios::binary) << text;
        }
    }
    ZoneFolder(const ZoneFolder&) = delete;
    ZoneFolder& operator=(const ZoneFolder&) = delete;
    ~ZoneFolder() {
        std::error_code ignored;
        std::filesystem::remove_all(path_, ignored);
    }

    std::string path() const { return path_.string(); }

private:
    std::filesystem::path path_;
};

} // namespace kvt::test
