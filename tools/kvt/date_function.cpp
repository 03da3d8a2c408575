#include "date_function.h"

#include "command.h"
#include "date_lines.h"
#include "exit_status.h"
#include "failure.h"
#include "text.h"

#include <kvt/datetime/datetime.h>

namespace host {

const char* const valueNotes =
    R"(Without a value, or with '-' for it, values are read from standard input, one on
each line, and results are written as they come. A line that fails leaves an
empty line, so that lines keep their numbers. An interval with a sign may stand
as it is; anything else that begins with '-' and a letter needs '--' before it.

Exit status:
  0  done
  1  done, but some lines of standard input failed
  2  not done: the value failed, or the command line was wrong)";

void ValueFunction::declare(CLI::App& parent) {
    app_ = parent.add_subcommand(words_.name, words_.summary);
    app_->add_option(words_.value, first_, "The value; standard input without it and for '-'")->type_name("");
    if (*words_.operand != '\0') {
        app_->add_option(words_.operand, second_, words_.operandHelp)->type_name("");
    }
    // "-P1D" would be the option "-P" to the reader of the command line, and so it is.
    app_->add_option("-P", negativeInterval_)->group("");
    declareOptions(*app_);
    app_->add_flag("--json", json_, "Print a JSON object on a line for each value, failures included");
    setHelp(*app_, words_.examples, ownNotes() + valueNotes);
}

int ValueFunction::run(Diagnostics& diagnostics) {
    std::vector<std::string> arguments;
    const auto add = [&](const std::string& option, const std::string& text) {
        if (app_->get_option(option)->count() != 0) {
            arguments.push_back(text);
        }
    };
    const bool hasOperand = *words_.operand != '\0';
    add(words_.value, first_);
    if (hasOperand) {
        add(words_.operand, second_);
    }
    add("-P", "-P" + negativeInterval_);
    const std::size_t most = hasOperand ? 2 : 1;
    if (arguments.size() > most) {
        throw Failure("unexpected argument '" + printable(arguments.back()) + "'");
    }
    if (hasOperand && arguments.empty()) {
        throw Failure(std::string(words_.operand) + " is required");
    }
    prepare(hasOperand ? arguments.back() : std::string());
    const bool fromInput = arguments.size() < most || arguments.front() == "-";
    const ApplyToValue applyTo = [&](const kvt::ex::UString<0>& value) { return apply(value); };
    return fromInput ? runLines(applyTo, json_, diagnostics)
                     : runValue(arguments.front(), applyTo, json_, diagnostics);
}

void FunctionGroup::declare(CLI::App& parent) {
    app_ = parent.add_subcommand(name_, summary_);
    for (const auto& function : functions_) {
        function->declare(*app_);
    }
    app_->require_subcommand(1);
    setHelp(*app_, examples_, valueNotes);
}

int FunctionGroup::run(Diagnostics& diagnostics) {
    for (const auto& function : functions_) {
        if (function->isChosen()) {
            return function->run(diagnostics);
        }
    }
    return NotDone;
}

void ZoneDatabaseOption::declare(CLI::App& app) {
    app.add_option("--zone-database", folder_,
                   "Folder with the zone database, which 'kvt tzdata' writes; "
                   "~/Downloads/tzdata without this option")
        ->type_name("DIR");
}

void ZoneDatabaseOption::use() const {
    if (!folder_.empty()) {
        kvt::ex::datetime::setInstallPathWrapper(folder_);
    }
}

kvt::ex::UString<0> toUString(const std::string& utf8) {
    return kvt::ex::UString<0>(utf8.data(), utf8.size());
}

} // namespace host
