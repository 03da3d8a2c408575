#include "regex_cases.h"

#include <kvt/regex/uregex.h>

#include <stdexcept>

namespace conformance {

using kvt::ex::URegex;
using kvt::ex::URegexMatch;
using kvt::ex::UString;

std::optional<Places> foundByKvt(const std::string& pattern, const std::string& text) {
    const auto bytes = [](const std::string& from) { return UString<28>(from.data(), from.size()); };
    try {
        const URegexMatch<28> match = URegex<28>(bytes(pattern)).search(bytes(text));
        Places places;
        for (const auto& [position, length] : match.groups()) {
            const auto begin = static_cast<std::ptrdiff_t>(position); // npos is -1
            places.emplace_back(begin, begin < 0 ? -1 : begin + static_cast<std::ptrdiff_t>(length));
        }
        return places;
    } catch (const std::runtime_error&) {
        return std::nullopt;
    }
}

std::optional<Places> foundByBoost(const std::string& pattern, const std::string& text) {
    try {
        const boost::regex regex(pattern, boost::regex::perl);
        boost::smatch match;
        Places places;
        if (boost::regex_search(text, match, regex)) {
            for (const auto& group : match) {
                places.emplace_back(group.matched ? group.first - text.begin() : -1,
                                    group.matched ? group.second - text.begin() : -1);
            }
        }
        return places;
    } catch (const std::runtime_error&) {
        return std::nullopt;
    }
}

std::string shown(const std::optional<Places>& places) {
    if (!places) {
        return "a failure";
    }
    std::string text = places->empty() ? "nothing" : "";
    for (const auto& [begin, end] : *places) {
        text += " " + std::to_string(begin) + "-" + std::to_string(end);
    }
    return text;
}

} // namespace conformance
