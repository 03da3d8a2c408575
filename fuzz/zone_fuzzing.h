// What the fuzzers of zone files share: a folder on the disk, and the `date` library reading it.
#pragma once

#include <fuzzing.h>

#include <kvt/datetime/zone_folder.h>

#include <date/tz.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <unistd.h>

namespace kvt::fuzz {

/// From which the `date` library reads, once there is one; gone with the process.
class ZoneFolder {
public:
    ZoneFolder() {
        keepFilesInMemory();
        std::string name = (std::filesystem::temp_directory_path() / "kvt-zones-XXXXXX").string();
        require(::mkdtemp(name.data()) != nullptr, "a temporary folder");
        path_ = name;
        std::ofstream(path_ / "version") << "fuzz\n";
        date::set_install(name);
    }
    ZoneFolder(const ZoneFolder&) = delete;
    ZoneFolder& operator=(const ZoneFolder&) = delete;
    ~ZoneFolder() {
        std::error_code ignored;
        std::filesystem::remove_all(path_, ignored);
    }

    const std::filesystem::path& path() const { return path_; }

    /// Each file that is read is written anew, many of them empty.
    void fill(const kvt::ex::datetime::ZoneFiles& files) const {
        for (const char* name :
             {"africa", "antarctica", "asia", "australasia", "backward", "etcetera", "europe", "pacificnew",
              "northamerica", "southamerica", "systemv", "leapseconds"}) {
            const auto file = files.find(name);
            std::ofstream(path_ / name, std::ios::binary | std::ios::trunc)
                << (file == files.end() ? std::string() : file->second);
        }
    }

private:
    std::filesystem::path path_;
};

/// What is written to cerr while it lives.
class Printed {
public:
    Printed() : before_(std::cerr.rdbuf(text_.rdbuf())) {}
    Printed(const Printed&) = delete;
    Printed& operator=(const Printed&) = delete;
    ~Printed() { std::cerr.rdbuf(before_); }

    std::string text() const { return text_.str(); }

private:
    std::ostringstream text_;
    std::streambuf* before_;
};

/// Loads what is in the folder, shows the database to `look`, and lets go of it. Nothing may be printed meanwhile.
template <typename Look>
void withZones(const Look& look) {
    {
        const Printed errors;
        look(date::reload_tzdb());
        requireEqual(errors.text(), std::string(), "what is printed");
    }
    date::get_tzdb_list().erase_after(date::get_tzdb_list().begin());
}

} // namespace kvt::fuzz
