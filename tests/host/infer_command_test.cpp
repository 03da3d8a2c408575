#include "host_test.h"

namespace {

using kvt::test::HostTest;

class InferCommand : public HostTest {};

TEST_F(InferCommand, PrintsAJobWithItsEvidence) {
    write("people.csv", "name;born;paid\nM\xFCller;31.12.1999;1.234,50\nJ\xF6rg;2020-01-02;12,5\nAnna;;n/"
                        "a\nEva;1.2.2003;3\n");
    const auto result = kvt({"infer", path("people.csv")});
    EXPECT_EQ(result.status, 0) << result.err;
    const std::string job = result.out.substr(result.out.find("\n[input]"));
    EXPECT_NE(job.find("encoding = \"windows-1252\"\n"), std::string::npos) << job;
    EXPECT_NE(job.find("# Of the first 5 rows, 5 have 3 cells by it.\ndelimiter = \";\"\n"),
              std::string::npos)
        << job;
    EXPECT_NE(job.find("header = true\n"), std::string::npos) << job;
    EXPECT_NE(job.find("# Column 2, \"born\": 3 dates or times, 1 cell empty.\n"
                       "#   2 as %d.%m.%Y, such as \"31.12.1999\"\n"
                       "#   1 as %Y-%m-%d, such as \"2020-01-02\"\n"
                       "[[step]]\ndo = \"date\"\ncolumn = \"born\"\n"),
              std::string::npos)
        << job;
    EXPECT_NE(job.find("# Column 3, \"paid\": text; 3 cells are numbers.\n"), std::string::npos) << job;
}

// Each job is proof of itself: translate reads by it what is in the file.
TEST_F(InferCommand, ProposesMonthsInTheLanguageOfTheColumn) {
    write("a.csv", "id,day\n1,3. M\xC3\xA4rz 2020\n2,14. Okt. 2021\n3,1.2.2003\n4,24. Dezember 1999\n");
    const auto result = kvt({"infer", path("a.csv"), "-o", path("job.toml")});
    EXPECT_EQ(result.status, 0) << result.err;
    const std::string job = read("job.toml");
    EXPECT_NE(job.find("# Column 2, \"day\": 4 dates or times.\n"
                       "#   3 as %d. %B %Y, such as \"3. M\xC3\xA4rz 2020\"\n"
                       "#   1 as %d.%m.%Y, such as \"1.2.2003\"\n"
                       "#   The names of months are those of language 'de'.\n"
                       "[[step]]\ndo = \"date\"\ncolumn = \"day\"\n"
                       "format = [\"%d. %B %Y\", \"%d.%m.%Y\"]\nmonths = \"de\"\n"),
              std::string::npos)
        << job;
    const auto translated = kvt({"translate", "--job", path("job.toml"), path("a.csv")});
    EXPECT_EQ(translated.status, 0) << translated.err;
    EXPECT_EQ(translated.out, "id,day\n1,2020-03-03\n2,2021-10-14\n3,2003-02-01\n4,1999-12-24\n");
}

TEST_F(InferCommand, ReadsStandardInput) {
    const auto result = kvt({"infer"}, "a,b\n1,2\n");
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(result.out.substr(0, result.out.find(". Look")),
              "# What standard input seems to be: 8 bytes, 1 row");
}

TEST_F(InferCommand, TakesTheWordOfTheUserForTheEncoding) {
    write("a.csv", "a,b\n\xE9,1\n");
    const auto result = kvt({"infer", "--from", "KOI8-R", path("a.csv")});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_NE(result.out.find("# As you said.\nencoding = \"KOI8-R\"\n"), std::string::npos) << result.out;
    EXPECT_EQ(kvt({"infer", "--from", "nosuch", path("a.csv")}).status, 2);
}

TEST_F(InferCommand, SaysWhatIsWrongWithRows) {
    write("a.csv", "a,b\n1,2\n1\n\n\"x\"y,2\n");
    const auto result = kvt({"infer", path("a.csv")});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_NE(result.out.find("# 1 row is empty.\n"), std::string::npos) << result.out;
    EXPECT_NE(result.out.find("# 1 row has more or fewer cells, the first is row 3.\n"), std::string::npos)
        << result.out;
    EXPECT_NE(result.out.find("the first is row 5.\n"), std::string::npos) << result.out;
}

// Only a row with an open quote can be blamed on one.
// Without its quotes, the first cell would end within a character.
TEST_F(InferCommand, TakesNoNamesFromABrokenRow) {
    const std::string rows = "1.2.2003,x\n4.5.2006,y\n";
    write("a.csv", "\"a\"b\xC3\xBC,b\n" + rows);
    const auto result = kvt({"infer", path("a.csv")});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_NE(result.out.find("the first is row 1.\n"), std::string::npos) << result.out;
    EXPECT_NE(result.out.find("# Column 1: 2 dates or times.\n"), std::string::npos) << result.out;
    EXPECT_NE(result.out.find("do = \"date\"\ncolumn = \"1\"\n"), std::string::npos) << result.out;
}

TEST_F(InferCommand, NamesTheQuoteOfARowThatIsTooLong) {
    const std::string cell(70 << 20, 'x');
    write("plain.csv", "a,b\n1," + cell);
    EXPECT_EQ(kvt({"infer", path("plain.csv")}).err,
              "kvt: " + path("plain.csv") + ": a row is longer than 64 MiB\n");
    write("quoted.csv", "a,b\n1,\"" + cell);
    EXPECT_EQ(kvt({"infer", path("quoted.csv")}).err,
              "kvt: " + path("quoted.csv") +
                  ": a row is longer than 64 MiB; the quote that opens at byte 6 of its text may never be "
                  "closed\n");
}

TEST_F(InferCommand, NamesTextThatWentThroughTheWrongEncoding) {
    write("a.csv", "a,b\nM\xC3\x83\xC2\xBCller,1\n");
    EXPECT_NE(kvt({"infer", path("a.csv")}).out.find("\"M\xC3\x83\xC2\xBCller\" was \"M\xC3\xBCller\""),
              std::string::npos);
}

TEST_F(InferCommand, WritesAFileOrNone) {
    write("a.csv", "a,b\n1,2\n");
    EXPECT_EQ(kvt({"infer", path("a.csv"), "-o", path("job.toml")}).status, 0);
    EXPECT_TRUE(exists("job.toml"));
    EXPECT_EQ(kvt({"infer", path("nosuch"), "-o", path("other.toml")}).status, 2);
    EXPECT_FALSE(exists("other.toml"));
}

// The beginning decides on the delimiter, but all rows are counted, over the borders of blocks.
TEST_F(InferCommand, ReadsAllOfALargeFile) {
    std::string text = "n,d\n";
    for (int i = 0; i < 200000; ++i) {
        text += std::to_string(i) + ",\"2020-01-02\"\n";
    }
    write("large.csv", text);
    const std::string job = kvt({"infer", path("large.csv")}).out;
    EXPECT_NE(job.find("200,000 rows"), std::string::npos);
    EXPECT_NE(job.find("#   200,000 as %Y-%m-%d"), std::string::npos) << job;
}

// What infer proposes is a job that translate takes as it is, and the result is clean.
TEST_F(InferCommand, ProposesAJobThatTranslateTakes) {
    write("people.csv", "name;born;paid\r\nM\xFCller;31.12.1999;1.234,50\r\nJ\xF6rg;2020-01-02;12,5\r\n");
    ASSERT_EQ(kvt({"infer", path("people.csv"), "-o", path("job.toml")}).status, 0);
    const auto result = kvt({"translate", "--job", path("job.toml"), path("people.csv")});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(result.out,
              "name;born;paid\r\nM\xC3\xBCller;1999-12-31;1234.50\r\nJ\xC3\xB6rg;2020-01-02;12.5\r\n");
}

TEST_F(InferCommand, ProposesAPivotForYearsOfTwoDigits) {
    write("a.csv", "day,n\n31.12.99,x\n01.02.03,y\n");
    ASSERT_EQ(kvt({"infer", path("a.csv"), "-o", path("job.toml")}).status, 0);
    EXPECT_EQ(kvt({"translate", "--job", path("job.toml"), path("a.csv")}).out,
              "day,n\n1999-12-31,x\n2003-02-01,y\n");
}

TEST_F(InferCommand, TranslateExplainsWhatAJobDoes) {
    write("a.csv", "d,n\n01.02.2020,x\nbad,y\n1.1.2021,z\n");
    const auto result =
        kvt({"translate", "--date", "d=%d.%m.%Y", "--where", "n~[xy]", "--explain", path("a.csv")});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_NE(result.out.find("[[step]]\ndo = \"date\"\ncolumn = \"d\"\nformat = \"%d.%m.%Y\"\n"),
              std::string::npos)
        << result.out;
    EXPECT_NE(result.out.find("row 1  before  d,n\n       after   d,n\n"
                              "row 2  before  01.02.2020,x\n       after   20200201,x\n"
                              "row 3  before  bad,y\n       after   bad,y\n       failed  d: "),
              std::string::npos)
        << result.out;
    EXPECT_NE(result.out.find("row 4  before  1.1.2021,z\n       after   (left out)\n"), std::string::npos)
        << result.out;
}

// What stands on the command line counts more than the job, and its steps come behind.
TEST_F(InferCommand, TranslateTakesOptionsBesideAJob) {
    write("job.toml", "[input]\ndelimiter = \";\"\nheader = false\n[[step]]\ndo = \"case\"\ncolumn = "
                      "1\nchange = \"upper\"\n");
    write("a.csv", "a,b\nc,d\n");
    const auto result = kvt(
        {"translate", "--job", path("job.toml"), "--delimiter", ",", "--replace", "1=/A/x/", path("a.csv")});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(result.out, "x,b\nC,d\n");
}

} // namespace
