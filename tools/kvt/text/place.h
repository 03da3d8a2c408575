// Where something stands in a file: the one form of it, in messages and in what is printed for programs.
#pragma once

#include <cstdint>
#include <string>

namespace host {

struct Place {
    std::string file;
    std::uint64_t offset = 0; ///< in bytes from the start of the file
    std::uint64_t line = 1;
    std::uint64_t column = 1; ///< in characters, whatever their bytes are
};

/// Line and column while one goes through a text. Lines end with LF, CR or CRLF; a byte order mark at the start is not
/// counted.
struct TextPosition {
    std::uint64_t line = 1;
    std::uint64_t column = 1;
    bool afterReturn = false; ///< a LF now belongs to the line end before it
    bool atStart = true;

    /// Whether the character ends a line.
    bool pass(char32_t character);
};

/// "FILE: line 2, column 5, byte 17".
std::string describe(const Place& place);

/// "2:5:17", and "FILE:" before it if that is wanted.
void appendPlace(const Place& place, bool showFile, std::string& out);

} // namespace host
