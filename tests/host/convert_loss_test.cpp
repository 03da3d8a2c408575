// What `kvt convert` says about losses: the stop, the report, the ledger, and the statuses that go with them.

#include "encode.h"
#include "host_test.h"

#include <nlohmann/json.hpp>

#include <sstream>

namespace kvt::test {

namespace {

std::vector<nlohmann::json> jsonLines(const std::string& text) {
    std::vector<nlohmann::json> lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) {
        lines.push_back(nlohmann::json::parse(line));
    }
    return lines;
}

std::size_t countOf(const std::string& text, const std::string& part) {
    std::size_t count = 0;
    for (std::size_t at = text.find(part); at != std::string::npos; at = text.find(part, at + 1)) {
        ++count;
    }
    return count;
}

} // namespace

class KvtConvertLoss : public HostTest {};

TEST_F(KvtConvertLoss, StopIsTheDefaultAndTellsEverythingAboutTheFirstLoss) {
    write("cities", "Krak\u00f3w\n\u0141\u00f3d\u017a, 1423\nBern\n");
    const ChildResult result = convert("UTF-8", "windows-1252", "", {"cities", "-o", "out"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(
        result.err,
        "kvt: cities: line 2, column 1, byte 8: The text \"\u0141\", read as UTF-8, holds something that "
        "does "
        "not exist in windows-1252.\n"
        "     lost:        U+0141 LATIN CAPITAL LETTER L WITH STROKE \"\u0141\" (C5 81)\n"
        "     would read:  ?\u00f3d?, 1423\n"
        "     Nothing was written.\n"
        "kvt: 1 loss from UTF-8 to windows-1252, 1 different:\n"
        "       1  U+0141 LATIN CAPITAL LETTER L WITH STROKE \"\u0141\" (C5 81); first in cities: line 2, "
        "column 1, byte 8\n");
    EXPECT_EQ(names(), std::vector<std::string>{"cities"});
    EXPECT_EQ(convert("UTF-8", "windows-1252", "", {"cities", "-o", "out", "--on-error", "stop"}).err,
              result.err);
}

TEST_F(KvtConvertLoss, StopOnBytesThatAreNoTextShowsThem) {
    const ChildResult result = convert("UTF-8", "UTF-16LE", "ab\xff\x41 \xc3\xa9\nnext", {"-o", "out"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err,
              "kvt: standard input: line 1, column 3, byte 2: The bytes \"\\xFF\" are not valid UTF-8.\n"
              "     lost:        bad bytes FF\n"
              "     would read:  ab\uFFFDA \u00e9\n"
              "     Nothing was written.\n"
              "kvt: 1 loss from UTF-8 to UTF-16LE, 1 different:\n"
              "       1  bad bytes FF; first in standard input: line 1, column 3, byte 2\n");
    EXPECT_FALSE(exists("out"));
}

TEST_F(KvtConvertLoss, StopOnStandardOutputWritesNothingOfTheLossOrBehindIt) {
    const std::string clean(1000000, 'x');
    const ChildResult result = convert("UTF-8", "US-ASCII", clean + "\u0141behind");
    EXPECT_EQ(result.status, 2);
    EXPECT_LE(result.out.size(), clean.size());
    EXPECT_GE(result.out.size(), clean.size() / 2);
    EXPECT_EQ(result.out, clean.substr(0, result.out.size()));
    EXPECT_TRUE(contains(result.err, "What was written to standard output ends before the loss."))
        << result.err;
}

TEST_F(KvtConvertLoss, TheLineAroundTheLossIsCutWhenItIsLong) {
    const std::string input = std::string(300000, 'a') + "1234567890\u0141" + std::string(300000, 'b');
    write("in", input);
    const ChildResult result = convert("UTF-8", "US-ASCII", "", {"in", "-o", "out"});
    EXPECT_TRUE(contains(result.err, "     would read:  " + std::string(30, 'a') + "1234567890?" +
                                         std::string(39, 'b') + "\n"))
        << result.err;
}

TEST_F(KvtConvertLoss, TheLineAroundTheLossGoesOnInTheNextBlockOfAFile) {
    write("in", std::string(131072 - 8, '\n') + "before\u0141behind\n");
    EXPECT_TRUE(
        contains(convert("UTF-8", "US-ASCII", "", {"in", "-o", "out"}).err, "would read:  before?behind\n"));
}

TEST_F(KvtConvertLoss, ReplaceGoesOnAndEndsWithTheLedger) {
    const ChildResult result =
        convert("UTF-8", "windows-1252", "\u0142a\u0141\n\u0142\xff\u0142", {"--on-error", "replace"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "?a?\n???");
    EXPECT_EQ(result.err,
              "kvt: 5 losses from UTF-8 to windows-1252, 3 different:\n"
              "       3  U+0142 LATIN SMALL LETTER L WITH STROKE \"\u0142\" (C5 82); first in standard "
              "input: line 1, column 1, byte 0\n"
              "       1  U+0141 LATIN CAPITAL LETTER L WITH STROKE \"\u0141\" (C5 81); first in standard "
              "input: line 1, column 3, byte 3\n"
              "       1  bad bytes FF; first in standard input: line 2, column 2, byte 8\n");
}

TEST_F(KvtConvertLoss, ReportTellsOfEachLossOnStandardError) {
    const ChildResult result = convert("UTF-8", "US-ASCII", "a\u0141\n\xff\u0141", {"--on-error", "report"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "a?\n??");
    const std::string expected =
        "kvt: standard input: line 1, column 2, byte 1: U+0141 LATIN CAPITAL LETTER L WITH STROKE \"\u0141\" "
        "(C5 81) "
        "is not in US-ASCII\n"
        "kvt: standard input: line 2, column 1, byte 4: bad bytes FF are not valid UTF-8\n"
        "kvt: standard input: line 2, column 2, byte 5: U+0141 LATIN CAPITAL LETTER L WITH STROKE \"\u0141\" "
        "(C5 81) "
        "is not in US-ASCII\n"
        "kvt: 3 losses from UTF-8 to US-ASCII, 2 different:\n";
    EXPECT_EQ(result.err.substr(0, expected.size()), expected);
}

TEST_F(KvtConvertLoss, ReportToAFileIsJsonLines) {
    write("in \"quoted\"", "a\u0141\n\xff\U0001F600");
    const ChildResult result =
        convert("UTF-8", "windows-1250", "", {"--report", "losses", "-o", "out", "in \"quoted\""});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(read("out"), "a\xa3\n??");
    EXPECT_FALSE(contains(result.err, "is not in")) << result.err;
    EXPECT_TRUE(contains(result.err, "kvt: 2 losses from UTF-8 to windows-1250, 2 different:")) << result.err;
    const auto lines = jsonLines(read("losses"));
    ASSERT_EQ(lines.size(), 2u);
    EXPECT_EQ(lines[0], (nlohmann::json{{"file", "in \"quoted\""},
                                        {"offset", 4},
                                        {"line", 2},
                                        {"column", 1},
                                        {"kind", "bad-input"},
                                        {"bytes", "FF"},
                                        {"codePoint", nullptr},
                                        {"name", nullptr},
                                        {"from", "UTF-8"},
                                        {"to", "windows-1250"}}));
    EXPECT_EQ(lines[1], (nlohmann::json{{"file", "in \"quoted\""},
                                        {"offset", 5},
                                        {"line", 2},
                                        {"column", 2},
                                        {"kind", "not-representable"},
                                        {"bytes", "F0 9F 98 80"},
                                        {"codePoint", "U+1F600"},
                                        {"name", "GRINNING FACE"},
                                        {"from", "UTF-8"},
                                        {"to", "windows-1250"}}));
}

TEST_F(KvtConvertLoss, ReportOfACleanTextIsAnEmptyFile) {
    const ChildResult result =
        convert("UTF-8", "US-ASCII", "clean", {"--report", "losses", "--on-error", "report"});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.out, "clean");
    EXPECT_EQ(result.err, "");
    EXPECT_TRUE(exists("losses"));
    EXPECT_EQ(read("losses"), "");
}

TEST_F(KvtConvertLoss, AFileNameThatIsNoUtf8StillGivesValidJson) {
    write("a\xff", "\u0141");
    EXPECT_EQ(convert("UTF-8", "US-ASCII", "", {"--report", "losses", "a\xff"}).status, 1);
    const auto lines = jsonLines(read("losses"));
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0]["file"], "a\\xFF");
}

TEST_F(KvtConvertLoss, CharactersThatLeaveNoTraceInTheOutputAreLossesToo) {
    // A converter drops characters that nobody sees without putting anything in their place.
    const ChildResult result = convert("UTF-8", "US-ASCII", "a\u200bb", {"--on-error", "replace"});
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(contains(result.err, "       1  U+200B ZERO WIDTH SPACE (E2 80 8B); first in")) << result.err;
    EXPECT_EQ(convert("UTF-8", "US-ASCII", "a\u200bb").status, 2);
}

TEST_F(KvtConvertLoss, AReplacementCharacterOfTheInputThatDoesNotFitIsALoss) {
    EXPECT_EQ(convert("UTF-8", "ISO-8859-1", "\uFFFD", {"--on-error", "replace"}).status, 1);
    EXPECT_EQ(convert("UTF-8", "UTF-16LE", "\uFFFD").status, 0);
}

TEST_F(KvtConvertLoss, AnUnfinishedCharacterAtTheEndIsALoss) {
    struct Row {
        const char* from;
        std::string input;
        const char* lost;
    };
    for (const Row& row :
         {Row{"UTF-8", "ab\xe2\x82", "bad bytes E2 82"},
          Row{"UTF-16LE", std::string("a\0b", 3), "bad bytes 62"}, Row{"Shift_JIS", "a\x93", "bad bytes 93"},
          Row{"UTF-16BE", std::string("\xd8\x3d", 2), "bad bytes D8 3D"},
          Row{"UTF-7", "ab+", "bad bytes 2B; first in standard input: line 1, column 3, byte 2"},
          Row{"UTF-7", "a\nb+A", "bad bytes 41; first in standard input: line 2, column 2, byte 4"},
          Row{"HZ-GB-2312", "a\n\n~", "bad bytes 7E; first in standard input: line 3, column 1, byte 3"},
          Row{"HZ-GB-2312", "~{VPV", "bad bytes 56; first in standard input: line 1, column 2, byte 4"}}) {
        const ChildResult result = convert(row.from, "UTF-32LE", row.input, {"--on-error", "replace"});
        EXPECT_EQ(result.status, 1) << row.from;
        EXPECT_TRUE(contains(result.err, row.lost)) << row.from << ": " << result.err;
    }
}

TEST_F(KvtConvertLoss, EveryCommandThatReadsTextSeesAnUnfinishedEnd) {
    const std::vector<std::vector<std::string>> commands = {
        {"convert", "--to", "UTF-8", "--from"},
        {"text", "upper", "--encoding"},
        {"match", "a", "--encoding"},
        {"date", "parse", "%Y", "--encoding"},
    };
    for (std::vector<std::string> command : commands) {
        command.emplace_back("UTF-7");
        const ChildResult result = kvt(command, "1999\na+");
        EXPECT_EQ(result.status, 2) << command[0];
        EXPECT_TRUE(contains(result.err, "line 2, column 2, byte 6: The bytes \"+\" are not valid UTF-7"))
            << result.err;
    }
    const ChildResult dry =
        kvt({"convert", "--dry-run", "--from", "HZ-GB-2312", "--to", "UTF-8,US-ASCII"}, "1999\na~");
    EXPECT_EQ(dry.status, 1);
    EXPECT_TRUE(contains(dry.out, "1          1")) << dry.out;
}

TEST_F(KvtConvertLoss, TheSubstitutionIsAQuestionMarkOrTheReplacementCharacter) {
    EXPECT_EQ(convert("UTF-8", "Shift_JIS", "\u0141", {"--on-error", "replace"}).out, "?");
    EXPECT_EQ(convert("UTF-8", "UTF-16BE", "\xff", {"--on-error", "replace"}).out, "\xff\xfd");
    EXPECT_EQ(convert("Shift_JIS", "UTF-8", "\xa0", {"--on-error", "replace"}).out, "\uFFFD");
}

TEST_F(KvtConvertLoss, TheLedgerListsEveryDifferentLossUpToABound) {
    std::u32string text;
    for (char32_t c = 0x4E00; c < 0x4E00 + 1500; ++c) {
        text += c;
    }
    const ChildResult result = convert("UTF-8", "US-ASCII", utf8Of(text + text), {"--on-error", "replace"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, std::string(3000, '?'));
    EXPECT_TRUE(contains(result.err, "kvt: 3000 losses from UTF-8 to US-ASCII, more than 1000 different:"))
        << result.err;
    EXPECT_EQ(countOf(result.err, "first in standard input"), 1000u);
    EXPECT_TRUE(contains(result.err, "     and  1000 losses of characters or bytes that are not listed\n"));

    const ChildResult within =
        convert("UTF-8", "US-ASCII", utf8Of(text.substr(0, 1000)), {"--on-error", "replace"});
    EXPECT_TRUE(contains(within.err, "kvt: 1000 losses from UTF-8 to US-ASCII, 1000 different:"));
    EXPECT_FALSE(contains(within.err, "not listed"));
}

TEST_F(KvtConvertLoss, ATextOfLossesOnlyIsAllCounted) {
    std::string text;
    for (int index = 0; index < 200000; ++index) {
        text += index % 100 == 99 ? "\n" : "\u0141";
    }
    const ChildResult result = convert("UTF-8", "US-ASCII", text, {"--report", "losses"});
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(contains(result.err, "kvt: 198000 losses from UTF-8 to US-ASCII, 1 different:"))
        << result.err;
    const auto lines = jsonLines(read("losses"));
    ASSERT_EQ(lines.size(), 198000u);
    EXPECT_EQ(lines.back()["line"], 2000);
    EXPECT_EQ(lines.back()["column"], 99);
    EXPECT_EQ(lines.back()["offset"], text.size() - 3);
}

} // namespace kvt::test
