// format: no input makes it throw, and a value gives the same text as its canonical form.
//
// Input: the value, a line feed, and the format.
#include <datetime_fuzzing.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    std::string_view format = input.rest();
    const auto value = ustring(takeLine(format));
    const TextResult result = kvt::ex::datetime::format(value, ustring(format));
    requireShape(result);
    require(std::get<0>(result) != ReturnState::Repaired, "nothing is repaired");

    const TextResult canonical = kvt::ex::datetime::format(value, ustring("ZQT"));
    requireCanonical(canonical);
    if (isGood(canonical) && !trimmed(format).empty()) {
        const TextResult again = kvt::ex::datetime::format(std::get<1>(canonical), ustring(format));
        if (!isBehindLastYear(canonical)) {
            requireEqual(textOf(again), textOf(result), "the form of the value plays no part");
            requireEqual(messageOf(again), messageOf(result), "nor for a message");
        }
    } else {
        require(!isGood(result), "what has no canonical form has no other");
    }
    return 0;
}
