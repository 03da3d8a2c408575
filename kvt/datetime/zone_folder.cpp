// A folder of zone files on the disk. What can be had of it is read at once, and looked over as texts (zone_files).

#include <kvt/datetime/detail/zone_files.h>

#include <algorithm>
#include <fstream>
#include <optional>

namespace kvt::ex::datetime {

namespace {

namespace fs = std::filesystem;

constexpr const char* versionFile = "version";
constexpr const char* newsFile = "NEWS";

// All files of a release together have a quarter of it.
constexpr std::uintmax_t mostBytes = std::uintmax_t{4} << 20;
// "2025b"; the private releases of today have some twenty.
constexpr std::size_t longestVersion = 64;

[[noreturn]] void fail(const std::string& file, std::string reason) {
    throw ZoneFolderFault{file, 0, std::move(reason)};
}

// The text of a file; none where there is no such file. Never touches what is not a file, as a pipe would keep us.
std::optional<std::string> textOf(const std::string& folder, const std::string& name) {
    const fs::path path = fs::path(folder) / name;
    std::error_code error;
    const fs::file_status status = fs::status(path, error);
    if (status.type() == fs::file_type::not_found) {
        return std::nullopt;
    }
    if (error) {
        fail(name, "it cannot be read: " + error.message());
    }
    if (!fs::is_regular_file(status)) {
        fail(name, "it is not a file");
    }
    const std::uintmax_t bytes = fs::file_size(path, error);
    if (error) {
        fail(name, "it cannot be read: " + error.message());
    }
    if (bytes > mostBytes) {
        fail(name, "it is too large for a zone file");
    }
    std::ifstream stream(path, std::ios::binary);
    std::string text(static_cast<std::size_t>(bytes), '\0');
    if (!stream.read(text.data(), static_cast<std::streamsize>(bytes))) {
        fail(name, "it cannot be read");
    }
    return text;
}

// The word at the front of `text`, which is taken from it.
std::string_view takeWord(std::string_view& text) {
    constexpr std::string_view blanks = " \t\n\v\f\r";
    text.remove_prefix(std::min(text.find_first_not_of(blanks), text.size()));
    const std::string_view word = text.substr(0, text.find_first_of(blanks));
    text.remove_prefix(word.size());
    return word;
}

std::string_view releaseIn(std::string_view news) {
    for (std::string_view word = takeWord(news); !word.empty(); word = takeWord(news)) {
        if (word == "Release") {
            return takeWord(news);
        }
    }
    return {};
}

// The words for what is missing are those of the `date` library, which hosts know from 933050.
void checkVersion(const std::string& folder) {
    std::optional<std::string> text = textOf(folder, versionFile);
    const bool isNews = !text;
    if (isNews) {
        text = textOf(folder, newsFile);
    }
    std::string_view rest = text ? std::string_view(*text) : std::string_view();
    const std::string_view version = isNews ? releaseIn(rest) : takeWord(rest);
    const auto isPlain = [](char c) { return c >= '!' && c <= '~'; };
    if (version.empty() || version.size() > longestVersion ||
        !std::all_of(version.begin(), version.end(), isPlain)) {
        fail(versionFile, "Unable to get Timezone database version from " + folder + "/");
    }
}

ZoneFiles filesIn(const std::string& folder) {
    ZoneFiles files;
    const auto read = [&](std::string_view name) {
        std::string key(name);
        if (std::optional<std::string> text = textOf(folder, key)) {
            files.emplace(std::move(key), std::move(*text));
        }
    };
    std::for_each(detail::zoneFileNames.begin(), detail::zoneFileNames.end(), read);
    read(detail::checksumFileName);
    return files;
}

} // namespace

namespace detail {

std::vector<ZoneFileStamp> zoneFolderStamp(const std::string& folder) {
    std::vector<ZoneFileStamp> stamps;
    const auto add = [&](std::string_view name) {
        const fs::path path = fs::path(folder) / name;
        std::error_code error;
        const fs::file_status status = fs::status(path, error);
        ZoneFileStamp stamp;
        stamp.type = status.type();
        if (fs::is_regular_file(status)) {
            stamp.bytes = fs::file_size(path, error);
            stamp.changed = fs::last_write_time(path, error);
        }
        stamps.push_back(stamp);
    };
    add("");
    std::for_each(zoneFileNames.begin(), zoneFileNames.end(), add);
    for (const std::string_view name :
         {checksumFileName, std::string_view(versionFile), std::string_view(newsFile)}) {
        add(name);
    }
    return stamps;
}

} // namespace detail

kvt::future::optional<ZoneFolderFault> zoneFolderFault(const std::string& folder) {
    try {
        std::error_code error;
        if (!fs::exists(folder, error)) {
            fail({}, "Timezone database not found at \"" + folder + "\"");
        }
        checkVersion(folder);
        return zoneFilesFault(filesIn(folder));
    } catch (ZoneFolderFault& fault) {
        return std::move(fault);
    }
}

} // namespace kvt::ex::datetime
