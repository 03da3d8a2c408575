// `kvt match`: the lines of a text that a regular expression matches, or where its groups stand in them.

#include "base/failure.h"
#include "base/input.h"
#include "base/output.h"
#include "base/progress.h"
#include "base/text.h"
#include "cli/choices.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "text/file_options.h"
#include "text/line_pattern.h"
#include "text/line_reader.h"
#include "text/text_writer.h"

#include <cstdint>
#include <optional>
#include <stdexcept>

namespace host {

namespace {

constexpr const char* examples = R"(kvt match '^\d{4}-\d\d-\d\d' journal.txt
kvt match --groups '(\w+)@(\w+)' --encoding windows-1252 mail.txt
kvt match --dialect legacy 'f(x)$' < formulas.txt)";

constexpr const char* notes =
    R"(Prints the lines in which REGEX matches somewhere, as they stand in the text.
With --groups, prints for the first match in each such line one line for each
group, LINE:GROUP:POSITION:LENGTH:TEXT, and FILE: before it when there are
several FILEs. Group 0 is the whole match; a group that took no part has '-' for
its position and length. Lines are counted from 1. Positions are counted from 0
in the line, and they and lengths in bytes of the line as UTF-8, whatever ENC is.

With --count, prints how many lines there are, FILE: before it when there are
several FILEs; with --line-number, the number of each line and a colon before it.

The dialect 'perl' is the syntax of Perl's regular expressions. In 'legacy' the
characters { } ( ) | are ordinary text, and so is $ but at the end: it has no
groups, and it finds nothing in an empty line. In both, case counts, and
everything works on bytes of UTF-8: '.' is one byte, and '[é]' one of two; write
'(?:é|è)' for one of two characters. Classes such as \w know ASCII only.

What is read is text in the encoding of --encoding, and lines are printed in it;
REGEX is UTF-8 always, and so is what --groups prints, where groups hold whole
characters. Without FILE, and for '-', standard input is read. Put '--' before
REGEX when it begins with '-'.

Lines end with LF, CR or CRLF and have at most 64 MiB of UTF-8; their ends are no
part of what REGEX sees. They are printed with the ends that they had, or LF for
a last line without one. A byte order mark is no part of the first line; it goes
before the first line of its FILE that is printed, if there is any.

Bytes that are no text in ENC, and a line on which REGEX takes too long, end the
command with their place. An output file appears whole or not at all; to standard
output, what is complete is written block by block.

Exit status:
  0  done, also when nothing matched
  2  not done)";

const Choices<Dialect> dialectChoices = {{"perl", Dialect::Perl}, {"legacy", Dialect::Legacy}};

void appendGroups(const TextLine& line, const GroupPlaces& groups, bool showFile, std::string& out) {
    for (std::size_t number = 0; number < groups.size(); ++number) {
        if (showFile) {
            out.append(line.file) += ':';
        }
        out += std::to_string(line.number) + ":" + std::to_string(number) + ":";
        if (const std::optional<GroupPlace>& place = groups[number]) {
            out += std::to_string(place->position) + ":" + std::to_string(place->length) + ":";
            out += line.text.substr(place->position, place->length);
        } else {
            out += "-:-:";
        }
        out += '\n';
    }
}

class MatchCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.operand("REGEX", regex_, "What to look for").required();
        syntax.flag("-v,--invert-match", invert_, "Print the lines in which REGEX does not match");
        syntax.flag("-c,--count", count_, "Print how many lines it would be, for each FILE");
        syntax.flag("-n,--line-number", numbers_, "Print the number of each line before it");
        syntax.flag("-i,--ignore-case", ignoreCase_, "Take letters of ASCII in either case for the same");
        syntax.flag("--groups", groups_, "Print where the groups of each match stand, not the lines");
        syntax.option("--dialect", dialect_, "WHICH",
                      "How REGEX is to be read: 'perl' (default) or 'legacy'");
        files_.declareEncoding(syntax);
        files_.declare(syntax);
    }

    int run(Diagnostics& diagnostics) override {
        const Dialect dialect = choose("--dialect", dialect_, dialectChoices);
        if (groups_ && (invert_ || count_ || numbers_)) {
            throw Failure("--groups does not go with --invert-match, --count or --line-number");
        }
        if (ignoreCase_ && dialect != Dialect::Perl) {
            throw Failure("--ignore-case goes with the dialect 'perl' only");
        }
        // By itself first, so that its faults are its own.
        pattern_ = compilePattern(regex_, dialect);
        if (ignoreCase_) {
            pattern_ = compilePattern("(?i)" + regex_, dialect);
        }
        const TextEncoding encoding = files_.encoding();
        const std::vector<std::string> inputs = files_.inputs();
        showFiles_ = inputs.size() > 1;
        const std::unique_ptr<Output> output = openOutput(files_.outputPath());
        std::optional<TextWriter> writer;
        {
            Progress progress(diagnostics, totalSize(inputs), files_.progress(), "");
            for (const std::string& path : inputs) {
                LineReader reader(path, encoding);
                refuseInPlace(*output, reader.input());
                if (!writer) { // in the byte order of the first
                    writer.emplace(*output, reader.encoding(), !groups_ && !count_);
                }
                searchAll(reader, *writer, progress);
            }
        }
        writer->finish();
        return Done;
    }

private:
    void searchAll(LineReader& reader, TextWriter& writer, Progress& progress) {
        TextLine line{};
        std::uint64_t found = 0;
        while (reader.readBlock()) {
            while (reader.next(line)) {
                if (matches(line) == invert_) {
                    continue;
                }
                ++found;
                if (!count_) {
                    write(line, reader, writer);
                }
            }
            writer.flush();
            progress.advance(reader.lastBlock());
        }
        if (count_) {
            writer.buffer() +=
                (showFiles_ ? reader.input().name() + ":" : std::string()) + std::to_string(found) + "\n";
            writer.flush();
        }
    }

    bool matches(const TextLine& line) {
        try {
            return pattern_->find(line.text, groups_ ? &places_ : nullptr);
        } catch (const std::runtime_error& failure) {
            throw Failure(std::string(line.file) + ": line " + std::to_string(line.number) +
                          ": REGEX gives up: " + printable(failure.what()));
        }
    }

    void write(const TextLine& line, LineReader& reader, TextWriter& writer) {
        std::string& out = writer.buffer();
        if (groups_) {
            appendGroups(line, places_, showFiles_, out);
        } else {
            out.append(reader.takeMark());
            if (numbers_) {
                out.append(std::to_string(line.number)).append(":");
            }
            out.append(line.text);
            out += line.end.empty() ? "\n" : line.end;
        }
        writer.endLine(line);
    }

    std::string regex_;
    std::string dialect_ = "perl";
    FileOptions files_;
    bool showFiles_ = false;
    bool groups_ = false;
    bool invert_ = false;
    bool count_ = false;
    bool numbers_ = false;
    bool ignoreCase_ = false;
    std::unique_ptr<LinePattern> pattern_;
    GroupPlaces places_;
};

} // namespace

CommandInfo matchCommand() {
    return {"match", "Find the lines that a regular expression matches", examples, notes,
            std::make_unique<MatchCommand>()};
}

} // namespace host
