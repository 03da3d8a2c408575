#include "translate/cell_text.h"

#include <algorithm>

namespace host {

std::string_view textOfCell(std::string_view cell, const RowForm& form, std::string& scratch) {
    if (cell.size() < 2 || cell.front() != form.quote) {
        return cell;
    }
    std::string_view inner = cell.substr(1, cell.size() - 2);
    std::size_t quote = inner.find(form.quote);
    if (quote == std::string_view::npos) {
        return inner;
    }
    scratch.clear();
    for (; quote != std::string_view::npos; quote = inner.find(form.quote)) {
        scratch += inner.substr(0, quote + 1);
        inner.remove_prefix(std::min(quote + 2, inner.size()));
    }
    scratch += inner;
    return scratch;
}

void appendCell(std::string& out, std::string_view text, const RowForm& form) {
    if (QuoteNeed(form)(text)) {
        appendQuoted(out, text, form);
    } else {
        out += text;
    }
}

void appendQuoted(std::string& out, std::string_view text, const RowForm& form) {
    out += form.quote;
    for (std::size_t quote = text.find(form.quote); quote != std::string_view::npos;
         quote = text.find(form.quote)) {
        out.append(text.substr(0, quote + 1)) += form.quote;
        text.remove_prefix(quote + 1);
    }
    out.append(text) += form.quote;
}

} // namespace host
