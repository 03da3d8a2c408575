#include "sort/line_command.h"

#include "base/failure.h"
#include "base/input.h"
#include "base/output.h"
#include "base/progress.h"
#include "base/text.h"
#include "cli/exit_status.h"
#include "cli/sizes.h"
#include "sort/line_feeder.h"
#include "sort/workspace.h"
#include "text/byte_order_mark.h"

#include <algorithm>

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

Lines are compared as bytes. With --ignore-case, the FILEs are UTF-8, and lines
that differ in case only are equal; bytes that are no UTF-8 end the command with
their place. Case is that of full Unicode case folding, whatever the locale.
Lines are written as they were read in any case.

At most SIZE of the lines are held in memory, beside some 32 MiB for the program
itself; SIZE is a number with K, M, G or T behind it, at least 64K. What goes
beyond is kept in the workspace, a file that is not there before and not there
afterwards, also when the command fails or is interrupted. Without --workspace it
is in the folder of $TMPDIR, or in /tmp. It takes up to about twice the size of
the input.

A byte order mark of UTF-8 at the start of a FILE is part of no line, and stands
at the start of the output.

All FILEs are read before anything is written. An output file appears whole or
not at all, so that it may be one of the FILEs.

Exit status:
  0  done
  2  not done)";

void LineCommand::declareShared(Syntax& syntax) {
    syntax.flag("-i,--ignore-case,--fold", ignoreCase_, "Take lines that differ in case only for equal");
    syntax.option("--memory", memory_, "SIZE", "How much may be held in memory; 256M without it");
    syntax.option("--workspace", workspace_, "FILE", "A file to make, use beyond that, and remove");
    files_.declare(syntax);
}

int LineCommand::process(LineOrder order, OutputOrder outputOrder, bool showCounts,
                         Diagnostics& diagnostics) {
    const std::uint64_t memory = parseSize("--memory", memory_);
    if (memory < leastMemory) {
        throw Failure("--memory takes at least " + std::to_string(leastMemory / 1024) + "K, not '" +
                      printable(memory_) + "'");
    }
    if (!workspace_.empty() && !isStandardOutput(files_.outputPath()) &&
        isSamePlace(workspace_, files_.outputPath())) {
        throw Failure("the workspace needs a file of its own: " + printable(workspace_));
    }
    const std::unique_ptr<Output> output = openOutput(files_.outputPath());
    // The workspace is gone when the output appears.
    sendThrough(*output, std::min(memory, mostMemory), order, outputOrder, showCounts, diagnostics);
    output->commit();
    return Done;
}

void LineCommand::sendThrough(Output& output, std::uint64_t memory, LineOrder order, OutputOrder outputOrder,
                              bool showCounts, Diagnostics& diagnostics) const {
    const std::vector<std::string> inputs = files_.inputs();
    const bool asRead = outputOrder == OutputOrder::AsRead;
    const Progress::Show show = files_.progress();
    Workspace workspace(workspace_);
    LineSorter sorter({order, asRead, memory / 16 * 15}, workspace);
    LineFeeder feeder({ignoreCase_, asRead, memory / 16}, sorter, workspace);
    {
        Progress reading(diagnostics, totalSize(inputs), show, "reading");
        for (const std::string& path : inputs) {
            feeder.read(path, reading);
        }
    }
    Progress writing(diagnostics, feeder.size(), show, "writing");
    if (feeder.hasMark()) {
        output.write(byteOrderMark(kvt::ex::Encoding::Utf8));
    }
    LineOutput lines(output, workspace, showCounts, writing);
    if (asRead) {
        sorter.finishByPlace(lines);
    } else {
        sorter.finish(lines);
    }
    lines.flush();
}

} // namespace host
