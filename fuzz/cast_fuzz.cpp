// cast: no input makes it throw, and a second cast to the same kind changes nothing.
//
// Input: a byte for the target, then the value.
#include <datetime_fuzzing.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const auto target = static_cast<CastToTemporalType>(input.byte() % 5);
    const TextResult result = cast(ustring(input.rest()), target);
    requireShape(result);
    if (!isGood(result)) {
        require(std::get<2>(result).has_value(), "a failure has a message");
        return 0;
    }
    const TextResult again = cast(std::get<1>(result), target);
    if (!isBehindLastYear(result)) {
        require(std::get<0>(again) == ReturnState::Success, "a canonical value needs no repair");
        requireEqual(textOf(again), textOf(result), "a second cast changes nothing");
    }
    return 0;
}
