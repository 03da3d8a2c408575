// The nearest of some words to one that was mistyped.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace host {

/// The words that `typed` was probably meant to be, nearest first, at most three. Case, blanks, hyphens and
/// underscores do not count as differences between words, but decide between words that are otherwise as near.
std::vector<std::string> nearest(std::string_view typed, const std::vector<std::string>& words);

/// " Did you mean 'a'?", " Did you mean 'a', 'b' or 'c'?", or nothing.
std::string didYouMean(std::string_view typed, const std::vector<std::string>& words);

} // namespace host
