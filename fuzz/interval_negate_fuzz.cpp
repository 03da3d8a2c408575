// intervalNegate: no input makes it throw, and a text that it takes gains or loses one character at its front.
//
// Input: the interval.
#include <datetime_fuzzing.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const std::string interval(input.rest());
    const TextResult result = intervalNegate(ustring(interval));
    requireShape(result);
    if (isGood(result)) {
        require(textOf(result) == "-" + interval || textOf(result) == interval.substr(1),
                "only one character is changed");
    } else {
        require(messageOf(result) == 933064 || messageOf(result) == 933068,
                "no interval, or one beyond all bounds");
    }
    return 0;
}
