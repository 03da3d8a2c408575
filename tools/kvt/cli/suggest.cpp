#include "cli/suggest.h"

#include "base/text_units.h"

#include <algorithm>
#include <tuple>

namespace host {

namespace {

constexpr std::size_t mostSuggestions = 3;

std::string folded(std::string_view word) {
    std::string out;
    for (const char letter : word) {
        if (letter != '-' && letter != '_' && letter != ' ') {
            out += asciiLower(letter);
        }
    }
    return out;
}

// Insertions, deletions, replacements and swaps of neighbours that turn one word into the other.
std::size_t distance(std::string_view left, std::string_view right) {
    const std::size_t width = right.size() + 1;
    std::vector<std::size_t> cost((left.size() + 1) * width);
    const auto at = [&](std::size_t i, std::size_t j) -> std::size_t& { return cost[i * width + j]; };
    for (std::size_t i = 0; i <= left.size(); ++i) {
        for (std::size_t j = 0; j < width; ++j) {
            if (i == 0 || j == 0) {
                at(i, j) = i + j;
                continue;
            }
            const bool same = left[i - 1] == right[j - 1];
            at(i, j) = std::min({at(i - 1, j) + 1, at(i, j - 1) + 1, at(i - 1, j - 1) + (same ? 0 : 1)});
            if (i > 1 && j > 1 && left[i - 1] == right[j - 2] && left[i - 2] == right[j - 1]) {
                at(i, j) = std::min(at(i, j), at(i - 2, j - 2) + 1);
            }
        }
    }
    return at(left.size(), right.size());
}

} // namespace

std::vector<std::string> nearest(std::string_view typed, const std::vector<std::string>& words) {
    constexpr std::size_t longestWord = 64;
    if (typed.size() > longestWord) {
        return {};
    }
    using Candidate = std::tuple<std::size_t, std::size_t, std::string>;
    const std::string key = folded(typed);
    const std::size_t farthest = std::max<std::size_t>(1, key.size() / 3);
    std::vector<Candidate> candidates;
    for (const std::string& word : words) {
        const std::size_t steps = distance(key, folded(word));
        if (steps <= farthest) {
            candidates.emplace_back(steps, distance(typed, word), word);
        }
    }
    std::sort(candidates.begin(), candidates.end());
    std::vector<std::string> found;
    for (const Candidate& candidate : candidates) {
        // Only the nearest: a word that is one step away makes those at two steps noise.
        if (found.size() < mostSuggestions && std::get<0>(candidate) == std::get<0>(candidates.front()) &&
            (found.empty() || found.back() != std::get<2>(candidate))) {
            found.push_back(std::get<2>(candidate));
        }
    }
    return found;
}

std::string didYouMean(std::string_view typed, const std::vector<std::string>& words) {
    const std::vector<std::string> found = nearest(typed, words);
    std::string text;
    for (std::size_t index = 0; index < found.size(); ++index) {
        text += index == 0 ? " Did you mean " : index + 1 == found.size() ? " or " : ", ";
        text += "'" + found[index] + "'";
    }
    return text.empty() ? text : text + "?";
}

} // namespace host
