// A second reader of values by patterns, to compare parse() with. It uses streams, strings and exceptions, goes step by
// step, and does not care for speed. It shares no code with the library; its calendar counts.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace kvt::test {

/// What parse() has to answer: the text of a success, else the message.
struct PatternAnswer {
    bool success = false;
    std::string text;
    std::uint32_t message = 0;
    std::vector<std::string> parameters;

    friend bool operator==(const PatternAnswer&, const PatternAnswer&) = default;
};

/// Both of ASCII, without white space at their ends and not empty; the format has a "%".
PatternAnswer referenceParse(const std::string& value, const std::string& format, bool lenient);

} // namespace kvt::test
