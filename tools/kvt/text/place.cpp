#include "text/place.h"

namespace host {

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
