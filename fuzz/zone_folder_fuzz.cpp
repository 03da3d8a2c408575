// zoneFilesFault: any bytes are looked over without harm, and what is found good the `date` library loads as it is,
// prints nothing, and gives an offset for.
//
// Input: the text of a file "europe"; a line "@NAME" begins another file.
#include <fuzzing.h>

#include <kvt/datetime/zone_folder.h>

#include <date/tz.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <unistd.h>

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

// A folder that is gone with the process.
class Folder {
public:
    Folder() {
        std::string name = (std::filesystem::temp_directory_path() / "kvt-zones-XXXXXX").string();
        require(::mkdtemp(name.data()) != nullptr, "a temporary folder");
        path_ = name;
        std::ofstream(path_ / "version") << "fuzz\n";
        date::set_install(name);
    }
    Folder(const Folder&) = delete;
    Folder& operator=(const Folder&) = delete;
    ~Folder() {
        std::error_code ignored;
        std::filesystem::remove_all(path_, ignored);
    }

    void fill(const ZoneFiles& files) const {
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

void askForOffsets(const date::time_zone& zone) {
    // Few, as each is found by going through all changes from the first on.
    for (const int year : {1893, 1944, 2011, 2500}) {
        for (const unsigned month : {1U, 7U}) {
            const date::sys_seconds moment = date::sys_days(date::year(year) / month / 1);
            const auto offset = zone.get_info(moment).offset;
            require(offset > -std::chrono::hours(28) && offset < std::chrono::hours(28), "an offset");
            zone.get_info(date::local_seconds(moment.time_since_epoch()));
        }
    }
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const Folder folder;
    const ZoneFiles files = filesIn({reinterpret_cast<const char*>(data), size});
    if (const auto fault = kvt::ex::datetime::zoneFilesFault(files)) {
        require(!fault->reason.empty(), "a fault has a reason");
        require(fault->line == 0 || !fault->file.empty(), "a line is in a file");
        return 0;
    }
    folder.fill(files);
    std::string printed;
    {
        const Printed errors;
        for (const date::time_zone& zone : date::reload_tzdb().zones) {
            askForOffsets(zone);
        }
        printed = errors.text();
    }
    requireEqual(printed, std::string(), "what is printed");
    date::get_tzdb_list().erase_after(date::get_tzdb_list().begin());
    return 0;
}
