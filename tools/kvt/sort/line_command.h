// What `kvt sort` and `kvt unique` have in common: their options, and the way of lines from files through the
// workspace into an output.
#pragma once

#include "base/progress.h"
#include "cli/command.h"
#include "sort/line_feeder.h"
#include "sort/line_sorter.h"
#include "text/file_options.h"

#include <cstdint>
#include <string>
#include <vector>

namespace host {

class Output;

class LineCommand : public Command {
public:
    void declare(Syntax& syntax) final;

protected:
    enum class OutputOrder { Sorted, AsRead };
    /// What one of the commands wants.
    struct Plan {
        LineOrder order = LineOrder::Ascending;
        OutputOrder outputOrder = OutputOrder::Sorted;
        bool showCounts = false;
        KeyRule key = {}; ///< but for the field and for case, which both have
    };

    /// Declares what the command has alone.
    virtual void declareOwn(Syntax& syntax) = 0;
    int process(const Plan& plan, Diagnostics& diagnostics);

private:
    struct Way {
        Plan plan;
        FeedRule feed;
        std::uint64_t memory; ///< bytes
        std::vector<std::string> inputs;
        Progress::Show show;
    };

    KeyRule keyRule(KeyRule rule) const;
    // Gives what is to be said about lines without a key.
    std::string sendThrough(const Way& way, Output& output, Diagnostics& diagnostics) const;
    static void writeLines(const Plan& plan, const LineFeeder& feeder, LineSorter& sorter,
                           const Workspace& workspace, Output& output, Progress& progress);

    FileOptions files_;
    std::string workspace_;
    std::string memory_ = "256M";
    std::string key_;
    std::string delimiter_;
    Option keyOption_;
    Option delimiterOption_;
    bool ignoreCase_ = false;
};

/// The end of the help of both commands, up to the list of statuses.
extern const char* const lineCommandNotes;

} // namespace host
