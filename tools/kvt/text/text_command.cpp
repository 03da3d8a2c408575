// `kvt text`: the string operations of the library on the lines of a text.

#include "base/failure.h"
#include "base/text.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "text/file_options.h"
#include "text/line_filter.h"
#include "text/text_operation.h"

#include <functional>
#include <memory>
#include <utility>

namespace host {

namespace {

constexpr const char* examples = R"(kvt text upper --encoding windows-1252 names.txt
kvt text find 'strasse' --ignore-case *.txt
kvt text replace ';' ',' < in.csv > out.csv)";

constexpr const char* notes =
    R"(What is read and written is text in the encoding of --encoding; arguments are
UTF-8 always, and what 'find' and 'hash' print is plain ASCII but for names of
files. Several FILEs become one output; without any, and for '-', standard input
is read. Put '--' before the arguments when one of them begins with '-'.

Lines end with LF, CR or CRLF and have at most 64 MiB of UTF-8. Their ends are
no part of what an operation sees and are written as they were; so is a byte
order mark at the start of a FILE. Upper and lower case and folding follow
Unicode, whatever the locale, and may change the length of a line. Only whole
characters are found, replaced and cut at, also where one folds to several.

Bytes that are no text in ENC, and characters of the result that do not exist in
it, end the command with their place. An output file appears whole or not at
all; to standard output, what is complete is written block by block. To repair a
text, or to change its encoding, use 'kvt convert'.

Exit status:
  0  done, also when nothing was found
  2  not done)";

class OperationFilter : public LineFilter {
public:
    explicit OperationFilter(std::unique_ptr<TextOperation> operation) : operation_(std::move(operation)) {}
    bool givesText() const override { return operation_->givesText(); }
    bool asksForPlaces() const override { return operation_->asksForPlaces(); }
    void takeMark(std::string_view mark, std::string& out) override { out.append(givesText() ? mark : ""); }
    void takeLine(const TextLine& line, std::string& out) override { operation_->apply(line, out); }

private:
    std::unique_ptr<TextOperation> operation_;
};

class TextCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        declareCase(syntax, "upper", "Every letter in upper case", CaseChange::Upper);
        declareCase(syntax, "lower", "Every letter in lower case", CaseChange::Lower);
        declareCase(syntax, "fold", "The form that texts share which differ in case only", CaseChange::Fold);
        declareFind(syntax);
        declareReplace(syntax);
        declareSplit(syntax);
        declareStrip(syntax);
        declareHash(syntax);
    }

    int run(Diagnostics& diagnostics) override {
        OperationFilter filter(chosen());
        filterLines(files_, filter, diagnostics);
        return Done;
    }

private:
    using Make = std::function<std::unique_ptr<TextOperation>()>;

    std::unique_ptr<TextOperation> chosen() const {
        for (const auto& [operation, make] : operations_) {
            if (operation->isChosen()) {
                return make();
            }
        }
        throw Failure("no operation");
    }

    Statements form() const {
        return records_                     ? Statements::Records
               : files_.inputs().size() > 1 ? Statements::LinesWithFile
                                            : Statements::Lines;
    }

    CaseRule rule() const { return ignoreCase_ ? CaseRule::Ignore : CaseRule::Distinguish; }

    // An operation with what all have. Its own arguments stand before the files.
    void declareOperation(Syntax& syntax, const std::string& name, const std::string& summary,
                          const std::string& itsExamples, const std::string& itsNotes,
                          const std::vector<std::pair<std::string, std::string*>>& arguments,
                          const Make& make) {
        Syntax& operation = syntax.subcommand(name, summary);
        for (const auto& [argument, value] : arguments) {
            operation.operand(argument, *value, argumentMeaning(argument)).required();
        }
        files_.declareEncoding(operation);
        files_.declare(operation);
        operation.setHelp(itsExamples, itsNotes.empty() ? notes : itsNotes + "\n\n" + notes);
        operations_.emplace_back(&operation, [arguments, make] {
            for (const auto& [argument, value] : arguments) {
                requireUtf8(argument, *value);
            }
            return make();
        });
    }

    static std::string argumentMeaning(const std::string& argument) {
        return argument == "NEEDLE" ? "Text to look for"
               : argument == "FROM" ? "Text to replace"
               : argument == "TO"   ? "What to put in its place; may be empty"
               : argument == "SET"  ? "The characters that go"
                                    : "Text between the pieces";
    }

    void declareIgnoreCase(const std::string& meaning) {
        operations_.back().first->flag("-i,--ignore-case", ignoreCase_, meaning);
    }

    void declareRecords(const std::string& meaning) {
        operations_.back().first->flag("--json", records_, meaning);
    }

    void declareCase(Syntax& syntax, const std::string& name, const std::string& summary, CaseChange change) {
        declareOperation(syntax, name, summary,
                         "kvt text " + name + " names.txt\nkvt text " + name +
                             " --encoding KOI8-R names.txt -o changed.txt",
                         "", {}, [change] { return changeCase(change); });
    }

    void declareFind(Syntax& syntax) {
        declareOperation(syntax, "find", "Print where a text stands", R"(kvt text find 'TODAY' notes.txt
kvt text find --ignore-case 'straße' one.txt two.txt)",
                         R"(Prints LINE:COLUMN:BYTE for each place, from the left, none within the one
before; FILE: before it when there are several FILEs. Lines and columns are
counted from 1, columns in characters, and a byte order mark is none. BYTE is
where the place begins in the file as it is, whatever ENC is, from 0. Nothing is
printed when nothing is found.)",
                         {{"NEEDLE", &first_}}, [this] { return findText(first_, rule(), form()); });
        declareIgnoreCase("Find it in upper and lower case alike");
        declareRecords("Print a JSON object on a line for each place");
    }

    void declareReplace(Syntax& syntax) {
        declareOperation(syntax, "replace", "Replace a text, everywhere",
                         R"(kvt text replace 'colour' 'color' book.txt -o book.txt
kvt text replace --ignore-case 'strasse' 'Str.' < addresses.txt)",
                         "Replaces from the left and does not look again at what was put in.",
                         {{"FROM", &first_}, {"TO", &second_}},
                         [this] { return replaceText(first_, second_, rule()); });
        declareIgnoreCase("Replace it in upper and lower case alike");
    }

    void declareSplit(Syntax& syntax) {
        declareOperation(syntax, "split", "Cut each line into pieces, a line for each",
                         R"(kvt text split ', ' list.txt
printf 'a::b' | kvt text split --skip-empty ':')",
                         R"(Each piece gets the end of its line, or LF where that has none. The whole
DELIMITER goes. A line without it is one piece, be it empty.)",
                         {{"DELIMITER", &first_}}, [this] { return splitText(first_, rule(), skipEmpty_); });
        declareIgnoreCase("Cut at DELIMITER in upper and lower case alike");
        operations_.back().first->flag("--skip-empty", skipEmpty_, "Leave empty pieces out");
    }

    void declareStrip(Syntax& syntax) {
        declareOperation(
            syntax, "strip", "Drop characters from the ends of each line",
            R"(kvt text strip ' ' table.txt
kvt text strip --back '.!?' titles.txt)",
            R"(SET is a list of characters, each for itself; every one of them goes from the
front and from the back of the line up to the first that is not in SET.)",
            {{"SET", &first_}}, [this] {
                return stripText(first_, front_ == back_ ? Side::Both : front_ ? Side::Front : Side::Back);
            });
        operations_.back().first->flag("--front", front_, "From the front only");
        operations_.back().first->flag("--back", back_, "From the back only");
    }

    void declareHash(Syntax& syntax) {
        declareOperation(syntax, "hash", "Print a hash of each line", R"(kvt text hash names.txt
kvt text hash --ignore-case --encoding UTF-16LE names.txt)",
                         R"(Prints 16 hexadecimal digits for each line: the hash that the library's UTF-8
strings have, 64-bit FNV-1a. The same text has the same hash in every encoding.
It is quick and not made to withstand anybody who wants two texts to agree.)",
                         {}, [this] { return hashText(rule(), form()); });
        declareIgnoreCase("Give texts that differ in case only the same hash");
        declareRecords("Print a JSON object on a line for each line");
    }

    std::vector<std::pair<Syntax*, Make>> operations_;
    FileOptions files_;
    std::string first_;
    std::string second_;
    bool ignoreCase_ = false;
    bool records_ = false;
    bool skipEmpty_ = false;
    bool front_ = false;
    bool back_ = false;
};

} // namespace

CommandInfo textCommand() {
    return {"text", "Change, search and compare text line by line", examples, notes,
            std::make_unique<TextCommand>()};
}

} // namespace host
