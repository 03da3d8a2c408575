#include "translate/row_cells.h"

#include <utility>

namespace host {

void RowCells::fail(std::size_t slot, const std::string& column, Problem problem) {
    const bool isOfRow = isOfInput(slot);
    CellFailure& failure = failures_.emplace_back();
    failure.column = column;
    failure.value = text(slot);
    failure.problem = std::move(problem);
    failure.place = isOfRow ? row_->cell(slot).data() : row_->row().data();
    if (onError_ == OnCellError::Empty) {
        become(slot, State::FailedAndEmpty, {});
    } else {
        become(slot, State::FailedAndKept, isOfRow ? textOfInput(slot) : std::string_view());
    }
}

} // namespace host
