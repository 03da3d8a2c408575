// A job as the text of a job file (job_file.h).
#pragma once

#include "translate/job.h"

#include <string>
#include <string_view>

namespace host {

/// A string of TOML, in quotes.
std::string tomlString(std::string_view utf8);

/// All of the job, what is as usual left out. Reading the text gives the same job.
std::string jobText(const Job& job);

} // namespace host
