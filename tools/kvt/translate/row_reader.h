// Delimited text as rows of cells, by RFC 4180 and what else there is in the world: any delimiter, any quote, and
// lines that end with LF, CR or CRLF.
//
//     RowReader reader(form, text);              // whole rows; the last one need not have a line end
//     while (reader.next()) {
//         for (std::size_t i = 0; i < reader.cellCount(); ++i) use(reader.cell(i));
//     }
//
// A cell is a view of the text as it stands there, quotes included, so that what nobody changes is written as it was;
// cell_text.h has its text. A quote counts at the beginning of a cell only: behind it, delimiters and line ends are
// text up to the next single quote. Anywhere else a quote is a character as any other.
//
// A row may have a fault. It is a row all the same, and ends where it would have ended without.
#pragma once

#include "translate/row_form.h"
#include "translate/special_bytes.h"

#include <cstddef>
#include <cstdint>
#include <string_view>
#include <vector>

namespace host {

enum class RowFault : std::uint8_t {
    None,
    QuoteNeverEnds,  ///< the text ends within quotes; the place is that of the opening quote
    TextBehindQuote, ///< something follows a closing quote; the place is behind the quote
    Nul,             ///< the row has a byte of zero; the place is its own
};

class RowReader {
public:
    RowReader(const RowForm& form, std::string_view text);

    /// Goes on with another text.
    void restart(std::string_view text);

    /// Reads the next row; false behind the last one. What is known of the row before is gone.
    bool next();

    std::size_t cellCount() const { return count_; }
    /// As it stands in the text.
    std::string_view cell(std::size_t index) const {
        const char* const begin = index == 0 ? begin_ : ends_[index - 1] + 1;
        return {begin, static_cast<std::size_t>(ends_[index] - begin)};
    }
    /// Where the cells end; the next one begins one byte behind, as delimiters have one.
    const char* const* ends() const { return ends_.data(); }

    /// The row without its line end.
    std::string_view row() const { return {begin_, static_cast<std::size_t>(rowEnd() - begin_)}; }
    /// "\n", "\r", "\r\n", or nothing at the end of the text.
    std::string_view lineEnd() const { return {rowEnd(), static_cast<std::size_t>(next_ - rowEnd())}; }

    /// The first fault of the row, and its place in the text.
    RowFault fault() const { return fault_; }
    const char* faultPlace() const { return faultPlace_; }

private:
    static constexpr std::ptrdiff_t width = 64;

    const char* rowEnd() const { return ends_[count_ - 1]; }
    void lookAt(const char* block);
    const char* nextOther();
    bool takeQuoted(const char* quote);
    bool endRow(const char* lineEnd);
    void blame(RowFault fault, const char* place);

    RowForm form_;
    SpecialBytes<1> delimiter_;
    SpecialBytes<4> other_;       ///< quote, line ends and NUL
    const char* block_ = nullptr; ///< the 64 bytes of the text that the masks are about
    std::uint64_t others_ = 0;    ///< all of the block
    std::uint64_t ahead_ = 0;     ///< these and the delimiters, so far as they are still ahead
    const char* begin_ = nullptr; ///< of this row
    const char* next_ = nullptr;  ///< of the next one
    const char* end_ = nullptr;   ///< of the text
    std::vector<const char*> ends_;
    std::size_t count_ = 0;
    RowFault fault_ = RowFault::None;
    const char* faultPlace_ = nullptr;
};

} // namespace host
