// An option or operand that takes one of a few words.
#pragma once

#include "base/failure.h"
#include "base/text.h"
#include "cli/suggest.h"

#include <string>
#include <utility>
#include <vector>

namespace host {

/// The words, and what each stands for.
template <typename Value>
using Choices = std::vector<std::pair<std::string, Value>>;

/// The words alone.
template <typename Value>
std::vector<std::string> wordsOf(const Choices<Value>& choices) {
    std::vector<std::string> words;
    for (const auto& choice : choices) {
        words.push_back(choice.first);
    }
    return words;
}

/// The value of the word `typed`, given for `what`. Throws Failure when it is not one of the words; the failure
/// suggests the nearest.
template <typename Value>
Value choose(const std::string& what, const std::string& typed, const Choices<Value>& choices) {
    std::string list;
    for (const auto& [name, value] : choices) {
        if (name == typed) {
            return value;
        }
        list += (list.empty() ? "" : ", ") + name;
    }
    throw Failure(what + " takes one of " + list + ", not '" + printable(typed) + "'." +
                  didYouMean(typed, wordsOf(choices)));
}

} // namespace host
