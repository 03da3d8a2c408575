// What the tests of regular expressions share: the outcome of a search in one comparable value, by the library and by
// the engine used directly, and a reader's own translation of the old dialect.
#pragma once

#include <kvt/regex/obsolete_regexp.h>
#include <kvt/regex/uregex.h>

#include <boost/regex.hpp>

#include <cstdint>
#include <locale>
#include <ostream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace kvt::test {

using Span = std::pair<std::uint64_t, std::uint64_t>;
using Spans = std::vector<Span>;

inline constexpr std::uint64_t none = ~std::uint64_t{0};

/// A failure of the engine; code -1 when there was none.
struct EngineError {
    int code = -1;
    std::ptrdiff_t position = 0;
    std::string text;

    bool operator==(const EngineError&) const = default;
};

inline std::ostream& operator<<(std::ostream& out, const EngineError& error) {
    return out << "error " << error.code << " at " << error.position << ": " << error.text;
}

/// Runs `operation` and gives what the engine threw.
template <typename Operation>
EngineError errorOf(Operation operation) {
    try {
        operation();
        return {};
    } catch (const boost::regex_error& error) {
        return {static_cast<int>(error.code()), error.position(), error.what()};
    }
}

/// Groups, empty when nothing matched, or the failure.
struct Found {
    Spans groups;
    EngineError error;

    bool operator==(const Found&) const = default;
};

inline std::ostream& operator<<(std::ostream& out, const Found& found) {
    for (const auto& [position, length] : found.groups) {
        out << "(" << static_cast<std::int64_t>(position) << ", " << length << ") ";
    }
    return out << found.error;
}

template <std::uint32_t N>
ex::UString<N> units(std::string_view bytes) {
    return ex::UString<N>(ex::UStringView<N>(bytes));
}

template <std::uint32_t N>
Spans groupsOf(const ex::URegexMatch<N>& match) {
    return {match.groups().begin(), match.groups().end()};
}

template <std::uint32_t N>
Found matchedBy(const ex::URegex<N>& regex, std::string_view subject) {
    Found found;
    found.error = errorOf([&] { found.groups = groupsOf(regex.match(units<N>(subject))); });
    return found;
}

template <std::uint32_t N>
Found searchedBy(const ex::URegex<N>& regex, std::string_view subject, std::uint64_t start) {
    Found found;
    found.error = errorOf([&] { found.groups = groupsOf(regex.search(units<N>(subject), start)); });
    return found;
}

/// The same by the engine. Offsets are taken from the iterators, not from the engine's own arithmetic.
inline Spans engineGroups(const boost::match_results<std::string_view::const_iterator>& result,
                          std::string_view subject, std::uint64_t start) {
    Spans groups;
    for (const auto& group : result) {
        if (group.matched) {
            groups.emplace_back(group.first - subject.begin(), group.second - group.first);
        } else {
            groups.emplace_back(start - 1, 0);
        }
    }
    return groups;
}

inline Found matchedByEngine(const boost::regex& regex, std::string_view subject) {
    Found found;
    boost::match_results<std::string_view::const_iterator> result;
    found.error = errorOf([&] {
        if (boost::regex_match(subject.begin(), subject.end(), result, regex)) {
            found.groups = engineGroups(result, subject, 0);
        }
    });
    return found;
}

inline Found searchedByEngine(const boost::regex& regex, std::string_view subject, std::uint64_t start) {
    Found found;
    boost::match_results<std::string_view::const_iterator> result;
    found.error = errorOf([&] {
        if (boost::regex_search(subject.begin() + static_cast<std::ptrdiff_t>(start), subject.end(), result,
                                regex)) {
            found.groups = engineGroups(result, subject, start);
        }
    });
    return found;
}

/// The groups of all matches, and the failure that ended the search for them.
struct AllFound {
    std::vector<Spans> matches;
    EngineError error;

    bool operator==(const AllFound&) const = default;
};

inline std::ostream& operator<<(std::ostream& out, const AllFound& all) {
    for (const Spans& groups : all.matches) {
        out << "[" << Found{groups, {}} << "] ";
    }
    return out << all.error;
}

template <std::uint32_t N>
AllFound allFoundBy(const ex::URegex<N>& regex, std::string_view subject) {
    AllFound all;
    all.error = errorOf([&] {
        regex.searchAll(units<N>(subject), [&](const ex::URegexMatch<N>& match) {
            all.matches.push_back(groupsOf(match));
            return true;
        });
    });
    return all;
}

inline AllFound allFoundByEngine(const boost::regex& regex, std::string_view subject) {
    using Iterator = boost::regex_iterator<std::string_view::const_iterator>;
    AllFound all;
    all.error = errorOf([&] {
        for (Iterator match(subject.begin(), subject.end(), regex); match != Iterator(); ++match) {
            all.matches.push_back(engineGroups(*match, subject, 0));
        }
    });
    return all;
}

/// Position and length as ObsoleteRegexp gives them.
inline Span indexedBy(const ObsoleteRegexp& regexp, std::string_view text, std::uint64_t start) {
    std::uint64_t length = 12345;
    const std::uint64_t position = regexp.index(text.data(), text.size(), &length, start);
    return {position, length};
}

/// The old dialect in Perl syntax: looks for one character after the other in the text that grows as it goes, and
/// escapes it in place.
inline std::string perlByHand(std::string pattern) {
    std::size_t pos = 0;
    for (;;) {
        const std::size_t i = pattern.find_first_of("{}()|$", pos);
        if (i == std::string::npos) {
            return pattern;
        }
        if (pattern[i] == '$' && i == pattern.size() - 1) {
            return pattern;
        }
        if (i > 0 && pattern[i - 1] == '\\') {
            pos = i + 1;
        } else {
            pattern.insert(i, "\\");
            pos = i + 2;
        }
    }
}

/// A pattern compiled while letters of the global locale include "!", which they do not in the classic one.
inline ex::URegex<0> compiledWithExclamationLetters(const char* pattern) {
    class Letters : public std::ctype<char> {
    public:
        Letters() : std::ctype<char>(table()) {}

    private:
        static const mask* table() {
            static const std::vector<mask> masks = [] {
                std::vector<mask> all(classic_table(), classic_table() + table_size);
                all['!'] = alpha | lower | print | graph;
                return all;
            }();
            return masks.data();
        }
    };
    const std::locale before = std::locale::global(std::locale(std::locale::classic(), new Letters));
    const ex::URegex<0> regex(pattern);
    std::locale::global(before);
    return regex;
}

/// Calls `use` for each text of at most `longest` characters of the alphabet, the empty one first.
template <typename Use>
void forEachShortText(std::string_view alphabet, std::size_t longest, Use use) {
    std::vector<std::string> round = {""};
    for (std::size_t length = 0; length <= longest; ++length) {
        std::vector<std::string> longer;
        for (const std::string& text : round) {
            use(text);
            if (length < longest) {
                for (const char unit : alphabet) {
                    longer.push_back(text + unit);
                }
            }
        }
        round.swap(longer);
    }
}

} // namespace kvt::test
