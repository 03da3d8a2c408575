// Delimited text read byte by byte, by one switch over what may stand where: slow, and plain enough to be believed.
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {

enum class ReferenceFault { None, QuoteNeverEnds, TextBehindQuote, Nul };

struct ReferenceRow {
    struct Cell {
        std::string asItStands;
        std::string text; ///< without quotes; open in a row with a fault
    };
    std::vector<Cell> cells;
    std::size_t begin = 0;
    std::string lineEnd;
    ReferenceFault fault = ReferenceFault::None;
    std::size_t faultPlace = 0;
};

/// The rows of a text.
std::vector<ReferenceRow> referenceRows(std::string_view text, char delimiter, char quote);

/// How much of a text that goes on is whole rows for sure.
std::size_t referenceBorder(std::string_view text, char delimiter, char quote);

} // namespace kvt::test
