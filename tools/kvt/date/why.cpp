// `kvt date why`: how a value was read, as a table of steps.

#include "date/function.h"
#include "date/pattern_words.h"

#include "base/output.h"
#include "base/table.h"
#include "base/text.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "cli/output_option.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/pattern_trace.h>

#include <algorithm>

namespace host {

namespace {

using kvt::ex::datetime::PatternStep;
using kvt::ex::datetime::PatternStepState;
using kvt::ex::datetime::PatternTrace;
using Traces = kvt::ex::vector<PatternTrace>;

constexpr const char* examples = R"(kvt date why 2020-13-01 '%Y-%m-%d'
kvt date why 2020-01-02T03:04 ISO)";

constexpr const char* notes =
    R"(For each element of the format: what it reads, and what it took from the value
or where it stopped. "not known" stands where an element took a part of a
character. For keywords: each form that they stand for, and how far it got.

Exit status:
  0  done, whether or not the value fits the format
  2  not done: the value or the format is no UTF-8)";

std::string inQuotes(std::string_view text) {
    return "\"" + printable(text) + "\"";
}

const char* stateName(PatternStepState state) {
    switch (state) {
    case PatternStepState::Read:
        return "read";
    case PatternStepState::Stopped:
        return "stopped";
    case PatternStepState::NotReached:
        return "not reached";
    case PatternStepState::Unknown:
        break;
    }
    return "not known";
}

DateOutcome outcomeOfTrace(const PatternTrace& trace) {
    DateOutcome outcome = outcomeOf(trace.result);
    outcome.withoutMessage = "The value is empty.";
    return outcome;
}

// ---- As text

// What stands where an element stopped.
std::string restOf(const std::string& value, std::size_t at) {
    return at == value.size() ? "the end of the value" : inQuotes(value.substr(at));
}

std::string whatHappened(const std::string& value, const PatternStep& step) {
    switch (step.state) {
    case PatternStepState::Read:
        return step.taken.isEmpty() ? "nothing" : inQuotes(step.taken.toStdString());
    case PatternStepState::Stopped:
        return step.at ? "stopped at " + restOf(value, *step.at) : "stopped; where is not known";
    case PatternStepState::NotReached:
    case PatternStepState::Unknown:
        break;
    }
    return stateName(step.state);
}

std::string shownOutcome(const DateOutcome& outcome) {
    if (outcome.isGood()) {
        return "result: " + resultText(outcome) + "\n";
    }
    std::string text = "no result: " + failureText(outcome) + "\n";
    for (const std::string& line : markedFormat(outcome)) {
        text += "     " + line + "\n";
    }
    return text;
}

std::string shown(const std::string& value, const PatternTrace& trace) {
    std::vector<std::vector<std::string>> rows = {{"element", "reads", "took"}};
    for (const PatternStep& step : trace.steps) {
        rows.push_back(
            {inQuotes(step.element.toStdString()), step.reads.toStdString(), whatHappened(value, step)});
    }
    std::string text = formatTable({Align::Left, Align::Left, Align::Left}, rows);
    if (trace.end && *trace.end < value.size()) {
        text += "not looked at: " + inQuotes(value.substr(*trace.end)) + "\n";
    }
    return text + shownOutcome(outcomeOfTrace(trace));
}

// How far one form got, in a few words.
std::string howFar(const std::string& value, const PatternTrace& trace) {
    if (!trace.wasTried) {
        return trace.isKnown ? "not tried" : "passed over";
    }
    const DateOutcome outcome = outcomeOfTrace(trace);
    if (outcome.isGood()) {
        return "fits";
    }
    if (!trace.isPattern) {
        return "does not fit";
    }
    for (const PatternStep& step : trace.steps) {
        if (step.state == PatternStepState::Stopped) {
            return inQuotes(step.element.toStdString()) + " " + whatHappened(value, step);
        }
    }
    return failureText(outcome);
}

std::string shown(const std::string& value, const Traces& traces) {
    std::vector<std::vector<std::string>> rows = {{"keyword", "form", "result"}};
    for (const PatternTrace& trace : traces) {
        rows.push_back(
            {printable(trace.keyword.toStdString()), trace.form.toStdString(), howFar(value, trace)});
    }
    return formatTable({Align::Left, Align::Left, Align::Left}, rows);
}

// ---- As JSON

nlohmann::ordered_json jsonOf(const PatternTrace& trace) {
    nlohmann::ordered_json steps = nlohmann::ordered_json::array();
    for (const PatternStep& step : trace.steps) {
        nlohmann::ordered_json object;
        object["element"] = step.element.toStdString();
        object["reads"] = step.reads.toStdString();
        object["state"] = stateName(step.state);
        object["offset"] = step.at ? nlohmann::ordered_json(*step.at) : nullptr;
        object["taken"] =
            step.state == PatternStepState::Read ? nlohmann::ordered_json(step.taken.toStdString()) : nullptr;
        object["why"] = step.state == PatternStepState::Stopped
                            ? nlohmann::ordered_json(step.why.toStdString())
                            : nullptr;
        steps.push_back(std::move(object));
    }
    return steps;
}

nlohmann::ordered_json jsonOf(const Traces& traces) {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (const PatternTrace& trace : traces) {
        nlohmann::ordered_json object;
        object["keyword"] = trace.keyword.toStdString();
        object["form"] = trace.form.toStdString();
        object["tried"] = trace.wasTried;
        object["fits"] = trace.wasTried && outcomeOfTrace(trace).isGood();
        if (trace.isPattern && trace.wasTried) {
            object["steps"] = jsonOf(trace);
        }
        list.push_back(std::move(object));
    }
    return list;
}

class WhyFunction : public DateFunction {
public:
    void declare(Syntax& parent) override {
        syntax_ = &parent.subcommand("why", "Show step by step how 'parse' reads a value");
        syntax_->operand("VALUE", value_, "The value").required();
        syntax_->operand("FORMAT", format_, "A pattern or keywords, as for 'parse'").required();
        syntax_->flag("--lenient", lenient_, "Let parts run over into the next larger one, as for 'parse'");
        syntax_->flag("--json", json_, "Print a JSON object on a line");
        declareOutput(*syntax_, output_);
        syntax_->setHelp(examples, notes);
    }
    bool isChosen() const override { return syntax_->isChosen(); }

    int run(Diagnostics&) override {
        requireUtf8("VALUE", value_);
        requireUtf8("FORMAT", format_);
        const auto value = toUString(value_);
        const auto format = toUString(format_);
        const std::string shownValue = withoutBlanks(value_);
        const Traces traces = kvt::ex::datetime::traceParse(value, format, lenient_);
        nlohmann::ordered_json object;
        object["value"] = shownValue;
        object["format"] = withoutBlanks(format_);
        if (traces.front().isPattern && traces.front().keyword.isEmpty()) {
            const PatternTrace& trace = traces.front();
            object["steps"] = jsonOf(trace);
            object["end"] = trace.end ? nlohmann::ordered_json(*trace.end) : nullptr;
            addTo(object, outcomeOfTrace(trace));
            print(json_ ? jsonLine(object) : shown(shownValue, trace), output_);
        } else {
            DateOutcome outcome = outcomeOf(kvt::ex::datetime::parse(value, format, lenient_));
            outcome.withoutMessage = "The value is empty.";
            object["tries"] = jsonOf(traces);
            addTo(object, outcome);
            print(json_ ? jsonLine(object) : shown(shownValue, traces) + shownOutcome(outcome), output_);
        }
        return Done;
    }

private:
    Syntax* syntax_ = nullptr;
    std::string value_;
    std::string format_;
    std::string output_;
    bool lenient_ = false;
    bool json_ = false;
};

} // namespace

void addWhyFunction(DateFunctions& functions) {
    functions.push_back(std::make_unique<WhyFunction>());
}

} // namespace host
