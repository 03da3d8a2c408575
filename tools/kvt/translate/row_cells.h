// The cells of one row on their way through the steps. A cell stays a view of the text that was read until a step
// gives it another text. Steps that cannot do their work say so by fail(); the cell is then out of their reach.
#pragma once

#include "translate/cell_text.h"
#include "translate/cell_value.h"
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
        : form_(form), onError_(onError), states_(slotCount), values_(slotCount), unquoted_(slotCount) {}

    /// A row begins. `row` outlives the use of its cells.
    void begin(const RowReader& row) {
        row_ = &row;
        for (const std::size_t slot : touched_) {
            states_[slot] = State::AsItStood;
        }
        touched_.clear();
        failures_.clear();
    }

    /// Whether the cell is the one that was read.
    bool isAsItStood(std::size_t slot) const {
        return states_[slot] == State::AsItStood ||
               (states_[slot] == State::FailedAndKept && slot < row_->cellCount());
    }
    /// Whether it is a cell of the input, and not one that was made.
    bool isOfInput(std::size_t slot) const { return slot < row_->cellCount(); }
    /// The cell as it stands in the input.
    std::string_view asItStood(std::size_t slot) const { return row_->cell(slot); }

    /// Valid until the cell gets another one.
    std::string_view text(std::size_t slot) {
        return states_[slot] == State::AsItStood ? textOfInput(slot) : values_[slot].text();
    }
    /// The text may be a view of this cell.
    void set(std::size_t slot, std::string_view text) {
        const bool isSame = states_[slot] == State::AsItStood && isOfInput(slot) && text == textOfInput(slot);
        if (!isSame) {
            values_[slot].assign(text);
            touch(slot, State::Changed);
        }
    }
    void fail(std::size_t slot, const std::string& column, Problem problem);
    /// Steps pass over a cell that has failed.
    bool hasFailed(std::size_t slot) const {
        return states_[slot] == State::FailedAndKept || states_[slot] == State::FailedAndEmpty;
    }

    /// Of this row.
    const std::vector<CellFailure>& failures() const { return failures_; }
    /// How many cells have another text than they had.
    std::size_t changedCount() const {
        std::size_t count = 0;
        for (const std::size_t slot : touched_) {
            count += states_[slot] == State::Changed || states_[slot] == State::FailedAndEmpty ? 1 : 0;
        }
        return count;
    }

private:
    enum class State : std::uint8_t { AsItStood, Changed, FailedAndKept, FailedAndEmpty };

    std::string_view textOfInput(std::size_t slot) {
        if (slot >= row_->cellCount()) {
            return {};
        }
        const std::string_view cell = row_->cell(slot);
        return cell.empty() || cell.front() != form_.quote ? cell : textOfCell(cell, form_, unquoted_[slot]);
    }
    void touch(std::size_t slot, State state) {
        if (states_[slot] == State::AsItStood) {
            touched_.push_back(slot);
        }
        states_[slot] = state;
    }

    RowForm form_;
    OnCellError onError_;
    const RowReader* row_ = nullptr;
    std::vector<State> states_;
    std::vector<CellValue> values_;
    std::vector<std::string> unquoted_;
    std::vector<std::size_t> touched_;
    std::vector<CellFailure> failures_;
};

} // namespace host
