// cast against the second implementation of the tests, and itself: a second cast to the same kind changes nothing.
//
// Input: a byte for the target, then the value.
#include <datetime_fuzzing.h>
#include <reference/value_reference.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::test::answerOf;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const auto target = static_cast<CastToTemporalType>(input.byte() % 5);
    const std::string value(input.rest());
    const TextResult result = cast(ustring(value), target);
    requireEqual(answerOf(result), kvt::test::naiveCast(value, target), "the value of another kind");
    if (isGood(result) && !isBehindLastYear(result)) {
        const TextResult again = cast(std::get<1>(result), target);
        require(std::get<0>(again) == ReturnState::Success, "a canonical value needs no repair");
        requireEqual(textOf(again), textOf(result), "a second cast changes nothing");
    }
    return 0;
}
