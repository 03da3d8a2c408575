// Between a cell as it stands in a file and its text: quotes taken off, and put on where they must be.
#pragma once

#include "translate/row_form.h"
#include "translate/special_bytes.h"

#include <string>
#include <string_view>

namespace host {

/// The text of a cell of a row without fault. A view of the cell, or of `scratch` where quotes within it are doubled.
std::string_view textOfCell(std::string_view cell, const RowForm& form, std::string& scratch);

/// Whether a text is another one when it is read as a cell, unless quotes stand around it.
class QuoteNeed {
public:
    explicit QuoteNeed(const RowForm& form) : special_({form.delimiter, form.quote, '\n', '\r'}) {}
    bool operator()(std::string_view text) const { return special_.isIn(text); }

private:
    SpecialBytes<4> special_;
};

/// Appends `text` with quotes around it.
void appendQuoted(std::string& out, std::string_view text, const RowForm& form);

/// Appends `text` as a cell, with quotes where it needs them.
void appendCell(std::string& out, std::string_view text, const RowForm& form);

} // namespace host
