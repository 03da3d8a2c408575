// parse: no input makes it throw, what it gives is canonical, and with patterns it agrees with the slow second reading.
//
// Input: a byte for `lenient`, then the value, a line feed, and the format.
#include <datetime_fuzzing.h>

#include <reference/pattern_reference.h>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;

namespace {

std::string parametersOf(const TextResult& result) {
    std::string text;
    if (std::get<2>(result)) {
        for (const auto& parameter : std::get<2>(result)->parameters) {
            text += "{" + parameter.toStdString() + "}";
        }
    }
    return text;
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const bool lenient = input.byte() % 2 == 1;
    std::string_view format = input.rest();
    const std::string_view value = takeLine(format);
    const TextResult result = parse(ustring(value), ustring(format), lenient);
    requireCanonical(result);

    const std::string plainValue(trimmed(value));
    const std::string plainFormat(trimmed(format));
    if (plainValue.empty()) {
        require(!isGood(result) && messageOf(result) == 0, "no value, no message");
    } else if (plainFormat.find('%') != std::string::npos && isAscii(value) && isAscii(format)) {
        const kvt::test::PatternAnswer expected = kvt::test::referenceParse(plainValue, plainFormat, lenient);
        requireEqual(isGood(result), expected.success, "the state");
        requireEqual(textOf(result), expected.text, "the text");
        requireEqual(messageOf(result), expected.message, "the message");
        std::string parameters;
        for (const std::string& parameter : expected.parameters) {
            parameters += "{" + parameter + "}";
        }
        requireEqual(parametersOf(result), parameters, "the parameters");
    }
    return 0;
}
