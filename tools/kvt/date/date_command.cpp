// `kvt date`: the date and time functions of the library, each as a subcommand.

#include "cli/command.h"
#include "cli/exit_status.h"
#include "date/function.h"

namespace host {

namespace {

constexpr const char* examples = R"(kvt date parse '31 Jan 2020' '%d %b %Y'
kvt date add 20200131 P1M
kvt date why 2020-13-01 '%Y-%m-%d')";

constexpr const char* notes = R"(Values are in the library's canonical form:
  20200102                      a date
  030405.25   030405+01:00      a time of day, without and with an offset
  20200102030405.25             both
  20200102030405.25+01:00       both, with an offset
'parse' makes them of any other form, and 'format' makes any other form of them.

Exit status:
  0  done
  1  done, but some lines failed
  2  not done: the value failed, or the command line was wrong)";

class DateCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        addTextFunctions(functions_);
        addArithmeticFunctions(functions_);
        addZoneFunctions(functions_);
        addWhyFunction(functions_);
        for (const auto& function : functions_) {
            function->declare(syntax);
        }
    }

    int run(Diagnostics& diagnostics) override {
        for (const auto& function : functions_) {
            if (function->isChosen()) {
                return function->run(diagnostics);
            }
        }
        return NotDone;
    }

private:
    DateFunctions functions_;
};

} // namespace

CommandInfo dateCommand() {
    return {"date", "Read, write and reckon with dates, times and intervals", examples, notes,
            std::make_unique<DateCommand>()};
}

} // namespace host
