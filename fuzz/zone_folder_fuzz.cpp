// zoneFilesFault: any bytes are looked over without harm, and what is found good the `date` library loads as it is,
// prints nothing, and gives an offset for.
//
// Input: the text of a file "europe"; a line "@NAME" begins another file.
#include <zone_fuzzing.h>

#include <chrono>

using namespace kvt::fuzz;
using kvt::ex::datetime::ZoneFiles;

namespace {

ZoneFiles filesIn(std::string_view input) {
    ZoneFiles files;
    std::string* file = &files["europe"];
    while (!input.empty()) {
        const std::size_t end = std::min(input.find('\n'), input.size() - 1) + 1;
        const std::string_view line = input.substr(0, end);
        input.remove_prefix(end);
        if (line.front() == '@') {
            file = &files[std::string(line.substr(1, line.size() - 2))];
        } else {
            file->append(line);
        }
    }
    return files;
}

void askForOffsets(const date::time_zone& zone) {
    // Few, as each is found by going through all changes from the first on.
    for (const int year : {1893, 1944, 2011, 2500}) {
        for (const unsigned month : {1U, 7U}) {
            const date::sys_seconds moment = date::sys_days(date::year(year) / date::month(month) / 1);
            const auto offset = zone.get_info(moment).offset;
            require(offset > -std::chrono::hours(28) && offset < std::chrono::hours(28), "an offset");
            zone.get_info(date::local_seconds(moment.time_since_epoch()));
        }
    }
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const ZoneFolder folder;
    const ZoneFiles files = filesIn({reinterpret_cast<const char*>(data), size});
    if (const auto fault = kvt::ex::datetime::zoneFilesFault(files)) {
        require(!fault->reason.empty(), "a fault has a reason");
        require(fault->line == 0 || !fault->file.empty(), "a line is in a file");
        return 0;
    }
    folder.fill(files);
    withZones([](const date::tzdb& database) {
        for (const date::time_zone& zone : database.zones) {
            askForOffsets(zone);
        }
    });
    return 0;
}
