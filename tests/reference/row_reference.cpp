#include "row_reference.h"

namespace kvt::test {

std::vector<ReferenceRow> referenceRows(std::string_view text, char delimiter, char quote) {
    std::vector<ReferenceRow> rows;
    std::size_t at = 0;
    while (at < text.size()) {
        ReferenceRow row;
        row.begin = at;
        const auto blame = [&](ReferenceFault fault, std::size_t place) {
            if (row.fault == ReferenceFault::None) {
                row.fault = fault;
                row.faultPlace = place;
            }
        };
        for (bool isRowOver = false; !isRowOver;) {
            enum { Begin, Plain, Quoted, Closed } state = Begin;
            ReferenceRow::Cell cell;
            const std::size_t opened = at;
            for (;; ++at) {
                const bool isEnd = at == text.size();
                if (state == Quoted) {
                    if (isEnd) {
                        blame(ReferenceFault::QuoteNeverEnds, opened);
                        isRowOver = true;
                        break;
                    }
                    const bool isPair = text.substr(at, 2) == std::string(2, quote);
                    if (text[at] == quote && !isPair) {
                        state = Closed;
                    } else {
                        if (text[at] == '\0') {
                            blame(ReferenceFault::Nul, at);
                        }
                        cell.text += text[at];
                        if (isPair) {
                            cell.asItStands += text[at++];
                        }
                    }
                    cell.asItStands += text[at];
                    continue;
                }
                if (isEnd || text[at] == '\n' || text[at] == '\r') {
                    isRowOver = true;
                    break;
                }
                if (text[at] == delimiter) {
                    ++at;
                    break;
                }
                cell.asItStands += text[at];
                if (state == Begin && text[at] == quote) {
                    state = Quoted;
                    continue;
                }
                if (state == Closed) {
                    blame(ReferenceFault::TextBehindQuote, at);
                }
                if (text[at] == '\0') {
                    blame(ReferenceFault::Nul, at);
                }
                state = Plain;
                cell.text += text[at];
            }
            row.cells.push_back(cell);
        }
        for (const char* end : {"\r\n", "\n", "\r"}) {
            if (text.substr(at).substr(0, std::string_view(end).size()) == end) {
                row.lineEnd = end;
                break;
            }
        }
        at += row.lineEnd.size();
        rows.push_back(row);
    }
    return rows;
}

std::size_t referenceBorder(std::string_view text, char delimiter, char quote) {
    std::size_t border = 0;
    const std::vector<ReferenceRow> rows = referenceRows(text, delimiter, quote);
    for (std::size_t index = 0; index < rows.size(); ++index) {
        border = rows[index].begin;
        if (index + 1 == rows.size() && rows[index].lineEnd == "\n") {
            border = text.size();
        }
        if (index + 1 == rows.size() && rows[index].lineEnd == "\r\n") {
            border = text.size();
        }
    }
    return border;
}

} // namespace kvt::test
