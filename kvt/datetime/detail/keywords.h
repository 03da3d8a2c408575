// Formats that are lists of keywords, "ZQT|ISO" in any case, and not patterns.
#pragma once

#include <kvt/datetime/detail/text.h>

#include <algorithm>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

enum class Keyword {
    Zqt, ///< the canonical form
    Iso, ///< the extended form of ISO 8601
};

/// A format that is not a pattern names keywords.
inline bool isKeywordList(std::string_view format) noexcept {
    return std::find(format.begin(), format.end(), '%') == format.end(); // mostly the first of them
}

/// The keyword that an item of a list names, in any case, if any. Letters beyond ASCII have no part in it: those whose
/// upper case is ASCII are longer, and a UString keeps its length when it is brought into upper case.
inline std::optional<Keyword> keywordOf(std::string_view item) noexcept {
    const auto isText = [](std::string_view text, std::string_view upperCase) {
        return std::equal(text.begin(), text.end(), upperCase.begin(), upperCase.end(),
                          [](char c, char upper) {
                              return (c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c) == upper;
                          });
    };
    item = trimmed(item);
    return isText(item, "ZQT")   ? std::optional(Keyword::Zqt)
           : isText(item, "ISO") ? std::optional(Keyword::Iso)
                                 : std::nullopt;
}

/// Calls `use` with each item of a list, in order, until it answers true.
template <typename Use>
void forEachItem(std::string_view list, Use use) {
    while (true) {
        const std::size_t end = std::min(list.find('|'), list.size());
        if (use(list.substr(0, end)) || end == list.size()) {
            return;
        }
        list.remove_prefix(end + 1);
    }
}

/// Calls `use` with each known keyword of a list, in order, until it answers true; whether any was known.
template <typename Use>
bool forEachKeyword(std::string_view list, Use use) {
    bool anyKnown = false;
    forEachItem(list, [&](std::string_view item) {
        const std::optional<Keyword> keyword = keywordOf(item);
        anyKnown |= keyword.has_value();
        return keyword && use(*keyword);
    });
    return anyKnown;
}

} // namespace kvt::ex::datetime::detail
