// `kvt unique`: each line of files once, in the order of the input.

#include "sort/line_command.h"

#include <string>

namespace host {

namespace {

constexpr const char* examples = R"(kvt unique names.txt
kvt unique --ignore-case --count one.txt two.txt
kvt unique --memory 1G huge.log -o huge.log)";

constexpr const char* ownNotes =
    R"(The first of equal lines stays where it is, and the others go, wherever they are:
the input need not be sorted. With --count each line has before it how many there
were, and a tab.

)";

class UniqueCommand : public LineCommand {
public:
    void declare(Syntax& syntax) override {
        syntax.flag("--count", count_, "Write before each line how many there were");
        declareShared(syntax);
    }

    int run(Diagnostics& diagnostics) override {
        return process(LineOrder::Ascending, OutputOrder::AsRead, count_, diagnostics);
    }

private:
    bool count_ = false;
};

} // namespace

CommandInfo uniqueCommand() {
    return {"unique", "Drop lines that were there before, however many", examples,
            std::string(ownNotes) + lineCommandNotes, std::make_unique<UniqueCommand>()};
}

} // namespace host
