// create against the second implementation of the tests, and against the value that is read again.
//
// Input: two bytes each for year, month, day, hours, minutes, seconds; four for the nanoseconds; then the offset.
#include <datetime_fuzzing.h>
#include <reference/value_reference.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::test::answerOf;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const auto number = [&](unsigned usual) {
        const unsigned high = input.byte();
        const unsigned low = input.byte();
        // Mostly what a field may be and a little more; else any number.
        return static_cast<int>(high < 240 ? (high * 256 + low) % usual : high * 256 + low);
    };
    kvt::test::NaiveDateTime at{1970, 1, 1};
    at.year = 990 + number(9020);
    at.month = number(14);
    at.day = number(33);
    at.hours = number(26);
    at.minutes = number(62);
    at.seconds = number(62);
    at.nanoseconds = number(50000) * 20001;
    const std::string offset(input.rest());

    DateTimeParts parts;
    parts.setYear(at.year);
    parts.setMonth(static_cast<std::uint64_t>(at.month));
    parts.setDay(static_cast<std::uint64_t>(at.day));
    parts.setHours(static_cast<std::uint64_t>(at.hours));
    parts.setMinutes(static_cast<std::uint64_t>(at.minutes));
    parts.setSeconds(static_cast<std::uint64_t>(at.seconds));
    parts.setNanoseconds(static_cast<std::uint64_t>(at.nanoseconds));
    parts.setOffset(ustring(offset));
    const TextResult result = create(parts);
    requireEqual(answerOf(result), kvt::test::naiveCreate(at, offset), "the value made of fields");
    requireCanonical(result);
    return 0;
}
