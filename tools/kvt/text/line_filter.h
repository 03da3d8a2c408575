// The way of lines through a command that reads texts and writes one: each file in turn, line after line, into one
// output, in the encoding in which they came.
#pragma once

#include "text/line_reader.h"

#include <string>
#include <string_view>

namespace host {

class Diagnostics;
class FileOptions;

/// What a command makes of lines. It appends to `out`, as UTF-8.
class LineFilter {
public:
    virtual ~LineFilter() = default;
    /// Whether what it makes is text, which goes on in its own encoding, or statements about it, which are UTF-8.
    virtual bool givesText() const { return true; }
    /// Whether it asks lines for places.
    virtual bool asksForPlaces() const { return false; }

    /// A file begins; its name is one for people.
    virtual void beginFile(std::string_view) {}
    /// It begins with a byte order mark, which is part of no line.
    virtual void takeMark(std::string_view mark, std::string& out) = 0;
    virtual void takeLine(const TextLine& line, std::string& out) = 0;
    /// Of lines in a row with their ends, the place up to which lines end that need not be taken: nothing would come of
    /// them.
    virtual std::size_t passOver(std::string_view) { return 0; }
    virtual void endFile(std::string&) {}
};

/// Sends the lines of all inputs through the filter. What is complete is written block by block. Throws Failure, for
/// what is wrong with the options, too.
void filterLines(const FileOptions& files, LineFilter& filter, Diagnostics& diagnostics);

} // namespace host
