// What a translation is to do, as plain data: the form of what comes in and goes out, the steps in between, and what
// becomes of failures. The command line fills it; so may anything else. Nothing in it is checked before it is used.
//
//     Job job;
//     job.input.encoding = "windows-1252";
//     job.steps.push_back(makeStep("date", {{"column", "born"}, {"format", "%d.%m.%Y"}}));   // step_table.h
#pragma once

#include <string>
#include <utility>
#include <vector>

namespace host {

/// Texts by the names that step_table.h has for them.
using StepArguments = std::vector<std::pair<std::string, std::string>>;

/// One thing that is done to each row.
struct JobStep {
    std::string name; ///< one of stepTable()
    StepArguments arguments;

    friend bool operator==(const JobStep&, const JobStep&) = default;
};

struct Job {
    struct Input {
        std::string encoding = "UTF-8";
        std::string delimiter = ","; ///< one character of ASCII, or its name; see asciiCharacter()
        std::string quote = "\"";
        bool hasHeader = true; ///< the first row of each file names the columns
    };
    struct Output {
        std::string encoding = "UTF-8";
        std::string delimiter;         ///< empty: that of the input
        std::string lineEnds = "keep"; ///< "keep", "lf" or "crlf"
        bool quoteAll = false;
    };

    Input input;
    Output output;
    std::vector<JobStep> steps;    ///< in the order in which they are done
    std::string onError = "stop";  ///< "stop", "keep", "empty" or "skip"
    std::string mostErrors;        ///< a number; empty: any number
    std::string zoneDatabase = {}; ///< a folder; empty: the one that is found
};

/// The character that `typed` is, or names: "tab", "comma", "semicolon", "pipe", "space". It is one that can stand between cells
/// or around them. Throws Failure, which names `option`.
char asciiCharacter(const std::string& option, const std::string& typed);

} // namespace host
