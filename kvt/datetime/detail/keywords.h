// Formats that are lists of keywords, "ZQT|ISO" in any case, and not patterns.
#pragma once

#include <kvt/datetime/detail/text.h>
#include <kvt/string/ustring.h>

#include <algorithm>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

enum class Keyword {
    Zqt, ///< the canonical form
    Iso, ///< the extended form of ISO 8601
};

/// A format that is no pattern names keywords.
inline bool isKeywordList(std::string_view format) noexcept {
    return format.find('%') == std::string_view::npos;
}

/// The keyword that an item of a list names, if any.
inline std::optional<Keyword> keywordOf(std::string_view item) {
    constexpr std::size_t longest = 8; // bytes; a letter beyond ASCII may stand for an ASCII one in upper case
    item = trimmed(item);
    if (item.empty() || item.size() > longest) {
        return std::nullopt;
    }
    const UString<0> upper = UString<0>::getAsUpperCase(UStringView<0>(item));
    const std::string_view name = viewOf(upper);
    return name == "ZQT"   ? std::optional(Keyword::Zqt)
           : name == "ISO" ? std::optional(Keyword::Iso)
                           : std::nullopt;
}

/// Calls `use` with each known keyword of a list, in order, until it answers true; whether any was known.
template <typename Use>
bool forEachKeyword(std::string_view list, Use use) {
    bool anyKnown = false;
    while (true) {
        const std::size_t end = std::min(list.find('|'), list.size());
        if (const auto keyword = keywordOf(list.substr(0, end))) {
            anyKnown = true;
            if (use(*keyword)) {
                return true;
            }
        }
        if (end == list.size()) {
            return anyKnown;
        }
        list.remove_prefix(end + 1);
    }
}

} // namespace kvt::ex::datetime::detail
