#include <support/trust_page.h>

#include <algorithm>
#include <cctype>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string_view>

namespace kvt::test {
namespace {

std::vector<std::string> readLines(const std::string& path) {
    std::ifstream file(path);
    if (!file) {
        throw std::runtime_error(path + " cannot be read");
    }
    std::vector<std::string> lines;
    for (std::string line; std::getline(file, line);) {
        lines.push_back(line);
    }
    return lines;
}

std::vector<std::string> split(std::string_view text, char separator) {
    std::vector<std::string> pieces(1);
    for (std::size_t at = 0; at < text.size(); ++at) {
        if (text[at] == separator) {
            pieces.emplace_back();
        } else {
            // A bar that is part of a cell is written with a backslash before it.
            at += text[at] == '\\' && at + 1 < text.size() && text[at + 1] == separator ? 1 : 0;
            pieces.back() += text[at];
        }
    }
    return pieces;
}

std::string trimmed(std::string text) {
    text.erase(std::remove(text.begin(), text.end(), '`'), text.end());
    const auto begin = text.find_first_not_of(' ');
    return begin == std::string::npos ? "" : text.substr(begin, text.find_last_not_of(' ') + 1 - begin);
}

// "| a | b |" as "a" and "b".
std::vector<std::string> cellsOf(const std::string& line) {
    std::vector<std::string> cells = split(line, '|');
    cells.erase(cells.begin());
    if (!cells.empty()) {
        cells.pop_back();
    }
    std::transform(cells.begin(), cells.end(), cells.begin(), trimmed);
    return cells;
}

bool isRow(const std::string& line) {
    return !line.empty() && line.front() == '|';
}

} // namespace

std::map<std::string, std::string> TrustTable::row(const std::string& key) const {
    std::map<std::string, std::string> cells;
    for (const std::vector<std::string>& row : rows) {
        for (std::size_t i = 0; row.front() == key && i < columns.size(); ++i) {
            cells[columns[i]] = row[i];
        }
    }
    return cells;
}

std::vector<TrustTable> readTrustPage(const std::string& path) {
    std::vector<TrustTable> tables;
    std::string heading;
    const std::vector<std::string> lines = readLines(path);
    for (std::size_t i = 0; i < lines.size(); ++i) {
        const std::string& line = lines[i];
        const bool begins = isRow(line) && i + 1 < lines.size() && lines[i + 1].rfind("|--", 0) == 0;
        if (!line.empty() && line.front() == '#') {
            heading = line.substr(line.find_first_not_of("# "));
        } else if (begins) {
            if (!tables.empty() && tables.back().heading == heading) {
                throw std::runtime_error("two tables below the heading " + heading);
            }
            tables.push_back({heading, cellsOf(line), {}, ""});
            ++i; // the line below the names
        } else if (isRow(line)) {
            if (tables.empty() || cellsOf(line).size() != tables.back().columns.size()) {
                throw std::runtime_error("a row with another number of cells: " + line);
            }
            tables.back().rows.push_back(cellsOf(line));
        } else if (!tables.empty() && tables.back().heading == heading && line.rfind("Held by `", 0) == 0) {
            tables.back().heldBy = split(line, '`')[1];
        }
    }
    return tables;
}

TrustTable readTrustFile(const std::string& path) {
    TrustTable table;
    for (const std::string& line : readLines(path)) {
        std::vector<std::string> cells = split(line, '\t');
        if (table.columns.empty()) {
            table.columns = cells;
        } else if (cells.size() == table.columns.size()) {
            table.rows.push_back(cells);
        } else {
            throw std::runtime_error(path + " has a row with another number of cells: " + line);
        }
    }
    return table;
}

std::string trustFileName(const std::string& heading) {
    std::string name;
    for (const char unit : heading) {
        name += unit == ' ' ? '_' : static_cast<char>(std::tolower(static_cast<unsigned char>(unit)));
    }
    return name + ".tsv";
}

std::map<std::string, std::string> trustRow(const std::string& sourceFolder, const std::string& heading,
                                            const std::string& key) {
    for (const TrustTable& table : readTrustPage(sourceFolder + "/docs/trust.md")) {
        if (table.heading == heading) {
            return table.row(key);
        }
    }
    return {};
}

} // namespace kvt::test
