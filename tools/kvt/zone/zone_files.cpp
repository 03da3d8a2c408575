#include "zone/zone_files.h"

#include "base/failure.h"
#include "base/input.h"
#include "base/output.h"
#include "base/text.h"

#include <filesystem>
#include <memory>
#include <string_view>
#include <system_error>

namespace host {

namespace {

namespace fs = std::filesystem;

// The text of the first of these files that is there; empty without any.
std::string firstOf(const std::vector<fs::path>& paths) {
    for (const fs::path& path : paths) {
        std::error_code error;
        if (fs::is_regular_file(path, error)) {
            return contentsOf(path.string());
        }
    }
    return {};
}

} // namespace

std::string contentsOf(const std::string& path) {
    Input input(path);
    std::string text;
    for (std::string_view block = input.read(); !block.empty(); block = input.read()) {
        text += block;
    }
    return text;
}

ZoneDatabase readZoneRules(const std::string& file) {
    const fs::path beside = fs::path(file).parent_path();
    const fs::path system = fs::path(systemZoneRules).parent_path();
    const std::string rules = contentsOf(file);
    const std::string leapSeconds = firstOf({beside / "leapseconds", beside / "leap-seconds.list",
                                             system / "leapseconds", system / "leap-seconds.list"});
    try {
        ZoneDatabase database = makeZoneDatabase(rules, leapSeconds);
        requireGood(database);
        return database;
    } catch (const ZoneDatabaseError& error) {
        throw Failure(printable(file) + ": " + printable(error.what()));
    }
}

void writeZoneFiles(const ZoneDatabase& database, const std::string& folder) {
    for (const auto& [name, text] : database.files) {
        const std::unique_ptr<Output> output = openOutput((fs::path(folder) / name).string());
        output->write(text);
        output->commit();
    }
}

} // namespace host
