// A job as a file, in TOML:
//
//     [input]
//     encoding = "windows-1252"
//     delimiter = ";"
//
//     [[step]]
//     do = "date"
//     column = "born"
//     format = ["%d.%m.%Y", "%Y-%m-%d"]
//
// A file that is wrong in any place is refused whole, with that place.
#pragma once

#include "translate/job.h"

#include <string>
#include <string_view>

namespace host {

/// The job that a text of a file has, all of it checked. `zoneDatabase` is the folder that the steps use, or empty. Throws Failure, "FILE:LINE:COLUMN: " and
/// what is wrong there.
Job readJob(std::string_view text, const std::string& file, const std::string& zoneDatabase = {});

/// The same of the file itself.
Job readJobFile(const std::string& path, const std::string& zoneDatabase = {});

} // namespace host
