// diff, diffAsNumber and compare: no input makes them throw, and they agree on what can be compared and on the order.
//
// Input: a byte for the unit, then the first value, a line feed, and the second.
#include <datetime_fuzzing.h>

#include <kvt/datetime/message_numbers.h>

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
    const bool isComparable = isGood(diffAsNumber(first, second, UnitType::Seconds));
    requireEqual(order != -3, isComparable, "compare fails where the exact difference does");
    requireEqual(isGood(diffAsNumber(first, second, UnitType::Months)), isGood(interval),
                 "months and intervals fail alike");
    const NumberResult number = diffAsNumber(first, second, unit);
    if (!isGood(interval)) {
        // In UTC, or by a fraction that is rounded up, a value may be outside the years that the calendar takes.
        require(!isComparable || messageOf(interval) == message_number::partOutOfRange,
                "only the calendar stops at the first and the last year");
        requireEqual(isGood(number), isComparable && unit > UnitType::Months && unit <= UnitType::Seconds,
                     "exact lengths go beyond them");
        return 0;
    }
    require(isComparable, "what has an interval can be compared");
    requireEqual(compare(second, first), -order, "the other way round");
    require(isGood(intervalNegate(std::get<1>(interval))), "a difference is an interval");
    requireEqual(isGood(number), unit <= UnitType::Seconds, "all units but those that are none");
    const double difference = std::get<1>(number);
    require(!isGood(number) || (difference > 0) - (difference < 0) == order, "the sign is the order");
    return 0;
}
