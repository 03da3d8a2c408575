// add against the second implementation of the tests: state, text and message. What it gives is canonical.
//
// Input: the value, a line feed, and the interval.
#include <datetime_fuzzing.h>
#include <reference/value_reference.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::test::answerOf;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    std::string_view interval = input.rest();
    const std::string value(takeLine(interval));
    const TextResult result = add(ustring(value), ustring(interval));
    requireCanonical(result);
    if (const auto expected = kvt::test::naiveAdd(value, std::string(interval))) {
        requireEqual(answerOf(result), *expected, "the sum");
    }
    return 0;
}
