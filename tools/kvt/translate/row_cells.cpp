#include "translate/row_cells.h"

#include <utility>

namespace host {

void RowCells::fail(std::size_t slot, const std::string& column, Problem problem) {
    const bool isOfInput = slot < row_->cellCount();
    CellFailure& failure = failures_.emplace_back();
    failure.column = column;
    failure.value = text(slot);
    failure.problem = std::move(problem);
    failure.place = isOfInput ? row_->cell(slot).data() : row_->row().data();
    if (onError_ == OnCellError::Empty) {
        values_[slot].assign({});
        touch(slot, State::FailedAndEmpty);
    } else {
        values_[slot].assign(isOfInput ? textOfInput(slot) : std::string_view());
        touch(slot, State::FailedAndKept);
    }
}

} // namespace host
