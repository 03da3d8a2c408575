// The zone of the machine through the `date` library, which asks the system anew each time which zone it is in, and
// loads its database once, at the first use.
//
// That library trusts its database. Text that it cannot read it prints, and some ends the process; so the folder is
// looked over before it is loaded, and a folder with a fault is never loaded at all (zone_folder.h).

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/local_zone.h>
#include <kvt/datetime/detail/zone_files.h>
#include <kvt/platform/downloads_folder.h>

#include <date/tz.h>

#include <atomic>
#include <chrono>
#include <mutex>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

namespace kvt::ex::datetime {

namespace {

// "/opt/tzdata/europe, line 12: there is no rule "EU"". The two faults of a folder that is not a database have their
// own words, path included.
std::string textOf(const std::string& folder, const ZoneFolderFault& fault) {
    if (fault.file.empty() || fault.file == "version") {
        return fault.reason;
    }
    std::string place = folder + "/" + fault.file;
    if (fault.line != 0) {
        place += ", line " + std::to_string(fault.line);
    }
    return place + ": " + fault.reason;
}

// The folder of the process, and what was found in it.
class Database {
public:
    /// Never destroyed: objects that outlive main() may ask for an offset.
    static Database& instance() {
        static Database& only = *new Database;
        return only;
    }

    void setFolder(const std::string& folder) {
        const std::lock_guard lock(mutex_);
        date::set_install(folder);
        folder_ = folder;
        look_.reset();
    }

    /// The loaded database. Throws std::runtime_error where it cannot be used.
    const date::tzdb& get() {
        if (!isLoaded_.load(std::memory_order_acquire)) {
            const std::lock_guard lock(mutex_);
            load();
        }
        return date::get_tzdb();
    }

private:
    // What was seen of the folder, good for as long as its files are the same.
    struct Look {
        std::vector<detail::ZoneFileStamp> stamp;
        std::optional<ZoneFolderFault> fault;
    };

    void load() {
        if (!folder_) {
            // That library would find the same folder, but does not say which it is.
            const std::string folder = platform::downloadsFolder() + "/tzdata";
            date::set_install(folder);
            folder_ = folder;
        }
        std::vector<detail::ZoneFileStamp> stamp = detail::zoneFolderStamp(*folder_);
        if (!look_ || look_->stamp != stamp) {
            look_ = Look{std::move(stamp), zoneFolderFault(*folder_)};
        }
        if (look_->fault) {
            throw std::runtime_error(textOf(*folder_, *look_->fault));
        }
        date::get_tzdb();
        isLoaded_.store(true, std::memory_order_release);
    }

    std::mutex mutex_;
    std::optional<std::string> folder_; ///< none while nobody has named one
    std::optional<Look> look_;
    std::atomic<bool> isLoaded_{false};
};

} // namespace

namespace detail {

std::int32_t localOffsetMinutes(const TemporalInstant& instant) {
    const date::tzdb& database = Database::instance().get();
    const date::time_zone& zone = *database.locate_zone(database.current_zone()->name());
    // Zones change at whole seconds.
    const std::chrono::seconds seconds(wholeSeconds(utcCount(instant)));
    const date::sys_seconds moment =
        instant.offsetMinutes ? date::sys_seconds(seconds) : zone.to_sys(date::local_seconds(seconds));
    return static_cast<std::int32_t>(zone.get_info(moment).offset.count() / secondsPerMinute);
}

} // namespace detail

void setInstallPathWrapper(const std::string& path) {
    try {
        Database::instance().setFolder(path);
    } catch (...) {
        // Lack of memory. The folder stays what it was, and whoever needs the database says that it is not there.
    }
}

} // namespace kvt::ex::datetime
