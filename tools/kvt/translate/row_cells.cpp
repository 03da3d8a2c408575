#include "translate/row_cells.h"

#include "translate/cell_text.h"

#include <algorithm>
#include <utility>

namespace host {

std::string_view RowCells::textOfInput(std::size_t slot) {
    return slot < row_->cellCount() ? textOfCell(row_->cell(slot), form_, unquoted_[slot])
                                    : std::string_view();
}

void RowCells::touch(std::size_t slot, State state) {
    if (states_[slot] == State::AsItStood) {
        touched_.push_back(slot);
    }
    states_[slot] = state;
}

void RowCells::set(std::size_t slot, std::string_view text) {
    if (states_[slot] == State::AsItStood && slot < row_->cellCount() && text == textOfInput(slot)) {
        return;
    }
    values_[slot].assign(text);
    touch(slot, State::Changed);
}

void RowCells::fail(std::size_t slot, const std::string& column, Problem problem) {
    const bool isOfInput = slot < row_->cellCount();
    CellFailure& failure = failures_.emplace_back();
    failure.column = column;
    failure.value = text(slot);
    failure.problem = std::move(problem);
    failure.place = isOfInput ? row_->cell(slot).data() : row_->row().data();
    if (onError_ == OnCellError::Empty) {
        values_[slot].clear();
        touch(slot, State::FailedAndEmpty);
    } else {
        values_[slot].assign(isOfInput ? textOfInput(slot) : std::string_view());
        touch(slot, State::FailedAndKept);
    }
}

std::size_t RowCells::changedCount() const {
    return static_cast<std::size_t>(std::count_if(touched_.begin(), touched_.end(), [&](std::size_t slot) {
        return states_[slot] == State::Changed || states_[slot] == State::FailedAndEmpty;
    }));
}

} // namespace host
