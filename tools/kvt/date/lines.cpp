#include "date/lines.h"

#include "base/diagnostics.h"
#include "base/messages.h"
#include "base/output.h"
#include "base/text.h"
#include "cli/exit_status.h"
#include "text/line_reader.h"
#include "text/value_lines.h"

#include <kvt/foundation/throwable.h>

#include <cstddef>
#include <memory>
#include <utility>

namespace host {

namespace {

// No value is nearly as long.
constexpr std::size_t longestLine = 64 * 1024;

// A text that cannot be taken for a value at all fails like any other value.
DateOutcome outcomeFor(const std::string& value, const ApplyToValue& apply) {
    try {
        return apply(kvt::ex::UString<0>(value.data(), value.size()));
    } catch (const kvt::ex::Throwable& failure) {
        return failedOutcome(describe(failure));
    }
}

void sayFailure(const DateOutcome& outcome, Diagnostics& diagnostics) {
    diagnostics.fail(failureText(outcome));
    for (const std::string& line : markedFormat(outcome)) {
        diagnostics.line("     " + line);
    }
}

class ValueOfLine : public LineWork {
public:
    ValueOfLine(const ApplyToValue& apply, bool json) : apply_(apply), json_(json) {}

    bool apply(const TextLine& line, std::string& out) override {
        const bool isTooLong = line.text.size() > longestLine;
        value_.assign(isTooLong ? std::string_view() : line.text);
        outcome_ =
            isTooLong ? failedOutcome("The line is too long for a value.") : outcomeFor(value_, apply_);
        if (json_) {
            nlohmann::ordered_json object;
            object["line"] = line.number;
            object["value"] = value_;
            addTo(object, outcome_);
            out += jsonLine(object);
        } else {
            out += (outcome_.isGood() ? resultText(outcome_) : std::string()) + "\n";
        }
        if (!outcome_.isGood()) {
            kind_ = outcome_.message ? std::to_string(outcome_.message->number) : outcome_.withoutMessage;
            kind_.append(" ").append(outcome_.format);
        }
        return outcome_.isGood();
    }
    std::string_view kind() const override { return kind_; }
    std::string reason() const override { return failureText(outcome_); }
    std::vector<std::string> below() const override { return markedFormat(outcome_); }

private:
    const ApplyToValue& apply_;
    bool json_;
    std::string value_;
    DateOutcome outcome_ = failedOutcome("");
    std::string kind_;
};

} // namespace

int runValue(const std::string& value, const ApplyToValue& apply, bool json, const std::string& outputPath,
             Diagnostics& diagnostics) {
    const DateOutcome outcome = outcomeFor(value, apply);
    if (!json && !outcome.isGood()) {
        sayFailure(outcome, diagnostics);
        return NotDone;
    }
    if (json) {
        nlohmann::ordered_json object;
        object["value"] = value;
        addTo(object, outcome);
        print(jsonLine(object), outputPath);
    } else {
        print(resultText(outcome) + "\n", outputPath);
    }
    return outcome.isGood() ? Done : NotDone;
}

int runLines(const ApplyToValue& apply, bool json, ValueLines& lines, Diagnostics& diagnostics) {
    ValueOfLine work(apply, json);
    return lines.run(work, json, diagnostics);
}

int showOutcome(const DateOutcome& outcome, bool json, const std::string& outputPath,
                Diagnostics& diagnostics) {
    if (json) {
        nlohmann::ordered_json object;
        addTo(object, outcome);
        print(jsonLine(object), outputPath);
    } else if (outcome.isGood()) {
        print(resultText(outcome) + "\n", outputPath);
    } else {
        sayFailure(outcome, diagnostics);
    }
    return outcome.isGood() ? Done : NotDone;
}

} // namespace host
