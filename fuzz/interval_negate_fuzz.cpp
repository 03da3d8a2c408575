// intervalNegate against a second reader of intervals, and against the text itself: it gains or loses one character at its
// front. An interval that is written again by intervalCreate is the one that was read.
//
// Input: the interval.
#include <datetime_fuzzing.h>
#include <reference/value_reference.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::test::answerOf;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const std::string text(input.rest());
    const TextResult result = intervalNegate(ustring(text));
    if (const auto expected = kvt::test::naiveNegate(text)) {
        requireEqual(answerOf(result), *expected, "the interval the other way round");
    }
    const auto read = kvt::test::naiveInterval(text);
    if (!read || !std::holds_alternative<kvt::test::NaiveInterval>(*read)) {
        return 0;
    }
    const auto& interval = std::get<kvt::test::NaiveInterval>(*read);
    if (interval.seconds < 1'000'000 && interval.nanoseconds < 1'000'000'000) {
        const IntervalParts parts(
            static_cast<std::uint64_t>(interval.years), static_cast<std::uint64_t>(interval.months),
            static_cast<std::uint64_t>(interval.days), static_cast<std::uint64_t>(interval.hours),
            static_cast<std::uint64_t>(interval.minutes),
            static_cast<double>(interval.seconds) + interval.nanoseconds / 1e9, interval.isNegative);
        requireEqual(answerOf(intervalCreate(parts)), kvt::test::success(interval.text()), "written again");
    }
    return 0;
}
