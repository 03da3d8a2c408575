// `kvt sort`: the order, for all that lines can be, with memory for all of them and for next to nothing.

#include "encode.h"
#include "host_test.h"
#include "line_texts.h"

#include <cctype>
#include <random>
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
        const std::string forward = sortedSlowly(text);
        const std::string backward = sortedSlowly(text, true);
        for (const char* memory : {"64K", "300K", "256M"}) {
            EXPECT_TRUE(sorted(text, {"--memory", memory}) == forward) << shape.name << ", " << memory;
            EXPECT_TRUE(sorted(text, {"--memory", memory, "-r"}) == backward)
                << shape.name << ", reverse, " << memory;
        }
    }
}

TEST_F(KvtSort, RandomLinesAreFoldedInAnyMemory) {
    const std::string text = randomLines({"", "Common Beginning ", 3, "abcABC "}, 400000, 7);
    const std::string forward = sortedSlowly(text, false, foldedAscii);
    const std::string backward = sortedSlowly(text, true, foldedAscii);
    for (const char* memory : {"64K", "256M"}) {
        EXPECT_TRUE(sorted(text, {"--memory", memory, "--fold"}) == forward) << memory;
        EXPECT_TRUE(sorted(text, {"--memory", memory, "--fold", "-r"}) == backward) << memory;
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

TEST_F(KvtSort, AFieldMayBeTheKey) {
    const std::string table = "b\t2\tx\na\t2\ty\nc\t1\nd\n";
    EXPECT_EQ(sorted(table, {"--key", "2"}), "d\nc\t1\nb\t2\tx\na\t2\ty\n");
    EXPECT_EQ(sorted(table, {"--key", "2", "--reverse"}), "b\t2\tx\na\t2\ty\nc\t1\nd\n");
    EXPECT_EQ(sorted(table, {"-k1"}), "a\t2\ty\nb\t2\tx\nc\t1\nd\n");
    EXPECT_EQ(sorted("x;;b\nx;;a\ny;;\n", {"--key", "2", "--delimiter", ";;"}), "y;;\nx;;a\nx;;b\n");
    EXPECT_EQ(sorted("1€b\n2€A\n", {"--key", "2", "--delimiter", "€"}), "2€A\n1€b\n");
    EXPECT_EQ(sorted("1 b\n2 B\n3 a\n", {"--key", "2", "--delimiter", " ", "-i"}), "3 a\n1 b\n2 B\n");
    EXPECT_EQ(sorted("1\r\tb\n2\ta\xff\n", {"--key", "2"}), "2\ta\xff\n1\r\tb\n");
    EXPECT_EQ(sorted("\n\t\nb\ta\n", {"--key", "1", "-r"}), "b\ta\n\n\t\n");
    for (const auto& [options, error] : std::vector<std::pair<std::vector<std::string>, std::string>>{
             {{"--key", "0"}, "--key takes a number from 1, not '0'"},
             {{"--key", "-1"},
              "--key takes a whole number from 0 to 18446744073709551615 in plain digits, not '-1'"},
             {{"--delimiter", ";"}, "--delimiter goes with --key only"},
             {{"--key", "1", "--delimiter", ""}, "--delimiter is empty"},
             {{"--number", "--date", "%Y"}, "--number and --date do not go together"},
             {{"--number", "-i"}, "--ignore-case does not go with --number or --date"},
             {{"--date", "%Q"}, "--date: \"%Q\" is no flag (933079); there are"},
             {{"--date", ""}, "--date: The format is empty. (933074)"}}) {
        std::vector<std::string> arguments = options;
        arguments.insert(arguments.begin(), "sort");
        const ChildResult result = kvt(arguments, "a\n");
        EXPECT_EQ(result.status, 2);
        EXPECT_TRUE(result.err.starts_with("kvt: " + error)) << result.err;
    }
}

TEST_F(KvtSort, NumbersCompareExactly) {
    const std::vector<std::string> ascending = {"-inf",
                                                "-1e400",
                                                "-100",
                                                "-12",
                                                "-1.2",
                                                "-1.11",
                                                "-1.1",
                                                "-1",
                                                "-0.1",
                                                "-1e-5",
                                                "-1e-400",
                                                "0",
                                                "1e-400",
                                                "1e-5",
                                                "0.1",
                                                ".2",
                                                "1",
                                                "1.1",
                                                "1.11",
                                                "2",
                                                "10",
                                                "10.5",
                                                "99",
                                                "9007199254740992",
                                                "9007199254740993",
                                                "1e17",
                                                "1e400",
                                                "1e99999999999999",
                                                "inf"};
    std::vector<std::string> shuffled = ascending;
    std::mt19937 random(3);
    for (int round = 0; round < 20; ++round) {
        std::shuffle(shuffled.begin(), shuffled.end(), random);
        EXPECT_EQ(sorted(textOf(shuffled), {"--number"}), textOf(ascending));
        EXPECT_EQ(sorted(textOf(shuffled), {"-nr"}), textOf({ascending.rbegin(), ascending.rend()}));
    }
    const std::string equal = "1\n1.0\n+1\n 1 \n10e-1\n0.1E+1\n01\n1.\n";
    EXPECT_EQ(sorted(equal + "0\n-0\n0e9\n", {"--number"}), "0\n-0\n0e9\n" + equal);
    EXPECT_EQ(sorted(equal, {"--number", "--reverse"}), equal);
}

TEST_F(KvtSort, RandomNumbersAreSortedInAnyMemory) {
    std::mt19937 random(17);
    std::vector<std::pair<std::int64_t, std::string>> numbers;
    for (int count = 0; count < 30000; ++count) {
        // In thousandths, written in one of several ways.
        const std::int64_t value = static_cast<std::int64_t>(random() % 2000001) - 1000000;
        const std::int64_t magnitude = value < 0 ? -value : value;
        std::string text = value < 0 ? "-" : "";
        switch (random() % 3) {
        case 0:
            text += std::to_string(magnitude) + "e-3";
            break;
        case 1:
            text += "0." + std::string(10, '0') + std::to_string(magnitude) + "e" +
                    std::to_string(7 + std::to_string(magnitude).size());
            break;
        default: {
            const std::string rest = std::to_string(1000 + magnitude % 1000).substr(1);
            text += std::to_string(magnitude / 1000) + "." + rest;
        }
        }
        numbers.emplace_back(value, "x" + std::to_string(count) + "\t" + text);
    }
    std::vector<std::string> lines;
    for (const auto& number : numbers) {
        lines.push_back(number.second);
    }
    const std::string text = textOf(lines);
    for (const bool reverse : {false, true}) {
        std::stable_sort(numbers.begin(), numbers.end(), [&](const auto& left, const auto& right) {
            return reverse ? right.first < left.first : left.first < right.first;
        });
        std::string expected;
        for (const auto& number : numbers) {
            expected += number.second + "\n";
        }
        for (const char* memory : {"64K", "256M"}) {
            std::vector<std::string> options = {"--key", "2", "--number", "--memory", memory};
            if (reverse) {
                options.push_back("--reverse");
            }
            EXPECT_TRUE(sorted(text, options) == expected) << memory << (reverse ? " reverse" : "");
        }
        std::sort(numbers.begin(), numbers.end(), [](const auto& left, const auto& right) {
            return std::stoi(left.second.substr(1)) < std::stoi(right.second.substr(1));
        });
    }
}

TEST_F(KvtSort, LinesWithoutANumberStandAtTheEndAndAreCounted) {
    write("in", "name\tsize\nb\t2\n\nc\t0x10\na\t1\nd\tnan\ne\t\n");
    const ChildResult up = kvt({"sort", "--key", "2", "--number", "in"});
    EXPECT_EQ(up.status, 1);
    EXPECT_EQ(up.out, "a\t1\nb\t2\nname\tsize\n\nc\t0x10\nd\tnan\ne\t\n");
    EXPECT_EQ(up.err,
              "kvt: 5 lines have no number in field 2, the first is in: line 1; they stand at the end\n");
    EXPECT_EQ(kvt({"sort", "--key", "2", "-nr", "in"}).out,
              "b\t2\na\t1\nname\tsize\n\nc\t0x10\nd\tnan\ne\t\n");
    EXPECT_EQ(kvt({"sort", "--number"}, "2\n1\nx\n").err,
              "kvt: 1 line has no number, the first is standard input: line 3; it stands at the end\n");
    const std::string digits(70000, '1');
    EXPECT_EQ(kvt({"sort", "--number"}, digits + "\n2\n").status, 1);
    EXPECT_EQ(kvt({"sort", "--number"}, "1e999999999999999999\n-e1\n1e\n.\n-\n+-1\n1 2\n").err.substr(0, 25),
              "kvt: 7 lines have no numb");
}

TEST_F(KvtSort, DatesAreReadByAFormat) {
    EXPECT_EQ(sorted("1;31.01.2020\n2;01.12.2019\n3;31.01.2020\n",
                     {"--key", "2", "--delimiter", ";", "--date", "%d.%m.%Y"}),
              "2;01.12.2019\n1;31.01.2020\n3;31.01.2020\n");
    EXPECT_EQ(
        sorted("2020-01-01T12:00:00+02:00\n2020-01-01T10:30:00Z\n2020-01-01T12:00:00+01:00\n2020-01-01\n"
               "2020-01-01T10:15:00.5\n2020-01-01T10:15:00.25\n",
               {"--date", "ISO"}),
        "2020-01-01\n2020-01-01T12:00:00+02:00\n2020-01-01T10:15:00.25\n2020-01-01T10:15:00.5\n"
        "2020-01-01T10:30:00Z\n2020-01-01T12:00:00+01:00\n");
    EXPECT_EQ(sorted("23:00\n1:00\n", {"--date", "%H:%M"}), "1:00\n23:00\n");
    const ChildResult some =
        kvt({"sort", "--date", "%Y-%m-%d", "-r"}, "2020-02-30\n2020-01-01\n2021-01-01\n\xff\n");
    EXPECT_EQ(some.out, "2021-01-01\n2020-01-01\n2020-02-30\n\xff\n");
    EXPECT_EQ(some.err,
              "kvt: 2 lines have no date of that format, the first is standard input: line 1; they stand at "
              "the end\n");
    EXPECT_EQ(some.status, 1);
}

TEST_F(KvtSort, LinesStayInTheirEncoding) {
    for (const bool big : {false, true}) {
        const std::string name = big ? "UTF-16BE" : "UTF-16LE";
        // U+0A0D and U+0D0A are not line ends, and surrogates come behind the private use area, by code points.
        EXPECT_EQ(sorted(utf16Of(U"\U0001F600\n\uE000\n\u0A0D\n\u0D0Ab\na", big), {"--encoding", name}),
                  utf16Of(U"a\n\u0A0D\n\u0D0Ab\n\uE000\n\U0001F600\n", big));
        EXPECT_EQ(sorted(utf16Of(U"\uFEFFb\na\n", big), {"--encoding", "UTF-16"}),
                  utf16Of(U"\uFEFFa\nb\n", big));
    }
    EXPECT_EQ(sorted("\xd1\n\xc1\n\xd1\xc1\n", {"--encoding", "KOI8-R", "-i"}), "\xc1\n\xd1\n\xd1\xc1\n");
    EXPECT_EQ(sorted("2\xa7"
                     "3\n1\xa7"
                     "1\n",
                     {"--encoding", "ISO-8859-1", "--key", "2", "--delimiter", "§", "-n"}),
              "1\xa7"
              "1\n2\xa7"
              "3\n");
    EXPECT_EQ(sorted("\x1b$BEl\x1b(B\na\n", {"--encoding", "ISO-2022-JP"}), "a\n\x1b$BEl\x1b(B\n");
    const ChildResult bad = kvt({"sort", "--encoding", "Shift_JIS"}, "a\n\x85\x39\n");
    EXPECT_EQ(bad.status, 2);
    EXPECT_EQ(
        bad.err,
        "kvt: standard input: line 2, column 1, byte 2: The bytes \"\\x85\" are not valid Shift_JIS.\n");
    const std::string text = randomLines({"", "Łódź ", 6, "abc "}, 300000, 8);
    const std::string wide = convert("UTF-8", "UTF-16BE", text).out;
    EXPECT_TRUE(sorted(wide, {"--encoding", "UTF-16BE", "--memory", "64K"}) ==
                convert("UTF-8", "UTF-16BE", sortedSlowly(text)).out);
}

} // namespace kvt::test
