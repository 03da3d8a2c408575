// `kvt sort`: the lines of files in order, however many there are.

#include "base/failure.h"
#include "base/text.h"
#include "date/pattern_words.h"
#include "sort/line_command.h"

#include <string>

namespace host {

namespace {

constexpr const char* examples = R"(kvt sort names.txt
kvt sort --key 3 --number --reverse population.tsv -o ranking.tsv
kvt sort --key 2 --delimiter ';' --date '%d.%m.%Y' events.csv)";

constexpr const char* ownNotes =
    R"(Lines that are equal, or that have equal keys, stay in the order in which they
were read, with --reverse as well.

With --number, keys are decimal numbers, with a sign, a fraction, an exponent and
blanks around them or without, or inf. They compare exactly, however many digits
they have. With --date, they are dates, times or both in a FORMAT of 'kvt date
parse', whose help lists the flags. What has an offset from UTC is compared in
UTC, what has none as if it were in UTC; times of day come before dates. Lines
without such a number or date stand at the end, in either order; they are counted
on standard error.

)";

constexpr const char* statuses = R"(  0  done
  1  done, but some lines have no number, or no date
  2  not done)";

class SortCommand : public LineCommand {
public:
    int run(Diagnostics& diagnostics) override {
        if (number_ && dateOption_.isGiven()) {
            throw Failure("--number and --date do not go together");
        }
        Plan plan;
        plan.order = reverse_ ? LineOrder::Descending : LineOrder::Ascending;
        plan.key.missingFirst = reverse_;
        if (number_) {
            plan.key.by = KeyRule::By::Number;
        } else if (dateOption_.isGiven()) {
            requireUtf8("--date", format_);
            if (const std::string wrong = wrongInReadFormat(format_); !wrong.empty()) {
                throw Failure("--date: " + wrong);
            }
            plan.key.by = KeyRule::By::Date;
            plan.key.dateFormat = format_;
        }
        return process(plan, diagnostics);
    }

private:
    void declareOwn(Syntax& syntax) override {
        syntax.flag("-r,--reverse", reverse_, "The last first; equal lines stay in the order of the input");
        syntax.flag("-n,--number", number_, "Compare numbers");
        dateOption_ =
            syntax.option("--date", format_, "FORMAT", "Compare dates and times, such as '%d.%m.%Y'");
    }

    bool reverse_ = false;
    bool number_ = false;
    std::string format_;
    Option dateOption_;
};

} // namespace

CommandInfo sortCommand() {
    return {"sort", "Sort the lines of files, however many", examples,
            std::string(ownNotes) + lineCommandNotes + statuses, std::make_unique<SortCommand>()};
}

} // namespace host
