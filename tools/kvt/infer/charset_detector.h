// What the detector of ICU thinks of bytes whose encoding nobody has named. It is the only door to it.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace host {

struct CharsetGuess {
    std::string name;   ///< as ICU names it, such as "windows-1252"
    int confidence = 0; ///< 0 to 100
};

/// The most likely one first; empty where the detector has no opinion or cannot be had.
std::vector<CharsetGuess> detectCharsets(std::string_view bytes);

} // namespace host
