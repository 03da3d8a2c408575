// `kvt unique`: each line of files once, in the order of the input.

#include "sort/line_command.h"

#include <string>

namespace host {

namespace {

constexpr const char* examples = R"(kvt unique names.txt
kvt unique --ignore-case --count one.txt two.txt
kvt unique --key 2 --delimiter ';' orders.csv
kvt unique --memory 1G huge.log -o huge.log)";

constexpr const char* ownNotes =
    R"(The first of equal lines stays where it is, and the others go, wherever they are:
the input need not be sorted. With --key, lines are equal whose fields are. With
--count each line has before it how many there were, and a tab.

)";

constexpr const char* statuses = R"(  0  done
  2  not done)";

class UniqueCommand : public LineCommand {
public:
    int run(Diagnostics& diagnostics) override {
        return process({LineOrder::Ascending, OutputOrder::AsRead, count_}, diagnostics);
    }

private:
    void declareOwn(Syntax& syntax) override {
        syntax.flag("-c,--count", count_, "Write before each line how many there were");
    }

    bool count_ = false;
};

} // namespace

CommandInfo uniqueCommand() {
    return {"unique", "Drop lines that were there before, however many", examples,
            std::string(ownNotes) + lineCommandNotes + statuses, std::make_unique<UniqueCommand>()};
}

} // namespace host
