// parseZQTDateTime against the second implementation of the tests, and the value is made again of its fields.
//
// Input: a byte for the precision, then the value.
#include <datetime_fuzzing.h>
#include <reference/value_reference.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::test::answerOf;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const auto precision = static_cast<std::int16_t>(input.byte() % 14 - 2);
    const std::string value(input.rest());
    const PartsResult result = parseZQTDateTime(ustring(value), precision);
    const DateTimeParts& parts = std::get<1>(result);
    const kvt::test::NaiveDateTime at{parts.year(),
                                      parts.month(),
                                      parts.day(),
                                      static_cast<int>(parts.hours()),
                                      static_cast<int>(parts.minutes()),
                                      static_cast<int>(parts.seconds()),
                                      static_cast<int>(parts.nanoseconds())};
    kvt::test::Answer answer = kvt::test::answerWithoutValue(result);
    answer.text =
        isGood(result) ? kvt::test::naiveFields(at, parts.offset().toStdString(), parts.type()) : "";
    requireEqual(answer, kvt::test::naiveParts(value, precision), "the fields");
    require(isGood(result) || parts.type() == TemporalType::Unsupported, "a failure has the default parts");
    if (isGood(result) && precision == 9 && parts.hasDate() && parts.hasTime()) {
        const TextResult made = create(parts);
        if (isGood(made)) { // not with a fraction of a whole second, which create() refuses
            const TextResult expected = cast(ustring(value), CastToTemporalType::Datetime);
            requireEqual(compare(std::get<1>(made), std::get<1>(expected)), 0, "the same moment");
        }
    }
    return 0;
}
