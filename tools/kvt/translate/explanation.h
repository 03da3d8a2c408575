// What a job would do, before it does it: the job as a file, and the first rows before and after.
#pragma once

#include "translate/job.h"

#include <string>
#include <vector>

namespace host {

/// UTF-8. Reads the beginning of the first input. Throws Failure.
std::string explanationOf(const Job& job, const std::vector<std::string>& inputs);

} // namespace host
