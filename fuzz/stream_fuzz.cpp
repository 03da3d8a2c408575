// A stream cut into blocks at any byte, for any two encodings that ICU lists: the text of ICUTranscoder, and the losses
// that ICU's callbacks see in the whole text, with their places and bytes.
//
// Input: source encoding, target encoding, a byte for the cuts, then the text. From 128 on the byte has the text begin
// behind as much ASCII as brings it to a border of the blocks within.
#include <fuzzing.h>
#include <reference/stream_reference.h>

#include <kvt/encoding/encoding.h>

using namespace kvt::fuzz;

namespace {

constexpr std::size_t borders[] = {512, 1024, 4096, 8192};

/// Whole characters of the source encoding, which has at least one byte for each.
std::string filling(const std::string& encoding, std::size_t bytes) {
    const std::string one = kvt::test::encodeWithIcu(encoding, std::u16string(64, u'a'));
    std::string text;
    while (!one.empty() && text.size() + one.size() <= bytes) {
        text += one;
    }
    return text;
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const std::string from = input.pick(allEncodings());
    const std::string to = input.pick(allEncodings());
    const unsigned control = input.byte();
    std::string text(input.rest());
    std::size_t first = 1 + control % 9;
    if (control >= 128) {
        const std::size_t border = borders[control / 32 % 4];
        text.insert(0, filling(from, border - control % 32));
        first = border - control % 16;
    }
    if (text.empty() || from == to) {
        return 0;
    }
    requireEqual(kvt::test::differenceInStream(from, to, text, {first}), std::string(), "a stream");
    return 0;
}
