#include "infer/column_guess.h"

#include "base/text_units.h"

namespace host {

namespace {

void keepFirst(std::string& example, std::string_view cell) {
    constexpr std::size_t longest = 60;
    if (example.empty()) {
        example = cell.substr(0, longest);
    }
}

} // namespace

void ColumnGuess::add(std::string_view cell) {
    ++cells_;
    const std::string_view text = trimmed(cell);
    padded_ += text.size() != cell.size() ? 1 : 0;
    if (text.empty()) {
        ++empty_;
        return;
    }
    if (!dates_.add(text)) {
        keepFirst(noDate_, text);
    }
    if (!numbers_.add(text)) {
        keepFirst(noNumber_, text);
    }
}

// Nine of ten cells say what a column is. Digits alone are numbers rather than dates, unless all of them are dates.
ColumnGuess::Type ColumnGuess::type() const {
    const std::uint64_t filled = cells_ - empty_;
    const auto most = [&](std::uint64_t count) { return 10 * count >= 9 * filled; };
    if (filled == 0) {
        return Type::Empty;
    }
    if (most(dates_.cells()) && (dates_.cells() == filled || !most(numbers_.cells()))) {
        return Type::Date;
    }
    return most(numbers_.cells()) && 10 * numbers_.withLeadingZero() < filled ? Type::Number : Type::Text;
}

std::uint64_t ColumnGuess::others() const {
    switch (type()) {
    case Type::Date:
        return cells_ - empty_ - dates_.cells();
    case Type::Number:
        return cells_ - empty_ - numbers_.cells();
    default:
        return 0;
    }
}

std::string ColumnGuess::exampleOfOthers() const {
    return type() != Type::Date ? noNumber_ : noDate_.empty() ? dates_.exampleOfOthers() : noDate_;
}

} // namespace host
