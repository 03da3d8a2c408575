// parseZQTDateTime: no input makes it throw, and the fields that it gives make the value again.
//
// Input: a byte for the precision, then the value.
#include <datetime_fuzzing.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const auto precision = static_cast<std::int16_t>(input.byte() % 14 - 2);
    const auto value = ustring(input.rest());
    const PartsResult result = parseZQTDateTime(value, precision);
    if (!isGood(result)) {
        require(std::get<2>(result).has_value(), "a failure has a message");
        require(std::get<1>(result).type() == TemporalType::Unsupported, "and the default parts");
        return 0;
    }
    require(!std::get<2>(result), "a good result has no message");
    require(precision >= -1 && precision <= 9, "there are no other precisions");
    const DateTimeParts& parts = std::get<1>(result);
    if (precision == 9 && parts.hasDate() && parts.hasTime()) {
        const TextResult made = create(parts);
        const TextResult expected = cast(value, CastToTemporalType::Datetime);
        if (isGood(made)) { // not with a fraction of a whole second, which create() refuses
            requireEqual(compare(std::get<1>(made), std::get<1>(expected)), 0, "the same moment");
        }
    }
    return 0;
}
