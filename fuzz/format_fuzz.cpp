// format against a slow second writer, where the texts are ASCII; a value gives the same text as its canonical form.
//
// Input: the value, a line feed, and the format.
#include <datetime_fuzzing.h>
#include <reference/format_reference.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::test::answerOf;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    std::string_view pattern = input.rest();
    const std::string value(takeLine(pattern));
    const TextResult result = format(ustring(value), ustring(pattern));
    requireShape(result);
    const TextResult canonical = format(ustring(value), ustring("ZQT"));
    requireCanonical(canonical);
    if (isBehindLastYear(canonical)) {
        return 0;
    }
    if (isAscii(value) && isAscii(pattern)) {
        requireEqual(answerOf(result), kvt::test::naiveFormat(value, std::string(pattern)), "the text");
    }
    if (isGood(canonical) && !trimmed(pattern).empty()) {
        const TextResult again = format(std::get<1>(canonical), ustring(pattern));
        requireEqual(textOf(again), textOf(result), "the form of the value plays no part");
        requireEqual(messageOf(again), messageOf(result), "nor for a message");
    }
    return 0;
}
