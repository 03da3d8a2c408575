// What can be seen of one transcoder: its state, whole texts, pieces of a stream, what it reports and what it does
// not. That the bytes are right for all encodings is for icu_differential_test.cpp to show.
#include <support/outcome.h>

#include <kvt/encoding/icu_transcoder.h>
#include <kvt/encoding/stream_transcoder.h>
#include <kvt/string/ustring.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <string>
#include <string_view>
#include <thread>
#include <utility>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::Encoding;
using kvt::ex::ICUTranscoder;
using kvt::ex::InvalidEncodingException;
using kvt::ex::StreamTranscoder;
using kvt::ex::UString;
using kvt::ex::UStringBadEncodingException;
using kvt::ex::UStringTranscodingException;
using View = kvt::future::string_view;

using Pairs = std::vector<std::pair<std::string, std::string>>;

Pairs lossyPairs(const std::string& lossy, const std::string& substitution) {
    return {{"substituted_conversion", lossy}, {"substitution_characters", substitution}};
}

/// Converts bytes to bytes; what was in the output before must not show.
Outcome convert(Encoding from, Encoding to, View in) {
    std::string out = "before";
    Outcome outcome = outcomeOf([&] { ICUTranscoder(from, to).transcode(in, out); });
    outcome.bytes = out;
    return outcome;
}

Outcome quiet(std::string bytes) {
    return {std::move(bytes), 0, {}, {}};
}

// ---- The object --------------------------------------------------------------------------------------------------

TEST(IcuTranscoder, IsNotValidWhenMadeOfNothing) {
    EXPECT_FALSE(ICUTranscoder().isValid());
}

TEST(IcuTranscoder, IsValidWithTwoConvertersAndKnowsTheirEncodings) {
    const ICUTranscoder transcoder(Encoding::Windows1252, Encoding::Utf16BE);
    EXPECT_TRUE(transcoder.isValid());
    EXPECT_EQ(transcoder.fromEncoding(), Encoding(Encoding::Windows1252));
    EXPECT_EQ(transcoder.toEncoding(), Encoding(Encoding::Utf16BE));
    EXPECT_TRUE(ICUTranscoder(Encoding("Shift_JIS"), Encoding("ibm-971_P100-1995")).isValid());
}

TEST(IcuTranscoder, CanBeAssignedToWhenMadeOfNothing) {
    ICUTranscoder transcoder;
    transcoder = ICUTranscoder(Encoding::Iso8859_1, Encoding::Utf8);
    ASSERT_TRUE(transcoder.isValid());
    std::string out;
    transcoder.transcode(View("\xE9"), out);
    EXPECT_EQ(out, "\u00E9");
}

TEST(IcuTranscoder, CopiesConvertAsTheOriginal) {
    ICUTranscoder original(Encoding("Shift_JIS"), Encoding::Utf8);
    ICUTranscoder copy(original);
    ICUTranscoder assigned;
    assigned = original;
    for (ICUTranscoder* transcoder : {&original, &copy, &assigned, &original}) {
        std::string out;
        transcoder->transcode(View("\x8A\xBF\x8E\x9A"), out);
        EXPECT_EQ(out, "漢字");
    }
}

TEST(IcuTranscoder, StatusHasItsNumbers) {
    EXPECT_EQ(ICUTranscoder::Ok, 0);
    EXPECT_EQ(ICUTranscoder::OutputFull, 1);
    EXPECT_EQ(ICUTranscoder::Failed, 2);
}

TEST(IcuTranscoder, EncodingsWithoutAConverterAreUnknownToIt) {
    const Outcome unknown{"", 910005, {"unknown"}, {}};
    for (const Encoding::Type none : {Encoding::Unknown, Encoding::Binary, Encoding::Wwjd}) {
        SCOPED_TRACE(Encoding(none).getName());
        EXPECT_EQ(outcomeOf([&] { ICUTranscoder(none, Encoding::Utf8); }), unknown);
        EXPECT_EQ(outcomeOf([&] { ICUTranscoder(Encoding::Utf8, none); }), unknown);
        EXPECT_EQ(outcomeOf([&] { ICUTranscoder(none, none); }), unknown);
        EXPECT_EQ(outcomeOf([&] { ICUTranscoder::isSingleByteEncoding(none); }), unknown);
    }
    EXPECT_THROW(ICUTranscoder(Encoding("no-such-charset", kvt::ex::nothrow), Encoding::Utf8),
                 InvalidEncodingException);
}

TEST(IcuTranscoder, AnIdThatWasNeverHandedOutCannotBeOpened) {
    const Encoding nobody(static_cast<Encoding::Type>(30000));
    EXPECT_EQ(nobody.getName(), "");
    EXPECT_FALSE(ICUTranscoder(nobody, Encoding::Utf8).isValid());
    EXPECT_FALSE(ICUTranscoder(Encoding::Utf8, nobody).isValid());
    EXPECT_FALSE(ICUTranscoder::isSingleByteEncoding(nobody));
    EXPECT_FALSE(nobody.isSingleByte());
    EXPECT_FALSE(nobody.supports7BitASCII());
    const Outcome invalid{"before", 910005, {""}, {}};
    EXPECT_EQ(convert(nobody, Encoding::Utf8, "a"), invalid);
    EXPECT_EQ(convert(Encoding::Utf8, nobody, "a"), invalid);
    EXPECT_EQ(outcomeOf([&] { StreamTranscoder(nobody, Encoding::Utf8); }).number, 910005U);
    EXPECT_EQ(outcomeOf([&] { UString<0>("\u00e9").getAsEncoding(nobody); }).number, 910005U);
}

TEST(IcuTranscoder, AnIdIsOpenedWhenItHasBecomeThatOfAName) {
    const std::uint32_t last = Encoding("ibm-1124_P100-1996").id();
    const Encoding next(static_cast<Encoding::Type>(last + 1));
    ASSERT_FALSE(ICUTranscoder(next, Encoding::Utf8).isValid());
    ASSERT_EQ(Encoding("ibm-1129_P100-1997"), next);
    EXPECT_EQ(convert(next, Encoding::Utf8, "\xC3"), quiet("\u0102"));
}

TEST(IcuTranscoder, ASingleByteEncodingHasNoLongerCharacter) {
    const std::pair<const char*, bool> rows[] = {
        {"UTF-8", false},     {"US-ASCII", true},           {"UTF-16LE", false},        {"UTF-32BE", false},
        {"ISO-8859-1", true}, {"windows-1258", true},       {"KOI8-R", true},           {"Shift_JIS", false},
        {"EUC-JP", false},    {"ISO-2022-JP", false},       {"ibm-37_P100-1995", true}, {"UTF-7", false},
        {"gb18030", false},   {"ibm-971_P100-1995", false},
    };
    for (const auto& [name, expected] : rows) {
        EXPECT_EQ(ICUTranscoder::isSingleByteEncoding(Encoding(name)), expected) << name;
    }
}

// ---- Whole texts -------------------------------------------------------------------------------------------------

TEST(IcuTranscoder, EmptyTextGivesEmptyText) {
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Utf16LE, ""), quiet(""));
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Utf8, ""), quiet(""));
    // A converter with a header of its own does not get to write it.
    EXPECT_EQ(convert(Encoding::Utf8, Encoding("ISO-2022-KR"), ""), quiet(""));
    EXPECT_EQ(convert(Encoding::Utf8, Encoding("UTF-16,version=1"), View()), quiet(""));
}

TEST(IcuTranscoder, EqualEncodingsCopyWithoutALookAtTheText) {
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Utf8, "\xFF\xC3"), quiet("\xFF\xC3"));
    EXPECT_EQ(convert(Encoding::UsAscii, Encoding::UsAscii, "\xFF"), quiet("\xFF"));
    EXPECT_EQ(convert(Encoding("Shift_JIS"), Encoding("sjis"), "\x81"), quiet("\x81"));
    const Encoding system = Encoding::System;
    EXPECT_EQ(convert(system, Encoding(system.getName()), "\xFF\x81"), quiet("\xFF\x81"));
}

TEST(IcuTranscoder, TextLongerThanItsBuffersComesOutWhole) {
    std::string in;
    std::string expected;
    for (int i = 0; i < 20000; ++i) {
        in += "\x83\x89";
        in += 'a';
        expected += "ラa";
    }
    EXPECT_EQ(convert(Encoding("Shift_JIS"), Encoding::Utf8, in), quiet(expected));
    EXPECT_EQ(convert(Encoding::Utf8, Encoding("Shift_JIS"), expected), quiet(in));
}

TEST(IcuTranscoder, AllPairsOfUnitsConvert) {
    const std::string utf8 = "a\u00E9\u20AC\U0001F600";
    const std::u16string utf16 = u"a\u00E9\u20AC\U0001F600";
    const std::u32string utf32 = U"a\u00E9\u20AC\U0001F600";
    std::string out8;
    std::u16string out16;
    std::u32string out32;
    ICUTranscoder(Encoding::Utf8, Encoding::Utf16LE).transcode(View(utf8), out16);
    EXPECT_EQ(out16, utf16);
    ICUTranscoder(Encoding::Utf8, Encoding::Utf32LE).transcode(View(utf8), out32);
    EXPECT_EQ(out32, utf32);
    ICUTranscoder(Encoding::Utf16LE, Encoding::Utf8).transcode(std::u16string_view(utf16), out8);
    EXPECT_EQ(out8, utf8);
    ICUTranscoder(Encoding::Utf32LE, Encoding::Utf8).transcode(std::u32string_view(utf32), out8);
    EXPECT_EQ(out8, utf8);
    ICUTranscoder(Encoding::Utf16LE, Encoding::Utf32LE).transcode(std::u16string_view(utf16), out32);
    EXPECT_EQ(out32, utf32);
    ICUTranscoder(Encoding::Utf32LE, Encoding::Utf16LE).transcode(std::u32string_view(utf32), out16);
    EXPECT_EQ(out16, utf16);
    ICUTranscoder(Encoding::Utf8, Encoding("gb18030")).transcode(View(utf8), out8);
    EXPECT_EQ(out8, "a\xA8\xA6\xA2\xE3\x94\x39\xFC\x36");
}

// ---- What is reported --------------------------------------------------------------------------------------------

TEST(IcuTranscoder, ACharacterWithoutAFormIsSubstitutedAndReported) {
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::UsAscii, "caf\u00E9!"),
              (Outcome{"caf?!", 910003, {"caf\u00E9!", "UTF-8", "US-ASCII"}, lossyPairs("caf?!", "?")}));
}

TEST(IcuTranscoder, BadBytesAreSubstitutedAndReported) {
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Utf16BE, "a\xFF\n"),
              (Outcome{std::string("\0a\xFF\xFD\0\n", 6),
                       910002,
                       {"a\\xFF\\x0A", "UTF-8"},
                       lossyPairs("a\uFFFD\n", "\uFFFD")}));
    // A substitution that was read as U+FFFD becomes the target's own.
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_1, "a\xC3"),
              (Outcome{"a?", 910002, {"a\\xC3", "UTF-8"}, lossyPairs("a?", "?")}));
}

TEST(IcuTranscoder, BadInputOutranksALostCharacter) {
    for (const char* text : {"\u4E2D\xFF", "\xFF\u4E2D"}) {
        const Outcome outcome = convert(Encoding::Utf8, Encoding::Iso8859_1, text);
        EXPECT_EQ(outcome.number, 910002U) << hex(text);
        EXPECT_EQ(outcome.bytes, "??") << hex(text);
    }
}

TEST(IcuTranscoder, AReplacementCharacterIsNoNewLoss) {
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_1, "\uFFFD"), quiet("?"));
    EXPECT_EQ(convert(Encoding::Utf16LE, Encoding("Shift_JIS"), View("\xFD\xFF\x41\x00", 4)), quiet("?A"));
    // Next to a real loss it does not hide that.
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_1, "\uFFFD\u4E2D\uFFFD").number, 910003U);
}

TEST(IcuTranscoder, TheConvertersOwnSubstitutionInTheInputIsNoNewLoss) {
    // These cannot write "?", so that their own substitution stays: bytes that are not a character of theirs.
    const std::pair<const char*, const char*> rows[] = {{"ibm-971_P100-1995", "\xAF\xFE"},
                                                        {"ibm-16684_P110-2003", "\xFE\xFE"}};
    for (const auto& [name, substitution] : rows) {
        EXPECT_EQ(convert(Encoding(name), Encoding::Utf8, substitution), quiet("\uFFFD")) << name;
        EXPECT_EQ(convert(Encoding(name), Encoding::Utf8, std::string(substitution) + "\x21\x22").number,
                  910002U)
            << name;
        EXPECT_EQ(convert(Encoding::Utf8, Encoding(name), "?").bytes, substitution) << name;
    }
}

TEST(IcuTranscoder, AnIgnorableCharacterIsDroppedAndReported) {
    // ICU leaves these out instead of substituting them; the text is another one all the same.
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::UsAscii, "a\u00ADb"),
              (Outcome{"ab", 910003, {"a\u00ADb", "UTF-8", "US-ASCII"}, lossyPairs("ab", "?")}));
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_1, "a\u200Bb").number, 910003U);
}

TEST(IcuTranscoder, SubstitutionsAreQuestionMarksButInTheUnicodeForms) {
    const std::pair<const char*, const char*> rows[] = {
        {"UTF-16LE", "\uFFFD"}, {"UTF-16BE", "\uFFFD"},    {"UTF-32LE", "\uFFFD"}, {"UTF-32BE", "\uFFFD"},
        {"US-ASCII", "?"},      {"windows-1252", "?"},     {"Shift_JIS", "?"},     {"EUC-KR", "?"},
        {"gb18030", "?"},       {"ibm-37_P100-1995", "?"}, {"CESU-8", "?"},        {"KOI8-R", "?"},
    };
    for (const auto& [name, substitution] : rows) {
        const Outcome outcome = convert(Encoding::Utf8, Encoding(name), "\xFF");
        EXPECT_EQ(outcome.number, 910002U) << name;
        // CESU-8 and gb18030 have a form for the U+FFFD that stands for the bad byte, and so need no "?" for it.
        const bool holdsReplacement =
            std::string_view(name) == "CESU-8" || std::string_view(name) == "gb18030";
        EXPECT_EQ(outcome.pairs, lossyPairs(holdsReplacement ? "\uFFFD" : substitution, substitution))
            << name;
    }
}

TEST(IcuTranscoder, TheParametersOfAFailureMayHoldLossesThemselves) {
    // UTF-7 can spell a lone surrogate, which no form of the text without loss exists for.
    EXPECT_EQ(convert(Encoding("UTF-7"), Encoding::Iso8859_1, "a+2AA-b"),
              (Outcome{"a?b", 910003, {"a\uFFFDb", "UTF-7", "ISO-8859-1"}, lossyPairs("a?b", "?")}));
    EXPECT_EQ(
        convert(Encoding("UTF-7"), Encoding::Utf8, "a+2AA-b"),
        (Outcome{"a\uFFFDb", 910003, {"a\uFFFDb", "UTF-7", "UTF-8"}, lossyPairs("a\uFFFDb", "\uFFFD")}));
}

TEST(IcuTranscoder, StartsCleanAfterACaughtFailure) {
    const Encoding sjis("Shift_JIS");
    EXPECT_EQ(convert(sjis, Encoding::Iso8859_1, "\x81").number, 910002U);
    EXPECT_EQ(convert(sjis, Encoding::Iso8859_1, "\x41"), quiet("A"));
    EXPECT_EQ(convert(sjis, Encoding::Iso8859_1, "\x8A\xBF").number, 910003U);
    EXPECT_EQ(convert(sjis, Encoding::Iso8859_1, "\x41"), quiet("A"));
    EXPECT_EQ(convert(sjis, Encoding::Utf8, "\x8A\xBF"), quiet("漢"));
    // Both kinds at once leave nothing behind either, in whichever pair the converters are used next.
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_1, "\xFF\u4E2D").number, 910002U);
    EXPECT_EQ(convert(Encoding::Utf16LE, Encoding::Iso8859_1, View("\xE9\0", 2)), quiet("\xE9"));
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Utf16LE, "\u00E9"), quiet(std::string("\xE9\0", 2)));
}

TEST(IcuTranscoder, TheSameConverterOnBothSidesOfAChainStaysClean) {
    std::string text;
    const Encoding jis("ISO-2022-JP");
    ICUTranscoder(Encoding::Utf8, jis).transcode(View("漢字x"), text);
    const Outcome back = convert(jis, Encoding::Utf8, text);
    EXPECT_EQ(back, quiet("漢字x"));
    EXPECT_EQ(convert(Encoding::Utf8, jis, "漢字x"), quiet(text)) << "escape sequences begin anew";
}

// ---- Streams -----------------------------------------------------------------------------------------------------

/// What a stream gives when fed `step` bytes at a time into a buffer of `room` units.
template <typename CharOut = char>
std::basic_string<CharOut> stream(Encoding from, Encoding to, View in, std::size_t step, std::size_t room) {
    ICUTranscoder transcoder(from, to);
    std::basic_string<CharOut> result;
    std::basic_string<CharOut> buffer(room, CharOut{});
    bool reset = true;
    while (true) {
        View piece = in.substr(0, step);
        in.remove_prefix(piece.size());
        const bool last = in.empty();
        ICUTranscoder::Status status = ICUTranscoder::OutputFull;
        while (status == ICUTranscoder::OutputFull) {
            kvt::future::basic_string_view<CharOut> out(buffer.data(), buffer.size());
            status = transcoder.transcodeStream(piece, out, last, reset);
            EXPECT_EQ(out.data(), buffer.data());
            result.append(out);
            reset = false;
        }
        EXPECT_EQ(status, ICUTranscoder::Ok);
        EXPECT_TRUE(piece.empty());
        if (last) {
            return result;
        }
    }
}

TEST(IcuTranscoderStream, GivesTheSameWhateverThePieces) {
    const std::string text = "Grün 漢字 \U0001F600 end";
    const std::u16string expected = u"Grün 漢字 \U0001F600 end";
    for (const std::size_t step : {1U, 2U, 3U, 5U, 100U}) {
        for (const std::size_t room : {1U, 2U, 3U, 7U, 100U}) {
            EXPECT_EQ(stream<char16_t>(Encoding::Utf8, Encoding::Utf16LE, text, step, room), expected)
                << step << ' ' << room;
        }
    }
    std::string jis;
    ICUTranscoder(Encoding::Utf8, Encoding("ISO-2022-JP")).transcode(View("a漢b字"), jis);
    for (const std::size_t step : {1U, 2U, 3U, 100U}) {
        EXPECT_EQ(stream(Encoding("ISO-2022-JP"), Encoding::Utf8, jis, step, 2), "a漢b字") << step;
        EXPECT_EQ(stream(Encoding::Utf8, Encoding("ISO-2022-JP"), "a漢b字", step, 1), jis) << step;
    }
}

TEST(IcuTranscoderStream, CarriesWhatTheOutputCouldNotTake) {
    ICUTranscoder transcoder(Encoding::Iso8859_1, Encoding::Utf8);
    const std::string input(3000, '\xE9');
    View in(input);
    char buffer[5];
    View out(buffer, sizeof buffer);
    // All that fits in the pivot is taken at once; the output views what was written of the buffer.
    EXPECT_EQ(transcoder.transcodeStream(in, out, true, true), ICUTranscoder::OutputFull);
    EXPECT_EQ(out.data(), buffer);
    EXPECT_EQ(out, "\xC3\xA9\xC3\xA9\xC3");
    EXPECT_EQ(in.data() + in.size(), input.data() + input.size());
    EXPECT_LT(in.size(), input.size());
    std::string all(out);
    ICUTranscoder::Status status = ICUTranscoder::OutputFull;
    while (status == ICUTranscoder::OutputFull) {
        out = View(buffer, sizeof buffer);
        status = transcoder.transcodeStream(in, out, true, false);
        all.append(out);
    }
    EXPECT_EQ(status, ICUTranscoder::Ok);
    EXPECT_TRUE(in.empty());
    EXPECT_EQ(all.size(), 6000U);
}

TEST(IcuTranscoderStream, KeepsAnUnfinishedCharacterUntilTheFlush) {
    ICUTranscoder transcoder(Encoding::Utf8, Encoding::Utf16LE);
    char buffer[16];
    View in("\xE2\x82");
    View out(buffer, sizeof buffer);
    EXPECT_EQ(transcoder.transcodeStream(in, out, false, true), ICUTranscoder::Ok);
    EXPECT_TRUE(in.empty());
    EXPECT_TRUE(out.empty());
    in = "\xAC";
    out = View(buffer, sizeof buffer);
    EXPECT_EQ(transcoder.transcodeStream(in, out, true, false), ICUTranscoder::Ok);
    EXPECT_EQ(out, "\xAC\x20");
}

TEST(IcuTranscoderStream, ResetForgetsAnUnfinishedCharacter) {
    ICUTranscoder transcoder(Encoding::Utf8, Encoding::Utf16LE);
    char buffer[16];
    View in("\xE2\x82");
    View out(buffer, sizeof buffer);
    EXPECT_EQ(transcoder.transcodeStream(in, out, false, true), ICUTranscoder::Ok);
    in = "x";
    out = View(buffer, sizeof buffer);
    EXPECT_EQ(transcoder.transcodeStream(in, out, true, true), ICUTranscoder::Ok);
    EXPECT_EQ(out, View("x\0", 2));
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Utf16LE, "y"), quiet(std::string("y\0", 2)));
}

TEST(IcuTranscoderStream, FailsWithoutAPlaceToReadFrom) {
    ICUTranscoder transcoder(Encoding::Utf8, Encoding::Iso8859_1);
    char buffer[4];
    View in;
    View out(buffer, sizeof buffer);
    EXPECT_EQ(transcoder.transcodeStream(in, out, true, true), ICUTranscoder::Failed);
    EXPECT_TRUE(out.empty());
}

TEST(IcuTranscoderStream, LossesAreReportedByTheNextWholeText) {
    char buffer[16];
    for (const char* next : {"plain", "\u00E9"}) {
        ICUTranscoder transcoder(Encoding::Utf8, Encoding::Iso8859_1);
        View in("\xFF");
        View out(buffer, sizeof buffer);
        EXPECT_EQ(transcoder.transcodeStream(in, out, true, true), ICUTranscoder::Ok);
        EXPECT_EQ(out, "?");
        const std::string latin = *next == 'p' ? next : "\xE9";
        EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_1, next),
                  (Outcome{latin, 910002, {escaped(next), "UTF-8"}, lossyPairs(next, "?")}));
        EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_1, next), quiet(latin)) << "only once";
    }
    ICUTranscoder transcoder(Encoding::Utf8, Encoding::Iso8859_1);
    View in("\u4E2D");
    View out(buffer, sizeof buffer);
    EXPECT_EQ(transcoder.transcodeStream(in, out, true, true), ICUTranscoder::Ok);
    EXPECT_EQ(out, "?");
    // The loss is that of the target's converter, whatever the next source is.
    EXPECT_EQ(convert(Encoding::Windows1252, Encoding::Iso8859_1, "plain").number, 910003U);
    EXPECT_EQ(convert(Encoding::Windows1252, Encoding::Iso8859_1, "plain"), quiet("plain"));
}

TEST(IcuTranscoderStream, ALossElsewhereStaysWithItsConverter) {
    char buffer[16];
    ICUTranscoder transcoder(Encoding::Utf8, Encoding::Iso8859_2);
    View in("\u4E2D");
    View out(buffer, sizeof buffer);
    EXPECT_EQ(transcoder.transcodeStream(in, out, true, true), ICUTranscoder::Ok);
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_1, "\u00E9"), quiet("\xE9"));
    std::thread([] {
        EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_2, "x"), quiet("x"))
            << "another thread has its own";
    }).join();
    EXPECT_EQ(convert(Encoding::Utf8, Encoding::Iso8859_2, "x").number, 910003U);
}

TEST(IcuTranscoderStream, WideUnitsAreCountedAsUnits) {
    ICUTranscoder transcoder(Encoding::Utf32LE, Encoding::Utf16LE);
    const std::u32string text = U"a\U0001F600b";
    kvt::future::basic_string_view<char32_t> in(text);
    char16_t buffer[3];
    kvt::future::basic_string_view<char16_t> out(buffer, 3);
    EXPECT_EQ(transcoder.transcodeStream(in, out, true, true), ICUTranscoder::OutputFull);
    EXPECT_EQ(out, std::u16string_view(u"a\U0001F600"));
    out = {buffer, 3};
    EXPECT_EQ(transcoder.transcodeStream(in, out, true, false), ICUTranscoder::Ok);
    EXPECT_EQ(out, std::u16string_view(u"b"));
    EXPECT_TRUE(in.empty());
}

// ---- Threads -----------------------------------------------------------------------------------------------------

TEST(IcuTranscoderThreads, ConvertAndRegisterAtOnce) {
    const std::vector<std::string> names = availableConverters();
    constexpr int threadCount = 8;
    std::atomic<int> ready{0};
    std::vector<std::vector<std::pair<std::uint32_t, std::string_view>>> seen(threadCount);
    std::vector<std::thread> threads;
    std::atomic<int> wrong{0};
    for (int t = 0; t < threadCount; ++t) {
        threads.emplace_back([&, t] {
            ++ready;
            while (ready < threadCount) {
                std::this_thread::yield();
            }
            for (std::size_t i = 0; i < names.size(); ++i) {
                // Half of the threads meet the names in the other order.
                const std::string& name = names[t % 2 == 0 ? i : names.size() - 1 - i];
                const Encoding encoding(name, kvt::ex::nothrow);
                seen[static_cast<std::size_t>(t)].emplace_back(encoding.id(), encoding.getName());
                const Encoding unknown("no-such-" + name + std::to_string(t), kvt::ex::nothrow);
                std::string there;
                std::string back;
                const std::string text = "ABC";
                try {
                    ICUTranscoder(Encoding::Utf8, encoding).transcode(View(text), there);
                    ICUTranscoder(encoding, Encoding::Utf8).transcode(View(there), back);
                    wrong += back != text || unknown.id() != Encoding::Unknown;
                } catch (const UStringTranscodingException& failure) {
                    // A few have no Latin letters of this width.
                    wrong += failure.getLossyConversion().isEmpty();
                } catch (const UStringBadEncodingException& failure) {
                    wrong += failure.getLossyConversion().isEmpty();
                }
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(wrong, 0);
    // The views were taken while other threads registered names, and all threads agree on every id.
    for (auto& thread : seen) {
        for (const auto& [id, name] : thread) {
            EXPECT_EQ(Encoding(name).id(), id) << name;
            EXPECT_EQ(Encoding(name).getName().data(), name.data()) << name;
        }
        std::sort(thread.begin(), thread.end());
        EXPECT_EQ(thread, seen.front());
    }
}

TEST(IcuTranscoderThreads, LossesStayOnTheirThread) {
    std::vector<std::thread> threads;
    std::atomic<int> wrong{0};
    for (int t = 0; t < 4; ++t) {
        threads.emplace_back([&, t] {
            for (int i = 0; i < 300; ++i) {
                const bool good = t % 2 == 0;
                const Outcome outcome =
                    convert(Encoding::Utf8, Encoding("KOI8-R"), good ? "\u0416" : "\u4E2D\xFF");
                wrong += outcome.number != (good ? 0U : 910002U) || outcome.bytes != (good ? "\xF6" : "??");
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(wrong, 0);
}

} // namespace
} // namespace kvt::test
