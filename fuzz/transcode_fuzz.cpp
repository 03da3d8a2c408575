// A whole text from any encoding to any other: what the library gives, with its ways around ICU, against what ICU
// alone gives.
//
// Input: source encoding, target encoding, then the text; a third byte is how often the text is repeated, so that
// short inputs reach the borders of the buffers.
#include <fuzzing.h>
#include <support/outcome.h>

#include <kvt/encoding/icu_transcoder.h>
#include <kvt/string/ustring.h>

using namespace kvt::ex;
using namespace kvt::fuzz;
using kvt::test::Outcome;

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const std::string from = input.pick(allEncodings());
    const std::string to = input.pick(allEncodings());
    const unsigned repeat = input.byte();
    std::string text;
    do {
        text += input.rest();
    } while (text.size() < 10000 &&
             text.size() < input.rest().size() * (1 + (repeat < 192 ? repeat % 4 : repeat * 64)));

    std::string out = "before";
    Outcome outcome = kvt::test::outcomeOf([&] {
        ICUTranscoder transcoder{Encoding(from), Encoding(to)};
        transcoder.transcode(kvt::future::string_view(text), out);
    });
    outcome.bytes = out;
    requireEqual(outcome, kvt::test::expectedTranscode(from, to, text), from, " to ", to, " of ", Hex{text});

    const AnyString source{UStringView<30>(text), Encoding(from)};
    AnyString target{Encoding(to)};
    outcome = kvt::test::outcomeOf([&] { target.assign(source); });
    outcome.bytes = target.toStdString();
    requireEqual(outcome, kvt::test::expectedAssign(from, to, text), from, " assigned to ", to, " of ",
                 Hex{text});
    return 0;
}
