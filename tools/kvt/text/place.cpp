#include "text/place.h"

namespace host {

bool TextPosition::pass(char32_t character) {
    const bool isMark = atStart && character == U'\uFEFF';
    const bool endsLine = character == U'\n' || character == U'\r';
    if (endsLine) {
        line += character == U'\n' && afterReturn ? 0 : 1;
        column = 1;
    } else if (!isMark) {
        ++column;
    }
    atStart = false;
    afterReturn = character == U'\r';
    return endsLine;
}

std::string describe(const Place& place) {
    return place.file + ": line " + std::to_string(place.line) + ", column " + std::to_string(place.column) +
           ", byte " + std::to_string(place.offset);
}

void appendPlace(const Place& place, bool showFile, std::string& out) {
    if (showFile) {
        out.append(place.file) += ':';
    }
    out.append(std::to_string(place.line)) += ':';
    out.append(std::to_string(place.column)) += ':';
    out.append(std::to_string(place.offset));
}

} // namespace host
