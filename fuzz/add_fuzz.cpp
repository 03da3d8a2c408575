// add: no input makes it throw, and what it gives is canonical.
//
// Input: the value, a line feed, and the interval.
#include <datetime_fuzzing.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    std::string_view interval = input.rest();
    const auto value = ustring(takeLine(interval));
    requireCanonical(add(value, ustring(interval)));

    const TextResult nothing = add(value, ustring("PT0S"));
    requireCanonical(nothing);
    if (isGood(nothing) && !textOf(nothing).empty()) {
        requireEqual(compare(std::get<1>(nothing), value), 0, "nothing added changes nothing");
    }
    return 0;
}
