// The cells of one row on their way through the steps. A cell is a view: of the text that was read, until a step gives it
// another text, which the step keeps for as long as the row is there. Steps that cannot do their work say so by fail(); the cell is then out of their reach.
#pragma once

#include "translate/cell_text.h"
#include "translate/problem.h"
#include "translate/row_reader.h"

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// What becomes of a cell that could not be translated.
enum class OnCellError {
    Stop,  ///< the command ends
    Keep,  ///< it stays as it was in the input
    Empty, ///< it becomes empty
    Skip,  ///< its row is not written
};

/// A cell that could not be translated, or a row that is not one of the table.
struct CellFailure {
    std::uint64_t row = 0;       ///< within the block, from 0
    const char* place = nullptr; ///< of the cell in the text of the block, while that is there
    std::uint64_t offset = 0;    ///< of the cell in the file, in bytes, once that is known
    std::string column;          ///< its name; empty for a row as a whole
    std::string value;
    Problem problem;
};

class RowCells {
public:
    RowCells(const RowForm& form, OnCellError onError, std::size_t slotCount)
        : form_(form), onError_(onError), cells_(slotCount), unquoted_(slotCount) {}

    /// A row begins. `row` outlives the use of its cells.
    void begin(const RowReader& row) {
        row_ = &row;
        ++number_;
        changedCount_ = 0;
        failures_.clear();
    }

    /// Whether the cell is the one that was read.
    bool isAsItStood(std::size_t slot) const {
        const State state = stateOf(slot);
        return state == State::AsItStood || (state == State::FailedAndKept && isOfInput(slot));
    }
    /// Whether it is a cell of the input, and not one that was made.
    bool isOfInput(std::size_t slot) const { return slot < row_->cellCount(); }
    /// The cell as it stands in the input.
    std::string_view asItStood(std::size_t slot) const { return row_->cell(slot); }

    /// Valid until the cell gets another one.
    std::string_view text(std::size_t slot) {
        return stateOf(slot) == State::AsItStood ? textOfInput(slot) : cells_[slot].text;
    }
    /// What a step has to translate: nothing of a cell that has failed.
    std::string_view textToTranslate(std::size_t slot) {
        const State state = stateOf(slot);
        return state == State::AsItStood ? textOfInput(slot)
               : state == State::Changed ? cells_[slot].text
                                         : std::string_view();
    }
    /// The text has to stay until the next row; it may be a view of this cell.
    void set(std::size_t slot, std::string_view text) {
        if (stateOf(slot) != State::AsItStood || !isOfInput(slot) || text != textOfInput(slot)) {
            change(slot, text);
        }
    }
    /// The same for a text that is another one, or was in between.
    void change(std::size_t slot, std::string_view text) { become(slot, State::Changed, text); }
    void fail(std::size_t slot, const std::string& column, Problem problem);
    /// Steps pass over a cell that has failed.
    bool hasFailed(std::size_t slot) const {
        const State state = stateOf(slot);
        return state == State::FailedAndKept || state == State::FailedAndEmpty;
    }

    /// Of this row.
    const std::vector<CellFailure>& failures() const { return failures_; }
    /// How many cells have another text than they had.
    std::size_t changedCount() const { return changedCount_; }

private:
    enum class State : std::uint8_t { AsItStood, Changed, FailedAndKept, FailedAndEmpty };

    /// What became of a cell in one row. In any other row, it is as it stood.
    struct Cell {
        std::uint64_t row = 0;
        State state = State::AsItStood;
        std::string_view text;
    };

    State stateOf(std::size_t slot) const {
        return cells_[slot].row == number_ ? cells_[slot].state : State::AsItStood;
    }
    static std::size_t countOf(State state) {
        return state == State::Changed || state == State::FailedAndEmpty ? 1 : 0;
    }
    void become(std::size_t slot, State state, std::string_view text) {
        changedCount_ += countOf(state) - countOf(stateOf(slot));
        cells_[slot] = {number_, state, text};
    }

    std::string_view textOfInput(std::size_t slot) {
        if (slot >= row_->cellCount()) {
            return {};
        }
        const std::string_view cell = row_->cell(slot);
        return cell.empty() || cell.front() != form_.quote ? cell : textOfCell(cell, form_, unquoted_[slot]);
    }

    RowForm form_;
    OnCellError onError_;
    const RowReader* row_ = nullptr;
    std::uint64_t number_ = 0; ///< of the row, from 1
    std::vector<Cell> cells_;
    std::vector<std::string> unquoted_;
    std::size_t changedCount_ = 0;
    std::vector<CellFailure> failures_;
};

} // namespace host
