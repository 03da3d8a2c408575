#include "translate/row_borders.h"

#include <cstring>

namespace host {

void RowBorders::setBorder(std::uint64_t border) {
    border_ = border;
    for (Watch& watch : watches_) {
        if (!watch.border && border >= watch.limit) {
            watch.border = border;
        }
    }
}

std::optional<std::uint64_t> RowBorders::firstBehind(std::uint64_t limit) const {
    for (const Watch& watch : watches_) {
        if (watch.limit == limit) {
            return watch.border;
        }
    }
    return std::nullopt;
}

void RowBorders::add(std::string_view text) {
    if (text.empty()) {
        return;
    }
    const char* const begin = text.data();
    const char* const end = begin + text.size();
    const auto offsetOf = [&](const char* place) {
        return size_ + static_cast<std::uint64_t>(place - begin);
    };
    const auto isAtCellBegin = [&](const char* place) {
        if (place == begin) {
            return state_ == State::CellBegin;
        }
        return place[-1] == form_.delimiter || place[-1] == '\n' || place[-1] == '\r';
    };

    const char* place = begin;
    if (endsInReturn_ && state_ != State::Quoted) {
        setBorder(offsetOf(*begin == '\n' ? begin + 1 : begin));
    }
    if (state_ == State::AfterQuote) {
        state_ = *begin == form_.quote ? State::Quoted : State::Plain;
        place += *begin == form_.quote ? 1 : 0;
    }
    places_.restart(place, end);
    bool isQuoted = state_ == State::Quoted;
    while (true) {
        if (isQuoted) {
            const auto* const quote = static_cast<const char*>(
                place == end ? nullptr
                             : std::memchr(place, form_.quote, static_cast<std::size_t>(end - place)));
            if (quote == nullptr) {
                state_ = State::Quoted;
                break;
            }
            place = quote + 1;
            if (place == end) {
                state_ = State::AfterQuote;
                break;
            }
            if (*place == form_.quote) {
                ++place;
                continue;
            }
            isQuoted = false;
            places_.restart(place, end);
        }
        const char* const found = places_.next();
        if (found == end) {
            const char last = end[-1];
            state_ =
                last == form_.delimiter || last == '\n' || last == '\r' ? State::CellBegin : State::Plain;
            break;
        }
        if (*found == form_.quote) {
            if (isAtCellBegin(found)) {
                isQuoted = true;
                openQuote_ = offsetOf(found);
                place = found + 1;
            }
        } else if (*found == '\n') {
            setBorder(offsetOf(found + 1));
        } else if (found + 1 != end && found[1] != '\n') {
            setBorder(offsetOf(found + 1));
        }
    }
    endsInReturn_ = state_ == State::CellBegin && end[-1] == '\r';
    size_ += text.size();
}

} // namespace host
