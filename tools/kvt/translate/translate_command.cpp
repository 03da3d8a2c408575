// `kvt translate`: its options, most of which are made from the table of steps.

#include "base/failure.h"
#include "base/text.h"
#include "cli/choices.h"
#include "cli/command.h"
#include "cli/sizes.h"
#include "text/file_options.h"
#include "translate/explanation.h"
#include "translate/job_file.h"
#include "translate/plan.h"
#include "translate/step_table.h"
#include "translate/translation.h"

#include <algorithm>
#include <functional>
#include <thread>
#include <utility>

namespace host {

namespace {

constexpr const char* examples =
    R"(kvt translate --from windows-1252 --delimiter ';' --date born=%d.%m.%Y --number amount=de old.csv -o new.csv
kvt translate --date 'day=%d.%m.%Y|ISO' --on-error skip --reject bad.csv --report bad.jsonl in.csv -o out.csv
kvt translate --where 'state~^open$' --keep id,amount --sort amount in.csv)";

constexpr const char* notes =
    R"(Steps are done in the order in which they are given. COL is the name of a column,
or the number of a column of the input, from 1. Empty cells stay empty. --pivot
and --months count for each --date behind them.

Cells have delimiters between them and may have quotes around them, as RFC 4180
has it; lines end with LF, CR or CRLF. What no step changes is written as it
stood; what is changed has quotes only where it must, unless --quote-all. Rows of
all FILEs become one table; the header of each has to be that of the first.

A row that has too few or too many cells, a quote that is never closed, text
behind a closing quote, or a byte of zero is never written. For a cell that
cannot be translated, --on-error says what happens: 'stop' ends the command
without a result, 'keep' leaves the cell as it was, 'empty' makes it empty,
'skip' leaves the row out. --report has each of them with file, row, column, byte
offset, value, and number and text of the message; rows are counted from 1 in
each file, with the header. --reject gets the rows that were left out, as they
stood, with their header: mended, they go through the same command.

With several threads the output is the same, byte for byte. --part I/N does the
I-th of N parts of one FILE, cut between rows; the outputs of all parts, one
behind the other, are that of the whole. --merge-reports makes one of their
reports.

Exit status:
  0  done
  1  done, but something could not be translated
  2  not done; an output file was left as it was)";

class TranslateCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.option(
            "-j,--job", jobFile_, "FILE",
            "Do what FILE says, such as 'kvt infer' writes; options beside it count more, and steps come "
            "behind its own");
        syntax.flag("--explain", explains_,
                    "Print the job and the first rows before and after, and do no more");
        declareForms(syntax);
        syntax.flag("--header", hasHeader_, "The first row names the columns, the default");
        syntax.flag("--no-header", hasNoHeader_, "There is no such row; columns have numbers");
        declareSteps(syntax);
        onErrorOption_ = syntax
                             .option("--on-error", job_.onError, "WHAT",
                                     "What a failure does: 'stop' (default), 'keep', 'empty' or 'skip'")
                             .takes(onErrorWords());
        field(onErrorOption_, [](Job& to, const Job& from) { to.onError = from.onError; });
        syntax.option(
            "--report", options_.report, "FILE",
            "Write all failures to FILE: as CSV where it ends in .csv, else a JSON object on each line");
        syntax.option("--reject", options_.reject, "FILE",
                      "Write the rows that are left out to FILE; implies --on-error skip");
        field(syntax.option("--max-errors", job_.mostErrors, "N", "End when there are more than N failures"),
              [](Job& to, const Job& from) { to.mostErrors = from.mostErrors; });
        syntax.flag("--dry-run", options_.isDryRun,
                    "Write nothing, and say what would be written and what would fail");
        syntax.option("--threads", threads_, "N", "Work on N blocks at a time; all cores without it");
        syntax.option("--part", part_, "I/N", "Do the I-th of N parts of FILE");
        syntax.flag("--merge-reports", mergesReports_, "FILEs are the reports of parts; write them as one");
        syntax.option("--memory", memory_, "SIZE", "How much sorting may hold in memory; 256M without it");
        syntax.option("--workspace", options_.workspace, "FILE",
                      "A file to make, use beyond that, and remove");
        syntax.option("--zone-database", job_.zoneDatabase, "DIR",
                      "Folder with the zone database, as for 'kvt date'");
        files_.declare(syntax);
    }

    int run(Diagnostics& diagnostics) override {
        options_.inputs = files_.inputs();
        options_.output = files_.outputPath();
        if (mergesReports_) {
            mergeReports(options_.inputs, options_.output);
            return 0;
        }
        options_.progress = files_.progress();
        if (hasHeader_ && hasNoHeader_) {
            throw Failure("--header and --no-header do not go together");
        }
        readJob();
        if (!options_.reject.empty() && !onErrorOption_.isGiven()) {
            job_.onError = "skip";
        }
        options_.threads = threadCount();
        options_.part = part();
        options_.memory = parseSize("--memory", memory_);
        readSteps();
        if (explains_) {
            print(explanationOf(job_, options_.inputs));
            return 0;
        }
        return translate(job_, options_, diagnostics);
    }

private:
    using TakeField = std::function<void(Job& to, const Job& from)>;

    void declareForms(Syntax& syntax) {
        field(syntax.option("--from", job_.input.encoding, "ENC", "Encoding of the input; UTF-8 without it"),
              [](Job& to, const Job& from) { to.input.encoding = from.input.encoding; });
        field(syntax.option("--to", job_.output.encoding, "ENC", "Encoding of the output; UTF-8 without it"),
              [](Job& to, const Job& from) { to.output.encoding = from.output.encoding; });
        field(
            syntax.option("--delimiter", job_.input.delimiter, "CHAR",
                          "What stands between cells: a character, or 'tab', 'comma' (default), 'semicolon', "
                          "'pipe', 'space'"),
            [](Job& to, const Job& from) { to.input.delimiter = from.input.delimiter; });
        field(syntax.option("--quote", job_.input.quote, "CHAR", "What stands around cells; '\"' without it"),
              [](Job& to, const Job& from) { to.input.quote = from.input.quote; });
        field(syntax.option("--out-delimiter", job_.output.delimiter, "CHAR",
                            "The delimiter of the output, if it is another"),
              [](Job& to, const Job& from) { to.output.delimiter = from.output.delimiter; });
        field(syntax
                  .option("--line-ends", job_.output.lineEnds, "WHAT",
                          "'keep' the ends of rows (default), or write 'lf' or 'crlf'")
                  .takes(rowEndWords()),
              [](Job& to, const Job& from) { to.output.lineEnds = from.output.lineEnds; });
        field(syntax.flag("--quote-all", job_.output.quoteAll, "Put quotes around all cells"),
              [](Job& to, const Job& from) { to.output.quoteAll = from.output.quoteAll; });
    }

    void field(const Option& option, TakeField take) { fields_.emplace_back(option, std::move(take)); }

    // What stands on the command line counts more than what the file says.
    void readJob() {
        if (!jobFile_.empty()) {
            const Job typed = std::exchange(job_, readJobFile(jobFile_, job_.zoneDatabase));
            for (const auto& [option, take] : fields_) {
                if (option.isGiven()) {
                    take(job_, typed);
                }
            }
            job_.zoneDatabase = typed.zoneDatabase;
        }
        job_.input.hasHeader = hasHeader_ || (job_.input.hasHeader && !hasNoHeader_);
    }

    void declareSteps(Syntax& syntax) {
        for (const StepRow& row : stepTable()) {
            declareOrdered(syntax, row.name, row.typed, row.help);
            if (row.name == "date") {
                declareOrdered(syntax, "pivot", "YY",
                               "For %y: YY to 99 are in the last century, the others in this one");
                declareOrdered(syntax, "months", "LANG", "Names of months are those of LANG, as 'de'");
            }
        }
    }

    void declareOrdered(Syntax& syntax, const std::string& name, const std::string& value,
                        const std::string& help) {
        syntax.option(
            "--" + name, [this, name](const std::string& typed) { typed_.emplace_back(name, typed); }, value,
            help);
    }

    void readSteps() {
        std::string pivot;
        std::string months;
        for (const auto& [name, typed] : typed_) {
            if (name == "pivot") {
                pivot = typed;
            } else if (name == "months") {
                months = typed;
            } else {
                job_.steps.push_back(makeStepOf(name, typed, pivot, months));
            }
        }
    }

    JobStep makeStepOf(const std::string& name, const std::string& typed, const std::string& pivot,
                       const std::string& months) const {
        StepArguments arguments = readStep(name, typed);
        if (name == "date") {
            if (!pivot.empty()) {
                arguments.emplace_back("pivot", pivot);
            }
            if (!months.empty()) {
                arguments.emplace_back("months", months);
            }
        }
        return makeStep(name, std::move(arguments), job_.zoneDatabase);
    }

    std::size_t threadCount() const {
        if (threads_.empty()) {
            return std::max(1U, std::thread::hardware_concurrency());
        }
        constexpr std::uint64_t most = 1024;
        const std::uint64_t count = parseNumber("--threads", threads_);
        if (count == 0 || count > most) {
            throw Failure("--threads takes a number from 1 to " + std::to_string(most) + ", not '" +
                          printable(threads_) + "'");
        }
        return static_cast<std::size_t>(count);
    }

    std::optional<Part> part() const {
        if (part_.empty()) {
            return std::nullopt;
        }
        const std::size_t slash = std::min(part_.find('/'), part_.size());
        const Part part{parseNumber("--part", part_.substr(0, slash)),
                        parseNumber("--part", part_.substr(std::min(slash + 1, part_.size())))};
        constexpr std::uint64_t most = 1'000'000;
        if (part.number == 0 || part.number > part.count || part.count > most) {
            throw Failure("--part takes I/N with I from 1 to N, not '" + printable(part_) + "'");
        }
        return part;
    }

    Job job_;
    TranslationOptions options_;
    FileOptions files_;
    Option onErrorOption_;
    std::vector<std::pair<Option, TakeField>> fields_; ///< of the job that options set
    std::string jobFile_;
    bool explains_ = false;
    bool hasHeader_ = false;
    bool hasNoHeader_ = false;
    bool mergesReports_ = false;
    std::string threads_;
    std::string part_;
    std::string memory_ = "256M";
    std::vector<std::pair<std::string, std::string>> typed_; ///< steps, in order
};

} // namespace

CommandInfo translateCommand() {
    return {"translate", "Translate the columns of delimited text", examples, notes,
            std::make_unique<TranslateCommand>()};
}

} // namespace host
