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

/// The items of a list, from the first to the last. Even an empty list has one.
class KeywordList {
public:
    explicit KeywordList(std::string_view list) noexcept : rest_(list) {}

    /// The next item; none behind the last.
    std::optional<std::string_view> nextItem() noexcept {
        if (isAtEnd_) {
            return std::nullopt;
        }
        const std::size_t end = rest_.find('|');
        isAtEnd_ = end == std::string_view::npos;
        const std::string_view item = rest_.substr(0, end);
        rest_.remove_prefix(isAtEnd_ ? rest_.size() : end + 1);
        return item;
    }

    /// The next keyword, unknown ones being passed over; none behind the last.
    std::optional<Keyword> nextKeyword() noexcept {
        while (const std::optional<std::string_view> item = nextItem()) {
            if (const std::optional<Keyword> keyword = keywordOf(*item)) {
                return keyword;
            }
        }
        return std::nullopt;
    }

private:
    std::string_view rest_;
    bool isAtEnd_ = false;
};

} // namespace kvt::ex::datetime::detail
