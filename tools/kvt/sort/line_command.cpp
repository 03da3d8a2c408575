#include "sort/line_command.h"

#include "base/diagnostics.h"
#include "base/failure.h"
#include "base/input.h"
#include "base/messages.h"
#include "base/output.h"
#include "base/progress.h"
#include "base/text.h"
#include "cli/exit_status.h"
#include "cli/sizes.h"
#include "sort/line_feeder.h"
#include "sort/workspace.h"
#include "text/byte_order_mark.h"

#include <kvt/encoding/stream_transcoder.h>

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
        const std::string_view line = record.line();
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

// Text that is UTF-8 until it is written.
class EncodedOutput : public Output {
public:
    EncodedOutput(Output& output, kvt::ex::Encoding encoding)
        : output_(output), encoder_(kvt::ex::Encoding::Utf8, encoding),
          onLoss_([name = std::string(encoding.getName())](const kvt::ex::Loss& loss) {
              const std::string lost = printable(std::u32string_view(&loss.codePoint, 1));
              throw Failure("the result cannot be written. " + describe(910003, {lost, "UTF-8", name}));
          }) {}

    void write(std::string_view bytes) override {
        encoder_.convert(bytes, encoded_, onLoss_);
        pass();
    }
    void commit() override {
        encoder_.finish(encoded_, onLoss_);
        pass();
    }
    bool writesInPlaceTo(int descriptor) const override { return output_.writesInPlaceTo(descriptor); }

private:
    void pass() {
        output_.write(encoded_);
        encoded_.clear();
    }

    Output& output_;
    kvt::ex::StreamTranscoder encoder_;
    kvt::ex::StreamTranscoder::LossHandler onLoss_;
    std::string encoded_;
};

} // namespace

const char* const lineCommandNotes =
    R"(Several FILEs are read as one text; without any, and for '-', standard input is
read. Lines end with LF, which the last one of a FILE need not have and gets; CR
and NUL are characters as any other. Lines and files may have any size.

Lines are compared as bytes of UTF-8, which is by code points, and with --key by
one of their fields; a field that is not there is empty. With --ignore-case, what
differs in case only is equal; case is that of full Unicode case folding, in any
locale. Lines are written as they were read in any case, in the encoding of
--encoding. Bytes that are no text in it end the command with their place; but in
UTF-8 and without --ignore-case, any bytes are compared as they are.

At most SIZE of the lines are held in memory, beside some 32 MiB for the program
itself; SIZE is a number with K, M, G or T behind it, at least 64K. What goes
beyond is kept in the workspace, a file that is not there before and not there
afterwards, also when the command fails or is interrupted. Without --workspace it
is in the folder of $TMPDIR, or in /tmp. It takes up to about twice the size of
the input.

A byte order mark at the start of a FILE is part of no line, and stands at the
start of the output.

All FILEs are read before anything is written. An output file appears whole or
not at all, so that it may be one of the FILEs.

Exit status:
)";

void LineCommand::declare(Syntax& syntax) {
    declareOwn(syntax);
    syntax.flag("-i,--ignore-case", ignoreCase_, "Take what differs in case only for equal");
    syntax.flag("--fold", ignoreCase_, "").hidden();
    keyOption_ =
        syntax.option("-k,--key", key_, "N", "Compare the field N of each line, from 1, not all of it");
    delimiterOption_ =
        syntax.option("--delimiter", delimiter_, "TEXT", "What stands between fields; a tab without it");
    files_.declareEncoding(syntax);
    syntax.option("--memory", memory_, "SIZE", "How much may be held in memory; 256M without it");
    syntax.option("--workspace", workspace_, "FILE", "A file to make, use beyond that, and remove");
    files_.declare(syntax);
}

KeyRule LineCommand::keyRule(KeyRule rule) const {
    if (ignoreCase_) {
        if (rule.by != KeyRule::By::Bytes) {
            throw Failure("--ignore-case does not go with --number or --date");
        }
        rule.by = KeyRule::By::FoldedText;
    }
    if (keyOption_.isGiven()) {
        rule.field = parseNumber("--key", key_);
        if (rule.field == 0) {
            throw Failure("--key takes a number from 1, not '0'");
        }
    }
    if (delimiterOption_.isGiven()) {
        if (rule.field == 0) {
            throw Failure("--delimiter goes with --key only");
        }
        requireUtf8("--delimiter", delimiter_);
        if (delimiter_.empty()) {
            throw Failure("--delimiter is empty");
        }
        rule.delimiter = delimiter_;
    }
    return rule;
}

int LineCommand::process(const Plan& plan, Diagnostics& diagnostics) {
    Way way{plan,
            {keyRule(plan.key), files_.encoding(), plan.outputOrder == OutputOrder::AsRead, 0},
            0,
            files_.inputs(),
            files_.progress()};
    const std::uint64_t memory = parseSize("--memory", memory_);
    if (memory < leastMemory) {
        throw Failure("--memory takes at least " + std::to_string(leastMemory / 1024) + "K, not '" +
                      printable(memory_) + "'");
    }
    way.memory = std::min(memory, mostMemory);
    way.feed.memory = way.memory / 16;
    if (!workspace_.empty() && !isStandardOutput(files_.outputPath()) &&
        isSamePlace(workspace_, files_.outputPath())) {
        throw Failure("the workspace needs a file of its own: " + printable(workspace_));
    }
    const std::unique_ptr<Output> output = openOutput(files_.outputPath());
    // The workspace is gone when the output appears.
    const std::string complaint = sendThrough(way, *output, diagnostics);
    output->commit();
    if (complaint.empty()) {
        return Done;
    }
    diagnostics.say(complaint);
    return DoneWithLosses;
}

std::string LineCommand::sendThrough(const Way& way, Output& output, Diagnostics& diagnostics) const {
    Workspace workspace(workspace_);
    LineSorter sorter({way.plan.order, way.feed.places, way.memory / 16 * 15}, workspace);
    LineFeeder feeder(way.feed, sorter, workspace);
    {
        Progress reading(diagnostics, totalSize(way.inputs), way.show, "reading");
        for (const std::string& path : way.inputs) {
            feeder.read(path, reading);
        }
    }
    Progress writing(diagnostics, feeder.size(), way.show, "writing");
    if (feeder.encoding() == kvt::ex::Encoding(kvt::ex::Encoding::Utf8)) {
        writeLines(way.plan, feeder, sorter, workspace, output, writing);
    } else {
        EncodedOutput encoded(output, feeder.encoding());
        writeLines(way.plan, feeder, sorter, workspace, encoded, writing);
        encoded.commit();
    }
    const bool asNumbers = way.feed.key.by == KeyRule::By::Number;
    return feeder.withoutKey() == 0
               ? std::string()
               : counted(feeder.withoutKey(), "line has", "lines have") + " no " +
                     (asNumbers ? "number" : "date of that format") +
                     (way.feed.key.field == 0 ? "" : " in field " + std::to_string(way.feed.key.field)) +
                     ", the first is " + feeder.firstWithoutKey() + "; " +
                     (feeder.withoutKey() == 1 ? "it stands" : "they stand") + " at the end";
}

void LineCommand::writeLines(const Plan& plan, const LineFeeder& feeder, LineSorter& sorter,
                             const Workspace& workspace, Output& output, Progress& progress) {
    if (feeder.hasMark()) {
        output.write(byteOrderMark(kvt::ex::Encoding::Utf8));
    }
    LineOutput lines(output, workspace, plan.showCounts, progress);
    if (plan.outputOrder == OutputOrder::AsRead) {
        sorter.finishByPlace(lines);
    } else {
        sorter.finish(lines);
    }
    lines.flush();
}

} // namespace host
