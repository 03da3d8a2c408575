// Streams: the blocks do not matter, every loss is reported with its place, and an object serves many
// streams.

#include <kvt/encoding/icu_transcoder.h>
#include <kvt/encoding/stream_transcoder.h>
#include <kvt/foundation/throwable.h>
#include <support/failure_record.h>

#include <gtest/gtest.h>

#include <random>
#include <stdexcept>
#include <string>
#include <string_view>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

namespace kvt::ex {

bool operator==(const Loss& left, const Loss& right) {
    return left.kind == right.kind && left.offset == right.offset && left.bytes == right.bytes &&
           left.codePoint == right.codePoint;
}

void PrintTo(const Loss& loss, std::ostream* stream) {
    *stream << (loss.kind == Loss::BadInput ? "bad" : "lost") << " at " << loss.offset << " ["
            << kvt::test::printable(loss.bytes) << "] U+" << std::hex
            << static_cast<std::uint32_t>(loss.codePoint) << std::dec;
}

} // namespace kvt::ex

namespace {

using namespace kvt::test;
using namespace std::string_view_literals;
using kvt::ex::Encoding;
using kvt::ex::ICUTranscoder;
using kvt::ex::Loss;
using kvt::ex::StreamTranscoder;

struct Streamed {
    std::string out;
    std::vector<Loss> losses;
    std::uint64_t taken = 0;
};

/// Runs one stream, in blocks of the sizes given; the last size is used until the text ends.
Streamed streamed(StreamTranscoder& stream, std::string_view text, const std::vector<std::size_t>& sizes) {
    Streamed result;
    const auto note = [&](const Loss& loss) { result.losses.push_back(loss); };
    for (std::size_t block = 0; !text.empty(); ++block) {
        const std::string_view piece = text.substr(0, sizes[std::min(block, sizes.size() - 1)]);
        // A copy of its own, so that reading beyond the block is noticed.
        stream.convert(std::string(piece), result.out, note);
        text.remove_prefix(piece.size());
        result.taken += piece.size();
        EXPECT_EQ(stream.position(), result.taken);
    }
    stream.finish(result.out, note);
    return result;
}

Streamed streamed(const char* from, const char* to, std::string_view text) {
    StreamTranscoder stream{Encoding(from), Encoding(to)};
    return streamed(stream, text, {text.size() + 1});
}

/// What ICUTranscoder makes of the whole text, substitutions included.
std::string transcodedWhole(const char* from, const char* to, std::string_view text) {
    std::string out;
    try {
        ICUTranscoder(Encoding(from), Encoding(to)).transcode<char, char>(text, out);
    } catch (const kvt::ex::UStringException&) {
        // The substituted text is in `out`.
    }
    return out;
}

/// All blocks that can be told apart: one border at each place, and blocks of equal sizes.
void expectTheSameForAllBlocks(const char* from, const char* to, std::string_view text) {
    SCOPED_TRACE(std::string(from) + " to " + to + ": " + printable(text.substr(0, 80)));
    StreamTranscoder stream{Encoding(from), Encoding(to)};
    const Streamed whole = streamed(stream, text, {text.size() + 1});
    if (!(Encoding(from) == Encoding(to))) {
        // ICU leaves out the announcement of this encoding where a conversion begins with a reset.
        const std::string announcement = std::string_view(to) == "ISO-2022-KR" ? "\x1B$)C" : "";
        ASSERT_EQ(printable(whole.out), printable(announcement + transcodedWhole(from, to, text)));
    }
    // A compressor looks ahead and may choose other bytes for the same text.
    const bool compressed = std::string_view(to) == "SCSU";
    const auto readable = [&](const std::string& out) {
        return printable(compressed ? transcodedWhole(to, "UTF-8", out) : out);
    };
    const auto check = [&](const std::vector<std::size_t>& sizes) {
        const Streamed split = streamed(stream, text, sizes);
        ASSERT_EQ(readable(split.out), readable(whole.out)) << "first block " << sizes[0];
        ASSERT_EQ(split.losses, whole.losses) << "first block " << sizes[0];
    };
    for (std::size_t border = 1; border < text.size() && !testing::Test::HasFatalFailure(); ++border) {
        check({border, text.size()});
    }
    for (const std::size_t size : {1u, 2u, 3u, 5u, 7u}) {
        check({size});
    }
}

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

/// A piece of a source text, and what is lost of it.
struct Piece {
    std::string_view bytes;
    std::string_view out;          ///< in the target, with substitutes
    std::vector<Loss> losses = {}; ///< offsets from the start of the piece
};

Loss bad(std::uint64_t offset, std::string_view bytes) {
    return {Loss::BadInput, offset, std::string(bytes), 0xFFFD};
}
Loss lost(std::uint64_t offset, std::string_view bytes, char32_t codePoint) {
    return {Loss::NotRepresentable, offset, std::string(bytes), codePoint};
}

struct Mixture {
    const char* from;
    const char* to;
    std::vector<Piece> pieces;
};

std::vector<Mixture> mixtures() {
    return {
        {"UTF-8",
         "UTF-16BE",
         {{"a", "\0a"sv},
          {" \u00e9", "\0 \0\xE9"sv},
          {" \U0001F600", "\0 \xD8\x3D\xDE\0"sv},
          {"\xFF", "\xFF\xFD", {bad(0, "\xFF")}},
          {"\x80", "\xFF\xFD", {bad(0, "\x80")}},
          {"\xC3x", "\xFF\xFD\0x"sv, {bad(0, "\xC3")}},
          {"\xE2\x82x", "\xFF\xFD\0x"sv, {bad(0, "\xE2\x82")}},
          {"\xF0\x9F\x98x", "\xFF\xFD\0x"sv, {bad(0, "\xF0\x9F\x98")}},
          {"\xC0", "\xFF\xFD", {bad(0, "\xC0")}},
          {"\xED\xA0\x80", "\xFF\xFD\xFF\xFD\xFF\xFD", {bad(0, "\xED"), bad(1, "\xA0"), bad(2, "\x80")}}}},
        {"UTF-8",
         "windows-1252",
         {{"abc", "abc"},
          {"\u20ac", "\x80"},
          {"\u3042", "?", {lost(0, "\u3042", 0x3042)}},
          {"\U0001F600", "?", {lost(0, "\U0001F600", 0x1F600)}},
          {"\u0416", "?", {lost(0, "\u0416", 0x416)}},
          {"\uFFFD", "?", {lost(0, "\uFFFD", 0xFFFD)}},
          {"\xFF", "?", {bad(0, "\xFF")}},
          {"\u200B", "", {lost(0, "\u200B", 0x200B)}}}},
        {"UTF-16LE",
         "UTF-8",
         {{"a\0"sv, "a"},
          {"\x3D\xD8\x00\xDE"sv, "\U0001F600"},
          {"\x00\xD8x\0"sv, "\uFFFDx", {bad(0, "\x00\xD8"sv)}},
          {"\x00\xDC"sv, "\uFFFD", {bad(0, "\x00\xDC"sv)}}}},
        {"UTF-16BE",
         "US-ASCII",
         {{"\0a"sv, "a"},
          {"\xD8\x3D\xDE\x00"sv, "?", {lost(0, "\xD8\x3D\xDE\x00"sv, 0x1F600)}},
          {"\xD8\x00\0x"sv, "?x", {bad(0, "\xD8\x00"sv)}},
          {"\0\xE9"sv, "?", {lost(0, "\0\xE9"sv, 0xE9)}}}},
        {"UTF-32LE",
         "UTF-8",
         {{"a\0\0\0"sv, "a"},
          {"\x00\xF6\x01\x00"sv, "\U0001F600"},
          {"\x00\x00\x11\x00"sv, "\uFFFD", {bad(0, "\x00\x00\x11\x00"sv)}},
          {"\x00\xD8\x00\x00"sv, "\uFFFD", {bad(0, "\x00\xD8\x00\x00"sv)}}}},
        {"Shift_JIS",
         "KOI8-R",
         {{"abc", "abc"},
          {" \x82 ", " ? ", {bad(1, "\x82")}},
          {"\x84\x40", "\xE1"},
          {"\x82\xA0", "?", {lost(0, "\x82\xA0", 0x3042)}},
          {"\xB1", "?", {lost(0, "\xB1", 0xFF71)}}}},
        {"EUC-JP",
         "UTF-8",
         {{"abc", "abc"}, {"\xA4\xA2", "\u3042"}, {" \xA4 ", " \uFFFD ", {bad(1, "\xA4")}}}},
        {"GB18030",
         "ISO-8859-1",
         {{"abc", "abc"},
          {"\xA8\xA6", "\xE9"},
          {" \x81 ", " ? ", {bad(1, "\x81")}},
          {"\xD6\xD0", "?", {lost(0, "\xD6\xD0", 0x4E2D)}},
          {"\x94\x39\xFC\x36", "?", {lost(0, "\x94\x39\xFC\x36", 0x1F600)}}}},
        {"ISO-8859-3", "UTF-8", {{"abc", "abc"}, {"\xA5", "\uFFFD", {bad(0, "\xA5")}}, {"\xE9", "\u00e9"}}},
        {"US-ASCII", "UTF-8", {{"abc", "abc"}, {"\xE9", "\uFFFD", {bad(0, "\xE9")}}}},
        {"windows-1252", "ISO-8859-1", {{"\xE9", "\xE9"}, {"\x80", "?", {lost(0, "\x80", 0x20AC)}}}},
        {"IBM037", "US-ASCII", {{"\x81", "a"}, {"\x51", "?", {lost(0, "\x51", 0xE9)}}}},
        {"KOI8-R", "IBM037", {{"a", "\x81"}, {"\xC1", "\x6F", {lost(0, "\xC1", 0x430)}}}},
        {"UTF-8",
         "ISO-2022-JP",
         {{"a", "a"},
          {"\U0001F600", "?", {lost(0, "\U0001F600", 0x1F600)}},
          {"\xFF", "?", {bad(0, "\xFF")}}}},
        // Equal encodings: the text is validated.
        {"UTF-8",
         "UTF-8",
         {{"a\u00e9", "a\u00e9"},
          {"\xFF", "\uFFFD", {bad(0, "\xFF")}},
          {"\xC3z", "\uFFFDz", {bad(0, "\xC3")}}}},
        {"Shift_JIS", "Shift_JIS", {{"a\x82\xA0", "a\x82\xA0"}, {" \x82 ", " ? ", {bad(1, "\x82")}}}},
        {"UTF-16LE", "UTF-16LE", {{"a\0"sv, "a\0"sv}, {"\x00\xDC"sv, "\xFD\xFF", {bad(0, "\x00\xDC"sv)}}}},
        {"US-ASCII", "US-ASCII", {{"abc", "abc"}, {"\xE9", "?", {bad(0, "\xE9")}}}},
    };
}

TEST(StreamTranscoderLosses, HaveTheirPlaceBytesAndCharacter) {
    for (const Mixture& mixture : mixtures()) {
        for (const Piece& piece : mixture.pieces) {
            SCOPED_TRACE(std::string(mixture.from) + " to " + mixture.to + ": " + printable(piece.bytes));
            const Streamed result = streamed(mixture.from, mixture.to, piece.bytes);
            EXPECT_EQ(printable(result.out), printable(piece.out));
            EXPECT_EQ(result.losses, piece.losses);
        }
    }
}

TEST(StreamTranscoderLosses, AreExactInLongMixturesOfGoodAndBad) {
    std::mt19937 random(1);
    for (const Mixture& mixture : mixtures()) {
        SCOPED_TRACE(std::string(mixture.from) + " to " + mixture.to);
        StreamTranscoder stream{Encoding(mixture.from), Encoding(mixture.to)};
        for (const std::size_t count : {3u, 20u, 3000u}) {
            std::string text;
            Streamed expected;
            for (std::size_t number = 0; number < count; ++number) {
                // Good text twice as often, so that runs of it pass the shorter ways, too.
                const Piece& piece = mixture.pieces[random() % 3 == 0 ? random() % mixture.pieces.size() : 0];
                for (Loss loss : piece.losses) {
                    loss.offset += text.size();
                    expected.losses.push_back(loss);
                }
                text += piece.bytes;
                expected.out += piece.out;
            }
            for (const std::size_t size : {std::size_t{1}, std::size_t{2}, std::size_t{1000}, text.size()}) {
                const Streamed result = streamed(stream, text, {size});
                ASSERT_TRUE(result.out == expected.out) << count << " pieces in blocks of " << size;
                ASSERT_EQ(result.losses.size(), expected.losses.size())
                    << count << " pieces in blocks of " << size;
                for (std::size_t at = 0; at < expected.losses.size(); ++at) {
                    ASSERT_EQ(result.losses[at], expected.losses[at])
                        << count << " pieces in blocks of " << size;
                }
            }
        }
    }
}

// More than are remembered, and each again, so that some are known and others are not any more.
TEST(StreamTranscoderLosses, OfManyCharactersAreEachTheirOwn) {
    std::vector<std::pair<std::string, char32_t>> characters;
    for (char32_t codePoint = 0x3400; codePoint < 0x9F00; ++codePoint) {
        characters.emplace_back(std::string{static_cast<char>(0xE0 | codePoint >> 12),
                                            static_cast<char>(0x80 | (codePoint >> 6 & 0x3F)),
                                            static_cast<char>(0x80 | (codePoint & 0x3F))},
                                codePoint);
    }
    std::mt19937 random(5);
    std::string text(100, 'a');
    std::string out = text;
    std::vector<Loss> losses;
    for (int round = 0; round < 60000; ++round) {
        const auto& [bytes, codePoint] = characters[random() % (round % 2 == 0 ? 300 : characters.size())];
        losses.push_back(lost(text.size(), bytes, codePoint));
        const std::string behind(random() % 3, 'b');
        text += bytes + behind;
        out += "?" + behind;
    }
    for (const char* const to : {"windows-1252", "US-ASCII", "KOI8-R"}) {
        StreamTranscoder stream(Encoding::Utf8, Encoding(to));
        for (const std::size_t size : {std::size_t{997}, text.size()}) {
            const Streamed result = streamed(stream, text, {size});
            EXPECT_TRUE(result.out == out) << to;
            ASSERT_EQ(result.losses.size(), losses.size()) << to;
            EXPECT_TRUE(result.losses == losses) << to;
        }
    }
}

TEST(StreamTranscoderLosses, AnUnfinishedCharacterAtTheEndIsOne) {
    struct Row {
        const char* from;
        std::string_view text;
        std::string_view out;
        Loss loss;
    };
    const Row rows[] = {
        {"UTF-8", "a\xC3", "a\uFFFD", bad(1, "\xC3")},
        {"UTF-8", "a\xE2\x82", "a\uFFFD", bad(1, "\xE2\x82")},
        {"UTF-8", "\xF0\x9F\x98", "\uFFFD", bad(0, "\xF0\x9F\x98")},
        {"UTF-16LE", "a\0b"sv, "a\uFFFD", bad(2, "b")},
        {"UTF-16BE", "\0a\xD8\x3D"sv, "a\uFFFD", bad(2, "\xD8\x3D")},
        {"UTF-32BE", "\0\0\0a\0\0"sv, "a\uFFFD", bad(4, "\0\0"sv)},
        {"Shift_JIS", "a\x82", "a\uFFFD", bad(1, "\x82")},
        {"EUC-JP", "a\x8F\xA2", "a\uFFFD", bad(1, "\x8F\xA2")},
        {"GB18030", "ab\x94\x39\xFC", "ab\uFFFD", bad(2, "\x94\x39\xFC")},
        // Of these ICU says nothing.
        {"UTF-7", "a+", "a\uFFFD", bad(1, "+")},
        {"UTF-7", "+", "\uFFFD", bad(0, "+")},
        {"UTF-7", "+A", "\uFFFD", bad(1, "A")},
        {"UTF-7", "+AA", "\uFFFD", bad(1, "AA")},
        {"UTF-7", "+AGEA", "a\uFFFD", bad(3, "EA")},
        {"UTF-7", "+AGE-b+A", "ab\uFFFD", bad(7, "A")},
        {"UTF-7", "+AGEAYQBiA", "aab\uFFFD", bad(9, "A")},
        {"HZ-GB-2312", "ab~", "ab\uFFFD", bad(2, "~")},
        {"HZ-GB-2312", "~{V", "\uFFFD", bad(2, "V")},
        {"HZ-GB-2312", "~{VP~", "\u4E2D\uFFFD", bad(4, "~")},
        {"IMAP-mailbox-name", "a&", "a\uFFFD", bad(1, "&")},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(std::string(row.from) + ' ' + printable(row.text));
        StreamTranscoder stream{Encoding(row.from), Encoding::Utf8};
        for (const std::size_t size : {1u, 2u, 3u, 100u}) {
            const Streamed result = streamed(stream, row.text, {size});
            EXPECT_EQ(printable(result.out), printable(row.out));
            EXPECT_EQ(result.losses, std::vector<Loss>{row.loss});
        }
    }
}

TEST(StreamTranscoderLosses, ATextMayEndBehindACompleteShift) {
    struct Row {
        const char* from;
        std::string_view text;
        std::string_view out;
    };
    const Row rows[] = {
        {"UTF-7", "+AGE", "a"},
        {"UTF-7", "+AGE-", "a"},
        {"UTF-7", "+AAA", "\0"sv},
        {"UTF-7", "+AGEAYQBi", "aab"},
        {"UTF-7", "+-", "+"},
        {"UTF-7", "a-", "a-"},
        {"UTF-7", "AAAAAAA", "AAAAAAA"},
        {"HZ-GB-2312", "~~", "~"},
        {"HZ-GB-2312", "a~{", "a"},
        {"HZ-GB-2312", "~{VP", "\u4E2D"},
        {"HZ-GB-2312", "~{VP~}", "\u4E2D"},
        {"HZ-GB-2312", "a~\n", "a"},
        {"IMAP-mailbox-name", "a&-", "a&"},
        {"ISO-2022-JP", "a\x1B$B", "a"},
        {"ISO-2022-KR", "a\x0E", "a"},
    };
    for (const Row& row : rows) {
        const Streamed result = streamed(row.from, "UTF-8", row.text);
        EXPECT_EQ(printable(result.out), printable(row.out)) << row.from << ' ' << printable(row.text);
        EXPECT_TRUE(result.losses.empty()) << row.from << ' ' << printable(row.text);
    }
}

TEST(StreamTranscoderLosses, AnUnfinishedCharacterIsReportedByFinishOnly) {
    StreamTranscoder stream(Encoding::Utf8, Encoding::Utf16LE);
    std::string out;
    std::vector<Loss> losses;
    const auto note = [&](const Loss& loss) { losses.push_back(loss); };
    stream.convert("a\xE2\x82", out, note);
    EXPECT_TRUE(losses.empty());
    EXPECT_EQ(out.substr(0, 2), "a\0"sv);
    stream.finish(out, note);
    EXPECT_EQ(losses, (std::vector<Loss>{bad(1, "\xE2\x82")}));
    EXPECT_EQ(out, "a\0\xFD\xFF"sv);
}

TEST(StreamTranscoderLosses, OneCodeSequenceCanBeTwoCharacters) {
    // EC C3 is the letter ae and a combining grave accent, of which windows-1252 has the first.
    const Streamed result = streamed("ibm-16684_P110-2003", "windows-1252", "\xEC\xC3\xEC\xC3");
    EXPECT_EQ(result.out, "\xE6?\xE6?");
    EXPECT_EQ(result.losses, (std::vector<Loss>{lost(0, "\xEC\xC3", 0x300), lost(2, "\xEC\xC3", 0x300)}));
    expectTheSameForAllBlocks("ibm-16684_P110-2003", "windows-1252", "\xEC\xC3\xEC\xC3\xEC\xC4");
    expectTheSameForAllBlocks("ibm-16684_P110-2003", "UTF-8", "\xEC\xC3\xEC\xC3\xEC\xC4");
}

TEST(StreamTranscoderLosses, OfStatefulInputNameTheCharacter) {
    struct Row {
        const char* from;
        std::string_view text;
        std::size_t first; ///< where the bytes of the character begin
        std::string_view bytes;
        char32_t codePoint;
    };
    const Row rows[] = {
        {"ISO-2022-JP", "ab\x1B$B$\"\x1B(Bz", 5, "$\"", 0x3042},
        {"HZ-GB-2312", "ab~{VP~}z", 4, "VP", 0x4E2D},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.from);
        const Streamed result = streamed(row.from, "windows-1252", row.text);
        EXPECT_EQ(result.out, "ab?z");
        ASSERT_EQ(result.losses.size(), 1u);
        EXPECT_EQ(result.losses[0].kind, Loss::NotRepresentable);
        EXPECT_EQ(result.losses[0].codePoint, row.codePoint);
        EXPECT_EQ(result.losses[0].offset + result.losses[0].bytes.size(), row.first + row.bytes.size());
        EXPECT_TRUE(result.losses[0].bytes.ends_with(row.bytes)) << printable(result.losses[0].bytes);
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
