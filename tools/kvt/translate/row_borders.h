// Where a text may be cut so that each piece has whole rows. The rows themselves are not looked at, only quotes and
// line ends, and the text may come in pieces of any size.
#pragma once

#include "translate/row_form.h"

#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

namespace host {

class RowBorders {
public:
    explicit RowBorders(const RowForm& form) : form_(form) {}

    /// Goes on by `text`. What border() says is counted in bytes from the beginning of all text.
    void add(std::string_view text);

    /// The last border so far: a row begins there, or the text ends. A CR that ends the text is none yet.
    std::uint64_t border() const { return border_; }
    std::uint64_t size() const { return size_; }
    /// The first border that is at `limit` or behind it is remembered, as firstBehind(limit). Before all text.
    void watch(std::uint64_t limit) { watches_.push_back({limit, std::nullopt}); }
    std::optional<std::uint64_t> firstBehind(std::uint64_t limit) const;

    /// Where the quote that is open now was opened; meaningful while isWithinQuotes().
    std::uint64_t openQuote() const { return openQuote_; }
    bool isWithinQuotes() const { return state_ == State::Quoted; }

private:
    enum class State : std::uint8_t {
        CellBegin, ///< a quote opens a cell
        Plain,
        Quoted,
        AfterQuote, ///< the text ended behind a quote that closes the cell, or is the first of a pair
    };

    struct Watch {
        std::uint64_t limit;
        std::optional<std::uint64_t> border;
    };

    struct Text {
        const char* begin;
        const char* end;
        std::uint64_t offset; ///< of its beginning

        std::uint64_t offsetOf(const char* place) const {
            return offset + static_cast<std::uint64_t>(place - begin);
        }
    };

    void setBorder(std::uint64_t border);
    void takePlain(const char* begin, const char* end, const Text& text);

    RowForm form_;
    std::vector<Watch> watches_;
    State state_ = State::CellBegin;
    bool endsInReturn_ = false;
    std::uint64_t border_ = 0;
    std::uint64_t size_ = 0;
    std::uint64_t openQuote_ = 0;
};

} // namespace host
