#include "date/function.h"

#include "base/failure.h"
#include "base/text.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "date/lines.h"
#include "zone/zone_folder.h"

#include <kvt/datetime/datetime.h>

namespace host {

const char* const valueNotes =
    R"(Without a value, or with '-' for it, values are read from the lines of the FILEs
of --file, or of standard input, and results are written as they come. A line
that fails leaves an empty line, so that lines keep their numbers. The first ten
failures of a kind are said, and then they are counted. What is wrong with the
command line ends the command before the first line. An interval with a sign may
stand as it is; anything else that begins with '-' and a letter needs '--' before
it.

Exit status:
  0  done
  1  done, but some lines failed
  2  not done: the value failed, or the command line was wrong)";

void ValueFunction::declare(Syntax& parent) {
    syntax_ = &parent.subcommand(words_.name, words_.summary);
    first_.option =
        syntax_->operand(words_.value, first_.text, "The value; standard input without it and for '-'");
    if (*words_.operand != '\0') {
        second_.option = syntax_->operand(words_.operand, second_.text, words_.operandHelp);
    }
    // "-P1D" would be the option "-P" to the reader of the command line, and so it is.
    negativeInterval_.option = syntax_->option("-P", negativeInterval_.text, "", "").hidden();
    declareOptions(*syntax_);
    lines_.declare(*syntax_);
    syntax_->flag("--json", json_, "Print a JSON object on a line for each value, failures included");
    syntax_->setHelp(words_.examples, ownNotes() + valueNotes);
}

int ValueFunction::run(Diagnostics& diagnostics) {
    std::vector<std::string> arguments;
    const bool hasOperand = *words_.operand != '\0';
    for (const Typed* typed : {&first_, &second_}) {
        if (typed->option.isGiven()) {
            arguments.push_back(typed->text);
        }
    }
    if (negativeInterval_.option.isGiven()) {
        arguments.push_back("-P" + negativeInterval_.text);
    }
    const std::size_t most = hasOperand ? 2 : 1;
    if (arguments.size() > most) {
        throw Failure("unexpected argument '" + printable(arguments.back()) + "'");
    }
    if (hasOperand && arguments.empty()) {
        throw Failure(std::string(words_.operand) + " is required");
    }
    const std::string operand = hasOperand ? arguments.back() : std::string();
    requireUtf8(words_.operand, operand);
    const bool isAlone = hasOperand && arguments.size() < most;
    if (const std::string wrong = whatIsWrongWith(operand); !wrong.empty()) {
        throw Failure(isAlone && !lines_.isAsked() ? wrong + likelyMeant(operand) : wrong);
    }
    prepare(operand);
    const bool fromInput = arguments.size() < most || arguments.front() == "-";
    if (!fromInput && lines_.isAsked()) {
        throw Failure("VALUE and the options for lines do not go together; put '-' for the value");
    }
    if (!fromInput && !json_) {
        requireUtf8(words_.value, arguments.front());
    }
    const ApplyToValue applyTo = [&](const kvt::ex::UString<0>& value) {
        DateOutcome outcome = apply(value);
        if (withoutBlanks(value.toStdString()).empty()) {
            outcome.withoutMessage = "The value is empty.";
        }
        return outcome;
    };
    return fromInput ? runLines(applyTo, json_, lines_, diagnostics)
                     : runValue(arguments.front(), applyTo, json_, lines_.output(), diagnostics);
}

// With one argument alone it is the operand. Where it is none, it was most likely meant for a value.
std::string ValueFunction::likelyMeant(const std::string& typed) const {
    const std::string example = exampleFor(typed);
    return example.empty()
               ? std::string()
               : std::string("\n     ") + words_.operand + " is missing, unless this was meant: kvt date " +
                     words_.name + " '" + printable(typed) + "' " + example;
}

void FunctionGroup::declare(Syntax& parent) {
    syntax_ = &parent.subcommand(name_, summary_);
    for (const auto& function : functions_) {
        function->declare(*syntax_);
    }
    syntax_->setHelp(examples_, valueNotes);
}

int FunctionGroup::run(Diagnostics& diagnostics) {
    for (const auto& function : functions_) {
        if (function->isChosen()) {
            return function->run(diagnostics);
        }
    }
    return NotDone;
}

void ZoneDatabaseOption::declare(Syntax& syntax) {
    syntax.option("--zone-database", named_, "DIR",
                  "Folder with the zone database, as 'kvt tzdata' writes it; without this option "
                  "~/Downloads/tzdata, or else one that the command keeps in the cache");
}

std::string ZoneDatabaseOption::folder() const {
    return zoneFolder(named_).path;
}

void ZoneDatabaseOption::use() const {
    kvt::ex::datetime::setInstallPathWrapper(folder());
}

bool isValue(const std::string& text) {
    return outcomeOf(kvt::ex::datetime::timezoneRemove(toUString(text))).isGood();
}

kvt::ex::UString<0> toUString(const std::string& utf8) {
    return kvt::ex::UString<0>(utf8.data(), utf8.size());
}

} // namespace host
