// `kvt date why`: how a value was read, as a table of steps.

#include "date_function.h"

#include "command.h"
#include "date_why.h"
#include "exit_status.h"
#include "output.h"
#include "table.h"
#include "text.h"

#include <kvt/datetime/datetime.h>

namespace host {

namespace {

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

// What stands where an element stopped.
std::string restOf(const WhyReading& reading, std::size_t at) {
    const std::string rest = reading.value.substr(at);
    return rest.empty() ? "the end of the value" : inQuotes(rest);
}

std::string whatHappened(const WhyReading& reading, const WhyStep& step) {
    switch (step.state) {
    case StepState::Read:
        return step.taken.empty() ? "nothing" : inQuotes(step.taken);
    case StepState::Stopped:
        return step.at ? "stopped at " + restOf(reading, *step.at) : "stopped; where is not known";
    case StepState::NotReached:
    case StepState::Unknown:
        break;
    }
    return stepStateName(step.state);
}

std::string shownSteps(const WhyReading& reading) {
    std::vector<std::vector<std::string>> rows = {{"element", "reads", "took"}};
    for (const WhyStep& step : reading.steps) {
        rows.push_back({inQuotes(step.element), step.meaning, whatHappened(reading, step)});
    }
    return formatTable({Align::Left, Align::Left, Align::Left}, rows);
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

std::string shown(const WhyReading& reading) {
    std::string text = shownSteps(reading);
    if (reading.end && *reading.end < reading.value.size()) {
        text += "not looked at: " + inQuotes(reading.value.substr(*reading.end)) + "\n";
    }
    return text + shownOutcome(reading.outcome);
}

// How far one form got, in a few words.
std::string howFar(const WhyTry& made) {
    if (!made.wasTried) {
        return made.form == "no known keyword" ? "passed over" : "not tried";
    }
    if (made.fits) {
        return "fits";
    }
    if (!made.reading) {
        return "does not fit";
    }
    for (const WhyStep& step : made.reading->steps) {
        if (step.state == StepState::Stopped) {
            return inQuotes(step.element) + " " + whatHappened(*made.reading, step);
        }
    }
    return failureText(made.reading->outcome);
}

std::string shown(const std::vector<WhyTry>& tries) {
    std::vector<std::vector<std::string>> rows = {{"keyword", "form", "result"}};
    for (const WhyTry& made : tries) {
        rows.push_back({printable(made.keyword), made.form, howFar(made)});
    }
    return formatTable({Align::Left, Align::Left, Align::Left}, rows);
}

nlohmann::ordered_json jsonOf(const WhyReading& reading) {
    nlohmann::ordered_json steps = nlohmann::ordered_json::array();
    for (const WhyStep& step : reading.steps) {
        nlohmann::ordered_json object;
        object["element"] = step.element;
        object["reads"] = step.meaning;
        object["state"] = stepStateName(step.state);
        object["offset"] = step.at ? nlohmann::ordered_json(*step.at) : nullptr;
        object["taken"] = step.state == StepState::Read ? nlohmann::ordered_json(step.taken) : nullptr;
        steps.push_back(std::move(object));
    }
    return steps;
}

nlohmann::ordered_json jsonOf(const std::vector<WhyTry>& tries) {
    nlohmann::ordered_json list = nlohmann::ordered_json::array();
    for (const WhyTry& made : tries) {
        nlohmann::ordered_json object;
        object["keyword"] = made.keyword;
        object["form"] = made.form;
        object["tried"] = made.wasTried;
        object["fits"] = made.fits;
        if (made.reading) {
            object["steps"] = jsonOf(*made.reading);
        }
        list.push_back(std::move(object));
    }
    return list;
}

class WhyFunction : public DateFunction {
public:
    void declare(CLI::App& parent) override {
        app_ = parent.add_subcommand("why", "Tell step by step how 'parse' reads a value");
        app_->add_option("VALUE", value_, "The value")->type_name("")->required();
        app_->add_option("FORMAT", format_, "A pattern or keywords, as for 'parse'")
            ->type_name("")
            ->required();
        app_->add_flag("--lenient", lenient_, "Let parts run over into the next larger one, as for 'parse'");
        app_->add_flag("--json", json_, "Print a JSON object on a line");
        setHelp(*app_, examples, notes);
    }
    bool isChosen() const override { return app_->parsed(); }

    int run(Diagnostics&) override {
        nlohmann::ordered_json object;
        object["value"] = withoutBlanks(value_);
        object["format"] = withoutBlanks(format_);
        if (isPattern(format_)) {
            const WhyReading reading = whyByPattern(value_, format_, lenient_);
            object["steps"] = jsonOf(reading);
            object["end"] = reading.end ? nlohmann::ordered_json(*reading.end) : nullptr;
            addTo(object, reading.outcome);
            print(json_ ? jsonLine(object) : shown(reading));
        } else {
            const std::vector<WhyTry> tries = whyByKeywords(value_, format_, lenient_);
            DateOutcome outcome =
                outcomeOf(kvt::ex::datetime::parse(toUString(value_), toUString(format_), lenient_));
            outcome.withoutMessage = "The value is empty.";
            object["tries"] = jsonOf(tries);
            addTo(object, outcome);
            print(json_ ? jsonLine(object) : shown(tries) + shownOutcome(outcome));
        }
        return Done;
    }

private:
    CLI::App* app_ = nullptr;
    std::string value_;
    std::string format_;
    bool lenient_ = false;
    bool json_ = false;
};

} // namespace

void addWhyFunction(DateFunctions& functions) {
    functions.push_back(std::make_unique<WhyFunction>());
}

} // namespace host
