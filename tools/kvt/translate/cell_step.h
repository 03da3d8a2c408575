// What steps share that work on the text of one column.
#pragma once

#include "translate/step.h"

#include <string>
#include <utility>

namespace host {

class CellStep : public Step {
public:
    explicit CellStep(std::string column) : column_(std::move(column)) {}

    void bind(Layout& layout) final {
        const Layout::Column& column = layout.toChange(column_);
        column_ = column.name;
        slot_ = column.slot;
    }
    // Cells without a text have nothing that could be translated, and those that have failed are left alone.
    bool apply(RowCells& row) final {
        if (!row.hasFailed(slot_)) {
            const std::string_view text = row.text(slot_);
            if (!text.empty()) {
                applyTo(text, row);
            }
        }
        return true;
    }

protected:
    /// `text` is that of the cell. Calls set() or fail(), or neither.
    virtual void applyTo(std::string_view text, RowCells& row) = 0;

    void set(RowCells& row, std::string_view text) const { row.set(slot_, text); }
    void fail(RowCells& row, Problem problem) const { row.fail(slot_, column_, std::move(problem)); }

private:
    std::string column_;
    std::size_t slot_ = 0;
};

} // namespace host
