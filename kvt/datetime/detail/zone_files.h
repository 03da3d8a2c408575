// The files of a zone database: which they are, and how they come from a folder.
#pragma once

#include <kvt/datetime/zone_folder.h>

#include <array>
#include <cstdint>
#include <filesystem>
#include <string_view>
#include <system_error>
#include <vector>

namespace kvt::ex::datetime::detail {

/// What the `date` library opens, in its order. It takes a file that is not there for an empty one.
inline constexpr std::array<std::string_view, 12> zoneFileNames = {
    "africa", "antarctica", "asia",         "australasia",  "backward", "etcetera",
    "europe", "pacificnew", "northamerica", "southamerica", "systemv",  "leapseconds"};

inline constexpr std::string_view checksumFileName = "kvt-checksums";

/// By what a change of a folder's files is noticed without reading them: kind, bytes and time of last change of each.
struct ZoneFileStamp {
    std::filesystem::file_type type = std::filesystem::file_type::none;
    std::uintmax_t bytes = 0;
    std::filesystem::file_time_type changed;

    friend bool operator==(const ZoneFileStamp&, const ZoneFileStamp&) = default;
};
std::vector<ZoneFileStamp> zoneFolderStamp(const std::string& folder);

} // namespace kvt::ex::datetime::detail
