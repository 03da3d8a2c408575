#include "infer/month_words.h"

#include "translate/icu_data.h"

#include <algorithm>
#include <array>
#include <map>

namespace host {

namespace {

using MonthTable = std::map<std::string, std::vector<MonthMeaning>, std::less<>>;

MonthTable makeTable() {
    MonthTable table;
    for (std::size_t language = 0; language < monthLanguages().size(); ++language) {
        const auto all = monthNames(monthLanguages()[language]);
        for (std::size_t month = 0; all && month < all->size(); ++month) {
            for (const std::string& name : (*all)[month]) {
                std::vector<MonthMeaning>& meanings = table[foldedName(name)];
                auto meaning = std::find_if(meanings.begin(), meanings.end(),
                                            [&](const MonthMeaning& other) { return other.month == month; });
                if (meaning == meanings.end()) {
                    meaning = meanings.insert(meanings.end(), {month, 0});
                }
                meaning->languages |= std::uint32_t{1} << language;
            }
        }
    }
    return table;
}

} // namespace

const std::vector<std::string>& monthLanguages() {
    static const std::vector<std::string> languages = {"es", "pt", "fr", "de", "it", "pl", "nl", "ru", "uk",
                                                       "tr", "ro", "cs", "hu", "sv", "da", "nb", "fi", "el",
                                                       "bg", "sk", "hr", "sl", "sr", "lt", "lv", "et", "id"};
    return languages;
}

const std::vector<MonthMeaning>& monthsOfWord(std::string_view word) {
    static const MonthTable table = makeTable();
    static const std::vector<MonthMeaning> none;
    const auto found = table.find(foldedName(word));
    return found == table.end() ? none : found->second;
}

std::string_view englishMonth(std::size_t month) {
    static constexpr std::array<std::string_view, 12> names = {
        "January", "February", "March",     "April",   "May",      "June",
        "July",    "August",   "September", "October", "November", "December"};
    return names[month];
}

} // namespace host
