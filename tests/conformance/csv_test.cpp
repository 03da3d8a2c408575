// The cases of a well-known reader of CSV, read from its first test program: texts of one row, what is in it, and texts
// that are no row. Nothing is set there: commas, double quotes, a quote doubled within.
#include "suite.h"

#include <translate/cell_text.h>
#include <translate/row_form.h>
#include <translate/row_reader.h>

#include <gtest/gtest.h>

#include <cstring>
#include <optional>

namespace conformance {
namespace {

// The cells of a text that is one row; nothing where it has a fault or is more.
std::optional<std::vector<std::string>> readRow(const std::string& text) {
    const host::RowForm form{};
    host::RowReader reader(form, text);
    std::vector<std::string> cells;
    if (!reader.next()) {
        cells.emplace_back(); // no text is an empty line to the others
        return cells;
    }
    for (std::size_t i = 0; i < reader.cellCount(); ++i) {
        std::string scratch;
        cells.emplace_back(reader.fault() == host::RowFault::None
                               ? std::string(host::textOfCell(reader.cell(i), form, scratch))
                               : "");
    }
    const bool isOne = reader.fault() == host::RowFault::None && !reader.next();
    return isOne ? std::optional(cells) : std::nullopt;
}

// The text of a literal of perl at the front of `source`: '...', "...", qq(...); nothing for anything else.
std::optional<std::string> literal(const std::string& source) {
    const bool hasName = source.rfind("qq", 0) == 0;
    const std::size_t opening = hasName ? 2 : 0;
    const char begin = opening < source.size() ? source[opening] : '\0';
    const char end = begin == '(' ? ')' : begin == '{' ? '}' : begin;
    if (begin != '\'' && begin != '"' && begin != '(' && begin != '{') {
        return std::nullopt;
    }
    std::string text;
    for (std::size_t at = opening + 1; at < source.size() && source[at] != end; ++at) {
        if (source[at] == '$' && begin != '\'') {
            return std::nullopt;
        }
        if (source[at] != '\\' || begin == '\'') {
            text += source[at];
            continue;
        }
        const char* const letters = "nrt0\"\\";
        const char* const known = std::strchr(letters, source[++at]);
        if (known == nullptr) {
            return std::nullopt;
        }
        text += "\n\r\t\0\"\\"[known - letters];
    }
    return text;
}

TEST(ConformanceCsv, RowsAreReadAsElsewhere) {
    const std::string package = "libtext-csv-perl";
    if (sourceFolder(package).empty()) {
        GTEST_SKIP() << noSources(package);
    }
    Suite suite("rows of CSV", package + " " + sourceVersion(package));
    std::optional<std::vector<std::string>> row;
    for (const std::string& line : linesOf(contentsOf(sourceFolder(package) + "/t/10_base.t"))) {
        const auto behind = [&](const std::string& words) {
            const std::size_t at = line.find(words);
            return at == std::string::npos ? "" : line.substr(at + words.size());
        };
        if (const std::string argument = behind("$csv->parse ("); !argument.empty()) {
            const std::optional<std::string> text = literal(argument);
            row = text ? readRow(*text) : std::nullopt;
            const bool isRefused = line.find("!$csv") != std::string::npos;
            if (!text) {
                suite.leaveOut("calls without a text");
            } else if (!isRefused || !row) {
                suite.check(isRefused == !row, line);
            } else if (text->front() == '"') {
                suite.leaveOut("line ends within quotes, which are refused there unless asked for");
            } else {
                suite.leaveOut("quotes in a cell that does not begin with one, which are text to kvt");
            }
        } else if (row && !behind("scalar $csv->fields ()").empty()) {
            const std::string count = behind("scalar $csv->fields (), ");
            suite.check(!count.empty() && row->size() == std::stoul(count), line);
        } else if (const std::string cell = behind("($csv->fields ())["); row && !cell.empty()) {
            const std::optional<std::string> text = literal(cell.substr(4));
            const std::size_t index = std::stoul(cell);
            suite.check(text && index < row->size() && (*row)[index] == *text, line);
        }
    }
    suite.finish();
}

} // namespace
} // namespace conformance
