#include "line_command.h"

#include "exit_status.h"
#include "failure.h"
#include "input.h"
#include "line_feeder.h"
#include "output.h"
#include "progress.h"
#include "text.h"
#include "workspace.h"

#include <algorithm>
#include <charconv>
#include <limits>
#include <unistd.h>

namespace host {

namespace {

constexpr std::uint64_t leastMemory = 64 * 1024;
// More than this does not help anybody, and at some point cannot be mapped.
constexpr std::uint64_t mostMemory = std::uint64_t{1} << 40;

// Lines on their way out.
class LineOutput : public RecordSink {
public:
    LineOutput(Output& output, const Workspace& workspace, bool showCounts, Progress& progress)
        : output_(output), workspace_(workspace), showCounts_(showCounts), progress_(progress) {
        buffer_.reserve(bufferSize);
    }

    void take(const LineRecord& record) override {
        const std::string_view line = record.payload.empty() ? record.key : record.payload;
        if (showCounts_) {
            put(std::to_string(record.count) + "\t");
        }
        forEachPiece(workspace_, line, [this](std::string_view piece) { put(piece); });
        put("\n");
    }

    void flush() {
        output_.write(buffer_);
        progress_.advance(buffer_.size());
        buffer_.clear();
    }

private:
    static constexpr std::size_t bufferSize = 256 * 1024;

    void put(std::string_view bytes) {
        if (buffer_.size() + bytes.size() > bufferSize) {
            flush();
        }
        if (bytes.size() > bufferSize) {
            output_.write(bytes);
            progress_.advance(bytes.size());
        } else {
            buffer_.append(bytes);
        }
    }

    Output& output_;
    const Workspace& workspace_;
    bool showCounts_;
    Progress& progress_;
    std::string buffer_;
};

} // namespace

const char* const lineCommandNotes =
    R"(Several FILEs are read as one text; without any, and for '-', standard input is
read. Lines end with LF, which the last one of a FILE need not have and gets; CR
and NUL are bytes as any other. Lines and files may have any size.

Lines are compared as bytes. With --fold, the FILEs are UTF-8, and lines that
differ in case only are equal; bytes that are no UTF-8 end the command with their
place. Case is that of full Unicode case folding, whatever the locale. Lines are
written as they were read in any case.

At most SIZE of the lines are held in memory, beside some 32 MiB for the program
itself; SIZE is a number with K, M, G or T behind it, at least 64K. What goes
beyond is kept in the workspace, a file that is not there before and not there
afterwards, also when the command fails or is interrupted. Without --workspace it
is in the folder of $TMPDIR, or in /tmp. It takes up to about twice the size of
the input.

All FILEs are read before anything is written. An output file appears whole or
not at all, so that it may be one of the FILEs.

Exit status:
  0  done
  2  not done)";

std::uint64_t parseSize(const std::string& option, const std::string& typed) {
    std::uint64_t number = 0;
    const char* const end = typed.data() + typed.size();
    const auto [suffix, error] = std::from_chars(typed.data(), end, number);
    const std::string letter(suffix, end);
    const std::string_view letters = "KMGT";
    const std::size_t power = letter.empty()       ? 0
                              : letter.size() == 1 ? letters.find(letter[0] & ~0x20) + 1
                                                   : letters.size() + 1;
    if (error != std::errc() || power > letters.size() || (power == 0 && !letter.empty()) ||
        number > std::numeric_limits<std::uint64_t>::max() >> (10 * power)) {
        throw Failure(option + " takes a size such as 64K, 128M or 2G, not '" + printable(typed) + "'");
    }
    return number << (10 * power);
}

void LineCommand::declareShared(CLI::App& app) {
    app.add_flag("--fold", fold_, "Take lines that differ in case only for equal");
    app.add_option("-o,--output", output_, "Where the output goes; '-' is standard output, the default")
        ->type_name("FILE");
    app.add_option("--memory", memory_, "How much may be held in memory; 256M without it")->type_name("SIZE");
    app.add_option("--workspace", workspace_, "A file to make, use beyond that, and remove")
        ->type_name("FILE");
    app.add_flag("--progress", progress_,
                 "Tell on standard error how far it is; on a terminal that is done for long "
                 "inputs anyway");
    app.add_option("FILE", inputs_, "Files to read; '-' is standard input, the default")->type_name("");
}

int LineCommand::process(LineOrder order, OutputOrder outputOrder, bool showCounts,
                         Diagnostics& diagnostics) {
    const std::uint64_t memory = parseSize("--memory", memory_);
    if (memory < leastMemory) {
        throw Failure("--memory takes at least " + std::to_string(leastMemory / 1024) + "K, not '" +
                      printable(memory_) + "'");
    }
    if (!workspace_.empty() && !isStandardOutput(output_) && isSamePlace(workspace_, output_)) {
        throw Failure("the workspace needs a file of its own: " + printable(workspace_));
    }
    const std::unique_ptr<Output> output = openOutput(output_);
    // The workspace is gone when the output appears.
    sendThrough(*output, std::min(memory, mostMemory), order, outputOrder, showCounts, diagnostics);
    output->commit();
    return Done;
}

void LineCommand::sendThrough(Output& output, std::uint64_t memory, LineOrder order, OutputOrder outputOrder,
                              bool showCounts, Diagnostics& diagnostics) const {
    const std::vector<std::string> inputs = inputsOrStandardInput(inputs_);
    const bool asRead = outputOrder == OutputOrder::AsRead;
    const bool mayDraw = !isStandardOutput(output_) || ::isatty(STDOUT_FILENO) == 0;
    const Progress::Show show = progress_ ? Progress::Show::Always
                                : mayDraw ? Progress::Show::LongOnTerminal
                                          : Progress::Show::Never;
    Workspace workspace(workspace_);
    LineSorter sorter({order, asRead, memory / 16 * 15}, workspace);
    LineFeeder feeder({fold_, asRead, memory / 16}, sorter, workspace);
    {
        Progress reading(diagnostics, totalSize(inputs), show, "reading");
        for (const std::string& path : inputs) {
            feeder.read(path, reading);
        }
    }
    Progress writing(diagnostics, feeder.size(), show, "writing");
    LineOutput lines(output, workspace, showCounts, writing);
    if (asRead) {
        sorter.finishByPlace(lines);
    } else {
        sorter.finish(lines);
    }
    lines.flush();
}

} // namespace host
