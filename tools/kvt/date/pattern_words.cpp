#include "date/pattern_words.h"

#include "base/messages.h"
#include "base/table.h"
#include "base/text.h"
#include "base/text_units.h"

#include <kvt/datetime/message_numbers.h>
#include <kvt/datetime/pattern_trace.h>

#include <algorithm>
#include <string_view>
#include <vector>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
using kvt::ex::UString;

// The column of the table that is about one of the two functions; empty for what it does not know.
using Words = UString<0> datetime::PatternElement::*;

// Whether one of the words between "|" is a keyword, in any case.
bool hasKeyword(const std::string& format) {
    for (std::size_t begin = 0; begin <= format.size();) {
        const std::size_t end = std::min(format.find('|', begin), format.size());
        std::string word = withoutBlanks(std::string_view(format).substr(begin, end - begin));
        std::transform(word.begin(), word.end(), word.begin(), asciiLower);
        if (word == "zqt" || word == "iso") {
            return true;
        }
        begin = end + 1;
    }
    return false;
}

std::string patternHelp(const char* heading, Words words) {
    std::vector<std::vector<std::string>> rows;
    for (const datetime::PatternElement& row : datetime::patternElements()) {
        if (!(row.*words).isEmpty()) {
            rows.push_back({" ", row.element.toStdString(), (row.*words).toStdString()});
        }
    }
    return std::string(heading) + "\n" + formatTable({Align::Left, Align::Left, Align::Left}, rows) + "\n";
}

std::vector<std::string> flags(Words words) {
    std::vector<std::string> known;
    for (const datetime::PatternElement& row : datetime::patternElements()) {
        const std::string element = row.element.toStdString();
        if (element.starts_with('%') && !(row.*words).isEmpty()) {
            known.push_back(element);
        }
    }
    return known;
}

std::string listed(const std::vector<std::string>& known) {
    std::string list;
    for (const std::string& flag : known) {
        list += (list.empty() ? "" : " ") + flag;
    }
    return list;
}

std::string wrongInFormat(const std::string& typed, Words words) {
    namespace message_number = datetime::message_number;
    const std::string format = withoutBlanks(typed);
    const auto saying = [](std::uint32_t number, const std::vector<std::string>& parameters) {
        return describe(number, parameters) + " (" + std::to_string(number) + ")";
    };
    if (format.empty()) {
        return saying(message_number::formatEmpty, {});
    }
    if (format.find('%') == std::string::npos) {
        return hasKeyword(format) ? "" : saying(message_number::noKnownKeyword, {printable(format)});
    }
    const std::vector<std::string> known = flags(words);
    for (std::size_t at = format.find('%'); at != std::string::npos; at = format.find('%', at)) {
        if (at + 1 == format.size()) {
            return saying(message_number::formatEndsInPercent, {});
        }
        const auto element = std::find_if(known.begin(), known.end(), [&](const std::string& flag) {
            return format.compare(at, flag.size(), flag) == 0;
        });
        if (element == known.end()) {
            std::size_t end = at + 2;
            while (end < format.size() && isContinuation(format[end])) {
                ++end;
            }
            return "\"" + printable(format.substr(at, end - at)) + "\" is no flag (" +
                   std::to_string(message_number::unknownFlag) + "); there are " + listed(known);
        }
        at += element->size();
    }
    return {};
}

} // namespace

std::string readPatternHelp() {
    return patternHelp("What a pattern reads; --lenient lifts a bound in brackets:",
                       &datetime::PatternElement::reads);
}

std::string writtenPatternHelp() {
    return patternHelp("What a pattern writes:", &datetime::PatternElement::writes);
}

std::string readFlags() {
    return listed(flags(&datetime::PatternElement::reads));
}

std::string writtenFlags() {
    return listed(flags(&datetime::PatternElement::writes));
}

std::string wrongInReadFormat(const std::string& format) {
    return wrongInFormat(format, &datetime::PatternElement::reads);
}

std::string wrongInWrittenFormat(const std::string& format) {
    return wrongInFormat(format, &datetime::PatternElement::writes);
}

std::string withoutBlanks(std::string_view text) {
    constexpr std::string_view blanks = " \t\r\n\f\v";
    const std::size_t begin = std::min(text.find_first_not_of(blanks), text.size());
    const std::size_t end = text.find_last_not_of(blanks) + 1;
    return std::string(text.substr(begin, std::max(end, begin) - begin));
}

} // namespace host
