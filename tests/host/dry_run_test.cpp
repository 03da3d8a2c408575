// `kvt convert --dry-run`.

#include "host_test.h"

#include <sstream>

namespace kvt::test {

class KvtConvertDryRun : public HostTest {
protected:
    static std::vector<std::string> ranking(const std::string& table) {
        std::istringstream lines(table);
        std::string line;
        std::getline(lines, line);
        std::vector<std::string> names;
        while (std::getline(lines, line)) {
            std::istringstream words(line);
            std::string rank;
            std::string name;
            words >> rank >> name;
            names.push_back(name);
        }
        return names;
    }
};

TEST_F(KvtConvertDryRun, RanksTargetsByWhatTheyLose) {
    const ChildResult result =
        convert("UTF-8", "US-ASCII,windows-1252,UTF-16LE,windows-1250,UTF-8",
                "Krak\u00f3w, \u0141\u00f3d\u017a, \u0141om\u017ca, 5 \u20ac, \u00e3\n", {"--dry-run"});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.err, "");
    EXPECT_EQ(result.out,
              "   encoding      losses  different  bytes  lost\n"
              "1  UTF-8              0          0     37\n"
              "2  UTF-16LE           0          0     56\n"
              "3  windows-1250       1          1     28  \u00e3\n"
              "4  windows-1252       4          3     28  \u0141 \u017a \u017c\n"
              "5  US-ASCII           8          6     28  \u00f3 \u0141 \u017a \u017c \u20ac \u00e3\n");
}

TEST_F(KvtConvertDryRun, StatusIsOneWhenEveryTargetWouldLose) {
    EXPECT_EQ(convert("UTF-8", "US-ASCII,KOI8-R", "\u0141", {"--dry-run"}).status, 1);
    EXPECT_EQ(convert("UTF-8", "US-ASCII", "a", {"--dry-run"}).status, 0);
}

TEST_F(KvtConvertDryRun, BadInputIsLostForAll) {
    const ChildResult result = convert("UTF-8", "UTF-16LE,UTF-8", "a\xff\xff", {"--dry-run"});
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(contains(result.out, "2  UTF-8          2          1      7  <FF>")) << result.out;
}

TEST_F(KvtConvertDryRun, WritesNothing) {
    write("in", "a\u0141");
    EXPECT_EQ(convert("UTF-8", "US-ASCII", "", {"--dry-run", "in"}).status, 1);
    EXPECT_EQ(names(), std::vector<std::string>{"in"});
}

TEST_F(KvtConvertDryRun, ReadsAllFilesInBlocks) {
    std::string text;
    for (int index = 0; index < 100000; ++index) {
        text += "\u20ac\u0141\n";
    }
    write("one", text);
    write("two", text);
    const ChildResult result = convert("UTF-8", "windows-1252", "", {"--dry-run", "one", "two"});
    EXPECT_TRUE(contains(result.out, "windows-1252  200000          1  600000  \u0141")) << result.out;
}

TEST_F(KvtConvertDryRun, StrippedMarksAreNoLoss) {
    EXPECT_EQ(convert("UTF-8", "US-ASCII",
                      "\uFEFF"
                      "a",
                      {"--dry-run", "--bom", "keep"})
                  .status,
              1);
    EXPECT_EQ(convert("UTF-8", "US-ASCII",
                      "\uFEFF"
                      "a",
                      {"--dry-run", "--bom", "strip"})
                  .status,
              0);
}

TEST_F(KvtConvertDryRun, OptionsOfAConverterDoNotSplitTheList) {
    const ChildResult result =
        convert("UTF-8", "UTF-8,ISO-2022,locale=ja,version=0,US-ASCII", "a\u6771", {"--dry-run"});
    EXPECT_EQ(result.status, 0) << result.err;
    ASSERT_EQ(ranking(result.out).size(), 3u) << result.out;
    EXPECT_EQ(ranking(result.out).front(), "UTF-8");
    EXPECT_EQ(ranking(result.out).back(), "US-ASCII");
}

TEST_F(KvtConvertDryRun, AnUnknownTargetIsRefused) {
    const ChildResult result = convert("UTF-8", "UTF-8,UFT-8", "a", {"--dry-run"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.out, "");
    EXPECT_TRUE(contains(result.err, "\"UFT-8\" is not the name of an encoding")) << result.err;
    EXPECT_TRUE(contains(result.err, "'UTF-8'")) << result.err;
    EXPECT_EQ(convert("UTF-8", "UTF-8,", "a", {"--dry-run"}).status, 2);
}

} // namespace kvt::test
