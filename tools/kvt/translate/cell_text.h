// Between a cell as it stands in a file and its text: quotes taken off, and put on where they must be.
#pragma once

#include "translate/row_form.h"

#include <string>
#include <string_view>

namespace host {

/// The text of a cell of a row without fault. A view of the cell, or of `scratch` where quotes within it are doubled.
std::string_view textOfCell(std::string_view cell, const RowForm& form, std::string& scratch);

/// Whether `text` is another one when it is read as a cell, unless quotes stand around it.
bool needsQuotes(std::string_view text, const RowForm& form);

/// Appends `text` with quotes around it.
void appendQuoted(std::string& out, std::string_view text, const RowForm& form);

/// Appends `text` as a cell, with quotes where it needs them.
inline void appendCell(std::string& out, std::string_view text, const RowForm& form) {
    if (needsQuotes(text, form)) {
        appendQuoted(out, text, form);
    } else {
        out += text;
    }
}

} // namespace host
