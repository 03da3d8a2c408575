// What the cells of one column are: dates, numbers, text, or nothing.
#pragma once

#include "infer/date_guess.h"
#include "infer/number_guess.h"

#include <cstdint>
#include <string>
#include <string_view>

namespace host {

class ColumnGuess {
public:
    enum class Type { Empty, Date, Number, Text };

    /// Takes the text of a cell.
    void add(std::string_view cell);

    Type type() const;
    const DateGuess& dates() const { return dates_; }
    const NumberGuess& numbers() const { return numbers_; }

    std::uint64_t cells() const { return cells_; }
    std::uint64_t empty() const { return empty_; }
    /// With blanks at an end, which count as part of no value.
    std::uint64_t padded() const { return padded_; }
    /// Cells that are not of the column's type, and the first of them.
    std::uint64_t others() const;
    std::string exampleOfOthers() const;

private:
    DateGuess dates_;
    NumberGuess numbers_;
    std::uint64_t cells_ = 0;
    std::uint64_t empty_ = 0;
    std::uint64_t padded_ = 0;
    std::string noDate_;
    std::string noNumber_;
};

} // namespace host
