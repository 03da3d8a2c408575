#include "translate/row_borders.h"

#include <algorithm>
#include <cstring>

namespace host {

// What stands outside of quotes from `begin` to `end` in the text that goes on to `textEnd`.
void RowBorders::takePlain(const char* begin, const char* end, const Text& text) {
    const auto isBorder = [&](const char* place) {
        return *place == '\n' || (*place == '\r' && place + 1 != text.end && place[1] != '\n');
    };
    for (Watch& watch : watches_) {
        const char* place =
            watch.limit <= text.offset + 1
                ? text.begin
                : text.begin + std::min<std::uint64_t>(watch.limit - text.offset - 1,
                                                       static_cast<std::uint64_t>(text.end - text.begin));
        place = std::max(place, begin);
        while (!watch.border && place < end) {
            if (isBorder(place++)) {
                watch.border = text.offsetOf(place);
            }
        }
    }
    for (const char* place = end; place != begin;) {
        if (isBorder(--place)) {
            border_ = text.offsetOf(place + 1);
            return;
        }
    }
}

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

void RowBorders::add(std::string_view bytes) {
    if (bytes.empty()) {
        return;
    }
    const Text text{bytes.data(), bytes.data() + bytes.size(), size_};
    const char* place = text.begin;
    if (endsInReturn_) {
        // The line end that was there is one; a LF behind it is seen below.
        if (*place != '\n') {
            setBorder(text.offset);
        }
        endsInReturn_ = false;
    }
    if (state_ == State::AfterQuote) {
        state_ = *place == form_.quote ? State::Quoted : State::Plain;
        place += *place == form_.quote ? 1 : 0;
    }
    while (place != text.end) {
        const auto* const quote = static_cast<const char*>(
            std::memchr(place, form_.quote, static_cast<std::size_t>(text.end - place)));
        const char* const stop = quote == nullptr ? text.end : quote;
        if (state_ == State::Quoted) {
            if (quote == nullptr) {
                break;
            }
            place = quote + 1;
            if (place == text.end) {
                state_ = State::AfterQuote;
            } else if (*place == form_.quote) {
                ++place;
            } else {
                state_ = State::Plain;
            }
            continue;
        }
        takePlain(place, stop, text);
        if (stop != place) {
            const char last = stop[-1];
            const bool isCellBegin = last == form_.delimiter || last == '\n' || last == '\r';
            state_ = isCellBegin ? State::CellBegin : State::Plain;
        }
        place = stop;
        if (quote != nullptr) {
            const bool opens = state_ == State::CellBegin;
            openQuote_ = opens ? text.offsetOf(quote) : openQuote_;
            state_ = opens ? State::Quoted : State::Plain;
            ++place;
        }
    }
    endsInReturn_ = state_ == State::CellBegin && text.end[-1] == '\r';
    size_ += bytes.size();
}

} // namespace host
