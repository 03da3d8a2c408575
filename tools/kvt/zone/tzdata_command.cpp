// `kvt tzdata`: the folder with the zone database that the library reads, written from the system's own.

#include "base/failure.h"
#include "base/output.h"
#include "base/text.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "zone/zone_files.h"

#include <filesystem>
#include <optional>
#include <system_error>
#include <vector>

namespace host {

namespace {

namespace fs = std::filesystem;

// From the package unicode-cldr-core; the older place and the newer one.
constexpr const char* windowsZonesFiles[] = {"/usr/share/unicode/cldr/common/supplemental/windowsZones.xml",
                                             "/usr/share/unicode/cldr/supplemental/windowsZones.xml"};

constexpr const char* examples = R"(kvt tzdata --output tzdata
kvt tzdata --output tzdata --from ./tzdata.zi)";

constexpr const char* notes =
    R"(A program names the folder to the library once, by setInstallPathWrapper. Without
that, the library looks for a folder "tzdata" in the user's folder "Downloads".

The leap seconds come from leapseconds or leap-seconds.list beside FILE, else
beside the system's file. Where the package unicode-cldr-core is installed, its
windowsZones.xml, which maps names of zones on Windows, goes into the folder too.
The library refuses a folder in which it finds a fault. The file kvt-checksums,
in the form of cksum(1), lets it find all damage to what this command wrote.

Exit status:
  0  done
  2  not done: FILE cannot be read or is no zone data, or DIR cannot be written)";

std::optional<std::string> firstThatExists(const std::vector<fs::path>& paths) {
    for (const fs::path& path : paths) {
        std::error_code error;
        if (fs::is_regular_file(path, error)) {
            return path.string();
        }
    }
    return std::nullopt;
}

class TzdataCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.option("-o,--output", folder_, "DIR", "The folder, which is made if it is not there")
            .required();
        syntax.option("--from", from_, "FILE",
                      std::string("Rules as the zone compiler reads them; ") + systemZoneRules +
                          " without this option");
        syntax.option("--windows-zones", windowsZones_, "FILE",
                      "A windowsZones.xml to put into the folder; without this option, that of the package "
                      "unicode-cldr-core where it is installed");
    }

    int run(Diagnostics&) override {
        ZoneDatabase database = readZoneRules(from_);
        const std::optional<std::string> windowsZones = readWindowsZones();
        makeFolder();
        if (windowsZones) {
            database.files["windowsZones.xml"] = *windowsZones;
        }
        writeZoneFiles(database, folder_);
        print("version " + database.version + ": " + counted(database.zones, "zone", "zones") + ", " +
              counted(database.links, "link", "links") + ", " +
              counted(database.leapSeconds, "leap second", "leap seconds") + ", " +
              (windowsZones ? "with" : "without") + " windowsZones.xml\n");
        return Done;
    }

private:
    std::optional<std::string> readWindowsZones() const {
        const auto file = windowsZones_.empty()
                              ? firstThatExists({std::begin(windowsZonesFiles), std::end(windowsZonesFiles)})
                              : windowsZones_;
        return file ? std::optional(contentsOf(*file)) : std::nullopt;
    }

    void makeFolder() const {
        std::error_code error;
        fs::create_directories(folder_, error);
        if (error) {
            throw systemFailure("cannot create " + printable(folder_), error.value());
        }
    }

    std::string folder_;
    std::string from_ = systemZoneRules;
    std::string windowsZones_;
};

} // namespace

CommandInfo tzdataCommand() {
    return {"tzdata", "Write the zone database that the library reads", examples, notes,
            std::make_unique<TzdataCommand>()};
}

} // namespace host
