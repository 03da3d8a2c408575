#include "text/value_lines.h"

#include "base/diagnostics.h"
#include "base/failure.h"
#include "base/input.h"
#include "base/output.h"
#include "base/progress.h"
#include "base/text.h"
#include "cli/exit_status.h"
#include "cli/sizes.h"
#include "text/line_reader.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <limits>
#include <utility>

namespace host {

namespace {

// Of each kind; those behind are counted.
constexpr std::uint64_t mostSaid = 10;
// Kinds that have a line of their own in the ledger.
constexpr std::size_t mostKinds = 1000;

std::string placeOf(const TextLine& line) {
    return std::string(line.file) + ": line " + std::to_string(line.number);
}

std::string shownValue(std::string_view value) {
    constexpr std::size_t mostBytes = 200;
    return "\"" + printable(value.substr(0, mostBytes)) + (value.size() > mostBytes ? "...\"" : "\"");
}

// Many reasons name the value, and once is enough.
std::string withValue(const TextLine& line, const std::string& reason) {
    const std::string value = shownValue(line.text);
    return reason.find(value) == std::string::npos ? value + ": " + reason : reason;
}

// A command stops in the middle of a file only here.
struct TooMany {};

} // namespace

void ValueLines::declare(Syntax& syntax) {
    options_ = {syntax.option("-f,--file", paths_, "FILE",
                              "Read the values from the lines of FILE, '-' is standard input; may be given "
                              "several times"),
                syntax.option("--max-errors", mostErrors_, "N", "End when more than N lines have failed"),
                syntax.option("--report", reportPath_, "FILE",
                              "Write all failures to FILE, one JSON object on each line")};
    files_.declareEncoding(syntax);
    files_.declareOutput(syntax);
}

bool ValueLines::isAsked() const {
    return std::any_of(options_.begin(), options_.end(),
                       [](const Option& option) { return option.isGiven(); });
}

int ValueLines::run(LineWork& work, bool failuresAreInOutput, Diagnostics& diagnostics) {
    diagnostics_ = &diagnostics;
    failuresAreInOutput_ = failuresAreInOutput;
    limit_ = mostErrors_.empty() ? std::numeric_limits<std::uint64_t>::max()
                                 : parseNumber("--max-errors", mostErrors_);
    encoding_ = files_.encoding();
    const Progress::Show show = files_.progress();
    const std::vector<std::string> paths = inputsOrStandardInput(paths_);
    const std::unique_ptr<Output> output = openOutput(files_.outputPath());
    if (!reportPath_.empty()) {
        report_ = openOutput(reportPath_);
    }
    bool isWhole = true;
    try {
        Progress progress(diagnostics, totalSize(paths), show, "");
        for (const std::string& path : paths) {
            readFile(path, work, *output, progress);
        }
    } catch (const TooMany&) {
        isWhole = false;
    }
    if (report_) {
        report_->commit();
    }
    if (!failuresAreInOutput_) {
        printLedger();
    }
    if (!isWhole) {
        throw Failure("more than " + std::to_string(limit_) + " lines failed");
    }
    output->commit();
    return failures_ == 0 ? Done : DoneWithLosses;
}

void ValueLines::readFile(const std::string& path, LineWork& work, Output& output, Progress& progress) {
    LineReader reader(path, encoding_, LineReader::BadText::Passes);
    refuseInPlace(output, reader.input());
    TextLine line{};
    std::string results;
    while (reader.readBlock()) {
        while (reader.next(line)) {
            if (work.apply(line, results)) {
                continue;
            }
            if (failures_ == limit_) {
                output.write(results);
                throw TooMany();
            }
            take(line, work);
        }
        output.write(results);
        results.clear();
        diagnostics_->flush();
        progress.advance(reader.lastBlock());
    }
}

void ValueLines::take(const TextLine& line, const LineWork& work) {
    ++failures_;
    if (report_) {
        nlohmann::ordered_json object;
        object["file"] = std::string(line.file);
        object["line"] = line.number;
        object["value"] = std::string(line.text);
        object["reason"] = work.reason();
        report_->write(object.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n");
    }
    if (failuresAreInOutput_) {
        return;
    }
    auto found = kinds_.find(work.kind());
    if (found == kinds_.end()) {
        found =
            kinds_.try_emplace(kinds_.size() < mostKinds ? std::string(work.kind()) : std::string()).first;
    }
    Kind& kind = found->second;
    if (++kind.count == 1) {
        kind.order = kinds_.size();
        kind.example = placeOf(line) + ": " + withValue(line, work.reason());
    }
    if (kind.count <= mostSaid && !report_) {
        say(line, work, kind);
    }
}

void ValueLines::say(const TextLine& line, const LineWork& work, const Kind& kind) {
    diagnostics_->say(placeOf(line) + ": " + withValue(line, work.reason()));
    for (const std::string& text : work.below()) {
        diagnostics_->line("     " + text);
    }
    if (kind.count == mostSaid) {
        diagnostics_->line("     More of this kind are counted.");
    }
}

// Where the lines above say it all, there is nothing to add up.
void ValueLines::printLedger() const {
    const bool isAllSaid = std::all_of(kinds_.begin(), kinds_.end(),
                                       [](const auto& kind) { return kind.second.count <= mostSaid; });
    if (failures_ == 0 || (isAllSaid && !report_)) {
        return;
    }
    std::vector<const Kind*> kinds;
    for (const auto& [name, kind] : kinds_) {
        kinds.push_back(&kind);
    }
    std::sort(kinds.begin(), kinds.end(), [](const Kind* left, const Kind* right) {
        return left->count != right->count ? left->count > right->count : left->order < right->order;
    });
    diagnostics_->say(counted(failures_, "line", "lines") + " failed:");
    for (const Kind* kind : kinds) {
        std::string count = std::to_string(kind->count);
        count.insert(0, count.size() < 8 ? 8 - count.size() : 0, ' ');
        diagnostics_->line(count + "  such as " + kind->example);
    }
}

} // namespace host
