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
        const std::string_view text = row.textToTranslate(slot_);
        if (!text.empty()) {
            applyTo(text, row);
        }
        return true;
    }
    std::size_t slot() const { return slot_; }

protected:
    /// `text` is that of the cell. Calls one of those below, or none.
    virtual void applyTo(std::string_view text, RowCells& row) = 0;

    // The text stays until the next row, or:
    void set(RowCells& row, std::string_view text) const { row.set(slot_, text); }
    void change(RowCells& row, std::string_view text) const { row.change(slot_, text); }
    /// For a text that does not.
    void keep(RowCells& row, std::string_view text) {
        kept_ = text;
        row.set(slot_, kept_);
    }
    void fail(RowCells& row, Problem problem) const { row.fail(slot_, column_, std::move(problem)); }

private:
    std::string column_;
    std::size_t slot_ = 0;
    std::string kept_;
};

} // namespace host
