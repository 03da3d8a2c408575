#include "translate/row_output.h"

#include "translate/cell_text.h"

#include <algorithm>

namespace host {

RowOutput::RowOutput(const Plan& plan, const Layout& layout)
    : in_(plan.in), out_(plan.out), keepsForm_(plan.in == plan.out && !plan.job.output.quoteAll),
      lineEnds_(plan.lineEnds), quoteAll_(plan.job.output.quoteAll) {
    for (const Layout::Column& column : layout.columns()) {
        eachCell_.push_back({column.slot, column.slot, false});
        const bool isCopied = keepsForm_ && !layout.isChanging(column.slot);
        if (isCopied && !stretches_.empty() && stretches_.back().isCopied &&
            stretches_.back().last + 1 == column.slot) {
            stretches_.back().last = column.slot;
        } else {
            stretches_.push_back({column.slot, column.slot, isCopied});
        }
    }
}

void RowOutput::begin(std::string& out, std::string_view text) {
    output_ = &out;
    runBegin_ = runEnd_ = text.data();
    textEnd_ = text.data() + text.size();
}

void RowOutput::flush() {
    output_->append(runBegin_, runEnd_);
    runBegin_ = runEnd_;
}

inline void RowOutput::copy(const char* begin, const char* end) {
    if (begin != runEnd_) {
        flush();
        runBegin_ = begin;
    }
    runEnd_ = end;
}

// Where the text goes on with just this byte, the run goes on.
inline void RowOutput::put(char byte) {
    if (runEnd_ != textEnd_ && *runEnd_ == byte) {
        ++runEnd_;
    } else {
        flush();
        output_->push_back(byte);
    }
}

void RowOutput::put(std::string_view bytes) {
    flush();
    output_->append(bytes);
}

void RowOutput::putCell(RowCells& cells, std::size_t slot) {
    if (cells.isAsItStood(slot)) {
        const std::string_view cell = cells.asItStood(slot);
        // Quotes that were there protect from any delimiter.
        const bool isQuoted = !cell.empty() && cell.front() == in_.quote;
        if (keepsForm_ || (isQuoted && in_.quote == out_.quote) ||
            (!isQuoted && !quoteAll_ && !needsQuotes(cell, out_))) {
            copy(cell.data(), cell.data() + cell.size());
            return;
        }
    }
    flush();
    if (quoteAll_) {
        appendQuoted(*output_, cells.text(slot), out_);
    } else {
        appendCell(*output_, cells.text(slot), out_);
    }
    if (!cells.isAsItStood(slot) && cells.isOfInput(slot)) {
        // What stands behind the cell may be what is written next.
        const std::string_view cell = cells.asItStood(slot);
        runBegin_ = runEnd_ = cell.data() + cell.size();
    }
}

void RowOutput::write(RowCells& cells, const RowReader& row, bool needsLineEnd) {
    writeAs(stretches_, cells, row, needsLineEnd);
}

void RowOutput::writeEachCell(RowCells& cells, const RowReader& row, bool needsLineEnd) {
    writeAs(eachCell_, cells, row, needsLineEnd);
}

void RowOutput::writeAs(const std::vector<Stretch>& stretches, RowCells& cells, const RowReader& row,
                        bool needsLineEnd) {
    bool isFirst = true;
    for (const Stretch& stretch : stretches) {
        if (!isFirst) {
            put(out_.delimiter);
        }
        isFirst = false;
        if (stretch.isCopied) {
            copy(row.cell(stretch.first).data(), row.ends()[stretch.last]);
        } else {
            putCell(cells, stretch.first);
        }
    }
    putLineEnd(row, needsLineEnd);
}

void RowOutput::putLineEnd(const RowReader& row, bool needsLineEnd) {
    const std::string_view end = row.lineEnd();
    const std::string_view wanted = lineEnds_ == RowEnds::Lf      ? "\n"
                                    : lineEnds_ == RowEnds::CrLf  ? "\r\n"
                                    : end.empty() && needsLineEnd ? "\n"
                                                                  : end;
    if (wanted == end && runEnd_ == end.data()) {
        runEnd_ += end.size();
    } else {
        put(wanted);
    }
}

} // namespace host
