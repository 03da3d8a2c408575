// `kvt convert` where the text does not stay as it is: --fallback, --normalize and --on-error transliterate.

#include "encode.h"
#include "host_test.h"

#include <nlohmann/json.hpp>

#include <sstream>

namespace kvt::test {

class KvtConvertReading : public HostTest {
protected:
    using Strings = std::vector<std::string>;

    // With the input coming in pieces of so many bytes.
    ChildResult inPieces(const std::string& from, const std::string& to, const std::string& input,
                         std::size_t size, Strings more) {
        more.insert(more.begin(), {"convert", "--from", from, "--to", to});
        ChildSetup made = setup(more);
        std::size_t sent = 0;
        made.oneByOne = true;
        made.makeInput = [&]() -> std::string_view {
            const std::string_view piece = std::string_view(input).substr(sent, size);
            sent += piece.size();
            return piece;
        };
        return runChild(made);
    }

    void expectTheSameInPieces(const std::string& from, const std::string& to, const std::string& input,
                               const Strings& more) {
        const ChildResult whole = convert(from, to, input, more);
        for (const std::size_t size : {1u, 3u}) {
            const ChildResult result = inPieces(from, to, input, size, more);
            EXPECT_EQ(result.out, whole.out) << size;
            EXPECT_EQ(result.err, whole.err) << size;
            EXPECT_EQ(result.status, whole.status) << size;
        }
    }

    std::vector<nlohmann::json> losses() {
        std::vector<nlohmann::json> lines;
        std::istringstream in(read("losses"));
        for (std::string line; std::getline(in, line);) {
            lines.push_back(nlohmann::json::parse(line));
        }
        return lines;
    }
};

TEST_F(KvtConvertReading, ALineThatIsNotValidIsReadInTheFallback) {
    const std::string mixed = "\u00e9\n\xe9 1\r\nb\u00e9\r\xe9\xe9";
    const Strings fallback = {"--fallback", "windows-1252"};
    const ChildResult result = convert("UTF-8", "UTF-8", mixed, fallback);
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.out, "\u00e9\n\u00e9 1\r\nb\u00e9\r\u00e9\u00e9");
    EXPECT_EQ(
        result.err,
        "kvt: 2 lines are not valid UTF-8 and were read in windows-1252; first in standard input: line 2, "
        "column 1, byte 3\n");
    expectTheSameInPieces("UTF-8", "UTF-16BE", mixed, fallback);
    EXPECT_EQ(convert("UTF-8", "UTF-8", "a\nb\n", fallback).err, "");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "\xe9\n", fallback).err,
              "kvt: 1 line is not valid UTF-8 and was read in windows-1252; first in standard input: line 1, "
              "column 1, byte 0\n");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "", fallback).out, "");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "a\xe2\x82", fallback).out, "a\u00e2\u201a") << "an unfinished end";
    EXPECT_EQ(convert("Shift_JIS", "UTF-8", "\x83\x5c\n\xa0\n", {"--fallback", "KOI8-R"}).out,
              "\u30bd\n\u2550\n");
    EXPECT_EQ(convert("ISO-2022-JP", "UTF-8", "\x1b$B%=\x1b(B\n\xe9\n", fallback).out, "\u30bd\n\u00e9\n");
    EXPECT_EQ(convert("UTF-16LE", "UTF-8", std::string("a\0\n\0\0\xdc", 6), {"--fallback", "UTF-16BE"}).out,
              "a\n\u00dc");
}

TEST_F(KvtConvertReading, ALineThatFitsNeitherKeepsItsLosses) {
    // A5 is nothing in ISO-8859-3.
    const ChildResult result =
        convert("UTF-8", "UTF-8", "\xa5\n\xe9\n", {"--fallback", "ISO-8859-3", "--on-error", "replace"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "\uFFFD\n\u00e9\n");
    EXPECT_TRUE(
        contains(result.err, "       1  bad bytes A5; first in standard input: line 1, column 1, byte 0\n"));
    EXPECT_TRUE(contains(result.err,
                         "kvt: 1 line is not valid UTF-8 and was read in ISO-8859-3; first in standard "
                         "input: line 2, column 1, byte 2\n"));
    const ChildResult stopped =
        convert("UTF-8", "UTF-8", "a\nb\xa5\n", {"--fallback", "ISO-8859-3", "-o", "out"});
    EXPECT_EQ(stopped.status, 2);
    EXPECT_TRUE(contains(stopped.err,
                         "kvt: standard input: line 2, column 2, byte 3: The bytes \"\\xA5\" are not "
                         "valid UTF-8.\n     lost:        bad bytes A5\n     would read:  b\uFFFD\n"))
        << stopped.err;
    EXPECT_FALSE(exists("out"));
}

TEST_F(KvtConvertReading, FallbackLinesMayCrossEveryBlockBorder) {
    const std::string tail = "\u00e9\n\xe9x\r\n\u00e9\n";
    for (std::size_t before = 0; before <= tail.size() + 1; ++before) {
        const std::string lead = std::string(131072 - before, 'X') + "\n";
        write("in", lead + tail + lead + tail);
        EXPECT_EQ(convert("UTF-8", "UTF-8", "", {"--fallback", "windows-1252", "in"}).out,
                  lead + "\u00e9\n\u00e9x\r\n\u00e9\n" + lead + "\u00e9\n\u00e9x\r\n\u00e9\n")
            << before;
    }
    std::string lines;
    std::string expected;
    for (int line = 0; line < 50000; ++line) {
        lines += "\xe9 latin\n";
        expected += "\u00e9 latin\n";
    }
    const ChildResult all = convert("UTF-8", "UTF-8", lines, {"--fallback", "windows-1252"});
    EXPECT_EQ(all.out, expected);
    EXPECT_TRUE(contains(all.err, "kvt: 50000 lines are")) << all.err;
}

TEST_F(KvtConvertReading, ALineThatIsTooLongIsReadInFrom) {
    const std::string longLine(5 * 1024 * 1024, 'x');
    const ChildResult result = convert("UTF-8", "UTF-8", longLine + "\xe9\n\xe9\n",
                                       {"--fallback", "windows-1252", "--on-error", "replace"});
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(result.out == longLine + "\uFFFD\n\u00e9\n");
    EXPECT_TRUE(contains(result.err, "line 1, column 5242881, byte 5242880")) << result.err;
    EXPECT_TRUE(contains(result.err, "kvt: 1 line is not valid")) << result.err;
}

TEST_F(KvtConvertReading, LossesInAFallbackLineHaveTheirPlace) {
    write("one", "ab\n");
    write("two", "\u0142\n\xe9\x80 \xe9\n\u0142");
    const ChildResult result =
        convert("UTF-8", "US-ASCII", "",
                {"--fallback", "windows-1252", "--report", "losses", "-o", "out", "one", "two"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(read("out"), "ab\n?\n?? ?\n?");
    const auto found = losses();
    ASSERT_EQ(found.size(), 5u);
    EXPECT_EQ(found[0]["offset"], 0);
    EXPECT_EQ(found[2]["offset"], 4);
    EXPECT_EQ(found[2]["line"], 2);
    EXPECT_EQ(found[2]["column"], 2);
    EXPECT_EQ(found[2]["bytes"], "80");
    EXPECT_EQ(found[2]["codePoint"], "U+20AC");
    EXPECT_EQ(found[3]["column"], 4);
    EXPECT_EQ(found[4]["offset"], 8);
    EXPECT_EQ(found[4]["line"], 3);
    EXPECT_EQ(found[4]["bytes"], "C5 82");
    EXPECT_TRUE(contains(result.err, "first in two: line 2, column 1, byte 3\n")) << result.err;
}

TEST_F(KvtConvertReading, NormalizationIsThatOfTheWholeText) {
    const std::string composed = "\u00e9 \uac01 \u1eb7\n";
    const std::string apart = "e\u0301 \u1100\u1161\u11a8 a\u0306\u0323\n";
    EXPECT_EQ(convert("UTF-8", "UTF-8", apart, {"--normalize", "nfc"}).out, composed);
    EXPECT_EQ(convert("UTF-8", "UTF-8", apart, {"--normalize", "nfc"}).status, 0);
    EXPECT_EQ(convert("UTF-8", "windows-1252", "e\u0301", {"--normalize", "nfc"}).out, "\xe9");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "\ufb01 \u2460 \uff21e\u0301", {"--normalize", "nfkc"}).out,
              "fi 1 A\u00e9");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "\ufb01", {"--normalize", "nfc"}).out, "\ufb01");
    expectTheSameInPieces("UTF-8", "UTF-16LE", apart + apart, {"--normalize", "nfc"});
    expectTheSameInPieces("UTF-8", "UTF-8", apart + "\xff\u0301\xff",
                          {"--normalize", "nfkc", "--on-error", "replace"});
    for (std::size_t before = 0; before <= apart.size() + 1; ++before) {
        const std::string lead(131072 - before, 'X');
        EXPECT_EQ(convert("UTF-8", "UTF-8", lead + apart, {"--normalize", "nfc"}).out, lead + composed)
            << before;
    }
    EXPECT_EQ(convert("UTF-8", "UTF-8", "", {"--normalize", "nfd"}).status, 2);
}

TEST_F(KvtConvertReading, AnEndlessSequenceOfMarksIsNormalizedInParts) {
    std::string marks = "e";
    std::string longLine;
    for (int index = 0; index < 300000; ++index) {
        marks += "\u0301";
        longLine += "e\u0301";
    }
    const ChildResult result = convert("UTF-8", "UTF-8", marks, {"--normalize", "nfc"});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.out.substr(0, 4), "\u00e9\u0301");
    EXPECT_EQ(result.out.size(), marks.size() - 1);
    EXPECT_EQ(convert("UTF-8", "windows-1252", longLine, {"--normalize", "nfc"}).out,
              std::string(300000, '\xe9'));
}

TEST_F(KvtConvertReading, PlacesOfLossesAreThoseInTheInput) {
    const ChildResult result = convert("UTF-8", "windows-1252", "e\u0301e\u0301\n\ufb03 \u0142a\u0306",
                                       {"--normalize", "nfkc", "--report", "losses", "-o", "out"});
    EXPECT_EQ(read("out"), "\xe9\xe9\nffi ??");
    const auto found = losses();
    ASSERT_EQ(found.size(), 2u);
    EXPECT_EQ(found[0]["offset"], 11);
    EXPECT_EQ(found[0]["line"], 2);
    EXPECT_EQ(found[0]["column"], 3);
    EXPECT_EQ(found[0]["bytes"], "C5 82");
    EXPECT_EQ(found[1]["offset"], 13);
    EXPECT_EQ(found[1]["column"], 4);
    EXPECT_EQ(found[1]["codePoint"], "U+0103");
    EXPECT_EQ(result.status, 1);
    const ChildResult stopped =
        convert("UTF-8", "windows-1252", "e\u0301 \u0142!\nz", {"--normalize", "nfc"});
    EXPECT_TRUE(contains(stopped.err, "line 1, column 4, byte 4: ")) << stopped.err;
    EXPECT_TRUE(contains(stopped.err, "would read:  \u00e9 ?!\n")) << stopped.err;
}

TEST_F(KvtConvertReading, TransliterationWritesWhatTheTargetHas) {
    const Strings transliterate = {"--on-error", "transliterate"};
    const ChildResult result =
        convert("UTF-8", "US-ASCII", "\u0141\u00f3d\u017a \u2026 \U0001F600\u0141\n", transliterate);
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "Lodz ... ?L\n");
    EXPECT_EQ(
        result.err,
        "kvt: 6 losses from UTF-8 to US-ASCII, 5 different:\n"
        "       2  U+0141 LATIN CAPITAL LETTER L WITH STROKE \"\u0141\" (C5 81), written as \"L\"; first in "
        "standard input: line 1, column 1, byte 0\n"
        "       1  U+00F3 LATIN SMALL LETTER O WITH ACUTE \"\u00f3\" (C3 B3), written as \"o\"; first in "
        "standard input: line 1, column 2, byte 2\n"
        "       1  U+017A LATIN SMALL LETTER Z WITH ACUTE \"\u017a\" (C5 BA), written as \"z\"; first in "
        "standard input: line 1, column 4, byte 5\n"
        "       1  U+2026 HORIZONTAL ELLIPSIS \"\u2026\" (E2 80 A6), written as \"...\"; first in standard "
        "input: line 1, column 6, byte 8\n"
        "       1  U+1F600 GRINNING FACE \"\U0001F600\" (F0 9F 98 80); first in standard input: line 1, "
        "column "
        "8, byte 12\n");
    // What the target has stays as it is.
    EXPECT_EQ(convert("UTF-8", "windows-1252", "\u00e9\u0141\u0416", transliterate).out, "\xe9LZ");
    EXPECT_EQ(convert("UTF-8", "IBM037", "\u0436", transliterate).out, "\xa9");
    EXPECT_EQ(convert("UTF-8", "ISO-2022-JP", "\u3042\u0142\u3042", transliterate).out,
              "\x1b$B$\"\x1b(Bl\x1b$B$\"\x1b(B");
    const ChildResult withBadInput = convert("UTF-8", "US-ASCII", "a\xff\u0142", transliterate);
    EXPECT_EQ(withBadInput.out, "a?l");
    EXPECT_EQ(withBadInput.err.rfind("kvt: 2 losses from UTF-8 to US-ASCII, 2 different:\n", 0), 0u)
        << withBadInput.err;
    EXPECT_EQ(convert("UTF-8", "UTF-16LE", "\u0142", transliterate).status, 0);
    expectTheSameInPieces("UTF-8", "US-ASCII", "\u0141\u00f3d\u017a \xff\u2026\n\U0001F600", transliterate);
}

TEST_F(KvtConvertReading, TransliteratedCharactersAreInTheReportWithWhatWasWritten) {
    const ChildResult result = convert("UTF-8", "US-ASCII", "a\n\u00df\U0001F600",
                                       {"--on-error", "transliterate", "--report", "losses"});
    EXPECT_EQ(result.out, "a\nss?");
    const auto found = losses();
    ASSERT_EQ(found.size(), 2u);
    EXPECT_EQ(found[0]["replacement"], "ss");
    EXPECT_EQ(found[0]["line"], 2);
    EXPECT_FALSE(found[1].contains("replacement"));
    EXPECT_EQ(found[1]["column"], 2);
}

TEST_F(KvtConvertReading, LongTextsOfLossesAreTransliteratedInBoundedMemory) {
    std::string text;
    for (int index = 0; index < 100000; ++index) {
        text += "\u0142\u00df";
    }
    std::string expected;
    for (int index = 0; index < 100000; ++index) {
        expected += "lss";
    }
    EXPECT_EQ(convert("UTF-8", "US-ASCII", text, {"--on-error", "transliterate"}).out, expected);
}

TEST_F(KvtConvertReading, GoesTogetherWithVerifyAndDryRun) {
    const std::string mixed = "e\u0301\n\xe9\n";
    const Strings changes = {"--fallback", "windows-1252", "--normalize", "nfc"};
    const auto with = [&](Strings more) {
        more.insert(more.end(), changes.begin(), changes.end());
        return more;
    };
    const ChildResult verified = convert("UTF-8", "windows-1252", mixed, with({"--verify"}));
    EXPECT_EQ(verified.status, 0);
    EXPECT_EQ(verified.out, "\xe9\n\xe9\n");
    EXPECT_TRUE(contains(verified.err, "verify: nothing was lost")) << verified.err;
    const ChildResult differs =
        convert("UTF-8", "US-ASCII", "\u0142", {"--verify", "--on-error", "transliterate"});
    EXPECT_EQ(differs.status, 1);
    EXPECT_TRUE(contains(differs.err, "U+0142 comes back as U+006C")) << differs.err;
    const ChildResult dry = convert("UTF-8", "windows-1252,US-ASCII", mixed + "\u0142", with({"--dry-run"}));
    EXPECT_EQ(dry.status, 1);
    EXPECT_EQ(dry.out, "   encoding      losses  different  bytes  lost\n"
                       "1  windows-1252       1          1      5  \u0142\n"
                       "2  US-ASCII           3          2      5  \u00e9 \u0142\n");
    EXPECT_EQ(convert("UTF-8", "windows-1252", mixed, with({"--dry-run"})).status, 0);
    EXPECT_EQ(convert("UTF-16", "UTF-8", "\xfe\xff" + utf16Of(U"e\u0301", true), {"--normalize", "nfc"}).out,
              "\u00e9");
    EXPECT_EQ(convert("UTF-8", "ISCII,version=0", "\u0964\u0964", {"--normalize", "nfc"}).status, 2);
    EXPECT_EQ(convert("UTF-8", "UTF-8", "\xef\xbb\xbfz", {"--normalize", "nfc", "--bom", "add"}).out,
              "\ufeffz");
}

} // namespace kvt::test
