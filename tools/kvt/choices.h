// An option that takes one of a few words.
#pragma once

#include "failure.h"
#include "suggest.h"

#include <string>
#include <utility>
#include <vector>

namespace host {

/// The words, and what each stands for.
template <typename Value>
using Choices = std::vector<std::pair<std::string, Value>>;

/// Throws Failure when `typed` is not one of the words. The failure suggests the nearest.
template <typename Value>
Value choose(const std::string& option, const std::string& typed, const Choices<Value>& choices) {
    std::vector<std::string> names;
    std::string list;
    for (const auto& [name, value] : choices) {
        if (name == typed) {
            return value;
        }
        names.push_back(name);
        list += (list.empty() ? "" : ", ") + name;
    }
    throw Failure(option + " takes one of " + list + ", not '" + typed + "'." + didYouMean(typed, names));
}

} // namespace host
