// Lines that are one value each, for the commands that make a result of each of them: a line that fails leaves an empty
// line in the output, is accounted for, and does not end the rest.
//
// Many lines may fail, and alike. Of each kind of failure the first are named with their place, the others are counted,
// and a ledger at the end has every kind with its count.
#pragma once

#include "base/output.h"
#include "cli/syntax.h"
#include "text/file_options.h"

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace host {

class Diagnostics;
class LineReader;

class Progress;
struct TextLine;

/// What becomes of one line.
class LineWork {
public:
    virtual ~LineWork() = default;
    /// Appends the result of a line to `out`, or what stands for it where it fails. Whether it is good. The text of the
    /// line is UTF-8, but may hold any bytes where the input is UTF-8 itself.
    virtual bool apply(const TextLine& line, std::string& out) = 0;

    // About the line that failed last. Most failures are only counted, by their kind.

    /// What failures of one kind share, such as a number and a format. Valid until the next line.
    virtual std::string_view kind() const = 0;
    /// The reason, without a place.
    virtual std::string reason() const = 0;
    /// Lines to stand below it.
    virtual std::vector<std::string> below() const { return {}; }
};

class ValueLines {
public:
    /// Declares --file, --max-errors and --report, and what other commands on files take, too.
    void declare(Syntax& syntax);
    /// Whether the command line has an option that is about many lines.
    bool isAsked() const;
    const std::string& output() const { return files_.outputPath(); }

    /// Gives an ExitStatus. Where the failures are in the output already, they are counted and not said. Throws
    /// Failure.
    int run(LineWork& work, bool failuresAreInOutput, Diagnostics& diagnostics);

private:
    struct Kind {
        std::uint64_t count = 0;
        std::uint64_t order = 0;
        std::string example;
    };

    void readFile(const std::string& path, LineWork& work, Output& output, Progress& progress);
    void take(const TextLine& line, const LineWork& work);
    void say(const TextLine& line, const LineWork& work, const Kind& kind);
    void printLedger() const;

    std::vector<std::string> paths_;
    FileOptions files_;
    TextEncoding encoding_ = kvt::ex::Encoding::Utf8;
    std::string mostErrors_;
    std::string reportPath_;
    std::vector<Option> options_;

    Diagnostics* diagnostics_ = nullptr;
    std::unique_ptr<Output> report_;
    std::map<std::string, Kind, std::less<>> kinds_;
    std::uint64_t failures_ = 0;
    std::uint64_t limit_ = 0;
    bool failuresAreInOutput_ = false;
};

} // namespace host
