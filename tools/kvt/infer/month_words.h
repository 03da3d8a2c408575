// Which words name months, and in which languages.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// What a word means as a month.
struct MonthMeaning {
    std::size_t month;       ///< from 0
    std::uint32_t languages; ///< a bit for each of monthLanguages() that means it so
};

/// The languages that are tried, by their codes; those that are spoken most come first. English is not one of them.
const std::vector<std::string>& monthLanguages();

/// The months that a word names, in any case and with the dot that it may end with; none for any other word.
const std::vector<MonthMeaning>& monthsOfWord(std::string_view word);

/// The English names.
std::string_view englishMonth(std::size_t month);

} // namespace host
