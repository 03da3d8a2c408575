#include "date/lines.h"

#include "base/diagnostics.h"
#include "base/input.h"
#include "base/messages.h"
#include "base/output.h"
#include "base/progress.h"
#include "base/text.h"
#include "cli/exit_status.h"

#include <kvt/foundation/throwable.h>

#include <cstdint>
#include <unistd.h>

namespace host {

namespace {

// No value is nearly as long. What is beyond is not kept, so that a file without line ends does no harm.
constexpr std::size_t longestLine = 64 * 1024;

// A text that cannot be taken for a value at all fails like any other value.
DateOutcome outcomeFor(const std::string& value, const ApplyToValue& apply) {
    try {
        return apply(kvt::ex::UString<0>(value.data(), value.size()));
    } catch (const kvt::ex::Throwable& failure) {
        return failedOutcome(describe(failure));
    }
}

void sayFailure(const DateOutcome& outcome, const std::string& place, Diagnostics& diagnostics) {
    diagnostics.say(place + failureText(outcome));
    for (const std::string& line : markedFormat(outcome)) {
        diagnostics.line("     " + line);
    }
}

/// Splits blocks into lines, and writes what becomes of each.
class Lines {
public:
    Lines(const ApplyToValue& apply, bool json, Diagnostics& diagnostics)
        : apply_(apply), json_(json), diagnostics_(diagnostics) {}

    /// Appends the results of all lines that end in `block` to `out`.
    void add(std::string_view block, std::string& out) {
        for (std::size_t end = block.find('\n'); end != std::string_view::npos; end = block.find('\n')) {
            keep(block.substr(0, end));
            finishLine(out);
            block.remove_prefix(end + 1);
        }
        keep(block);
    }
    /// The last line need not have an end.
    void finish(std::string& out) {
        if (!line_.empty() || isCut_) {
            finishLine(out);
        }
    }
    bool anyFailed() const { return anyFailed_; }

private:
    void keep(std::string_view piece) {
        const std::string_view kept = piece.substr(0, longestLine - line_.size());
        isCut_ = isCut_ || kept.size() < piece.size();
        line_ += kept;
    }

    void finishLine(std::string& out) {
        ++number_;
        if (line_.ends_with('\r')) {
            line_.pop_back();
        }
        const DateOutcome outcome =
            isCut_ ? failedOutcome("The line is too long for a value.") : outcomeFor(line_, apply_);
        anyFailed_ = anyFailed_ || !outcome.isGood();
        if (json_) {
            nlohmann::ordered_json object;
            object["line"] = number_;
            object["value"] = isCut_ ? std::string() : line_;
            addTo(object, outcome);
            out += jsonLine(object);
        } else {
            out += (outcome.isGood() ? resultText(outcome) : std::string()) + "\n";
            if (!outcome.isGood()) {
                sayFailure(outcome, "standard input: line " + std::to_string(number_) + ": ", diagnostics_);
            }
        }
        line_.clear();
        isCut_ = false;
    }

    const ApplyToValue& apply_;
    bool json_;
    Diagnostics& diagnostics_;
    std::string line_;
    bool isCut_ = false;
    bool anyFailed_ = false;
    std::uint64_t number_ = 0;
};

} // namespace

int runValue(const std::string& value, const ApplyToValue& apply, bool json, Diagnostics& diagnostics) {
    const DateOutcome outcome = outcomeFor(value, apply);
    if (!json) {
        return showOutcome(outcome, json, diagnostics);
    }
    nlohmann::ordered_json object;
    object["value"] = value;
    addTo(object, outcome);
    print(jsonLine(object));
    return outcome.isGood() ? Done : NotDone;
}

int runLines(const ApplyToValue& apply, bool json, Diagnostics& diagnostics) {
    Input input("-");
    const std::unique_ptr<Output> output = openOutput("");
    Progress progress(diagnostics, input.remaining(), ::isatty(STDOUT_FILENO) == 0);
    Lines lines(apply, json, diagnostics);
    std::string results;
    for (std::string_view block = input.read(); !block.empty(); block = input.read()) {
        lines.add(block, results);
        output->write(results);
        results.clear();
        diagnostics.flush();
        progress.advance(block.size());
    }
    lines.finish(results);
    output->write(results);
    output->commit();
    return lines.anyFailed() ? DoneWithLosses : Done;
}

int showOutcome(const DateOutcome& outcome, bool json, Diagnostics& diagnostics) {
    if (json) {
        nlohmann::ordered_json object;
        addTo(object, outcome);
        print(jsonLine(object));
    } else if (outcome.isGood()) {
        print(resultText(outcome) + "\n");
    } else {
        sayFailure(outcome, "", diagnostics);
    }
    return outcome.isGood() ? Done : NotDone;
}

} // namespace host
