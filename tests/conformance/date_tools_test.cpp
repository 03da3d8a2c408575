// The cases of a set of tools for dates: "$ dadd 2012-03-31 1mo" and the line that is printed for it. Those are tried that
// speak of the Gregorian calendar in the usual forms, of one length of time, and of flags that mean the same here.
#include "suite.h"

#include <kvt/datetime/datetime.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <optional>
#include <regex>
#include <sstream>

namespace conformance {
namespace {

namespace fs = std::filesystem;
using namespace kvt::ex::datetime;
using kvt::ex::UString;

// A command line in words; quotes keep blanks together.
std::vector<std::string> wordsOf(const std::string& line) {
    std::vector<std::string> words;
    char quote = 0;
    bool inWord = false;
    for (const char c : line) {
        if (quote == 0 && (c == '"' || c == '\'')) {
            quote = c;
            words.resize(words.size() + (inWord ? 0 : 1));
            inWord = true;
        } else if (c == quote) {
            quote = 0;
        } else if (c == ' ' && quote == 0) {
            inWord = false;
        } else {
            words.resize(words.size() + (inWord ? 0 : 1));
            inWord = true;
            words.back() += c;
        }
    }
    return words;
}

UString<0> text(const std::string& from) {
    return {from.data(), from.size()};
}

std::string asIso(const UString<0>& value) {
    return std::get<1>(format(value, text("ISO"))).toStdString();
}

UString<0> canonical(const std::string& iso) {
    return std::get<1>(parse(text(iso), text("ISO"), false));
}

// Whether a word is a value of ISO 8601 that there is: no day 0, no hour 24.
bool isValue(const std::string& word) {
    static const std::regex iso(R"(\d{4}-\d{2}-\d{2}(T\d{2}:\d{2}:\d{2})?|\d{2}:\d{2}:\d{2})");
    return std::regex_match(word, iso) && !canonical(word).isEmpty();
}

// "-8w" as "-P56D"; nothing for what is no one length of time.
std::optional<std::string> interval(const std::string& duration) {
    std::smatch part;
    if (!std::regex_match(duration, part, std::regex(R"(([+-]?)(\d+)(d|w|mo|y|h|m|s)?)"))) {
        return std::nullopt;
    }
    const long number = std::stol(part[2]);
    const std::string unit = part[3];
    const std::string sign = part[1] == "-" ? "-" : "";
    if (unit == "h" || unit == "m" || unit == "s") {
        return sign + "PT" + std::to_string(number) + static_cast<char>(std::toupper(unit[0]));
    }
    const long days = unit == "w" ? 7 * number : number;
    return sign + "P" + std::to_string(days) + (unit == "mo" ? "M" : unit == "y" ? "Y" : "D");
}

bool hasSharedFlags(const std::string& pattern) {
    static const std::regex shared(R"(([^%]|%[YmdHMSbBaA])*)");
    return pattern.find('%') != std::string::npos && std::regex_match(pattern, shared);
}

// What kvt prints for a command of the others; nothing where that means something else or nothing to it.
std::optional<std::string> printed(const std::vector<std::string>& words) {
    const auto isIso = [&](std::size_t index) { return index < words.size() && isValue(words[index]); };
    const std::string& tool = words.at(0);
    const bool adds = tool == "dadd" || tool == "dtadd" || tool == "tadd";
    if (adds && words.size() == 3 && isIso(1)) {
        const std::optional<std::string> length = interval(words[2]);
        return length ? std::optional(asIso(std::get<1>(add(canonical(words[1]), text(*length)))))
                      : std::nullopt;
    }
    const bool countsDays = words.size() == 3 || (words.size() == 5 && words[3] == "-f" && words[4] == "%d");
    if (tool == "ddiff" && countsDays && isIso(1) && isIso(2) && words[1].size() == 10 &&
        words[2].size() == 10) {
        const auto [state, days, message] =
            diffAsNumber(canonical(words[2]), canonical(words[1]), UnitType::Days);
        return std::to_string(static_cast<long>(days));
    }
    const bool converts = tool == "dconv" || tool == "dtconv" || tool == "tconv";
    if (converts && words.size() == 2 && isIso(1)) {
        return asIso(canonical(words[1]));
    }
    if (converts && words.size() == 4 && words[1] == "-f" && isIso(3) && hasSharedFlags(words[2])) {
        return std::get<1>(format(canonical(words[3]), text(words[2]))).toStdString();
    }
    if (converts && words.size() == 4 && words[2] == "-f" && isIso(1) && hasSharedFlags(words[3])) {
        return std::get<1>(format(canonical(words[1]), text(words[3]))).toStdString();
    }
    if (converts && words.size() == 4 && words[1] == "-i" && hasSharedFlags(words[2])) {
        return asIso(std::get<1>(parse(text(words[3]), text(words[2] + "$"), false)));
    }
    return std::nullopt;
}

TEST(ConformanceDateTools, PrintTheSameWhereTheyMeanTheSame) {
    const std::string package = "dateutils";
    if (sourceFolder(package).empty()) {
        GTEST_SKIP() << noSources(package);
    }
    Suite suite("dates of dateutils", package + " " + sourceVersion(package));
    std::vector<fs::path> files;
    for (const fs::directory_entry& entry : fs::directory_iterator(sourceFolder(package) + "/test")) {
        if (entry.path().extension() == ".ctst") {
            files.push_back(entry.path());
        }
    }
    std::sort(files.begin(), files.end());
    for (const fs::path& file : files) {
        const std::vector<std::string> lines = linesOf(contentsOf(file));
        const auto command = std::find_if(lines.begin(), lines.end(),
                                          [](const std::string& line) { return line.rfind("$ ", 0) == 0; });
        const bool printsOneLine =
            command != lines.end() && lines.end() - command > 2 && command[2].rfind('$', 0) == 0;
        const std::optional<std::string> is =
            printsOneLine ? printed(wordsOf(command->substr(2))) : std::optional<std::string>();
        if (is) {
            suite.check(*is == command[1], file.filename().string() + ": " + *command + " prints " + *is);
        } else {
            suite.leaveOut("other calendars, forms, lengths and options");
        }
    }
    suite.finish();
}

} // namespace
} // namespace conformance
