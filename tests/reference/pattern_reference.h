// A second reading of values by patterns, to hold parse() against: with streams, strings and exceptions, step by step
// and without any regard for speed. It shares no code with the library; its calendar counts.
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
