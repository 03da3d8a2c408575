// How the numbers of a column are written: which sign stands before the decimals, and what groups the digits. Many a
// number can be read in more than one way ("1.234"); the column as a whole decides.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace host {

enum class NumberStyle : std::uint8_t {
    Plain,      ///< digits and perhaps a point: nothing to translate
    Point,      ///< 1,234.56
    Comma,      ///< 1.234,56
    Space,      ///< 1 234,56, with a blank of any kind
    Apostrophe, ///< 1'234.56
};
inline constexpr std::size_t numberStyles = 5;

class NumberGuess {
public:
    /// Whether the cell is a number in any style.
    bool add(std::string_view cell);

    /// Cells that are numbers.
    std::uint64_t cells() const { return cells_; }
    /// The style that reads most of them; of those that read as many, the simplest.
    NumberStyle style() const;
    std::uint64_t cellsOf(NumberStyle style) const { return counts_[static_cast<std::size_t>(style)]; }
    /// A cell that other styles read otherwise or not at all; empty where there is none.
    std::string example(NumberStyle style) const;

    /// Whole numbers with a zero in front, as in numbers of accounts and telephones.
    std::uint64_t withLeadingZero() const { return withLeadingZero_; }
    /// Numbers with the sign of a currency.
    std::uint64_t withCurrency() const { return withCurrency_; }

private:
    std::array<std::uint64_t, numberStyles> counts_{};
    std::vector<std::pair<NumberStyle, std::string>> examples_; ///< few, as there may be many columns
    std::uint64_t cells_ = 0;
    std::uint64_t withLeadingZero_ = 0;
    std::uint64_t withCurrency_ = 0;
};

} // namespace host
