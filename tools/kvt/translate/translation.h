// A whole translation: files through the steps of a job into one output, by one thread or several. The output, the
// report and the rejected rows are the same however many threads there are.
#pragma once

#include "base/progress.h"
#include "translate/job.h"
#include "translate/source_blocks.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace host {

class Diagnostics;

struct TranslationOptions {
    std::vector<std::string> inputs; ///< never empty
    std::string output;
    std::string report; ///< empty: none
    std::string reject; ///< empty: none
    std::size_t threads = 1;
    std::optional<Part> part;
    bool isDryRun = false;                    ///< nothing is written, not even a report
    std::uint64_t memory = 256 * 1024 * 1024; ///< for rows that are sorted
    std::string workspace;                    ///< empty: in the folder of temporary files
    Progress::Show progress = Progress::Show::Never;
};

/// Gives an ExitStatus. Throws as a Command does.
int translate(const Job& job, const TranslationOptions& options, Diagnostics& diagnostics);

/// Reports of parts, in order, as the one report of the whole. Throws Failure.
void mergeReports(const std::vector<std::string>& reports, const std::string& output);

} // namespace host
