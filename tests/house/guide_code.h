// What the program that guide_code.sh makes of a guide stands on: the checks of its values, and the way to run it.
#pragma once

#include <kvt/kvt.h>

#include <exception>
#include <iostream>
#include <sstream>
#include <string>
#include <tuple>

namespace guide {

inline int failures = 0;

inline std::string textOf(bool value) {
    return value ? "true" : "false";
}

// A number, or anything that can be written to a stream.
template <typename T>
std::string textOf(const T& value) {
    std::ostringstream out;
    out << value;
    return out.str();
}

// A result of the date and time functions stands for its value.
template <typename Value, typename Message>
std::string textOf(const std::tuple<kvt::ex::datetime::ReturnState, Value, Message>& result) {
    return textOf(std::get<1>(result));
}

template <typename Actual, typename Expected>
void check(int line, const Actual& actual, const Expected& expected) {
    if (textOf(actual) != textOf(expected)) {
        std::cerr << "line " << line << ": says " << textOf(expected) << ", is " << textOf(actual) << "\n";
        ++failures;
    }
}

// For code that shows how to get something, and not what for.
template <typename T>
void use(const T&) {}

inline int run(void (*readGuide)()) {
    try {
        readGuide();
    } catch (const std::exception& failure) {
        std::cerr << "unexpected: " << failure.what() << "\n";
        ++failures;
    }
    return failures == 0 ? 0 : 1;
}

} // namespace guide

using guide::use;
