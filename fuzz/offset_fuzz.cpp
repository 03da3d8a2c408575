// The offset of a text or a value against the second implementation of the tests: repairOffset, setOffset, timezoneGet and
// timezoneRemove.
//
// Input: a byte for what is asked of the offset, then the text.
#include <datetime_fuzzing.h>
#include <reference/value_reference.h>

#include <kvt/datetime/utc_offset.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::test::answerOf;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const auto type = static_cast<UTCOffsetType>(input.byte() % 4);
    const std::string text(input.rest());
    const auto repaired = ZQTDateTimeUTCOffset::repairOffset(ustring(text));
    const auto expected = kvt::test::naiveOffset(text);
    requireEqual(repaired.has_value(), expected.has_value() || text.empty(), "what is an offset");
    if (expected) {
        requireEqual(repaired->offsetMinutes(), expected->minutes, "its minutes");
        requireEqual(repaired->text().toStdString(), expected->text, "its text");
    }
    DateTimeParts parts;
    parts.setOffset(ustring(text));
    requireEqual(parts.offset().toStdString(), expected ? expected->text : "", "the offset of parts");

    // The text as it is, and behind a time.
    for (const std::string& value : {text, "120000" + text}) {
        requireEqual(answerOf(timezoneGet(ustring(value), type)), kvt::test::naiveTimezoneGet(value, type),
                     "the offset of a value");
        requireEqual(answerOf(timezoneRemove(ustring(value))), kvt::test::naiveTimezoneRemove(value),
                     "the value without it");
    }
    return 0;
}
