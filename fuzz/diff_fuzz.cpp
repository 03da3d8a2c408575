// diff, diffAsNumber and compare: no input makes them throw, and they agree on what can be compared and on the order.
//
// Input: a byte for the unit, then the first value, a line feed, and the second.
#include <datetime_fuzzing.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const auto unit = static_cast<UnitType>(input.byte() % 8);
    std::string_view rest = input.rest();
    const auto first = ustring(takeLine(rest));
    const auto second = ustring(rest);

    const TextResult interval = diff(first, second);
    requireShape(interval);
    const int order = compare(first, second);
    requireEqual(order == -3, !isGood(interval), "compare fails where diff does");
    if (!isGood(interval)) {
        requireEqual(messageOf(diffAsNumber(first, second, unit)) != 0, true, "and so does diffAsNumber");
        return 0;
    }
    requireEqual(compare(second, first), -order, "the other way round");
    require(isGood(intervalNegate(std::get<1>(interval))), "a difference is an interval");
    const NumberResult number = diffAsNumber(first, second, unit);
    requireEqual(isGood(number), unit <= UnitType::Seconds, "all units but those that are none");
    const double difference = std::get<1>(number);
    require(!isGood(number) || (difference > 0) - (difference < 0) == order, "the sign is the order");
    return 0;
}
