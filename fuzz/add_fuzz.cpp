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
        // The value in canonical form: a time whose fraction is rounded up may have wrapped at midnight.
        const TextResult canonical = format(value, ustring("ZQT"));
        requireEqual(compare(std::get<1>(nothing), std::get<1>(canonical)), 0,
                     "nothing added changes nothing");
    }
    return 0;
}
