#include "translate/row_output.h"

#include <cstring>

namespace host {

namespace {

// So many bytes are copied at once, however few there are: what stands between two cells that change is mostly shorter.
constexpr std::size_t slack = 64;

// The same as memcpy. Most texts of cells are short, as dates and numbers are, and are copied without a call; then, the
// same bytes may be written twice.
inline void copyText(char* to, std::string_view from) {
    const std::size_t size = from.size();
    if (size >= 8 && size <= 16) {
        std::memcpy(to, from.data(), 8);
        std::memcpy(to + size - 8, from.data() + size - 8, 8);
    } else if (size >= 4 && size < 8) {
        std::memcpy(to, from.data(), 4);
        std::memcpy(to + size - 4, from.data() + size - 4, 4);
    } else if (size != 0) {
        std::memcpy(to, from.data(), size);
    }
}

} // namespace

RowOutput::RowOutput(const Plan& plan, const Layout& layout)
    : in_(plan.in), out_(plan.out), needsQuotes_(plan.out),
      keepsForm_(plan.in == plan.out && !plan.job.output.quoteAll), lineEnds_(plan.lineEnds),
      quoteAll_(plan.job.output.quoteAll) {
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
    keepsRows_ = keepsForm_ && lineEnds_ == RowEnds::Keep && layout.columns().size() == layout.inputCount();
    for (std::size_t slot = 0; keepsRows_ && slot < layout.inputCount(); ++slot) {
        keepsRows_ = layout.columns()[slot].slot == slot;
        if (layout.isChanging(slot)) {
            changing_.push_back(slot);
        }
    }
}

void RowOutput::begin(std::string& room, std::string_view text) {
    room_ = &room;
    if (room.size() < text.size() + slack) {
        room.resize(text.size() + slack);
    }
    at_ = room.data();
    limit_ = at_ + room.size();
    runBegin_ = runEnd_ = text.data();
    textEnd_ = text.data() + text.size();
}

// And a little more.
inline void RowOutput::makeRoom(std::size_t count) {
    if (static_cast<std::size_t>(limit_ - at_) < count + slack) {
        const auto written = static_cast<std::size_t>(at_ - room_->data());
        room_->resize(room_->size() * 2 + count + slack);
        at_ = room_->data() + written;
        limit_ = room_->data() + room_->size();
    }
}

inline void RowOutput::append(std::string_view bytes) {
    makeRoom(bytes.size());
    copyText(at_, bytes);
    at_ += bytes.size();
}

inline void RowOutput::flush() {
    const auto size = static_cast<std::size_t>(runEnd_ - runBegin_);
    makeRoom(size);
    if (size <= slack && static_cast<std::size_t>(textEnd_ - runBegin_) >= slack) {
        std::memcpy(at_, runBegin_, slack); // what is too much is written over
    } else {
        std::memcpy(at_, runBegin_, size);
    }
    at_ += size;
    runBegin_ = runEnd_;
}

std::size_t RowOutput::size() {
    flush();
    return static_cast<std::size_t>(at_ - room_->data());
}

std::string_view RowOutput::end() {
    if (at_ == room_->data()) {
        return {runBegin_, static_cast<std::size_t>(runEnd_ - runBegin_)};
    }
    const std::size_t length = size();
    return std::string_view(*room_).substr(0, length);
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
        *at_++ = byte;
    }
}

inline void RowOutput::putCell(RowCells& cells, std::size_t slot) {
    const bool isAsItStood = cells.isAsItStood(slot);
    if (isAsItStood) {
        const std::string_view cell = cells.asItStood(slot);
        // Quotes that were there protect from any delimiter.
        const bool isQuoted = !cell.empty() && cell.front() == in_.quote;
        if (keepsForm_ || (isQuoted && in_.quote == out_.quote && !quoteAll_) ||
            (!isQuoted && !quoteAll_ && !needsQuotes_(cell))) {
            copy(cell.data(), cell.data() + cell.size());
            return;
        }
    }
    putText(cells.text(slot));
    if (!isAsItStood && cells.isOfInput(slot)) {
        // What stands behind the cell may be what is written next.
        const std::string_view cell = cells.asItStood(slot);
        runBegin_ = runEnd_ = cell.data() + cell.size();
    }
}

inline void RowOutput::putText(std::string_view text) {
    flush();
    if (quoteAll_ || needsQuotes_(text)) {
        quoted_.clear();
        appendQuoted(quoted_, text, out_);
        append(quoted_);
    } else {
        append(text);
    }
}

void RowOutput::write(RowCells& cells, const RowReader& row, bool needsLineEnd) {
    if (!keepsRows_) {
        writeAs(stretches_, cells, row, needsLineEnd);
        return;
    }
    const char* place = row.row().data();
    for (const std::size_t slot : changing_) {
        if (!cells.isAsItStood(slot)) {
            const std::string_view cell = cells.asItStood(slot);
            copy(place, cell.data());
            putText(cells.text(slot));
            place = runBegin_ = runEnd_ = cell.data() + cell.size();
        }
    }
    copy(place, row.row().data() + row.row().size());
    putLineEnd(row, needsLineEnd);
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
    const bool isKept = lineEnds_ == RowEnds::Keep && (!end.empty() || !needsLineEnd);
    const std::string_view wanted = isKept ? end : lineEnds_ == RowEnds::CrLf ? "\r\n" : "\n";
    if (isKept || wanted == end) {
        copy(end.data(), end.data() + end.size());
    } else {
        flush();
        append(wanted);
    }
}

} // namespace host
