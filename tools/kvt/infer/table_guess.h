// The form of a delimited text, from its first rows: which character stands between the cells, which one around them,
// and whether the first row has the names of the columns.
#pragma once

#include "translate/row_form.h"

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace host {

struct TableGuess {
    RowForm form;
    std::size_t columns = 1;     ///< that most rows have
    std::size_t rows = 0;        ///< that were looked at
    std::size_t rowsOfWidth = 0; ///< with so many columns
};

/// `text` is UTF-8, and its last row may be cut unless the text `isWhole`.
TableGuess guessTable(std::string_view text, bool isWhole);

} // namespace host
