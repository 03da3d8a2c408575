// The shortest decimal texts of random numbers, which were made with an implementation of another school.
#include "suite.h"

#include <kvt/codec/float_text.h>

#include <gtest/gtest.h>

#include <cstdio>
#include <cstdlib>

namespace conformance {
namespace {

// The digits of a text and the place of its decimal point among them, as the tables have them.
struct Digits {
    std::string digits;
    int point = 0;
};

Digits digitsOf(const std::string& text) {
    Digits found;
    bool behindPoint = false;
    std::size_t at = 0;
    for (; at < text.size() && text[at] != 'e'; ++at) {
        if (text[at] == '.') {
            behindPoint = true;
        } else if (text[at] != '0' || !found.digits.empty()) {
            found.digits += text[at];
            found.point += behindPoint ? 0 : 1;
        } else {
            found.point -= behindPoint ? 1 : 0; // a zero in front of the digits
        }
    }
    found.point += at < text.size() ? std::atoi(text.c_str() + at + 1) : 0;
    found.digits.erase(found.digits.find_last_not_of('0') + 1);
    return found;
}

// Rows such as {4.1e-12, "41", -11}.
template <typename Number, typename Read, typename Write>
void tryTable(const std::string& name, const std::string& file, Read read, Write write) {
    const std::string package = "double-conversion";
    if (sourceFolder(package).empty()) {
        GTEST_SKIP() << noSources(package);
    }
    Suite suite(name, package + " " + sourceVersion(package));
    for (const std::string& line : linesOf(contentsOf(sourceFolder(package) + "/test/cctest/" + file))) {
        char written[64];
        char shortest[64];
        int point = 0;
        if (std::sscanf(line.c_str(), " {%63[^,], \"%63[0-9]\", %d}", written, shortest, &point) != 3) {
            continue;
        }
        const Number number = read(written);
        char buffer[kvt::ex::floatTextBuffer];
        const std::string text(buffer, write(number, buffer));
        const Digits digits = digitsOf(text);
        suite.check(digits.digits == shortest && digits.point == point && read(text.c_str()) == number,
                    line + " became " + text);
    }
    suite.finish();
}

TEST(ConformanceShortestFloat, TextsOfDoubles) {
    tryTable<double>(
        "shortest texts of double", "gay-shortest.cc",
        [](const char* text) { return std::strtod(text, nullptr); },
        [](double number, char* buffer) { return kvt::ex::double_to_string(number, buffer); });
}

TEST(ConformanceShortestFloat, TextsOfFloats) {
    tryTable<float>(
        "shortest texts of float", "gay-shortest-single.cc",
        [](const char* text) { return std::strtof(text, nullptr); },
        [](float number, char* buffer) { return kvt::ex::float_to_string(number, buffer); });
}

} // namespace
} // namespace conformance
