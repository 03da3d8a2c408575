// The text is looked at 64 bytes at a time. Each byte that is none of the text is taken for the end of a cell, until it is
// seen to be of another kind than a delimiter, which happens once in a row of a plain table.

#include "translate/row_reader.h"

namespace host {

RowReader::RowReader(const RowForm& form, std::string_view text)
    : form_(form), delimiter_({form.delimiter}), other_({form.quote, '\n', '\r', '\0'}) {
    restart(text);
}

void RowReader::restart(std::string_view text) {
    next_ = text.data();
    end_ = text.data() + text.size();
    lookAt(next_);
}

inline void RowReader::lookAt(const char* block) {
    block_ = block;
    ahead_ = 0;
    if (end_ - block >= width) {
        others_ = other_.find(block);
        ahead_ = others_ | delimiter_.find(block);
    } else if (block != end_) {
        const auto rest = static_cast<std::size_t>(end_ - block);
        others_ = other_.findInLast(block, rest);
        ahead_ = others_ | delimiter_.findInLast(block, rest);
    }
}

bool RowReader::next() {
    if (next_ == end_) {
        return false;
    }
    begin_ = next_;
    fault_ = RowFault::None;
    count_ = 0;
    for (;;) {
        if (ends_.size() - count_ <= static_cast<std::size_t>(width)) {
            ends_.resize(ends_.size() * 2 + static_cast<std::size_t>(2 * width));
        }
        // All up to the first byte of another kind, that byte included.
        const std::uint64_t others = ahead_ & others_;
        const std::uint64_t ends = ahead_ & (others ^ (others - 1));
        ahead_ ^= ends;
        const char** cellEnd = ends_.data() + count_;
        for (std::uint64_t left = ends; left != 0; left &= left - 1) {
            *cellEnd++ = block_ + std::countr_zero(left);
        }
        count_ = static_cast<std::size_t>(cellEnd - ends_.data());
        if (others == 0) {
            if (end_ - block_ <= width) {
                return endRow(end_);
            }
            lookAt(block_ + width);
            continue;
        }
        const char* const place = ends_[--count_];
        if (*place == '\n' || *place == '\r') {
            return endRow(place);
        }
        if (*place == '\0') {
            blame(RowFault::Nul, place);
        } else if (place == (count_ == 0 ? begin_ : ends_[count_ - 1] + 1) && !takeQuoted(place)) {
            return endRow(end_);
        }
    }
}

// The next byte that is none of the text and not a delimiter; the end of the text behind the last one. Delimiters before
// it are passed over.
const char* RowReader::nextOther() {
    while ((ahead_ & others_) == 0) {
        if (end_ - block_ <= width) {
            ahead_ = 0;
            return end_;
        }
        lookAt(block_ + width);
    }
    const std::uint64_t others = ahead_ & others_;
    ahead_ &= ~(others ^ (others - 1));
    return block_ + std::countr_zero(others);
}

// Goes on to the quote that closes the cell; false where there is none.
bool RowReader::takeQuoted(const char* quote) {
    for (;;) {
        const char* place = nextOther();
        if (place == end_) {
            blame(RowFault::QuoteNeverEnds, quote);
            return false;
        }
        if (*place == '\0') {
            blame(RowFault::Nul, place);
        }
        if (*place != form_.quote) {
            continue;
        }
        const char* const behind = place + 1;
        if (behind != end_ && *behind == form_.quote) {
            nextOther();
            continue;
        }
        if (behind != end_ && *behind != form_.delimiter && *behind != '\n' && *behind != '\r') {
            blame(RowFault::TextBehindQuote, behind);
        }
        return true;
    }
}

// Always true: there is a row.
bool RowReader::endRow(const char* lineEnd) {
    ends_[count_++] = lineEnd;
    next_ = lineEnd;
    if (lineEnd == end_) {
        return true;
    }
    ++next_;
    if (*lineEnd == '\r' && next_ != end_ && *next_ == '\n') {
        nextOther();
        ++next_;
    }
    return true;
}

void RowReader::blame(RowFault fault, const char* place) {
    if (fault_ == RowFault::None) {
        fault_ = fault;
        faultPlace_ = place;
    }
}

} // namespace host
