#include "translate/problem.h"

#include "base/messages.h"

#include <algorithm>
#include <array>

namespace host {

namespace {

constexpr std::array<Message, 7> ownMessages = {{
    {problem_number::quoteNeverEnds, "The quote that opens here is never closed."},
    {problem_number::textBehindQuote, "There is text behind the closing quote."},
    {problem_number::nul, "The row has a byte of zero."},
    {problem_number::cellCount, "The row has %0, but the table has %1."},
    {problem_number::notANumber, "\"%0\" is not a number as it is written in %1."},
    {problem_number::pieceCount, "\"%0\" gives %1, but there are columns for %2."},
    {problem_number::regexTakesTooLong, "The regular expression takes too long on \"%0\"."},
}};

} // namespace

Problem makeProblem(std::uint32_t number, const std::vector<std::string>& parameters) {
    const auto own = std::find_if(ownMessages.begin(), ownMessages.end(),
                                  [&](const Message& message) { return message.number == number; });
    return {number, own != ownMessages.end() ? fill(own->text, parameters) : describe(number, parameters)};
}

} // namespace host
