// `kvt unique`: the first of equal lines, in the order of the input, and how many there were.

#include "host_test.h"
#include "line_texts.h"

#include <cctype>

namespace kvt::test {

using namespace std::string_literals;

class KvtUnique : public HostTest {
protected:
    std::string unique(const std::string& input, std::vector<std::string> options = {}) {
        options.insert(options.begin(), "unique");
        const ChildResult result = kvt(std::move(options), input);
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_EQ(result.err, "");
        return result.out;
    }

    static std::string same(const std::string& line) { return line; }
};

TEST_F(KvtUnique, TheFirstOfEqualLinesStaysWhereItIs) {
    struct Row {
        int line;
        std::string input;
        std::string output;
    };
    for (const Row& row : std::vector<Row>{
             {__LINE__, "", ""},
             {__LINE__, "\n", "\n"},
             {__LINE__, "b\na\nb\nc\na", "b\na\nc\n"},
             {__LINE__, "a\na", "a\n"},
             {__LINE__, "\n\nx\n\n", "\nx\n"},
             {__LINE__, "a\r\na\na\r\n", "a\r\na\n"},
             {__LINE__, "a\0\na\na\0\n\0\n\n"s, "a\0\na\n\0\n\n"s},
             {__LINE__, "a\nA\n", "a\nA\n"},
             {__LINE__, "\xff\n\xfe\n\xff\n", "\xff\n\xfe\n"},
             {__LINE__, "1234567\n12345678\n1234567\0\n1234567\n"s, "1234567\n12345678\n1234567\0\n"s},
         }) {
        EXPECT_EQ(unique(row.input), row.output) << "line " << row.line;
    }
}

TEST_F(KvtUnique, CountsStandBeforeTheLines) {
    EXPECT_EQ(unique("b\na\nb\n\nb\n", {"--count"}), "3\tb\n1\ta\n1\t\n");
    EXPECT_EQ(unique("b\nA\nB\na\n", {"--count", "--fold"}), "2\tb\n2\tA\n");
}

TEST_F(KvtUnique, FoldedLinesAreEqualWhenTheyDifferInCaseOnly) {
    EXPECT_EQ(unique("Stra\u00dfe\nb\nSTRASSE\nB\nstrase\n", {"--fold"}), "Stra\u00dfe\nb\nstrase\n");
    const ChildResult bad = kvt({"unique", "--fold"}, "a\n\x80\n");
    EXPECT_EQ(bad.status, 2);
    EXPECT_EQ(bad.err,
              "kvt: standard input: line 2, column 1, byte 2: The bytes \"\\x80\" are not valid UTF-8.\n");
}

TEST_F(KvtUnique, SeveralFilesAreOneText) {
    write("one", "a\nb");
    write("two", "b\nc");
    EXPECT_EQ(kvt({"unique", "one", "two", "one", "-o", "one"}).status, 0);
    EXPECT_EQ(read("one"), "a\nb\nc\n");
}

TEST_F(KvtUnique, RandomLinesBecomeUniqueInAnyMemory) {
    for (const LineShape& shape : lineShapes()) {
        const std::string text = randomLines(shape, 600000, 424242);
        const std::string plain = uniqueSlowly(text, false, same);
        const std::string withCounts = uniqueSlowly(text, true, same);
        for (const char* memory : {"64K", "300K", "256M"}) {
            EXPECT_TRUE(unique(text, {"--memory", memory}) == plain) << shape.name << ", " << memory;
            EXPECT_TRUE(unique(text, {"--memory", memory, "--count"}) == withCounts)
                << shape.name << ", counted, " << memory;
        }
    }
}

TEST_F(KvtUnique, RandomLinesAreFoldedInAnyMemory) {
    const std::string text = randomLines({"", "Common Beginning ", 6, "abcABC "}, 500000, 11);
    const std::string expected = uniqueSlowly(text, true, foldedAscii);
    for (const char* memory : {"64K", "256M"}) {
        EXPECT_TRUE(unique(text, {"--memory", memory, "--fold", "--count"}) == expected) << memory;
    }
}

TEST_F(KvtUnique, LinesMayBeLongerThanTheMemory) {
    const std::string same(2'000'000, 's');
    const std::string text =
        same + "b\nshort\n" + same + "a\n" + same + "b\nshort\n" + same + "\n" + same + "b";
    EXPECT_TRUE(unique(text, {"--memory", "64K", "--count"}) ==
                "3\t" + same + "b\n2\tshort\n1\t" + same + "a\n1\t" + same + "\n");
}

TEST_F(KvtUnique, AFieldMayDecide) {
    EXPECT_EQ(unique("a\t1\nb\t1\nc\t2\nd\n\n", {"--key", "2"}), "a\t1\nc\t2\nd\n");
    EXPECT_EQ(unique("a;X\nb;x\n", {"--key", "2", "--delimiter", ";", "-i", "--count"}), "2\ta;X\n");
    EXPECT_EQ(unique("\n\tb\na\n", {"--key", "1"}), "\na\n");
    const std::string text = randomLines({"", "", 8, "ab\t"}, 300000, 21);
    const auto second = [](const std::string& line) {
        const std::size_t begin = std::min(line.find('\t'), line.size());
        const std::size_t end = std::min(line.find('\t', std::min(begin + 1, line.size())), line.size());
        return line.substr(std::min(begin + 1, line.size()), end - std::min(begin + 1, end));
    };
    for (const char* memory : {"64K", "256M"}) {
        EXPECT_TRUE(unique(text, {"--memory", memory, "--key", "2", "--count"}) ==
                    uniqueSlowly(text, true, second))
            << memory;
    }
}

TEST_F(KvtUnique, LinesStayInTheirEncoding) {
    EXPECT_EQ(unique("\xe9\n\xc9\n\xe9\n", {"--encoding", "windows-1252"}), "\xe9\n\xc9\n");
    EXPECT_EQ(unique("\xe9\n\xc9\n", {"--encoding", "windows-1252", "-i", "-c"}), "2\t\xe9\n");
}

} // namespace kvt::test
