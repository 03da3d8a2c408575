// `kvt match`: the lines of a text that a regular expression matches, what matched in them, or what is put in its
// place.

#include "base/failure.h"
#include "base/text.h"
#include "base/text_units.h"
#include "cli/choices.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "text/file_options.h"
#include "text/line_filter.h"
#include "text/line_pattern.h"
#include "text/match_print.h"

#include <cstdint>
#include <memory>
#include <stdexcept>
#include <utility>

namespace host {

namespace {

constexpr const char* examples = R"(kvt match '^\d{4}-\d\d-\d\d' journal.txt
kvt match --only-matching --unicode '\p{Lu}\p{Ll}+' --encoding windows-1252 mail.txt
kvt match '(\d\d)\.(\d\d)\.(\d{4})' --replace '$3-$2-$1' --all-lines dates.txt -o dates.txt)";

constexpr const char* notes =
    R"(Prints the lines in which REGEX matches somewhere, as they stand in the text.
Other things are printed instead with one of these:
  --only-matching  each match in the line, if it is not empty, as a line
  --replace TEXT   the line with TEXT in the place of each match; with
                   --only-matching, TEXT for each match as a line. In TEXT, $1 is
                   what the first group took, $0 the whole match, $$ a dollar;
                   ${1} where a digit follows. --all-lines also prints the lines
                   without a match.
  --tsv            the groups of each match as a line, tabs between them, or the
                   whole match where REGEX has no groups; \t is a tab in a group,
                   \\ a backslash, and a group that took no part is empty
  --groups         LINE:COLUMN:BYTE:GROUP:LENGTH:TEXT for each group of the first
                   match, FILE: before it when there are several FILEs; group 0
                   is the whole match, and a group that took no part has '-' for
                   its column, byte and length
  --json           a JSON object for each match, with its groups
  --count          how many lines it would be, FILE: before it when there are
                   several FILEs
Lines and columns are counted from 1; columns and lengths are in characters.
BYTE, "offset" with --json, is where the group begins in the file as it is,
whatever ENC is, from 0. With --line-number, the number of the line and a colon
(a tab with --tsv) stand before what is printed.

The dialect 'perl' is the syntax of Perl's regular expressions. In 'legacy' the
characters { } ( ) | are ordinary text, and so is $ but at the end: it has no
groups, and it finds nothing in an empty line, and but one match in any other. In
both, everything works on bytes of UTF-8: '.' is one byte, and '[é]' one of two;
write '(?:é|è)' for one of two characters. Classes such as \w know ASCII only.
A match that cuts a character in two ends the command when it has to be printed;
an empty one within a character does not count. --unicode takes ICU's regular
expressions instead, in which '.' is a whole character, classes are those of
Unicode, and \p{...} has its properties.

What is read is text in the encoding of --encoding, and so is what is printed but
for --groups, --json and --count, which print UTF-8; REGEX and TEXT are UTF-8
always. Without FILE, and for '-', standard input is read. Put '--' before REGEX
when it begins with '-'.

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

bool isWithinCharacter(std::string_view line, std::size_t position) {
    return position < line.size() && isContinuation(line[position]);
}

class MatchFilter : public LineFilter {
public:
    struct Rule {
        bool invert = false;
        bool count = false;
        bool showFile = false; ///< before the count
        bool allLines = false; ///< those without a match are printed as they are
    };
    MatchFilter(const Rule& rule, LinePattern& pattern, MatchPrinter& printer)
        : rule_(rule), pattern_(pattern), printer_(printer) {}

    bool givesText() const override { return !rule_.count && printer_.givesText(); }
    bool asksForPlaces() const override { return !rule_.count && printer_.asksForPlaces(); }
    void beginFile(std::string_view file) override {
        file_ = file;
        mark_.clear();
        found_ = 0;
    }
    void takeMark(std::string_view mark, std::string&) override { mark_ = mark; }
    void takeLine(const TextLine& line, std::string& out) override {
        try {
            searchIn(line, out);
        } catch (const Failure&) {
            throw;
        } catch (const std::runtime_error& failure) {
            throw Failure(placeOf(line) + "REGEX gives up: " + printable(failure.what()));
        }
    }
    std::size_t passOver(std::string_view lines) override {
        return rule_.invert || rule_.allLines ? 0 : pattern_.passOver(lines);
    }
    void endFile(std::string& out) override {
        if (rule_.count) {
            out.append(rule_.showFile ? file_ + ":" : "").append(std::to_string(found_)) += '\n';
        }
    }

private:
    static std::string placeOf(const TextLine& line) {
        return std::string(line.file) + ": line " + std::to_string(line.number) + ": ";
    }

    void searchIn(const TextLine& line, std::string& out) {
        if (!rule_.count && printer_.needsPlaces()) {
            printMatchesIn(line, out);
        } else if (pattern_.find(line.text) != rule_.invert) {
            ++found_;
            if (!rule_.count) {
                begin(line, out);
                printer_.end(line, out);
            }
        }
    }

    void printMatchesIn(const TextLine& line, std::string& out) {
        bool hasBegun = rule_.allLines;
        if (hasBegun) {
            begin(line, out);
        }
        pattern_.findAll(line.text, [&](const GroupPlaces& groups) {
            if (groups[0]->length == 0 && isWithinCharacter(line.text, groups[0]->position)) {
                return true;
            }
            refuseHalves(line, groups);
            if (!std::exchange(hasBegun, true)) {
                begin(line, out);
            }
            return printer_.take(line, groups, out);
        });
        if (hasBegun) {
            printer_.end(line, out);
        }
    }

    void begin(const TextLine& line, std::string& out) {
        if (printer_.givesText()) {
            out.append(std::exchange(mark_, {}));
        }
        printer_.begin(line, out);
    }

    static void refuseHalves(const TextLine& line, const GroupPlaces& groups) {
        for (const std::optional<GroupPlace>& place : groups) {
            if (place && (isWithinCharacter(line.text, place->position) ||
                          isWithinCharacter(line.text, place->position + place->length))) {
                throw Failure(placeOf(line) +
                              "REGEX matches a part of a character; with --unicode it takes whole ones");
            }
        }
    }

    Rule rule_;
    LinePattern& pattern_;
    MatchPrinter& printer_;
    std::string file_;
    std::string mark_; ///< until it is printed
    std::uint64_t found_ = 0;
};

class MatchCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.operand("REGEX", regex_, "What to look for").required();
        syntax.flag("-v,--invert-match", rule_.invert, "Print the lines in which REGEX does not match");
        syntax.flag("-c,--count", rule_.count, "Print how many lines it would be, for each FILE");
        syntax.flag("-n,--line-number", numbers_, "Print the number of each line before it");
        syntax.flag("-i,--ignore-case", ignoreCase_,
                    "Take letters in either case for the same; those of ASCII, but with --unicode all");
        syntax.flag("--only-matching", only_, "Print what matched, each match as a line");
        replaceOption_ =
            syntax.option("--replace", replacement_, "TEXT",
                          "Put TEXT in the place of each match; $1 is what the first group took");
        syntax.flag("--all-lines", rule_.allLines, "With --replace, print lines without a match, too");
        syntax.flag("--tsv", rows_, "Print the groups of each match as a line, tabs between them");
        syntax.flag("--groups", groups_, "Print where the groups of the first match stand");
        syntax.flag("--json", records_, "Print a JSON object on a line for each match");
        syntax.flag("--unicode", unicode_, "Take REGEX for one of ICU's, which knows whole characters");
        dialectOption_ = syntax
                             .option("--dialect", dialect_, "WHICH",
                                     "How REGEX is to be read: 'perl' (default) or 'legacy'")
                             .takes(wordsOf(dialectChoices));
        files_.declareEncoding(syntax);
        files_.declare(syntax);
    }

    int run(Diagnostics& diagnostics) override {
        const Dialect dialect = chosenDialect();
        refuseWhatDoesNotGoTogether(dialect);
        const std::unique_ptr<LinePattern> pattern =
            compilePattern(regex_, dialect, ignoreCase_ ? LetterCase::Ignore : LetterCase::Distinguish);
        rule_.showFile = files_.inputs().size() > 1;
        const std::unique_ptr<MatchPrinter> printer = makePrinter(pattern->groupCount());
        MatchFilter filter(rule_, *pattern, *printer);
        filterLines(files_, filter, diagnostics);
        return Done;
    }

private:
    Dialect chosenDialect() const {
        if (unicode_ && dialectOption_.isGiven()) {
            throw Failure("--unicode and --dialect do not go together");
        }
        return unicode_ ? Dialect::Unicode : choose("--dialect", dialect_, dialectChoices);
    }

    void refuseWhatDoesNotGoTogether(Dialect dialect) const {
        const bool replaces = replaceOption_.isGiven();
        const std::pair<const char*, bool> forms[] = {
            {"--count", rule_.count},
            {"--groups", groups_},
            {"--tsv", rows_},
            {"--json", records_},
            {replaces ? "--replace" : "--only-matching", replaces || only_}};
        const char* form = nullptr;
        for (const auto& [name, isGiven] : forms) {
            if (isGiven && form != nullptr) {
                throw Failure(std::string(form) + " and " + name + " do not go together");
            }
            form = isGiven ? name : form;
        }
        if (form != nullptr && !rule_.count && rule_.invert) {
            throw Failure(std::string(form) + " and --invert-match do not go together");
        }
        if (numbers_ && (rule_.count || groups_ || records_)) {
            throw Failure(std::string(form) + " and --line-number do not go together");
        }
        if (rule_.allLines && (!replaces || only_)) {
            throw Failure("--all-lines goes with --replace, and not with --only-matching");
        }
        if (dialect == Dialect::Legacy && (ignoreCase_ || (form != nullptr && !rule_.count && !groups_))) {
            throw Failure(std::string(ignoreCase_ ? "--ignore-case" : form) +
                          " goes with the dialect 'perl' or --unicode only");
        }
    }

    std::unique_ptr<MatchPrinter> makePrinter(std::size_t groupCount) const {
        const MatchLabels labels{false, numbers_};
        if (replaceOption_.isGiven()) {
            requireUtf8("TEXT", replacement_);
            Replacement text(replacement_, groupCount);
            return only_ ? printReplacements(labels, std::move(text))
                         : printReplaced(labels, std::move(text));
        }
        return groups_    ? printGroups(rule_.showFile)
               : rows_    ? printRows(labels)
               : records_ ? printRecords(labels)
               : only_    ? printMatches(labels)
                          : printLines(labels);
    }

    std::string regex_;
    std::string dialect_ = "perl";
    std::string replacement_;
    Option replaceOption_;
    Option dialectOption_;
    FileOptions files_;
    MatchFilter::Rule rule_;
    bool groups_ = false;
    bool rows_ = false;
    bool records_ = false;
    bool only_ = false;
    bool numbers_ = false;
    bool ignoreCase_ = false;
    bool unicode_ = false;
};

} // namespace

CommandInfo matchCommand() {
    return {"match", "Find the lines that a regular expression matches", examples, notes,
            std::make_unique<MatchCommand>()};
}

} // namespace host
