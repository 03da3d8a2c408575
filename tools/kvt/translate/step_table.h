// All steps that a job may have: what each is called, what it takes, and what makes it. Options, help, documents and job
// files are made from this one table.
#pragma once

#include "translate/job.h"
#include "translate/step.h"

#include <memory>
#include <string>
#include <vector>

namespace host {

struct StepArgument {
    std::string name;
    bool isRequired;
    std::string help;
};

struct StepRow {
    std::string name;  ///< "date"; the option is "--date"
    std::string typed; ///< the form of the option's value: "COL=FORMAT"
    std::string help;  ///< one or two sentences
    std::vector<StepArgument> arguments;
    /// The arguments of what was typed. Throws Failure.
    StepArguments (*read)(const std::string& typed);
    MakeStep make; ///< null for those that order the rows when all are there: "sort" and "unique"
};

/// In the order of the help.
const std::vector<StepRow>& stepTable();

/// A step with its arguments by name, checked as far as that goes without the table that it is for: the step is there,
/// so are the required arguments and no others, and formats, expressions and the like can be read. Throws Failure.
JobStep makeStep(const std::string& name, StepArguments arguments, const std::string& zoneDatabase = {});

/// The same from what was typed behind "--NAME".
StepArguments readStep(const std::string& name, const std::string& typed);

/// The step at work. Throws Failure. Not for "sort" and "unique".
std::unique_ptr<Step> startStep(const JobStep& step, const std::string& zoneDatabase);

} // namespace host
