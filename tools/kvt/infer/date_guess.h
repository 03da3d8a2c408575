// Which forms of dates and times occur among the cells of a column, and which of them read all of it.
//
// The library's own parse() says whether a form reads a cell. Which forms are tried is known from the shape of the
// cell, its runs of digits and letters, so that a cell which is not a date costs next to nothing.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// A form that occurs.
struct DateForm {
    std::string format;      ///< for parse(), or with %y for a year of two digits
    std::uint64_t cells = 0; ///< that this form reads, and none in front of it
    std::string example;
    std::string alternative; ///< a form that reads the same cells, as where no day is above 12; or empty
};

class DateGuess {
public:
    /// Whether any form reads the cell.
    bool add(std::string_view cell);

    /// Cells that a form has read.
    std::uint64_t cells() const { return cells_; }
    /// The forms that read them all, the most frequent one first.
    std::vector<DateForm> forms() const;

private:
    struct Seen {
        std::uint64_t cells = 0;
        std::string example;
    };

    /// By the forms that read a cell, which are places in a list.
    std::map<std::vector<std::size_t>, Seen> seen_;
    std::uint64_t cells_ = 0;
};

} // namespace host
