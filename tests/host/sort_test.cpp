// `kvt sort`: the order, for all that lines can be, with memory for all of them and for next to nothing.

#include "host_test.h"
#include "line_texts.h"

#include <cctype>
#include <string_view>

namespace kvt::test {

using namespace std::string_literals;

class KvtSort : public HostTest {
protected:
    std::string sorted(const std::string& input, std::vector<std::string> options = {}) {
        options.insert(options.begin(), "sort");
        const ChildResult result = kvt(std::move(options), input);
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_EQ(result.err, "");
        return result.out;
    }
};

TEST_F(KvtSort, LinesAreOrderedByTheirBytes) {
    struct Row {
        int line;
        std::string input;
        std::string output;
    };
    for (const Row& row : std::vector<Row>{
             {__LINE__, "", ""},
             {__LINE__, "\n", "\n"},
             {__LINE__, "a", "a\n"},
             {__LINE__, "b\na", "a\nb\n"},
             {__LINE__, "b\na\n", "a\nb\n"},
             {__LINE__, "b\n\na\n\n", "\n\na\nb\n"},
             {__LINE__, "b\na\nB\nA\n", "A\nB\na\nb\n"},
             {__LINE__, "10\n9\n1\n", "1\n10\n9\n"},
             {__LINE__, "b\r\na\r\na\n", "a\na\r\nb\r\n"},
             {__LINE__, "a\r\na b\r\n", "a\r\na b\r\n"},
             {__LINE__, "\xff\n\x80\n\x7f\n\xc3\xa9\n", "\x7f\n\x80\n\xc3\xa9\n\xff\n"},
             {__LINE__, "a\0\0\na\na\0\n\0\n\n"s, "\n\0\na\na\0\na\0\0\n"s},
             {__LINE__, "1234567\0\n1234567\n12345678\n1234567\0\0\n123456\n"s,
              "123456\n1234567\n1234567\0\n1234567\0\0\n12345678\n"s},
             {__LINE__, "12345678b\n12345678\n12345678a\n1234567\n",
              "1234567\n12345678\n12345678a\n12345678b\n"},
         }) {
        EXPECT_EQ(sorted(row.input), row.output) << "line " << row.line;
        EXPECT_EQ(sorted(row.input, {"--reverse"}), sortedSlowly(row.input, true)) << "line " << row.line;
    }
}

TEST_F(KvtSort, FilesAreReadInOrderAndEachEndsItsLastLine) {
    write("one", "c\na");
    write("two", "");
    write("three", "b");
    EXPECT_EQ(kvt({"sort", "one", "two", "-", "three"}, "B").out, "B\na\nb\nc\n");
    const ChildResult missing = kvt({"sort", "one", "nowhere"});
    EXPECT_EQ(missing.status, 2);
    EXPECT_EQ(missing.out, "");
    EXPECT_EQ(missing.err, "kvt: cannot read nowhere: No such file or directory\n");
}

TEST_F(KvtSort, FoldedLinesThatDifferInCaseStayInTheirOrder) {
    EXPECT_EQ(sorted("b\nB\na\nA\nB\n", {"--fold"}), "a\nA\nb\nB\nB\n");
    EXPECT_EQ(sorted("b\nB\na\nA\nB\n", {"--fold", "--reverse"}), "b\nB\nB\na\nA\n");
    EXPECT_EQ(sorted("STRASSE\nstrase\nStraße\nstrasse\nStrat\n", {"--fold"}),
              "strase\nSTRASSE\nStraße\nstrasse\nStrat\n");
    EXPECT_EQ(sorted("\u212A\nK\nk\nj\n", {"--fold"}), "j\n\u212A\nK\nk\n");
    EXPECT_EQ(sorted("\u03a3x\n\u03c2x\n\u03c3x\n", {"--fold"}), "\u03a3x\n\u03c2x\n\u03c3x\n");
    EXPECT_EQ(sorted("B\0\nb\nB\0a\n"s, {"--fold"}), "b\nB\0\nB\0a\n"s);
    EXPECT_EQ(sorted("b\r\nA\r\n", {"--fold"}), "A\r\nb\r\n");
}

TEST_F(KvtSort, BytesThatAreNoTextAreKeptUnlessTheyWouldHaveToBeFolded) {
    EXPECT_EQ(sorted("b\xff\na\xc3\n"), "a\xc3\nb\xff\n");
    write("bad", "a\n\u00e9b\xff\nc\n");
    const ChildResult bad = kvt({"sort", "--fold", "bad", "-o", "out"});
    EXPECT_EQ(bad.status, 2);
    EXPECT_EQ(bad.err, "kvt: bad: line 2, column 3, byte 5: The bytes \"\\xFF\" are not valid UTF-8.\n");
    EXPECT_FALSE(exists("out"));
    const ChildResult cut = kvt({"sort", "--fold"}, "a\n\xe2\x82");
    EXPECT_EQ(cut.status, 2);
    EXPECT_TRUE(contains(cut.err, "standard input: line 2, column 1, byte 2: The bytes \"\\xE2\\x82\""))
        << cut.err;
}

TEST_F(KvtSort, RandomLinesAreSortedInAnyMemory) {
    for (const LineShape& shape : lineShapes()) {
        const std::string text = randomLines(shape, 600000, 20240517);
        for (const char* memory : {"64K", "300K", "256M"}) {
            EXPECT_TRUE(sorted(text, {"--memory", memory}) == sortedSlowly(text))
                << shape.name << ", " << memory;
            EXPECT_TRUE(sorted(text, {"--memory", memory, "-r"}) == sortedSlowly(text, true))
                << shape.name << ", reverse, " << memory;
        }
    }
}

TEST_F(KvtSort, RandomLinesAreFoldedInAnyMemory) {
    const auto fold = [](std::string line) {
        for (char& c : line) {
            c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        }
        return line;
    };
    const std::string text = randomLines({"", "Common Beginning ", 3, "abcABC "}, 400000, 7);
    for (const char* memory : {"64K", "256M"}) {
        EXPECT_TRUE(sorted(text, {"--memory", memory, "--fold"}) == sortedSlowly(text, false, fold))
            << memory;
        EXPECT_TRUE(sorted(text, {"--memory", memory, "--fold", "-r"}) == sortedSlowly(text, true, fold))
            << memory;
    }
}

TEST_F(KvtSort, HundredsOfRunsAreMergedInSeveralLevels) {
    // 64K of memory hold 52K of records, and four runs are merged at once.
    const std::string text = randomLines(lineShapes().front(), 12'000'000, 99);
    EXPECT_TRUE(sorted(text, {"--memory", "64K"}) == sortedSlowly(text));
}

TEST_F(KvtSort, TheOrderIsThatOfSortInThePlainLocale) {
    for (const LineShape& shape : lineShapes()) {
        write("in", randomLines(shape, 300000, 5));
        for (const std::string option : {"", "-r"}) {
            ChildSetup made;
            made.command = {"bash", "-c", "LC_ALL=C sort -s " + option + " in"};
            made.folder = folder_.string();
            const std::string expected = runChild(made).out;
            ASSERT_FALSE(expected.empty());
            std::vector<std::string> arguments = {"--memory", "128K", "in"};
            if (!option.empty()) {
                arguments.push_back(option);
            }
            EXPECT_TRUE(sorted("", arguments) == expected) << shape.name << " " << option;
        }
    }
}

TEST_F(KvtSort, LinesMayBeLongerThanTheMemory) {
    const std::string same(3'000'000, 's');
    const std::string text = same + "b\nshort\n" + same + "\n" + same + "a\n\n" +
                             std::string(1'500'000, 'A') + "\nother\n" + same + "b";
    EXPECT_TRUE(sorted(text, {"--memory", "64K"}) == sortedSlowly(text));
    EXPECT_TRUE(sorted(text, {"--memory", "64K", "-r"}) == sortedSlowly(text, true));
    // Folding makes other lengths of some characters, and none is cut where pieces meet.
    std::string accents;
    for (int count = 0; count < 400000; ++count) {
        accents += count % 3 == 0 ? "\u00c9" : count % 3 == 1 ? "\u1e9e" : "x";
    }
    const std::string folded = accents + "b\nz\n" + accents + "A\n" + accents + "B\n";
    EXPECT_TRUE(sorted(folded, {"--memory", "64K", "--fold"}) ==
                "z\n" + accents + "A\n" + accents + "b\n" + accents + "B\n");
}

TEST_F(KvtSort, InputAndOutputMayBeOneFile) {
    write("file", "b\na\n");
    EXPECT_EQ(kvt({"sort", "file", "-o", "file"}).status, 0);
    EXPECT_EQ(read("file"), "a\nb\n");
    write("file", textOf({std::string(200000, 'b'), "a"}));
    EXPECT_EQ(kvt({"sort", "file", "--memory", "64K", "--output", "file"}).status, 0);
    EXPECT_TRUE(read("file") == "a\n" + std::string(200000, 'b') + "\n");
    EXPECT_EQ(names(), std::vector<std::string>{"file"});
}

TEST_F(KvtSort, SizesAreNumbersWithAUnit) {
    for (const char* good : {"65536", "64K", "64k", "1M", "1g", "1T", "18014398509481983K"}) {
        EXPECT_EQ(sorted("b\na\n", {"--memory", good}), "a\nb\n") << good;
    }
    for (const char* bad :
         {"", "M", "12Q", "1KB", "1 K", "-1", "+1", "1.5M", "0x10", "17179869184G", "99999999999999999999"}) {
        const ChildResult result = kvt({"sort", "--memory", bad}, "a");
        EXPECT_EQ(result.status, 2) << bad;
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(result.err, "kvt: --memory takes a size such as 64K, 128M or 2G, not '"s + bad + "'\n");
    }
    const ChildResult little = kvt({"sort", "--memory", "63K"}, "a");
    EXPECT_EQ(little.status, 2);
    EXPECT_EQ(little.err, "kvt: --memory takes at least 64K, not '63K'\n");
}

} // namespace kvt::test
