// Boost.Regex's own cases, read from the calls in its test programs. Those for Perl's syntax with the defaults are what
// URegex promises.
#include "regex_cases.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <cstring>
#include <filesystem>

namespace conformance {
namespace {

namespace fs = std::filesystem;

// The source without what is in comments and what is for older compilers only; its lines keep their numbers.
std::string activeSource(const fs::path& path) {
    std::string source;
    bool comment = false;
    bool forOthers = false;
    for (const std::string& line : linesOf(contentsOf(path))) {
        const std::size_t first = std::min(line.find_first_not_of(" \t"), line.size());
        const auto begins = [&](const char* with) {
            return line.compare(first, std::strlen(with), with) == 0;
        };
        comment = comment || begins("/*");
        forOthers = forOthers || begins("#ifdef BOOST_REGEX_CXX03");
        source += (comment || forOthers || begins("//") ? "" : line) + "\n";
        comment = comment && line.find("*/") == std::string::npos;
        forOthers = forOthers && !begins("#endif");
    }
    return source;
}

// The arguments of a call whose opening parenthesis stands in front of `at`, as they are written; `at` comes to stand
// behind the closing one.
std::vector<std::string> argumentsAt(const std::string& source, std::size_t& at) {
    std::vector<std::string> arguments(1);
    int depth = 1;
    for (bool quoted = false; at < source.size(); ++at) {
        const char c = source[at];
        if (c == '\\' && quoted) {
            arguments.back() += source.substr(at++, 2);
            continue;
        }
        quoted = quoted != (c == '"');
        depth += quoted || (c != '(' && c != ')') ? 0 : c == '(' ? 1 : -1;
        if (depth == 0) {
            ++at;
            break;
        }
        if (c == ',' && !quoted && depth == 1) {
            arguments.emplace_back();
        } else {
            arguments.back() += c;
        }
    }
    return arguments;
}

// The text of string literals that stand one behind the other.
std::string literal(const std::string& argument) {
    std::string text;
    bool quoted = false;
    for (std::size_t at = 0; at < argument.size(); ++at) {
        if (argument[at] == '"') {
            quoted = !quoted;
        } else if (quoted && argument[at] == '\\') {
            const std::string letters = "ntrfvab";
            const char mark = argument[++at];
            if (const std::size_t known = letters.find(mark); known != std::string::npos) {
                text += "\n\t\r\f\v\a\b"[known];
            } else if (mark == 'x' || (mark >= '0' && mark <= '7')) {
                std::size_t used = 0;
                const std::string digits = argument.substr(at + (mark == 'x' ? 1 : 0), mark == 'x' ? 2 : 3);
                text += static_cast<char>(std::stoi(digits, &used, mark == 'x' ? 16 : 8));
                at += used - (mark == 'x' ? 0 : 1);
            } else {
                text += mark;
            }
        } else if (quoted) {
            text += argument[at];
        }
    }
    return text;
}

std::string withoutBlanks(std::string text) {
    text.erase(std::remove_if(text.begin(), text.end(), [](unsigned char c) { return std::isspace(c) != 0; }),
               text.end());
    return text;
}

// "make_array(0, 2, 1, 1, -2, -2)": the places of the first match, which -2 ends.
Places firstMatch(const std::string& argument) {
    std::vector<std::ptrdiff_t> numbers;
    std::string digits;
    for (const char c : argument.substr(argument.find('('))) {
        if (c == '-' || std::isdigit(static_cast<unsigned char>(c))) {
            digits += c;
        } else if (!digits.empty()) {
            numbers.push_back(std::stol(digits));
            digits.clear();
        }
    }
    Places places;
    for (std::size_t i = 0; i + 1 < numbers.size() && numbers[i] != -2; i += 2) {
        places.emplace_back(numbers[i], numbers[i + 1]);
    }
    return places;
}

// Boost's tables name the groups that the match has; a pattern may have more behind them.
bool agree(const std::optional<Places>& found, const Places& expected) {
    if (!found || found->empty() || expected.empty()) {
        return found && found->empty() == expected.empty();
    }
    for (std::size_t i = 0; i < found->size(); ++i) {
        const Place place = i < expected.size() ? expected[i] : Place{-1, -1};
        if ((*found)[i] != place && !((*found)[i].first < 0 && place.first < 0)) {
            return false;
        }
    }
    return true;
}

// The modifiers in front of a pattern that stand for flags; nothing for flags that have none.
std::optional<std::string> modifiersOf(const std::string& flags) {
    std::string modifiers;
    std::string taken;
    for (std::size_t at = 0; at <= flags.size();) {
        const std::size_t end = std::min(flags.find('|', at), flags.size());
        std::string flag = flags.substr(at, end - at);
        flag = flag.substr(flag.rfind(':') + 1);
        at = end + 1;
        if (flag == "icase") {
            modifiers += 'i';
        } else if (flag == "mod_x") {
            modifiers += 'x';
        } else if (flag == "mod_s") {
            modifiers += 's';
        } else if (flag == "no_mod_s") {
            taken += 's';
        } else if (flag == "no_mod_m") {
            taken += 'm';
        } else if (flag != "perl") {
            return std::nullopt;
        }
    }
    return modifiers.empty() && taken.empty() ? ""
                                              : "(?" + modifiers + (taken.empty() ? "" : "-" + taken) + ")";
}

void tryCall(Suite& suite, bool valid, const std::vector<std::string>& arguments, const std::string& place) {
    const std::optional<std::string> modifiers = modifiersOf(withoutBlanks(arguments.at(1)));
    if (withoutBlanks(arguments.at(1)).find("perl") == std::string::npos) {
        suite.leaveOut("other syntaxes than Perl's");
    } else if (!modifiers) {
        suite.leaveOut("flags that URegex does not have");
    } else if (valid && withoutBlanks(arguments.at(3)) != "match_default") {
        suite.leaveOut("flags that URegex does not have");
    } else {
        const std::string pattern = *modifiers + literal(arguments.at(0));
        const std::string text = valid ? literal(arguments.at(2)) : "";
        const std::optional<Places> found = foundByKvt(pattern, text);
        suite.check(valid ? agree(found, firstMatch(arguments.at(4))) : !found,
                    place + ": " + arguments.at(0) + " on " + (valid ? arguments.at(2) : "") + " found " +
                        shown(found));
    }
}

TEST(ConformanceBoostRegex, MatchesAsBoostsOwnCasesSay) {
    const std::string package = "boost";
    if (sourceFolder(package).empty()) {
        GTEST_SKIP() << noSources(package);
    }
    Suite suite("Boost.Regex's cases", "Boost " + sourceVersion(package));
    std::vector<fs::path> files;
    for (const fs::directory_entry& entry :
         fs::directory_iterator(sourceFolder(package) + "/libs/regex/test/regress")) {
        if (entry.path().extension() == ".cpp") {
            files.push_back(entry.path());
        }
    }
    std::sort(files.begin(), files.end());
    for (const fs::path& path : files) {
        const std::string source = activeSource(path);
        for (const std::string& call :
             {std::string("TEST_REGEX_SEARCH("), std::string("TEST_INVALID_REGEX(")}) {
            for (std::size_t at = 0; (at = source.find(call, at)) != std::string::npos;) {
                const auto line =
                    std::count(source.begin(), source.begin() + static_cast<std::ptrdiff_t>(at), '\n') + 1;
                at += call.size();
                const std::vector<std::string> arguments = argumentsAt(source, at);
                tryCall(suite, call[5] == 'R', arguments,
                        path.filename().string() + ":" + std::to_string(line));
            }
        }
    }
    suite.finish();
}

} // namespace
} // namespace conformance
