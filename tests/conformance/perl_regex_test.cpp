// perl's own cases for its regular expressions: a pattern, a text, whether it matches, and an expression that shows a
// part of the match.
//
// perl's ".", "^" and "$" mean other things than those of kvt unless the modifiers s and m are set, so that each pattern
// gets the modifiers of the case in front, the others taken away. What perl has and Boost.Regex has not, or means in
// another way, is left out; that it is Boost.Regex which says so is looked up.
#include "regex_cases.h"

#include <gtest/gtest.h>

#include <boost/version.hpp>

#include <algorithm>
#include <cctype>

namespace conformance {
namespace {

std::vector<std::string> splitAtTabs(const std::string& line) {
    std::vector<std::string> fields(1);
    for (const char byte : line) {
        if (byte == '\t') {
            fields.emplace_back();
        } else {
            fields.back() += byte;
        }
    }
    return fields;
}

// The text of "..." in perl, or nothing where it has variables in it, or characters that are no bytes.
std::optional<std::string> unquoted(const std::string& source) {
    std::string text;
    for (std::size_t at = 0; at < source.size(); ++at) {
        const bool variable = (source[at] == '$' || source[at] == '@') && at + 1 < source.size() &&
                              (std::isalnum(static_cast<unsigned char>(source[at + 1])) ||
                               source[at + 1] == '{' || source[at + 1] == '&');
        if (variable || static_cast<unsigned char>(source[at]) >= 0x80) {
            return std::nullopt;
        }
        if (source[at] != '\\' || at + 1 == source.size()) {
            text += source[at];
            continue;
        }
        const char mark = source[++at];
        const std::string letters = "ntrfeab";
        if (const std::size_t known = letters.find(mark); known != std::string::npos) {
            text += "\n\t\r\f\x1B\a\b"[known];
        } else if (mark == 'x') {
            const bool braces = at + 1 < source.size() && source[at + 1] == '{';
            std::size_t end = at + (braces ? 2 : 1);
            const std::size_t limit = braces ? source.find('}', end) : std::min(source.size(), end + 2);
            unsigned value = 0;
            for (; end < limit && std::isxdigit(static_cast<unsigned char>(source[end])); ++end) {
                value = value * 16 + static_cast<unsigned>(std::stoi(source.substr(end, 1), nullptr, 16));
            }
            if (value >= 0x80 || limit == std::string::npos) {
                return std::nullopt;
            }
            text += static_cast<char>(value);
            at = braces ? limit : end - 1;
        } else if (mark >= '0' && mark <= '7') {
            std::size_t end = at;
            unsigned value = 0;
            for (; end < std::min(source.size(), at + 3) && source[end] >= '0' && source[end] <= '7'; ++end) {
                value = value * 8 + static_cast<unsigned>(source[end] - '0');
            }
            if (value >= 0x80) {
                return std::nullopt;
            }
            text += static_cast<char>(value);
            at = end - 1;
        } else if (std::isalpha(static_cast<unsigned char>(mark))) {
            return std::nullopt; // \N{...}, \U and their like
        } else {
            text += mark;
        }
    }
    return text;
}

// What perl puts in for the expression behind a match: "$&-$1", "$-[0]" and so on; nothing for other variables.
std::optional<std::string> evaluated(const std::string& expression, const Places& places,
                                     const std::string& text) {
    if (expression == "pos") {
        return std::to_string(places[0].second);
    }
    std::string value;
    for (std::size_t at = 0; at < expression.size(); ++at) {
        if (expression[at] != '$') {
            if (expression[at] == '@' || expression[at] == '\\') {
                return std::nullopt;
            }
            value += expression[at];
            continue;
        }
        const std::string rest = expression.substr(at + 1);
        const auto textOf = [&](std::size_t group) {
            const Place place = group < places.size() ? places[group] : Place{-1, -1};
            return place.first < 0 ? ""
                                   : text.substr(static_cast<std::size_t>(place.first),
                                                 static_cast<std::size_t>(place.second - place.first));
        };
        if (rest.rfind('&', 0) == 0) {
            value += textOf(0);
            at += 1;
        } else if ((rest[0] == '-' || rest[0] == '+') && rest.size() > 3 && rest[1] == '[' &&
                   rest[3] == ']') {
            const auto group = static_cast<std::size_t>(rest[2] - '0');
            const Place place = group < places.size() ? places[group] : Place{-1, -1};
            value += place.first < 0 ? "" : std::to_string(rest[0] == '-' ? place.first : place.second);
            at += 4;
        } else if (std::isdigit(static_cast<unsigned char>(rest[0]))) {
            std::size_t digits = 0;
            const auto group = static_cast<std::size_t>(std::stoul(rest, &digits));
            value += textOf(group);
            at += digits;
        } else {
            return std::nullopt;
        }
    }
    return value;
}

struct Case {
    std::string line;
    std::string pattern; ///< with its modifiers in front
    std::string text;
    char result = 0; ///< y: it matches, n: it does not, c: perl does not compile it
    std::string expression;
    std::string expected;
};

// The case of a line, or why it cannot be one here.
std::string readCase(const std::string& line, Case& found) {
    std::string interpolated = line;
    for (std::size_t at = 0; (at = interpolated.find("\\n", at)) != std::string::npos;) {
        interpolated.replace(at, 2, "\n"); // perl's driver does so before it looks at anything
    }
    std::vector<std::string> fields = splitAtTabs(interpolated);
    fields.resize(std::max<std::size_t>(fields.size(), 6));
    std::string result = fields[2];
    result.erase(
        std::remove_if(result.begin(), result.end(), [](char c) { return c == 'M' || c == 'a' || c == 'S'; }),
        result.end());
    if (!fields[5].empty() || (result != "y" && result != "n" && result != "c")) {
        return "cases that perl's own run skips or knows to fail";
    }
    std::string pattern = fields[0];
    std::string modifiers;
    if (pattern.front() == '\'' || pattern.front() == '/' || pattern.front() == ':') {
        const std::size_t end = pattern.find_last_of(pattern.front());
        modifiers = pattern.substr(end + 1);
        pattern = pattern.substr(1, end - 1);
    }
    if (pattern.find("${") != std::string::npos) {
        return "patterns and texts with perl's variables, or with characters beyond ASCII";
    }
    if (modifiers.find_first_not_of("imsx") != std::string::npos ||
        modifiers.find("xx") != std::string::npos) {
        return "modifiers that Boost.Regex does not have";
    }
    const std::optional<std::string> text = unquoted(fields[1]);
    const std::optional<std::string> expected = unquoted(fields[4]);
    if (!text || (result == "y" && !expected) || std::any_of(pattern.begin(), pattern.end(), [](char c) {
            return static_cast<unsigned char>(c) >= 0x80;
        })) {
        return "patterns and texts with perl's variables, or with characters beyond ASCII";
    }
    std::string without;
    for (const char modifier : std::string("imsx")) {
        without += modifiers.find(modifier) == std::string::npos ? std::string(1, modifier) : "";
    }
    found = {line,      "(?" + modifiers + (without.empty() ? "" : "-" + without) + ")" + pattern,
             *text,     result[0],
             fields[3], result == "y" ? *expected : ""};
    return "";
}

// Whether what was found is what perl finds; nothing where the expression cannot be told from a match alone.
std::optional<bool> isRight(const Case& wanted, const std::optional<Places>& found) {
    if (wanted.result == 'c' || !found) {
        return (wanted.result == 'c') == !found;
    }
    if (found->empty() || wanted.result == 'n') {
        return found->empty() == (wanted.result == 'n');
    }
    const std::optional<std::string> value = evaluated(wanted.expression, *found, wanted.text);
    return value ? std::optional<bool>(*value == wanted.expected) : std::nullopt;
}

TEST(ConformancePerlRegex, MatchesAsPerlWhereTheSyntaxIsTheSame) {
    if (sourceFolder("perl").empty()) {
        GTEST_SKIP() << noSources("perl");
    }
    Suite suite("perl's cases of regular expressions",
                "perl " + sourceVersion("perl") + ", Boost " + std::to_string(BOOST_VERSION / 100));
    bool begun = false;
    for (const std::string& line : linesOf(contentsOf(sourceFolder("perl") + "/t/re/re_tests"))) {
        begun = begun || line == "__END__";
        if (!begun || line == "__END__" || line.find('\t') == std::string::npos || line[0] == '#') {
            continue;
        }
        Case wanted;
        if (const std::string reason = readCase(line, wanted); !reason.empty()) {
            suite.leaveOut(reason);
            continue;
        }
        const std::optional<Places> found = foundByKvt(wanted.pattern, wanted.text);
        const std::optional<bool> right = isRight(wanted, found);
        if (!right) {
            suite.leaveOut("expressions of other things than groups and places");
        } else if (*right || found != foundByBoost(wanted.pattern, wanted.text)) {
            suite.check(*right, line + "\n    gave " + shown(found));
        } else if (!found) {
            suite.leaveOut("syntax that Boost.Regex does not have");
        } else if (wanted.result == 'c') {
            suite.leaveOut("patterns that perl refuses and Boost.Regex takes");
        } else {
            suite.leaveOut("patterns that mean something else to Boost.Regex");
        }
    }
    suite.finish();
}

} // namespace
} // namespace conformance
