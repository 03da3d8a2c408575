// timezoneSet against the second implementation of the tests.
//
// Input: a byte for the mode, then the value, a line feed, and the zone. There is no zone database, so "local" fails.
#include <datetime_fuzzing.h>
#include <reference/value_reference.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::test::answerOf;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const bool withoutDatabase = (setInstallPathWrapper("/nowhere"), true);
    require(withoutDatabase, "the folder is named once");

    Input input(data, size);
    const auto mode = static_cast<SetZoneMode>(input.byte() % 4);
    std::string_view zone = input.rest();
    const std::string value(takeLine(zone));
    requireEqual(answerOf(timezoneSet(ustring(value), ustring(zone), mode)),
                 kvt::test::naiveTimezoneSet(value, std::string(zone), mode),
                 "the value with another offset");
    return 0;
}
