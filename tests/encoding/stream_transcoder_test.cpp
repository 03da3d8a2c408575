// Streams: the blocks do not matter, and an object serves many streams.
#include "streamed.h"

#include <gtest/gtest.h>

#include <random>
#include <stdexcept>
#include <string>
#include <string_view>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

namespace {

using namespace kvt::test;
using namespace std::string_view_literals;

struct Sample {
    const char* encoding;
    const char* text; ///< UTF-8
};

constexpr Sample samples[] = {
    {"UTF-8", "a\u00e9\u20ac\U0001F600 z\u3042\U0010FFFF\u0800\u07FF."},
    {"UTF-16LE", "a\u00e9\u20ac\U0001F600 z\u3042\U0010FFFF\uFEFF."},
    {"UTF-16BE", "a\u00e9\u20ac\U0001F600 z\u3042\U0010FFFF\uFEFF."},
    {"UTF-32LE", "a\u00e9\u20ac\U0001F600 z\u3042\U0010FFFF."},
    {"UTF-32BE", "a\u00e9\u20ac\U0001F600 z\u3042\U0010FFFF."},
    {"UTF-7", "a+b\u00e9\u20ac\U0001F600-z & \u3042\u3044x+"},
    {"IMAP-mailbox-name", "a&b\u00e9\u20ac\U0001F600-z \u3042\u3044x&"},
    {"CESU-8", "a\u00e9\u20ac\U0001F600\U0010FFFFz"},
    {"SCSU", "a\u00e9\u0416\u0436\u3042\u4e2d\u6587\U0001F600z"},
    {"BOCU-1", "a \u00e9\u0416\u0436\u3042\u4e2d\n\u6587\U0001F600z"},
    {"GB18030", "a\u00e9\u20ac\u4e2d\u6587\U0001F600\u0416."},
    {"GBK", "a\u4e2d\u6587 ABC\u0416."},
    {"HZ-GB-2312", "a~b {\u4e2d\u6587}~~ \u4e2d\n\u6587."},
    {"ISO-2022-JP", "ABC \u65e5\u672c\u8a9e text\n\u3042\u30a2 \\ ~ end \u3042"},
    {"ISO-2022-JP-2", "A\u65e5 \u4e2d \ud55c \u00e9 \u03b1z"},
    {"ISO-2022-KR", "ABC \ud55c\uad6d\uc5b4 text\n\ud55c."},
    {"ISO-2022-CN", "ABC \u4e2d\u6587 text\n\u4e2d."},
    {"Shift_JIS", "ABC \u65e5\u672c\u8a9e\u8868\u30a2\uff71\uff72 text"},
    {"EUC-JP", "ABC \u65e5\u672c\u8a9e\u8868\uff71\u4e02 text"},
    {"EUC-KR", "ABC \ud55c\uad6d\uc5b4 text"},
    {"EUC-TW", "ABC \u4e2d\u6587\u4e04 text"},
    {"Big5", "ABC \u4e2d\u6587\u529f text"},
    {"Big5-HKSCS", "ABC \u4e2d\u00ca\u0304\u00ea\u030c\u00ca\u00ea\U00020547 text"},
    {"ibm-930", "ABC \u65e5\u672c\u8a9e\uff71 TEXT \u3042"},
    {"ibm-939", "abc \u65e5\u672c\u8a9e text \u3042"},
    {"ibm-37_P100-1995,swaplfnl", "abc\n\u00e9 text"},
    {"IBM037", "abc \u00e9 text"},
    {"windows-1252", "caf\u00e9 \u20ac \u201e\u201c\u2022"},
    {"windows-1258", "Vi\u1ec7t Nam \u0111\u01b0\u1eddng"},
    {"KOI8-R", "\u041f\u0440\u0438\u0432\u0435\u0442, world"},
    {"ISO-8859-7", "\u0393\u03b5\u03b9\u03ac"},
    {"TIS-620", "\u0e2a\u0e27\u0e31\u0e2a\u0e14\u0e35"},
    {"ISCII,version=0", "\u0939\u093f\u0928\u094d\u0926\u0940 abc \u0939"},
    {"x-windows-949", "ABC \ud55c\uad6d\uc5b4 \ub620"},
};

TEST(StreamTranscoder, BlocksDoNotMatter) {
    for (const Sample& sample : samples) {
        const std::string bytes = transcodedWhole("UTF-8", sample.encoding, sample.text);
        ASSERT_FALSE(bytes.empty()) << sample.encoding;
        expectTheSameForAllBlocks("UTF-8", sample.encoding, sample.text);
        expectTheSameForAllBlocks(sample.encoding, "UTF-8", bytes);
        expectTheSameForAllBlocks(sample.encoding, "UTF-16BE", bytes);
        expectTheSameForAllBlocks(sample.encoding, "windows-1252", bytes);
        expectTheSameForAllBlocks(sample.encoding, "ISO-2022-JP", bytes);
    }
}

TEST(StreamTranscoder, BlocksDoNotMatterForBytesThatAreNoText) {
    std::mt19937 random(99);
    for (const Sample& sample : samples) {
        const std::string bytes = transcodedWhole("UTF-8", sample.encoding, sample.text);
        for (int round = 0; round < 4; ++round) {
            std::string text = bytes;
            for (int change = 0; change < 4; ++change) {
                text[random() % text.size()] = static_cast<char>(random());
            }
            text += static_cast<char>(0x80 + random() % 128);
            expectTheSameForAllBlocks(sample.encoding, "UTF-8", text);
            expectTheSameForAllBlocks(sample.encoding, "KOI8-R", text);
            if (HasFatalFailure()) {
                return;
            }
        }
    }
}

TEST(StreamTranscoder, LongTextsPassEveryBufferBorder) {
    for (const char* const encoding : {"UTF-8", "UTF-16BE", "Shift_JIS", "GB18030", "ISO-2022-JP"}) {
        SCOPED_TRACE(encoding);
        std::string text;
        for (int count = 0; text.size() < 40000; ++count) {
            text += "x\u65e5\u672c\u3042" + std::string(static_cast<std::size_t>(count % 7), '.');
        }
        const std::string bytes = transcodedWhole("UTF-8", encoding, text);
        StreamTranscoder forth(Encoding::Utf8, Encoding(encoding));
        StreamTranscoder back(Encoding(encoding), Encoding::Utf8);
        for (const std::size_t size :
             {std::size_t{1}, std::size_t{1023}, std::size_t{1024}, std::size_t{1025}, std::size_t{4095},
              std::size_t{4096}, std::size_t{4097}, std::size_t{100000}}) {
            const Streamed there = streamed(forth, text, {size});
            EXPECT_TRUE(there.out == bytes) << size;
            EXPECT_TRUE(there.losses.empty()) << size;
            const Streamed here = streamed(back, bytes, {size});
            EXPECT_TRUE(here.out == text) << size;
            EXPECT_TRUE(here.losses.empty()) << size;
        }
    }
}

struct Seen {
    char32_t character;
    std::uint64_t offset;
    friend bool operator==(const Seen&, const Seen&) = default;
    friend void PrintTo(const Seen& seen, std::ostream* stream) {
        *stream << "U+" << std::hex << static_cast<std::uint32_t>(seen.character) << std::dec << '@'
                << seen.offset;
    }
};

TEST(StreamTranscoder, WatchNamesEachCharacterAndWhereItBegins) {
    struct Row {
        const char* from;
        std::string_view text;
        std::vector<Seen> characters;
    };
    const Row rows[] = {
        {"UTF-8", "a\u00e9\U0001F600\xFFz", {{U'a', 0}, {0xE9, 1}, {0x1F600, 3}, {0xFFFD, 7}, {U'z', 8}}},
        {"UTF-16LE", "\x3D\xD8\x00\xDEz\0\x3D"sv, {{0x1F600, 0}, {U'z', 4}, {0xFFFD, 6}}},
        {"GB18030", "\xA1\x35\xFF", {{0xFFFD, 0}, {U'5', 1}, {0xFFFD, 2}}},
        {"ISO-2022-JP", "a\x1B$B$\"$\"\x1B(Bz", {{U'a', 0}, {0x3042, 4}, {0x3042, 6}, {U'z', 11}}},
        {"CESU-8", "\xED\xA0\xBD\xED\xB8\x80z", {{0x1F600, 0}, {U'z', 6}}},
        {"HZ-GB-2312", "ab~", {{U'a', 0}, {U'b', 1}, {0xFFFD, 2}}},
        {"Shift_JIS", "a\x83\x5C\xB1\xA0z", {{U'a', 0}, {0x30BD, 1}, {0xFF71, 3}, {0xFFFD, 4}, {U'z', 5}}},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.from);
        // Watched from the first byte on, and from each other one.
        for (std::size_t start = 0; start < row.text.size(); ++start) {
            std::vector<Seen> seen;
            StreamTranscoder stream(Encoding(row.from), Encoding::Utf32LE);
            std::string before;
            stream.convert(row.text.substr(0, start), before, {});
            stream.watch([&](char32_t character, std::uint64_t offset) {
                seen.push_back({character, offset});
            });
            std::string out = before;
            stream.convert(row.text.substr(start), out, {});
            stream.finish(out, {});
            const auto first = row.characters.begin() + static_cast<std::ptrdiff_t>(before.size() / 4);
            EXPECT_EQ(seen, std::vector<Seen>(first, row.characters.end())) << start;
            EXPECT_EQ(out.size(), row.characters.size() * 4);
        }
    }
}

TEST(StreamTranscoder, WatchEndsWithAnEmptyHandler) {
    StreamTranscoder stream(Encoding::Utf8, Encoding::UsAscii);
    std::string out;
    std::u32string seen;
    stream.convert("ab", out, {});
    stream.watch([&](char32_t character, std::uint64_t) { seen += character; });
    stream.convert("c\u00e9", out, {});
    stream.watch({});
    stream.convert("d", out, {});
    stream.watch([](char32_t, std::uint64_t) { throw std::runtime_error("seen"); });
    EXPECT_EQ(failureOf([&] { stream.convert("e", out, {}); }).text, "seen");
    EXPECT_EQ(seen, U"c\u00e9");
}

TEST(StreamTranscoder, FinishReturnsAStatefulEncodingToItsStart) {
    StreamTranscoder stream(Encoding::Utf8, Encoding("ISO-2022-JP"));
    std::string out;
    stream.convert("\u3042", out, {});
    stream.finish(out, {});
    EXPECT_EQ(out, "\x1B$B$\"\x1B(B");
    out.clear();
    stream.convert("\u3042", out, {});
    stream.finish(out, {});
    EXPECT_EQ(out, "\x1B$B$\"\x1B(B") << "the second stream selects its set again";
}

TEST(StreamTranscoder, ServesOneStreamAfterTheOther) {
    StreamTranscoder stream(Encoding("ISO-2022-JP"), Encoding::Utf8);
    for (int round = 0; round < 3; ++round) {
        std::string out;
        std::vector<Loss> losses;
        const auto note = [&](const Loss& loss) { losses.push_back(loss); };
        EXPECT_EQ(stream.position(), 0u);
        // The stream ends within a character and in the Japanese set; the next one starts with neither.
        stream.convert("a\x1B$B$\"$", out, note);
        EXPECT_EQ(stream.position(), 7u);
        stream.finish(out, note);
        EXPECT_EQ(stream.position(), 0u);
        EXPECT_EQ(out, "a\u3042\uFFFD");
        ASSERT_EQ(losses.size(), 1u);
        EXPECT_EQ(losses[0].kind, Loss::BadInput);
        EXPECT_EQ(losses[0].offset, 6u);
        EXPECT_EQ(losses[0].bytes, "$");
    }
}

TEST(StreamTranscoder, AppendsToWhatIsThere) {
    StreamTranscoder stream(Encoding::Iso8859_1, Encoding::Utf8);
    std::string out = "before ";
    stream.convert("\xE9", out, {});
    stream.convert("", out, {});
    stream.convert({}, out, {});
    stream.finish(out, {});
    EXPECT_EQ(out, "before \u00e9");
    stream.finish(out, {});
    EXPECT_EQ(out, "before \u00e9");
}

TEST(StreamTranscoder, ConvertsWithoutAHandler) {
    StreamTranscoder stream(Encoding::Utf8, Encoding::UsAscii);
    std::string out;
    stream.convert("a\u00e9\xFF\xC3", out, {});
    stream.finish(out, nullptr);
    EXPECT_EQ(out, "a???");
}

TEST(StreamTranscoder, SubstitutionStandsForEachLoss) {
    EXPECT_EQ(StreamTranscoder(Encoding::Utf8, Encoding::Windows1252).substitution(), "?");
    EXPECT_EQ(StreamTranscoder(Encoding::Utf16LE, Encoding::Utf8).substitution(), "\uFFFD");
    EXPECT_EQ(StreamTranscoder(Encoding::Utf8, Encoding::Utf16LE).substitution(), "\xFD\xFF");
    EXPECT_EQ(StreamTranscoder(Encoding::Utf8, Encoding::Utf16BE).substitution(), "\xFF\xFD");
    EXPECT_EQ(StreamTranscoder(Encoding::Utf8, Encoding::Utf32BE).substitution(), "\0\0\xFF\xFD"sv);
    EXPECT_EQ(StreamTranscoder(Encoding::Utf8, Encoding("Shift_JIS")).substitution(), "?");
    EXPECT_EQ(StreamTranscoder(Encoding::Utf8, Encoding("IBM037")).substitution(), "\x6F");
}

TEST(StreamTranscoder, ALaterBlockReportsOnlyItsOwnLosses) {
    StreamTranscoder stream(Encoding::Utf8, Encoding::UsAscii);
    std::string out;
    std::vector<Loss> losses;
    const auto note = [&](const Loss& loss) { losses.push_back(loss); };
    stream.convert("ab\u00e9", out, note);
    EXPECT_EQ(losses, (std::vector<Loss>{lost(2, "\u00e9", 0xE9)}));
    losses.clear();
    stream.convert("abc", out, note);
    EXPECT_TRUE(losses.empty());
    stream.convert("\u00e9", out, note);
    EXPECT_EQ(losses, (std::vector<Loss>{lost(7, "\u00e9", 0xE9)}));
}

TEST(StreamTranscoder, AnExceptionOfTheHandlerLeavesConvert) {
    const auto refuse = [](const Loss& loss) {
        throw std::runtime_error("at " + std::to_string(loss.offset));
    };
    for (const char* const to : {"US-ASCII", "UTF-16BE", "ISO-2022-JP", "UTF-8"}) {
        SCOPED_TRACE(to);
        std::string out;
        {
            StreamTranscoder stream(Encoding::Utf8, Encoding(to));
            EXPECT_EQ(failureOf([&] { stream.convert("abc\xFFz", out, refuse); }).text, "at 3");
        }
        {
            StreamTranscoder stream(Encoding::Utf8, Encoding(to));
            stream.convert("abc\xC3", out, refuse);
            EXPECT_EQ(failureOf([&] { stream.finish(out, refuse); }).text, "at 3");
        }
    }
    // Nothing stays behind for others on this thread.
    EXPECT_EQ(transcodedWhole("UTF-8", "US-ASCII", "abc"), "abc");
    EXPECT_EQ(failureOf([] {
                  std::string out;
                  ICUTranscoder(Encoding::Utf8, Encoding::UsAscii).transcode<char, char>("abc", out);
              }),
              noFailure());
}

TEST(StreamTranscoder, LossesAreNotLeftToTheThreadsOwnConverters) {
    EXPECT_EQ(streamed("Shift_JIS", "windows-1252", "\x82 \x82\xA0").losses.size(), 2u);
    EXPECT_EQ(
        failureOf([] {
            std::string out;
            ICUTranscoder(Encoding("Shift_JIS"), Encoding::Windows1252).transcode<char, char>("abc", out);
        }),
        noFailure());
}

TEST(StreamTranscoder, RefusesEncodingsWithoutAConverter) {
    for (const Encoding::Type none : {Encoding::Unknown, Encoding::Binary, Encoding::Wwjd}) {
        EXPECT_EQ(failureOf([&] { StreamTranscoder(none, Encoding::Utf8); }),
                  invalidEncodingFailure("unknown"));
        EXPECT_EQ(failureOf([&] { StreamTranscoder(Encoding::Utf8, none); }),
                  invalidEncodingFailure("unknown"));
        EXPECT_EQ(failureOf([&] { StreamTranscoder(none, none); }), invalidEncodingFailure("unknown"));
    }
    EXPECT_EQ(failureOf([] { StreamTranscoder(Encoding::System, Encoding::Utf16LE); }), noFailure());
}

TEST(StreamTranscoder, MovesInTheMiddleOfACharacterAndBetweenThreads) {
    static_assert(std::is_nothrow_move_constructible_v<StreamTranscoder>);
    static_assert(std::is_nothrow_move_assignable_v<StreamTranscoder>);
    static_assert(!std::is_copy_constructible_v<StreamTranscoder>);
    std::string out;
    StreamTranscoder first(Encoding::Utf8, Encoding("Shift_JIS"));
    first.convert("a\xE3\x81", out, {});
    StreamTranscoder second(std::move(first));
    std::thread([&] { second.convert("\x82\xE3", out, {}); }).join();
    StreamTranscoder third(Encoding::Utf8, Encoding::Utf16LE);
    third = std::move(second);
    EXPECT_EQ(third.position(), 5u);
    third.convert("\x81\x84z", out, {});
    third.finish(out, {});
    EXPECT_EQ(out, "a\x82\xA0\x82\xA2z");
}

TEST(StreamTranscoder, StreamsDoNotDisturbEachOther) {
    StreamTranscoder left(Encoding("ISO-2022-JP"), Encoding::Utf8);
    StreamTranscoder right(Encoding("ISO-2022-JP"), Encoding::Utf8);
    std::string leftOut;
    std::string rightOut;
    left.convert("\x1B$B$", leftOut, {});
    right.convert("$\"", rightOut, {});
    left.convert("\"\x1B(B", leftOut, {});
    left.finish(leftOut, {});
    right.finish(rightOut, {});
    EXPECT_EQ(leftOut, "\u3042");
    EXPECT_EQ(rightOut, "$\"");
}

} // namespace
