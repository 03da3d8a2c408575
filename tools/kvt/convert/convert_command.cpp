// `kvt convert`: its options, and what goes together with what.

#include "base/failure.h"
#include "base/input.h"
#include "cli/choices.h"
#include "cli/command.h"
#include "convert/conversion.h"
#include "convert/convert_options.h"
#include "convert/dry_run.h"
#include "text/encoding_catalogue.h"
#include "text/file_options.h"

#include <array>
#include <utility>

namespace host {

namespace {

constexpr const char* examples = R"(kvt convert --from Shift_JIS --to UTF-8 old.txt -o new.txt
kvt convert --from UTF-8 --to windows-1252 --on-error report --report losses.jsonl in.txt -o out.txt
kvt convert --from UTF-8 --dry-run --to windows-1252,ISO-8859-2,KOI8-R in.txt)";

constexpr const char* notes =
    R"(Several FILEs are converted in order, each as a text of its own, into one output;
without any, and for '-', standard input is read. Files may have any size.

An output file appears whole or not at all; until then, what was there before
stays, so that it may be one of the inputs. To standard output the text goes
block by block: when --on-error stop ends the conversion, blocks before the one
with the loss have been written, and nothing of the loss or behind it.

Places are the byte offset in the file, from 0, and line and column, from 1;
columns count characters of the decoded text, lines end with LF, CR or CRLF.
Whatever was lost is listed on standard error at the end: each character or
bad byte sequence, how often, and where first. Into the few encodings in which
not all that is written can be read again, --verify is always on.

--fallback is for files in which encodings are mixed: a line that is not valid in
--from is read in ENC, if it is valid in that, and counted at the end. Lines that
are longer than 4 MiB are read in --from. --on-error transliterate takes each
character for itself: 'Ł' becomes 'L', 'ж' 'z', '…' three dots; the list of
losses has what was written. Both go with --normalize, which takes place between
reading and writing: 'nfc' composes letters and their marks, 'nfkc' also makes
one of forms that mean the same, as 'ﬁ' and 'fi'. All places are in the input.

Byte order marks: the one at the start of each FILE is skipped. In UTF-16 and
UTF-32 it says which order the bytes are in, which is little-endian without one;
a mark that the name of the encoding contradicts ends the command. 'keep' takes
marks for characters, 'strip' refuses encodings where they cannot be cut off, as
UTF-7 is, and 'add' does so too and begins the output with one.

Exit status:
  0  done, nothing was lost; with --dry-run: some encoding would lose nothing
  1  done, but something was lost; with --dry-run: every encoding would lose
  2  not done; an output file was left as it was)";

const Choices<OnError> errorChoices = {{"stop", OnError::Stop},
                                       {"replace", OnError::Replace},
                                       {"report", OnError::Report},
                                       {"transliterate", OnError::Transliterate}};
const Choices<Normalization> normalizationChoices = {
    {"none", Normalization::None}, {"nfc", Normalization::Nfc}, {"nfkc", Normalization::Nfkc}};
const Choices<MarkPolicy> markChoices = {{"skip", MarkPolicy::Skip},
                                         {"keep", MarkPolicy::Keep},
                                         {"strip", MarkPolicy::Strip},
                                         {"add", MarkPolicy::Add}};

class ConvertCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.option("--from", from_, "ENC", "Encoding of the input").required();
        syntax
            .option("--to", to_, "ENC",
                    "Encoding of the output; with --dry-run, several with commas between them")
            .required();
        onErrorOption_ =
            syntax
                .option("--on-error", onError_, "WHAT",
                        "What a loss does: 'stop' ends the conversion without a result (default), "
                        "'replace' puts a substitution in its place, 'report' does so too and reports "
                        "every loss, 'transliterate' writes what --to lacks in Latin letters where it "
                        "has those, and else replaces it")
                .takes(wordsOf(errorChoices));
        syntax.option("--fallback", fallback_, "ENC",
                      "Read a line that is not valid in --from in this encoding");
        syntax
            .option("--normalize", normalization_, "FORM",
                    "Bring the text into a form of Unicode normalization: 'nfc' or 'nfkc'")
            .takes(wordsOf(normalizationChoices));
        syntax.option("--report", options_.report, "FILE",
                      "Write the report to FILE, one JSON object on each line, instead of to standard error; "
                      "implies --on-error report");
        syntax.flag("--verify", options_.verify,
                    "Convert the output back and say whether it is still the same text");
        syntax.flag("--dry-run", dryRun_,
                    "Write nothing; print the encodings of --to, best first, with what each "
                    "would lose");
        syntax.option("--bom", mark_, "WHAT", "Byte order marks: 'skip' (default), 'keep', 'strip' or 'add'")
            .takes(wordsOf(markChoices));
        files_.declare(syntax, "Files to convert; '-' is standard input, the default");
    }

    int run(Diagnostics& diagnostics) override {
        options_.inputs = files_.inputs();
        options_.output = files_.outputPath();
        options_.progress = files_.progress();
        options_.mark = choose("--bom", mark_, markChoices);
        options_.onError = choose("--on-error", onError_, errorChoices);
        if (!options_.report.empty()) {
            if (!onErrorOption_.isGiven()) {
                options_.onError = OnError::Report;
            }
            if (options_.onError != OnError::Report && options_.onError != OnError::Transliterate) {
                throw Failure("--report goes with --on-error report or transliterate only");
            }
        }
        options_.reading.normalization = choose("--normalize", normalization_, normalizationChoices);
        if (!fallback_.empty()) {
            options_.reading.fallback = textEncoding(fallback_);
        }
        const TextEncoding from = inputEncoding(from_);
        if (!dryRun_) {
            return Conversion(options_, from, textEncoding(to_), diagnostics).run();
        }
        if (!options_.output.empty() || !options_.report.empty() || options_.verify ||
            onErrorOption_.isGiven()) {
            throw Failure(
                "--dry-run writes nothing and does not go with -o, --on-error, --report or --verify");
        }
        std::vector<kvt::ex::Encoding> targets;
        for (const std::string& name : splitEncodings(to_)) {
            targets.push_back(textEncoding(name));
        }
        return dryRun(options_, from, targets, diagnostics);
    }

private:
    std::string from_;
    std::string to_;
    std::string onError_ = "stop";
    std::string mark_ = "skip";
    std::string fallback_;
    std::string normalization_ = "none";
    bool dryRun_ = false;
    Option onErrorOption_;
    FileOptions files_;
    ConvertOptions options_;
};

} // namespace

CommandInfo convertCommand() {
    return {"convert", "Convert text from one encoding to another", examples, notes,
            std::make_unique<ConvertCommand>()};
}

} // namespace host
