// What `kvt sort` and `kvt unique` have in common: their options, and the way of lines from files through the
// workspace into an output.
#pragma once

#include "cli/command.h"
#include "sort/line_sorter.h"
#include "text/file_options.h"

#include <cstdint>
#include <string>

namespace host {

class Output;

class LineCommand : public Command {
protected:
    enum class OutputOrder { Sorted, AsRead };

    void declareShared(Syntax& syntax);
    int process(LineOrder order, OutputOrder outputOrder, bool showCounts, Diagnostics& diagnostics);

private:
    void sendThrough(Output& output, std::uint64_t memory, LineOrder order, OutputOrder outputOrder,
                     bool showCounts, Diagnostics& diagnostics) const;

    FileOptions files_;
    std::string workspace_;
    std::string memory_ = "256M";
    bool ignoreCase_ = false;
};

/// The end of the help of both commands.
extern const char* const lineCommandNotes;

} // namespace host
