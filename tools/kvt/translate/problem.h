// Why something could not be translated: the number of a message, and its text. Numbers are those of the library's
// messages, and some of the command's own for what only rows and cells have.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace host {

struct Problem {
    std::uint32_t number = 0; ///< 0: there is a text only
    std::string text;
};

namespace problem_number {
inline constexpr std::uint32_t quoteNeverEnds = 920001;
inline constexpr std::uint32_t textBehindQuote = 920002;   ///< none
inline constexpr std::uint32_t nul = 920003;               ///< none
inline constexpr std::uint32_t cellCount = 920004;         ///< "1 cell", "2 columns"
inline constexpr std::uint32_t notANumber = 920005;        ///< the value, the language
inline constexpr std::uint32_t pieceCount = 920006;        ///< the value, "3 pieces", "2"
inline constexpr std::uint32_t regexTakesTooLong = 920007; ///< the value
inline constexpr std::uint32_t badBytes = 910002;          ///< the bytes, the encoding
inline constexpr std::uint32_t notRepresentable = 910003;  ///< the text, its encoding, the other encoding
} // namespace problem_number

/// The problem of that number with its text, which the parameters are put into.
Problem makeProblem(std::uint32_t number, const std::vector<std::string>& parameters = {});

} // namespace host
