// Rows on their way out. What stands in the output as it stood in the input is copied in one piece, be it a cell, a
// stretch of them with their delimiters, or many rows.
#pragma once

#include "translate/cell_text.h"
#include "translate/layout.h"
#include "translate/plan.h"
#include "translate/row_cells.h"
#include "translate/row_reader.h"

#include <string>
#include <string_view>
#include <vector>

namespace host {

class RowOutput {
public:
    RowOutput(const Plan& plan, const Layout& layout);

    /// `room`, of which nothing is kept, is for rows that are not as they stood; it and the text of the rows have to stay
    /// for as long as what end() gives is used.
    void begin(std::string& room, std::string_view text);
    /// Rows without a line end get one, where another row may follow.
    void write(RowCells& cells, const RowReader& row, bool needsLineEnd);
    /// The same for a row in which not only those cells may have changed that steps change.
    void writeEachCell(RowCells& cells, const RowReader& row, bool needsLineEnd);
    /// Bytes written so far.
    std::size_t size();
    /// What was written: in the room, or in the text where it stands there in one piece.
    std::string_view end();

private:
    struct Stretch {
        std::size_t first; ///< slots; more than one only where all are written as they were read
        std::size_t last;
        bool isCopied;
    };

    void makeRoom(std::size_t count);
    void append(std::string_view bytes);
    void copy(const char* begin, const char* end);
    void put(char byte);
    void flush();
    void putCell(RowCells& cells, std::size_t slot);
    void putText(std::string_view text);
    void writeAs(const std::vector<Stretch>& stretches, RowCells& cells, const RowReader& row,
                 bool needsLineEnd);
    void putLineEnd(const RowReader& row, bool needsLineEnd);

    RowForm in_;
    RowForm out_;
    QuoteNeed needsQuotes_;
    bool keepsForm_; ///< cells are written with the quotes that they had
    RowEnds lineEnds_;
    bool quoteAll_;
    bool keepsRows_;                    ///< rows are written as they were read, but for the cells that change
    std::vector<std::size_t> changing_; ///< their slots
    std::vector<Stretch> stretches_;
    std::vector<Stretch> eachCell_;
    std::string* room_ = nullptr; ///< longer than what is written
    char* at_ = nullptr;          ///< where it goes on
    char* limit_ = nullptr;
    std::string quoted_;
    const char* textEnd_ = nullptr;
    const char* runBegin_ = nullptr; ///< of the text, to be copied
    const char* runEnd_ = nullptr;
};

} // namespace host
