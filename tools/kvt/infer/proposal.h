// What was found out about a file, as a job for `kvt translate --job`: a file to be read and mended by a person, with
// the evidence beside each line.
#pragma once

#include "infer/survey.h"

#include <string>

namespace host {

/// UTF-8, of several lines.
std::string proposedJob(const Survey& survey);

} // namespace host
