#include "translate/step_table.h"

#include "base/failure.h"
#include "base/text.h"
#include "cli/suggest.h"

#include <algorithm>

namespace host {

namespace {

const std::string aColumn = "Name or number of the column";

// "COL=VALUE".
StepArguments readAssignment(const std::string& typed, const char* value) {
    const std::size_t sign = typed.find('=');
    if (sign == std::string::npos) {
        throw Failure("'=' is missing in '" + printable(typed) + "'");
    }
    return {{"column", typed.substr(0, sign)}, {value, typed.substr(sign + 1)}};
}

// "COL" or "COL=VALUE".
StepArguments readColumnWith(const std::string& typed, const char* value) {
    return typed.find('=') == std::string::npos ? StepArguments{{"column", typed}}
                                                : readAssignment(typed, value);
}

StepArguments readColumns(const std::string& typed) {
    return {{"columns", typed}};
}

// "COL=/REGEX/TEXT/" with any character in the place of "/".
StepArguments readReplace(const std::string& typed) {
    const std::size_t sign = typed.find('=');
    const std::string expression = sign == std::string::npos ? "" : typed.substr(sign + 1);
    const std::size_t middle = expression.size() < 3 ? std::string::npos : expression.find(expression[0], 1);
    if (middle == std::string::npos || middle + 1 == expression.size() ||
        expression.back() != expression[0] ||
        expression.find(expression[0], middle + 1) != expression.size() - 1) {
        throw Failure("--replace takes COL=/REGEX/TEXT/, where any other character may stand for '/', not '" +
                      printable(typed) + "'");
    }
    return {{"column", typed.substr(0, sign)},
            {"regex", expression.substr(1, middle - 1)},
            {"text", expression.substr(middle + 1, expression.size() - middle - 2)}};
}

// "COL=SEPARATOR:NAME,NAME"; the separator may be ":".
StepArguments readSplit(const std::string& typed) {
    StepArguments arguments = readAssignment(typed, "separator");
    const std::string value = arguments.back().second;
    const std::size_t colon = value.rfind(':');
    if (colon == std::string::npos || colon == 0) {
        throw Failure("--split takes COL=SEPARATOR:NAME,NAME, not '" + printable(typed) + "'");
    }
    arguments.back().second = value.substr(0, colon);
    arguments.emplace_back("names", value.substr(colon + 1));
    return arguments;
}

// "NAME=COL,COL:SEPARATOR"; without the separator the texts are joined as they are.
StepArguments readJoin(const std::string& typed) {
    const std::size_t sign = typed.find('=');
    if (sign == std::string::npos) {
        throw Failure("--join takes NAME=COL,COL:SEPARATOR, not '" + printable(typed) + "'");
    }
    const std::string value = typed.substr(sign + 1);
    const std::size_t colon = std::min(value.find(':'), value.size());
    return {{"name", typed.substr(0, sign)},
            {"columns", value.substr(0, colon)},
            {"separator", value.substr(std::min(colon + 1, value.size()))}};
}

// "COL~REGEX" or "COL!~REGEX".
StepArguments readWhere(const std::string& typed) {
    const std::size_t sign = typed.find('~');
    if (sign == std::string::npos || sign == 0) {
        throw Failure("--where takes COL~REGEX or COL!~REGEX, not '" + printable(typed) + "'");
    }
    const bool isNegated = typed[sign - 1] == '!';
    return {{"column", typed.substr(0, isNegated ? sign - 1 : sign)},
            {isNegated ? "not" : "regex", typed.substr(sign + 1)}};
}

// "COL=ZONE" or "COL=ZONE:MODE"; a colon within an offset is not one before a mode.
StepArguments readZone(const std::string& typed) {
    StepArguments arguments = readAssignment(typed, "zone");
    const std::string value = arguments.back().second;
    const std::size_t colon = value.rfind(':');
    const std::string mode = colon == std::string::npos ? "" : value.substr(colon + 1);
    if (!mode.empty() && mode.find_first_not_of("abcdefghijklmnopqrstuvwxyz") == std::string::npos) {
        arguments.back().second = value.substr(0, colon);
        arguments.emplace_back("mode", mode);
    }
    return arguments;
}

const StepRow& rowOf(const std::string& name) {
    const auto& table = stepTable();
    const auto row =
        std::find_if(table.begin(), table.end(), [&](const StepRow& other) { return other.name == name; });
    if (row == table.end()) {
        std::vector<std::string> names;
        for (const StepRow& other : table) {
            names.push_back(other.name);
        }
        throw Failure("there is no step '" + printable(name) + "'." + didYouMean(name, names));
    }
    return *row;
}

void checkNames(const StepRow& row, const StepArguments& arguments) {
    for (const auto& [name, value] : arguments) {
        const auto known =
            std::find_if(row.arguments.begin(), row.arguments.end(),
                         [&, &typed = name](const StepArgument& other) { return other.name == typed; });
        if (known == row.arguments.end()) {
            std::vector<std::string> names;
            for (const StepArgument& other : row.arguments) {
                names.push_back(other.name);
            }
            throw Failure("'" + row.name + "' takes no '" + printable(name) + "'." + didYouMean(name, names));
        }
        if (std::count_if(arguments.begin(), arguments.end(),
                          [&, &typed = name](const auto& other) { return other.first == typed; }) > 1) {
            throw Failure("'" + row.name + "' has '" + printable(name) + "' twice");
        }
    }
    for (const StepArgument& argument : row.arguments) {
        const bool isThere = std::any_of(arguments.begin(), arguments.end(), [&](const auto& other) {
            return other.first == argument.name && !other.second.empty();
        });
        if (argument.isRequired && !isThere) {
            throw Failure("'" + row.name + "' needs '" + argument.name + "'");
        }
    }
}

} // namespace

const std::vector<StepRow>& stepTable() {
    static const std::vector<StepRow> table = {
        {"date",
         "COL=FORMAT",
         "Read dates and times as FORMAT says and write them in canonical form; several FORMATs with '|' "
         "between "
         "them are tried in turn",
         {{"column", true, aColumn},
          {"format", true,
           "Patterns and keywords as 'kvt date parse' has them, with '|' between them; '||' is the "
           "character"},
          {"pivot", false, "For %y: years of two digits from this one on are of the last century"},
          {"months", false, "Language of the names of months, as 'de'"}},
         [](const std::string& typed) { return readAssignment(typed, "format"); },
         makeDateStep},
        {"write-date",
         "COL=FORMAT",
         "Write canonical dates and times as FORMAT says",
         {{"column", true, aColumn},
          {"format", true, "A pattern or a keyword as 'kvt date format' has them"}},
         [](const std::string& typed) { return readAssignment(typed, "format"); },
         makeWriteDateStep},
        {"zone",
         "COL=ZONE[:MODE]",
         "Give canonical times another offset, as 'kvt date zone set' does",
         {{"column", true, aColumn},
          {"zone", true, "An offset such as +01:00, 'utc', 'local', or the name of a zone"},
          {"mode", false, "'automatic', 'replace' or 'convert'"}},
         readZone,
         makeZoneStep},
        {"add",
         "COL=INTERVAL",
         "Move canonical dates and times by an interval such as P1M or -P1DT12H",
         {{"column", true, aColumn}, {"interval", true, "An interval in canonical form"}},
         [](const std::string& typed) { return readAssignment(typed, "interval"); },
         makeAddStep},
        {"number",
         "COL[=LANG]",
         "Read numbers as they are written in a language, with grouping and currency signs, and write them "
         "as plain "
         "decimals, digit for digit",
         {{"column", true, aColumn}, {"language", false, "Such as 'de' or 'fr'; 'en' without it"}},
         [](const std::string& typed) { return readColumnWith(typed, "language"); },
         makeNumberStep},
        {"replace",
         "COL=/REGEX/TEXT/",
         "Put TEXT in the place of each match; $1 and the like are the groups",
         {{"column", true, aColumn},
          {"regex", true, "A regular expression on characters, as ICU reads it"},
          {"text", false, "What takes the place of each match"}},
         readReplace,
         makeReplaceStep},
        {"case",
         "COL=CHANGE",
         "Make text 'upper', 'lower' or 'fold' it",
         {{"column", true, aColumn}, {"change", true, "'upper', 'lower' or 'fold'"}},
         [](const std::string& typed) { return readAssignment(typed, "change"); },
         makeCaseStep},
        {"strip",
         "COL[=CHARS]",
         "Drop white space, or the characters CHARS, from both ends",
         {{"column", true, aColumn}, {"characters", false, "Those that go"}},
         [](const std::string& typed) { return readColumnWith(typed, "characters"); },
         makeStripStep},
        {"normalize",
         "COL[=FORM]",
         "Give text a Unicode normal form: 'nfc' (without FORM), 'nfd', 'nfkc' or 'nfkd'",
         {{"column", true, aColumn}, {"form", false, "'nfc', 'nfd', 'nfkc' or 'nfkd'"}},
         [](const std::string& typed) { return readColumnWith(typed, "form"); },
         makeNormalizeStep},
        {"drop",
         "COL,...",
         "Leave columns out",
         {{"columns", true, "Names or numbers with commas between them"}},
         readColumns,
         makeDropStep},
        {"keep",
         "COL,...",
         "Leave all other columns out, and put these in this order",
         {{"columns", true, "Names or numbers with commas between them"}},
         readColumns,
         makeKeepStep},
        {"rename",
         "COL=NAME",
         "Call a column NAME",
         {{"column", true, aColumn}, {"name", true, "Its new name"}},
         [](const std::string& typed) { return readAssignment(typed, "name"); },
         makeRenameStep},
        {"split",
         "COL=SEPARATOR:NAME,...",
         "Put the pieces of a column between SEPARATORs into new columns in its place",
         {{"column", true, aColumn},
          {"separator", true, "The text between the pieces"},
          {"names", true, "Names of the new columns with commas between them"}},
         readSplit,
         makeSplitStep},
        {"join",
         "NAME=COL,...[:SEPARATOR]",
         "Put several columns together, with SEPARATOR between them, in the place of the first",
         {{"name", true, "Name of the new column"},
          {"columns", true, "Names or numbers with commas between them"},
          {"separator", false, "The text between them"}},
         readJoin,
         makeJoinStep},
        {"where",
         "COL~REGEX",
         "Leave out the rows in which REGEX matches nothing in a column; with '!~', those in which it "
         "matches",
         {{"column", true, aColumn},
          {"regex", false, "A regular expression on characters, as ICU reads it"},
          {"not", false, "One that must not match"}},
         readWhere,
         makeWhereStep},
        {"sort",
         "COL,...",
         "Sort the rows by these columns of the output, as bytes of UTF-8",
         {{"columns", true, "Names or numbers with commas between them"}},
         readColumns,
         nullptr},
        {"unique",
         "COL,...",
         "Of rows that are equal in these columns of the output, write the first only",
         {{"columns", true, "Names or numbers with commas between them"}},
         readColumns,
         nullptr},
    };
    return table;
}

JobStep makeStep(const std::string& name, StepArguments arguments, const std::string& zoneDatabase) {
    checkNames(rowOf(name), arguments);
    JobStep step{name, std::move(arguments)};
    if (rowOf(name).make != nullptr) {
        startStep(step, zoneDatabase);
    }
    return step;
}

StepArguments readStep(const std::string& name, const std::string& typed) {
    return rowOf(name).read(typed);
}

std::unique_ptr<Step> startStep(const JobStep& step, const std::string& zoneDatabase) {
    const StepRow& row = rowOf(step.name);
    checkNames(row, step.arguments);
    try {
        return row.make(StepValues(step, zoneDatabase));
    } catch (const Failure& failure) {
        throw Failure(row.name + ": " + failure.what());
    }
}

const std::string* StepValues::find(const std::string& name) const {
    const auto found = std::find_if(arguments_.begin(), arguments_.end(),
                                    [&](const auto& argument) { return argument.first == name; });
    return found == arguments_.end() ? nullptr : &found->second;
}

const std::string& StepValues::get(const std::string& name) const {
    static const std::string nothing;
    const std::string* const found = find(name);
    return found == nullptr ? nothing : *found;
}

std::vector<std::string> StepValues::list(const std::string& name) const {
    std::vector<std::string> items;
    const std::string& text = get(name);
    for (std::size_t begin = 0; begin <= text.size();) {
        const std::size_t end = std::min(text.find(',', begin), text.size());
        items.push_back(text.substr(begin, end - begin));
        begin = end + 1;
    }
    return items;
}

} // namespace host
