// `kvt tzdata`: the folder with the zone database that the library reads, written from the system's own.

#include "base/failure.h"
#include "base/input.h"
#include "base/output.h"
#include "base/text.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "zone/zone_database.h"

#include <filesystem>
#include <optional>
#include <system_error>
#include <vector>

namespace host {

namespace {

namespace fs = std::filesystem;

constexpr const char* systemFile = "/usr/share/zoneinfo/tzdata.zi";
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

std::string contentsOf(const std::string& path) {
    Input input(path);
    std::string text;
    for (std::string_view block = input.read(); !block.empty(); block = input.read()) {
        text += block;
    }
    return text;
}

std::optional<std::string> firstThatExists(const std::vector<fs::path>& paths) {
    for (const fs::path& path : paths) {
        std::error_code error;
        if (fs::is_regular_file(path, error)) {
            return path.string();
        }
    }
    return std::nullopt;
}

// Each file appears whole or not at all.
void writeFile(const fs::path& path, std::string_view text) {
    const std::unique_ptr<Output> output = openOutput(path.string());
    output->write(text);
    output->commit();
}

class TzdataCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.option("-o,--output", folder_, "DIR", "The folder, which is made if it is not there")
            .required();
        syntax.option("--from", from_, "FILE",
                      std::string("Rules as the zone compiler reads them; ") + systemFile +
                          " without this option");
        syntax.option("--windows-zones", windowsZones_, "FILE",
                      "A windowsZones.xml to put into the folder; without this option, that of the package "
                      "unicode-cldr-core where it is installed");
    }

    int run(Diagnostics&) override {
        const ZoneDatabase database = read();
        const std::optional<std::string> windowsZones = readWindowsZones();
        makeFolder();
        for (const auto& [name, text] : database.files) {
            writeFile(fs::path(folder_) / name, text);
        }
        if (windowsZones) {
            writeFile(fs::path(folder_) / "windowsZones.xml", *windowsZones);
        }
        print("version " + database.version + ": " + counted(database.zones, "zone", "zones") + ", " +
              counted(database.links, "link", "links") + ", " +
              counted(database.leapSeconds, "leap second", "leap seconds") + ", " +
              (windowsZones ? "with" : "without") + " windowsZones.xml\n");
        return Done;
    }

private:
    ZoneDatabase read() const {
        const fs::path beside = fs::path(from_).parent_path();
        const fs::path system = fs::path(systemFile).parent_path();
        const auto leapSeconds = firstThatExists({beside / "leapseconds", beside / "leap-seconds.list",
                                                  system / "leapseconds", system / "leap-seconds.list"});
        const std::string zoneinfo = contentsOf(from_);
        const std::string leapText = leapSeconds ? contentsOf(*leapSeconds) : std::string();
        try {
            ZoneDatabase database = makeZoneDatabase(zoneinfo, leapText);
            requireGood(database);
            return database;
        } catch (const ZoneDatabaseError& error) {
            throw Failure(printable(from_) + ": " + printable(error.what()));
        }
    }

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
    std::string from_ = systemFile;
    std::string windowsZones_;
};

} // namespace

CommandInfo tzdataCommand() {
    return {"tzdata", "Write the zone database that the library reads", examples, notes,
            std::make_unique<TzdataCommand>()};
}

} // namespace host
