// Which characters give a delimited text its form.
#pragma once

namespace host {

struct RowForm {
    char delimiter = ','; ///< between the cells of a row; ASCII
    char quote = '"';     ///< around a cell, and doubled within it; ASCII

    friend bool operator==(const RowForm&, const RowForm&) = default;
};

} // namespace host
