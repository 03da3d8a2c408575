#include "base/table.h"

#include "base/text_units.h"

#include <algorithm>

namespace host {

namespace {

std::size_t widthOf(const std::string& utf8) {
    return static_cast<std::size_t>(
        std::count_if(utf8.begin(), utf8.end(), [](char byte) { return !isContinuation(byte); }));
}

} // namespace

std::string formatTable(const std::vector<Align>& columns,
                        const std::vector<std::vector<std::string>>& rows) {
    std::vector<std::size_t> widths(columns.size());
    for (const auto& row : rows) {
        for (std::size_t column = 0; column < columns.size(); ++column) {
            widths[column] = std::max(widths[column], widthOf(row[column]));
        }
    }
    std::string text;
    for (const auto& row : rows) {
        std::string line;
        for (std::size_t column = 0; column < columns.size(); ++column) {
            const std::string padding(widths[column] - widthOf(row[column]), ' ');
            line += column == 0 ? "" : "  ";
            line += columns[column] == Align::Right ? padding + row[column] : row[column] + padding;
        }
        line.erase(line.find_last_not_of(' ') + 1);
        text += line + "\n";
    }
    return text;
}

} // namespace host
