// Which forms of dates and times occur among the cells of a column, and which of them read all of it.
//
// The library's own parse() says whether a form reads a cell. Which forms are tried is known from the shape of the
// cell, its runs of digits and letters, so that a cell which is not a date costs next to nothing.
#pragma once

#include <compare>
#include <cstddef>
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

    /// Cells that a form reads; of those with names of months, the ones in the language of most.
    std::uint64_t cells() const { return cellsIn(language()); }
    /// The forms that read them all, the most frequent one first.
    std::vector<DateForm> forms() const;
    /// The languages by which they are read, all just as well; none where English will do.
    std::vector<std::string> months() const;
    /// A cell that could be read in another language only; empty where there is none.
    std::string exampleOfOthers() const;

private:
    struct Seen {
        std::uint64_t cells = 0;
        std::string example;
    };

    /// A form and a language of its months, of which 0 is English, and also that of forms without names.
    struct Reader {
        std::size_t form;
        std::size_t language;
        friend auto operator<=>(const Reader&, const Reader&) = default;
    };
    using Readers = std::vector<Reader>;

    static void addReaders(std::string_view cell, std::size_t word, std::size_t length, Readers& readers);
    static bool isIn(const Reader& reader, std::size_t language);
    static bool isReadIn(const Readers& readers, std::size_t language);
    std::uint64_t cellsIn(std::size_t language) const;
    std::size_t language() const;

    std::map<Readers, Seen> seen_; ///< by all that read a cell
};

} // namespace host
