#include "translate/job.h"

#include "base/failure.h"
#include "base/text.h"
#include "cli/choices.h"

#include <algorithm>

namespace host {

char asciiCharacter(const std::string& option, const std::string& typed) {
    static const Choices<char> names = {{"tab", '\t'},  {"comma", ','}, {"semicolon", ';'},   {"pipe", '|'},
                                        {"space", ' '}, {"quote", '"'}, {"apostrophe", '\''}, {"\\t", '\t'}};
    const auto named =
        std::find_if(names.begin(), names.end(), [&](const auto& row) { return row.first == typed; });
    if (named != names.end()) {
        return named->second;
    }
    const bool isOne = typed.size() == 1 && typed[0] > 0 && typed[0] < 127;
    const bool isLetter =
        isOne && ((typed[0] >= 'a' && typed[0] <= 'z') || (typed[0] >= 'A' && typed[0] <= 'Z'));
    const bool isDigit = isOne && typed[0] >= '0' && typed[0] <= '9';
    if (!isOne || isLetter || isDigit || typed[0] == '\n' || typed[0] == '\r') {
        throw Failure(option +
                      " takes one character of ASCII that is not a letter, a digit or a line end, or one of "
                      "the words tab, "
                      "comma, semicolon, pipe, space, quote and apostrophe, not '" +
                      printable(typed) + "'");
    }
    return typed[0];
}

} // namespace host
