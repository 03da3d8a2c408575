// Which encodings ICU reads back as it wrote them, found by trying all.
//
// The text has every character that the encoding takes without a loss, in the order of their numbers and, once more, in
// one that puts scripts side by side. Characters of private use are left out: many encodings have had some that later
// became others, and map them one way.

#include "base/unicode_data.h"
#include "text/encoding_catalogue.h"

#include <kvt/encoding/stream_transcoder.h>

#include <gtest/gtest.h>
#include <unicode/ucnv.h>
#include <unicode/uset.h>
#include <unicode/utf.h>

#include <random>
#include <set>

namespace kvt::test {

namespace {

using kvt::ex::Encoding;
using kvt::ex::Loss;
using kvt::ex::StreamTranscoder;

std::string converted(std::string_view bytes, Encoding from, Encoding to,
                      const StreamTranscoder::LossHandler& onLoss) {
    StreamTranscoder stream(from, to);
    std::string out;
    stream.convert({bytes.data(), bytes.size()}, out, onLoss);
    stream.finish(out, onLoss);
    return out;
}

std::string_view bytesOf(const std::u32string& text) {
    return {reinterpret_cast<const char*>(text.data()), text.size() * sizeof(char32_t)};
}

bool isOfPrivateUse(char32_t character) {
    return (character >= 0xE000 && character < 0xF900) || character >= 0xF0000;
}

// What ICU says that its converter has; but for the mark, which some encodings drop at the beginning of a text.
std::u32string charactersOf(const std::string& name) {
    UErrorCode error = U_ZERO_ERROR;
    const std::unique_ptr<UConverter, decltype(&ucnv_close)> converter(ucnv_open(name.c_str(), &error),
                                                                       &ucnv_close);
    const std::unique_ptr<USet, decltype(&uset_close)> set(uset_openEmpty(), &uset_close);
    ucnv_getUnicodeSet(converter.get(), set.get(), UCNV_ROUNDTRIP_AND_FALLBACK_SET, &error);
    EXPECT_TRUE(U_SUCCESS(error)) << name;
    std::u32string text;
    for (char32_t character = 0; character < 0x30000; ++character) {
        if (uset_contains(set.get(), static_cast<UChar32>(character)) != 0 && !isOfPrivateUse(character) &&
            !U_IS_SURROGATE(character) && character != U'\uFEFF') {
            text += character;
        }
    }
    return text;
}

std::u32string takenBy(Encoding encoding, const std::u32string& text) {
    std::set<std::uint64_t> lost;
    converted(bytesOf(text), Encoding::Utf32LE, encoding,
              [&](const Loss& loss) { lost.insert(loss.offset / sizeof(char32_t)); });
    std::u32string taken;
    for (std::size_t index = 0; index < text.size(); ++index) {
        if (!lost.contains(index)) {
            taken += text[index];
        }
    }
    return taken;
}

bool isReadBack(Encoding encoding, const std::u32string& text) {
    bool isWhole = true;
    const auto onLoss = [&](const Loss&) { isWhole = false; };
    const std::string written = converted(bytesOf(text), Encoding::Utf32LE, encoding, onLoss);
    return converted(written, encoding, Encoding::Utf32LE, onLoss) == bytesOf(text) && isWhole;
}

} // namespace

TEST(ComingBack, EveryEncodingDoesOrIsKnownNotTo) {
    std::size_t tried = 0;
    for (const std::string& name : host::converterNames()) {
        const Encoding encoding(name, kvt::ex::nothrow);
        if (encoding.id() == Encoding::Unknown) {
            continue;
        }
        ++tried;
        const std::u32string taken = takenBy(encoding, charactersOf(name));
        std::u32string mixed = taken;
        std::shuffle(mixed.begin(), mixed.end(), std::mt19937(1));
        // What is lost beside others only is a loss, and not this test's concern.
        const bool isRead = isReadBack(encoding, taken) && isReadBack(encoding, takenBy(encoding, mixed));
        EXPECT_EQ(isRead, host::comesBack(encoding)) << name << ", " << taken.size() << " characters";
    }
    EXPECT_GT(tried, 200u);
}

} // namespace kvt::test
