#include "infer/table_guess.h"

#include "translate/row_reader.h"

#include <algorithm>
#include <map>
#include <tuple>

namespace host {

namespace {

constexpr std::string_view delimiters = ",;\t|:";

// How many rows have how many cells.
TableGuess measured(std::string_view text, bool isWhole, const RowForm& form) {
    std::map<std::size_t, std::size_t> rowsByWidth;
    TableGuess guess{form, 1, 0, 0};
    RowReader reader(form, text);
    while (reader.next()) {
        const bool isCut = !isWhole && reader.lineEnd().empty();
        if (isCut || (reader.row().empty() && reader.cellCount() == 1)) {
            continue; // an empty line is a row of no table
        }
        ++guess.rows;
        ++rowsByWidth[reader.cellCount()];
    }
    for (const auto& [columns, rows] : rowsByWidth) {
        if (rows > guess.rowsOfWidth) {
            guess.columns = columns;
            guess.rowsOfWidth = rows;
        }
    }
    return guess;
}

// More is better. A delimiter that parts the rows alike comes before one that parts them into more cells.
auto rankOf(const TableGuess& guess) {
    const std::size_t percent = guess.rows == 0 ? 0 : 100 * guess.rowsOfWidth / guess.rows;
    const bool isTable = guess.columns > 1 && percent >= 50;
    return std::tuple(isTable, percent >= 95, guess.columns);
}

// Cells that begin and end with the quote.
std::size_t quotedCells(std::string_view text, const RowForm& form) {
    std::size_t count = 0;
    RowReader reader(form, text);
    while (reader.next()) {
        for (std::size_t i = 0; i < reader.cellCount(); ++i) {
            const std::string_view cell = reader.cell(i);
            count += cell.size() > 1 && cell.front() == form.quote && cell.back() == form.quote ? 1 : 0;
        }
    }
    return count;
}

} // namespace

TableGuess guessTable(std::string_view text, bool isWhole) {
    TableGuess best = measured(text, isWhole, {delimiters.front(), '"'});
    for (const char delimiter : delimiters.substr(1)) {
        const TableGuess other = measured(text, isWhole, {delimiter, '"'});
        best = rankOf(best) < rankOf(other) ? other : best;
    }
    // Single quotes stand around cells only where no double ones do.
    const RowForm single = {best.form.delimiter, '\''};
    if (quotedCells(text, best.form) == 0 && quotedCells(text, single) > 0) {
        const TableGuess other = measured(text, isWhole, single);
        best = rankOf(best) <= rankOf(other) ? other : best;
    }
    return best;
}

} // namespace host
