// The losses of a stream: each is reported once, with its place, its bytes and its character.
#include "streamed.h"

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace {

using namespace kvt::test;
using namespace std::string_view_literals;

/// A piece of a source text, and what is lost of it.
struct Piece {
    std::string_view bytes;
    std::string_view out;          ///< in the target, with substitutes
    std::vector<Loss> losses = {}; ///< offsets from the start of the piece
};

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
        // Behind a loss a few characters are taken without ICU, in whichever form is wanted.
        {"UTF-8",
         "UTF-16LE",
         {{"a", "a\0"sv},
          {"\u00e9", "\xE9\0"sv},
          {"\u20ac", "\xAC\x20"},
          {"\U0001F600", "\x3D\xD8\0\xDE"sv},
          {"\xFF", "\xFD\xFF", {bad(0, "\xFF")}}}},
        {"UTF-8",
         "UTF-32LE",
         {{"a", "a\0\0\0"sv},
          {"\u20ac", "\xAC\x20\0\0"sv},
          {"\U0001F600", "\x00\xF6\x01\0"sv},
          {"\xFF", "\xFD\xFF\0\0"sv, {bad(0, "\xFF")}}}},
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

// Text goes by way of UTF-16 in pieces, none of which ends within a pair.
TEST(StreamTranscoderLosses, APairAtTheEndOfAPieceIsOneCharacter) {
    for (const char* const to : {"Shift_JIS", "GBK"}) {
        StreamTranscoder stream(Encoding("UTF-16LE"), Encoding(to));
        for (std::size_t before = 2040; before < 2056; ++before) {
            std::string text;
            for (std::size_t i = 0; i < before; ++i) {
                text += "\x42\x30";
            }
            text += "\x3D\xD8\x00\xDE\x42\x30"sv;
            const Streamed expected = streamed(stream, text, {2});
            EXPECT_EQ(expected.losses, std::vector<Loss>{lost(2 * before, "\x3D\xD8\x00\xDE"sv, 0x1F600)});
            for (int round = 0; round < 3; ++round) { // soon by tables
                const Streamed result = streamed(stream, text, {text.size()});
                EXPECT_EQ(printable(result.out), printable(expected.out)) << to;
                EXPECT_EQ(result.losses, expected.losses) << to;
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

} // namespace
