// `kvt infer`: what a file seems to be, as a job for `kvt translate`.

#include "base/output.h"
#include "base/progress.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "infer/proposal.h"
#include "text/file_options.h"

#include <memory>
#include <string>

namespace host {

namespace {

constexpr const char* examples = R"(kvt infer people.csv
kvt infer people.csv -o people.toml
kvt translate --job people.toml people.csv)";

constexpr const char* notes =
    R"(Reads all of FILE and prints what it seems to be: its encoding, what stands
between and around its cells, whether the first row has names, and for each
column whether it has dates, numbers or text, and in which forms. That is a job
for 'kvt translate --job', with the evidence as comments beside each line, to be
looked over and mended.

An encoding is proposed if all of the file is text in it; with --from it is
known. A date such as 01/02/2020 can be read in two ways; if no other date of
the column decides, the job says so. Text that was once read in the wrong
encoding, so that an umlaut became two characters, is named.

Exit status:
  0  done
  2  not done)";

class InferCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.option("--from", encoding_, "ENC", "Encoding of FILE; found out without it");
        files_.declareOutput(syntax);
        syntax.operand("FILE", file_, "File to look at; '-' is standard input, the default");
    }

    int run(Diagnostics& diagnostics) override {
        const std::unique_ptr<Output> output = openOutput(files_.outputPath());
        const std::optional<std::uint64_t> size = totalSize({file_});
        Survey survey;
        {
            Progress progress(diagnostics, size ? std::optional(*size * 2) : std::nullopt, files_.progress(),
                              "");
            survey = surveyFile(file_, encoding_, [&](std::uint64_t bytes) { progress.advance(bytes); });
        }
        output->write(proposedJob(survey));
        output->commit();
        return Done;
    }

private:
    FileOptions files_;
    std::string file_ = "-";
    std::string encoding_;
};

} // namespace

CommandInfo inferCommand() {
    return {"infer", "Say what a file of delimited text seems to be, as a job for translate", examples, notes,
            std::make_unique<InferCommand>()};
}

} // namespace host
