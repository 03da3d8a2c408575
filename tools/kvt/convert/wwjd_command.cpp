// `kvt wwjd`: text to its form in pure ASCII and back.

#include "base/failure.h"
#include "base/input.h"
#include "base/messages.h"
#include "base/output.h"
#include "base/progress.h"
#include "base/text.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "convert/loss_report.h"
#include "convert/wwjd_stream.h"
#include "text/file_options.h"
#include "text/line_counter.h"
#include "text/place.h"
#include "text/source.h"

namespace host {

namespace {

constexpr const char* examples = R"(printf 'a b, "c"' | kvt wwjd encode
printf 'a<space>b' | kvt wwjd decode)";

constexpr const char* encodeExamples = R"(kvt wwjd encode text.txt -o text.wwjd
printf 'Café, 5 €' | kvt wwjd encode)";

constexpr const char* decodeExamples = R"(kvt wwjd decode text.wwjd -o text.txt
printf 'Caf<u00e9><comma><space>5' | kvt wwjd decode)";

constexpr const char* notes = R"(wwjd text is ASCII without separators, quotes and brackets: 25 characters are
spelt as tokens such as <space> or <comma>, and each UTF-16 unit beyond ASCII as
<uXXXX>. What only looks like a token stands for itself. The other side is UTF-8.

Several FILEs become one output; without any, and for '-', standard input is
read. An output file appears whole or not at all.

Exit status:
  0  done
  2  not done: the input is not valid, or cannot be read, or the output cannot
     be written)";

class WwjdCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        encode_ = declareDirection(syntax, "encode", "UTF-8 to wwjd text", encodeExamples);
        declareDirection(syntax, "decode", "wwjd text to UTF-8", decodeExamples);
    }

    int run(Diagnostics& diagnostics) override {
        const std::vector<std::string> inputs = files_.inputs();
        const bool encoding = encode_->isChosen();
        std::unique_ptr<WwjdStream> stream;
        if (encoding) {
            stream = std::make_unique<WwjdEncoder>();
        } else {
            stream = std::make_unique<WwjdDecoder>();
        }
        const std::unique_ptr<Output> output = openOutput(files_.outputPath());
        {
            Progress progress(diagnostics, totalSize(inputs), files_.progress(), "");
            for (const std::string& path : inputs) {
                convertFile(path, *stream, *output, progress, encoding ? "UTF-8" : "zqt-wwjd");
            }
        }
        output->commit();
        return Done;
    }

private:
    Syntax* declareDirection(Syntax& syntax, const std::string& name, const std::string& summary,
                             const std::string& itsExamples) {
        Syntax& direction = syntax.subcommand(name, summary);
        files_.declare(direction);
        direction.setHelp(itsExamples, notes);
        return &direction;
    }

    static void convertFile(const std::string& path, WwjdStream& stream, Output& output, Progress& progress,
                            const std::string& encodingName) {
        Source source(path, kvt::ex::Encoding::Utf8, MarkPolicy::Skip);
        const Input& input = source.input();
        refuseInPlace(output, input);
        LineCounter lines(kvt::ex::Encoding::Utf8);
        std::string converted;
        try {
            std::string_view block = source.next();
            lines.restart(source.skipped());
            for (; !block.empty(); block = source.next()) {
                lines.beginBlock(block);
                stream.convert(block, converted);
                lines.endBlock();
                output.write(converted);
                converted.clear();
                progress.advance(block.size());
            }
            stream.finish(converted);
            output.write(converted);
        } catch (const kvt::ex::Loss& loss) {
            const LineCounter::Position position = lines.at(source.skipped() + loss.offset);
            const Place place{input.name(), source.skipped() + loss.offset, position.line, position.column};
            throw Failure(describe(place) + ": " + describe(910002, {printable(loss.bytes), encodingName}));
        }
    }

    FileOptions files_;
    Syntax* encode_ = nullptr;
};

} // namespace

CommandInfo wwjdCommand() {
    return {"wwjd", "Encode text as wwjd and decode it again", examples, notes,
            std::make_unique<WwjdCommand>()};
}

} // namespace host
