// `kvt sort`: the lines of files in order, however many there are.

#include "sort/line_command.h"

#include <string>

namespace host {

namespace {

constexpr const char* examples = R"(kvt sort names.txt
kvt sort --ignore-case --reverse one.txt two.txt -o sorted.txt
kvt sort --memory 1G --workspace /scratch/work huge.txt -o huge.txt)";

class SortCommand : public LineCommand {
public:
    void declare(Syntax& syntax) override {
        syntax.flag("-r,--reverse", reverse_, "The last first; equal lines stay in the order of the input");
        declareShared(syntax);
    }

    int run(Diagnostics& diagnostics) override {
        return process(reverse_ ? LineOrder::Descending : LineOrder::Ascending, OutputOrder::Sorted, false,
                       diagnostics);
    }

private:
    bool reverse_ = false;
};

} // namespace

CommandInfo sortCommand() {
    return {"sort", "Sort the lines of files, however many", examples,
            std::string("Equal lines stay in the order in which they were read.\n\n") + lineCommandNotes,
            std::make_unique<SortCommand>()};
}

} // namespace host
