// diff, diffAsNumber and compare against the second implementation of the tests, to the last bit.
//
// Input: a byte for the unit, then the first value, a line feed, and the second.
#include <datetime_fuzzing.h>
#include <reference/value_reference.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::test::answerOf;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const auto unit = static_cast<UnitType>(input.byte() % 8);
    std::string_view rest = input.rest();
    const std::string first(takeLine(rest));
    const std::string second(rest);
    const auto expected = kvt::test::naiveDiff(first, second);
    const TextResult interval = diff(ustring(first), ustring(second));
    requireEqual(answerOf(interval), expected.interval, "the interval");
    requireEqual(answerOf(diffAsNumber(ustring(first), ustring(second), unit)), expected.inUnit(unit),
                 "the number in unit " + std::to_string(static_cast<int>(unit)));
    requireEqual(compare(ustring(first), ustring(second)), expected.order, "the order");
    if (expected.order != -3) {
        requireEqual(compare(ustring(second), ustring(first)), -expected.order, "the other way round");
    }
    require(!isGood(interval) || isGood(intervalNegate(std::get<1>(interval))),
            "a difference is an interval");
    return 0;
}
