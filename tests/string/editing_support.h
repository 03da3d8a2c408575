// What the tests of editing share: the fixture that its typed suite has in each file, and what a standard exception
// says.
#pragma once

#include <support/string_types.h>

#include <stdexcept>
#include <string>

namespace kvt::test {

/// The class and text of a standard exception.
template <typename Action>
std::string thrownBy(Action action) {
    try {
        action();
    } catch (const std::out_of_range& failure) {
        return std::string("out_of_range: ") + failure.what();
    } catch (const std::length_error& failure) {
        return std::string("length_error: ") + failure.what();
    }
    return "nothing";
}
inline const std::string outOfRange = "out_of_range: invalid string position";

/// Editing of each string type.
template <typename Number>
class UStringEdit : public StringTest<Number> {};

} // namespace kvt::test
