// What `kvt translate` refuses before it reads, what it says of rows and cells that it cannot do, and the jobs at the
// edge of what it takes.

#include "translate_test.h"

namespace kvt::test {

class KvtTranslateRefused : public TranslateTest {};

TEST_F(KvtTranslateRefused, OptionsThatSayNoStep) {
    const std::string replace =
        "--replace takes COL=/REGEX/TEXT/, where any other character may stand for '/', not '";
    const struct {
        std::vector<std::string> arguments;
        std::string said;
    } rows[] = {
        {{"--replace", "a/x/y/"}, replace + "a/x/y/'"},
        {{"--replace", "a=//"}, replace + "a=//'"},
        {{"--replace", "a=/x/"}, replace + "a=/x/'"},
        {{"--replace", "a=/x/y"}, replace + "a=/x/y'"},
        {{"--replace", "a=/x/y/z/"}, replace + "a=/x/y/z/'"},
        {{"--replace", "a=xyz"}, replace + "a=xyz'"},
        {{"--split", "a=x"}, "--split takes COL=SEPARATOR:NAME,NAME, not 'a=x'"},
        {{"--split", "a=:x"}, "--split takes COL=SEPARATOR:NAME,NAME, not 'a=:x'"},
        {{"--join", "ab"}, "--join takes NAME=COL,COL:SEPARATOR, not 'ab'"},
        {{"--where", "a"}, "--where takes COL~REGEX or COL!~REGEX, not 'a'"},
        {{"--where", "~x"}, "--where takes COL~REGEX or COL!~REGEX, not '~x'"},
        {{"--case", "a"}, "'=' is missing in 'a'"},
        {{"--write-date", "a="}, "'write-date' needs 'format'"},
        {{"--write-date", "a=%Q"}, "write-date: \"%Q\" is no flag (933079)"},
        {{"--zone", "a=nowhere"}, "zone: 'nowhere' is neither an offset"},
        {{"--zone", "a=utc:foo"}, "zone: the mode takes one of automatic, replace, convert, not 'foo'."},
        {{"--normalize", "a=x"}, "normalize: the normal form takes one of nfc, nfd, nfkc, nfkd, not 'x'."},
        {{"--number", "a=zz_ZZ"}, "number: ICU knows no language 'zz_ZZ'"},
        {{"--sort", "a", "--unique", "a"}, "only one 'sort' or 'unique' is possible"},
        {{"--sort", "a", "--drop", "b"}, "'sort' comes behind all other steps"},
        {{"--drop", "a,b"}, "drop: no column is left"},
        {{"--drop", "0"}, "there is no column '0'."},
        {{"--drop", "3"}, "there is no column '3'."},
        {{"--drop", "1x"}, "there is no column '1x'."},
        {{"--drop", "99999999999999999999"}, "there is no column '99999999999999999999'."},
        {{"--drop", "a", "--keep", "1"}, "there is no column '1'."},
        {{"--pivot", "7x", "--date", "a=%y"}, "date: the pivot is two digits, not '7x'"},
        {{"--pivot", "x7", "--date", "a=%y"}, "date: the pivot is two digits, not 'x7'"},
        {{"--pivot", "7", "--date", "a=%y"}, "date: the pivot is two digits, not '7'"},
        {{"--pivot", "70", "--date", "a=%d.%m.%y %z"}, "date: '%z' does not go together with '%y'"},
        {{"--months", "de", "--date", "a=%b %Ez"}, "date: '%Ez' does not go together with '%y'"},
    };
    for (const auto& row : rows) {
        const ChildResult result = translate("a,b\n1,x\n", row.arguments);
        EXPECT_EQ(result.status, 2) << row.arguments.back();
        EXPECT_EQ(result.out, "") << row.arguments.back();
        EXPECT_TRUE(result.err.starts_with("kvt: " + row.said)) << row.arguments.back() << ": " << result.err;
    }
}

TEST_F(KvtTranslateRefused, OptionsThatDoNotGoTogether) {
    write("in", "a,b\n1,x\n");
    const std::string one = "--part takes I/N with I from 1 to N, not '";
    const std::string single = "--part takes one FILE, which is not standard input";
    const struct {
        std::vector<std::string> arguments;
        std::string said;
    } rows[] = {
        {{"--header", "--no-header"}, "--header and --no-header do not go together"},
        {{"--threads", "0"}, "--threads takes a number from 1 to 1024, not '0'"},
        {{"--threads", "2000"}, "--threads takes a number from 1 to 1024, not '2000'"},
        {{"--part", "0/2"}, one + "0/2'"},
        {{"--part", "3/2"}, one + "3/2'"},
        {{"--part", "1/2000000"}, one + "1/2000000'"},
        {{"--part", "1"}, "--part takes a whole number"},
        {{"--part", "1/2", "--sort", "a"}, "--part does not go together with 'sort' and 'unique'"},
        {{"--part", "1/2", "in"}, single},
        {{"--max-errors", "x"}, "--max-errors takes a whole number"},
        {{"--report", "-"}, "the report goes to a file"},
        {{"--report", "in"}, "the report needs a file of its own: in"},
        {{"--reject", "in"}, "what is rejected needs a file of its own: in"},
        {{"--reject", "out", "--report", "out"}, "what is rejected needs a file of its own: out"},
        {{"-o", "out", "--report", "out"}, "the report needs a file of its own: out"},
    };
    for (const auto& row : rows) {
        std::vector<std::string> arguments = row.arguments;
        arguments.emplace_back("in");
        const ChildResult result = translate("", arguments);
        EXPECT_EQ(result.status, 2) << row.said;
        EXPECT_TRUE(result.err.starts_with("kvt: " + row.said)) << row.said << ": " << result.err;
        EXPECT_EQ(names(), std::vector<std::string>{"in"}) << row.said;
    }
    EXPECT_EQ(translate("a\n", {"--part", "1/2"}).err, "kvt: " + single + "\n");
    EXPECT_EQ(translate("", {"--part", "1/2", "/dev/null"}).err,
              "kvt: --part takes a file that has a size, which /dev/null has not\n");
    // A device is no file that one would overwrite the other in.
    EXPECT_EQ(translate("", {"-o", "/dev/null", "--report", "/dev/null", "in"}).status, 0);
}

TEST_F(KvtTranslateRefused, RegularExpressionsWithWhatIsWrongInThem) {
    const std::pair<const char*, const char*> rows[] = {
        {"(", "parentheses do not go in pairs"},
        {"a{99999999999}", "a number is too large, behind 'a{999999999'"},
        {"a{x", "'{' begins no number of repetitions, behind 'a{'"},
        {"a{3,2}", "the most repetitions are fewer than the least"},
        {"(?<=a*)b", "a look behind has no bound to its length, behind '(?<=a*'"},
        {"[b-a]", "a range between brackets ends before it begins, behind '[b-'"},
        {"(?<a>x)(?<a>y)", "the name of a group is not one, behind '(?<a>x)(?<a'"},
        {"\\1", "a reference names a group that there is not"},
        {"[a", "']' is missing"},
        {"\\p{Foo}", "there is no such property of characters, behind '\\p{Foo'"},
        {"\\x{110000}", "a backslash stands before what has no meaning behind it"},
        {"a**", "it is not a regular expression, behind 'a*'"},
    };
    for (const auto& [regex, said] : rows) {
        const ChildResult result = translate("a\n1\n", {"--where", std::string("a~") + regex});
        EXPECT_EQ(result.status, 2) << regex;
        EXPECT_TRUE(result.err.starts_with(std::string("kvt: where: REGEX cannot be compiled: ") + said))
            << regex << ": " << result.err;
    }
}

TEST_F(KvtTranslateRefused, HeadersThatCannotBeRead) {
    EXPECT_EQ(translate("\"a,b\n1,2\n", {}).err,
              "kvt: standard input: the header cannot be read, at byte 0 of its text\n");
    EXPECT_EQ(translate("\"a\"x,b\n1,2\n", {}).err,
              "kvt: standard input: the header cannot be read, at byte 3 of its text\n");
    write("one", "a,b\n1,2\n");
    for (const std::string other : {"a\n1\n", "\"a\"x,b\n1,2\n"}) {
        write("two", other);
        const ChildResult result = translate("", {"one", "two"});
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.err, "kvt: two: the header is not that of the first file\n");
    }
}

// ---- Columns that are called like the numbers of others

TEST_F(KvtTranslateRefused, ASplitColumnGoesAndNoOtherThatIsCalledByItsNumber) {
    EXPECT_EQ(out("2,a\n1,x y\n", {"--split", "a= :p,q"}), "2,p,q\n1,x,y\n");
    EXPECT_EQ(out("a,b\n1,x y\n", {"--rename", "a=2", "--split", "b= :p,q"}), "2,p,q\n1,x,y\n");
    EXPECT_EQ(out("a,b\nx y,1\n", {"--split", "a= :p,q", "--split", "q=-:r,s"}), "p,r,s,b\nx,y,,1\n");
}

TEST_F(KvtTranslateRefused, AColumnMayBeSplitOrJoinedIntoOneOfItsOwnName) {
    EXPECT_EQ(out("a,b\nx y,1\n", {"--split", "a= :a,q"}), "a,q,b\nx,y,1\n");
    EXPECT_EQ(out("a,b\nx,1\n", {"--join", "a=a,b:-"}), "a\nx-1\n");
    EXPECT_EQ(out("a,b\nx,1\n", {"--join", "b=b,a"}), "b\n1x\n");
}

// ---- Failures

TEST_F(KvtTranslateRefused, MorePiecesThanColumnsAreAFailureOfTheCell) {
    const ChildResult result =
        translate("a,b\n1 2 3,x\n4 5,y\n", {"--split", "a= :p,q", "--on-error", "skip"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "p,q,b\n4,5,y\n");
    EXPECT_TRUE(contains(result.err, "row 2, column a, byte 4: \"1 2 3\": \"1 2 3\" gives 3 pieces, but "
                                     "there are columns for 2. (920006)"))
        << result.err;
}

TEST_F(KvtTranslateRefused, ARegularExpressionThatTakesTooLongIsAFailureOfTheCell) {
    const std::string cell = std::string(40, 'a') + "b";
    for (const std::vector<std::string>& step :
         {std::vector<std::string>{"--where", "a~(a|aa)+$"}, {"--replace", "a=/(a|aa)+$/x/"}}) {
        std::vector<std::string> arguments = step;
        arguments.insert(arguments.end(), {"--on-error", "keep"});
        const ChildResult result = translate("a\n" + cell + "\n", arguments);
        EXPECT_EQ(result.status, 1);
        EXPECT_EQ(result.out, "a\n" + cell + "\n");
        EXPECT_TRUE(contains(result.err, "takes too long on \"" + cell + "\". (920007)")) << result.err;
    }
}

TEST_F(KvtTranslateRefused, BadBytesOfAnEncodingWithStatesAreFailuresOfTheirCells) {
    write("in", "k,d\n\x1B$B4A\x1B(B,x\n\x1B$B\x7F\x7F"
                "4A\x1B(B,1\nb,\xFF\nc,2\n");
    const ChildResult result = translate(
        "", {"--from", "ISO-2022-JP", "--number", "d", "--on-error", "keep", "--report", "report.csv", "in"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "k,d\n漢,x\n\uFFFD漢,1\nb,\uFFFD\nc,2\n");
    EXPECT_EQ(read("report.csv"),
              "file,row,column,offset,value,number,text\n"
              "in,2,d,13,x,920005,\"\"\"x\"\" is not a number as it is written in en.\"\n"
              "in,3,k,15,\uFFFD漢,910002,\"The bytes \"\"\\x7F\\x7F\"\" are not valid "
              "ISO-2022-JP.\"\n"
              "in,4,d,30,\uFFFD,910002,\"The bytes \"\"\\xFF\"\" are not valid ISO-2022-JP.\"\n");
    EXPECT_TRUE(contains(result.err, "2 losses between ISO-2022-JP and UTF-8:\n       1  bad bytes 7F 7F\n"))
        << result.err;
    // Rejected rows are in the encoding of the input.
    write("good", "k,d\n\x1B$B4A\x1B(B,x\n1,2\n");
    EXPECT_EQ(translate("", {"--from", "ISO-2022-JP", "--number", "d", "--reject", "bad", "good"}).out,
              "k,d\n1,2\n");
    EXPECT_EQ(read("bad"), "k,d\n\x1B$B4A\x1B(B,x\n");
}

TEST_F(KvtTranslateRefused, BytesThatDoNotShowAreNamedByTheirNumber) {
    const ChildResult result =
        kvt({"convert", "--from", "ISO-2022-JP", "--to", "UTF-8"}, "\x1B$B\x7F\x7F\x1B(B\n");
    EXPECT_TRUE(contains(result.err, "The bytes \"\\x7F\\x7F\" are not valid ISO-2022-JP")) << result.err;
}

TEST_F(KvtTranslateRefused, AFailedCellIsLeftAloneByTheStepsBehind) {
    EXPECT_EQ(translate("a\nx\n1\n", {"--number", "a", "--where", "a~^[0-9]$", "--on-error", "keep"}).out,
              "a\nx\n1\n");
    EXPECT_EQ(translate("a\nx y\n1\n", {"--number", "a", "--split", "a= :p,q", "--on-error", "keep"}).out,
              "p,q\n,\n1,\n");
}

TEST_F(KvtTranslateRefused, LettersBecomeSmallOrTheFormThatTextsShare) {
    EXPECT_EQ(out("a\nÄSß\n", {"--case", "a=lower"}), "a\näsß\n");
    EXPECT_EQ(out("a\nÄSß\n", {"--case", "a=fold"}), "a\nässs\n");
}

TEST_F(KvtTranslateRefused, AGroupThatTookNoPartIsReplacedByNothing) {
    EXPECT_EQ(out("a\nxb\nb\n", {"--replace", "a=/(x)?(b)/<$1$2>/"}), "a\n<xb>\n<b>\n");
}

TEST_F(KvtTranslateRefused, LongValuesAreCutWhereTheyAreShown) {
    const ChildResult result =
        translate("a\n" + std::string(300, 'x') + "\n", {"--number", "a", "--on-error", "keep"});
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(contains(result.err, "byte 2: \"" + std::string(200, 'x') + "...\": ")) << result.err;
    // Of a row that is none of the table, too, and not within a character.
    write("in", "a\n" + std::string(999, 'x') + "ü,y\n");
    EXPECT_EQ(translate("", {"--on-error", "keep", "--report", "report.csv", "in"}).status, 1);
    EXPECT_TRUE(contains(read("report.csv"), "," + std::string(999, 'x') + ",920004,")) << read("report.csv");
}

TEST_F(KvtTranslateRefused, TimesThatAreOnNoClockOrTwiceAreCounted) {
    const ChildResult result = translate("d\n20200329023000\n20201025023000\n20201025021500\n",
                                         {"--zone", "d=Europe/Berlin", "--on-error", "keep"});
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(contains(result.err, "kvt: 1 local time on no clock, 2 on the clocks twice\n")) << result.err;
}

TEST_F(KvtTranslateRefused, FailuresOfMoreKindsThanAreKeptAreCountedTogether) {
    std::string names;
    std::string cells;
    std::vector<std::string> arguments = {"--on-error", "keep"};
    for (int column = 1; column <= 1002; ++column) {
        names += (column == 1 ? "c" : ",c") + std::to_string(column);
        cells += column == 1 ? "x" : ",x";
        arguments.insert(arguments.end(), {"--number", std::to_string(column)});
    }
    const ChildResult result = translate(names + "\n" + cells + "\n", arguments);
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(contains(result.err, "kvt: 1002 failures:\n       2  such as ")) << result.err.substr(0, 300);
}

// ---- What else can be

TEST_F(KvtTranslateRefused, SortedRowsAreEncodedAsTheOthers) {
    EXPECT_EQ(out("k,v\nb,ü\na,1\n", {"--to", "windows-1252", "--sort", "k"}), "k,v\na,1\nb,\xFC\n");
    EXPECT_EQ(out("k,v\nb,ü\nb,1\n", {"--to", "windows-1252", "--unique", "k"}), "k,v\nb,\xFC\n");
    const ChildResult dry = translate("k\nb\na\n", {"--sort", "k", "--dry-run"});
    EXPECT_EQ(dry.status, 0);
    EXPECT_EQ(dry.out, "");
    EXPECT_TRUE(contains(dry.err, "2 rows read, 2 written")) << dry.err;
    std::string many = "k\n";
    std::string sorted;
    for (int row = 399'999; row >= 200'000; --row) {
        many += std::to_string(row) + "\n";
    }
    for (int row = 200'000; row <= 399'999; ++row) {
        sorted += std::to_string(row) + "\n";
    }
    EXPECT_TRUE(out(many, {"--sort", "k"}) == "k\n" + sorted);
}

TEST_F(KvtTranslateRefused, ReportsBecomeOneWithOneHeader) {
    const std::string header = "file,row,column,offset,value,number,text\n";
    write("one.csv", header + "a,2,d,1,x,1,y\n");
    write("two.csv", header + "a,3,d,9,x,1,y\n");
    write("none.csv", "");
    EXPECT_EQ(out("", {"--merge-reports", "one.csv", "none.csv", "two.csv"}),
              header + "a,2,d,1,x,1,y\na,3,d,9,x,1,y\n");
}

TEST_F(KvtTranslateRefused, AnExplanationShowsRowsBesideWhatBecomesOfThem) {
    EXPECT_TRUE(out("", {"--explain"}).ends_with("The input is empty.\n"));
    const std::string said = out("a,b\n2,x\n1\n", {"--explain", "--number", "a", "--sort", "a"});
    EXPECT_TRUE(contains(said, "do = \"sort\"")) << said;
    EXPECT_TRUE(said.ends_with("row 1  before  a,b\n       after   a,b\n"
                               "row 2  before  2,x\n       after   2,x\n"
                               "row 3  before  1\n       after   (left out)\n"
                               "       failed  The row has 1 cell, but the table has 2 columns.\n"))
        << said;
    EXPECT_TRUE(out("x,y\n", {"--explain", "--no-header", "--number", "1"})
                    .ends_with("row 1  before  x,y\n       after   x,y\n"
                               "       failed  1: \"x\" is not a number as it is written in en.\n"));
}

TEST_F(KvtTranslateRefused, WhatStandsOnTheCommandLineCountsMoreThanTheJob) {
    write("job.toml", "[input]\nencoding = \"windows-1252\"\nquote = \"'\"\ndelimiter = \";\"\n"
                      "[output]\nencoding = \"UTF-16LE\"\nquote-all = false\n[failures]\nmax-errors = 0\n");
    EXPECT_EQ(out("a,b\n\"ü,1\",2\n", {"--job", "job.toml", "--from", "UTF-8", "--to", "UTF-8", "--quote",
                                       "quote", "--delimiter", ",", "--quote-all", "--max-errors", "5"}),
              "\"a\",\"b\"\n\"ü,1\",\"2\"\n");
    EXPECT_EQ(translate("a\nx\n", {"--job", "job.toml", "--to", "UTF-8", "--number", "a", "--on-error",
                                   "keep", "--max-errors", "1"})
                  .status,
              1);
}

TEST_F(KvtTranslateRefused, JobFilesThatAreNone) {
    write("long.toml", std::string(17 * 1024 * 1024, '#'));
    ChildResult result = translate("", {"--job", "long.toml"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: long.toml is too long for a job\n");
    const std::pair<const char*, const char*> rows[] = {
        {"[[step]]\ndo = \"where\"\ncolumn = \"a\"\n", "where: takes one of 'regex' and 'not'"},
        {"[[step]]\ndo = \"where\"\ncolumn = \"a\"\nregex = \"x\"\nnot = \"y\"\n",
         "where: takes one of 'regex' and 'not'"},
        {"[[step]]\ndo = \"drop\"\ncolums = \"a\"\n", "'drop' takes no 'colums'. Did you mean 'columns'?"},
        {"[[step]]\ndo = \"dorp\"\n", "there is no step 'dorp'. Did you mean 'drop'?"},
        {"[failures]\nmax-errors = \"x\"\n", "this is a whole number from 0"},
        {"[input]\ndelimiter = \"ab\"\n", "this takes one character of ASCII that is not a letter"},
        {"[input]\ndelimiter = \"Z\"\n", "this takes one character of ASCII that is not a letter"},
        {"[input]\ndelimiter = \"7\"\n", "this takes one character of ASCII that is not a letter"},
        {"[input]\ndelimiter = \"\\r\"\n", "this takes one character of ASCII that is not a letter"},
        {"[input]\ndelimiter = \"\\n\"\n", "this takes one character of ASCII that is not a letter"},
        {"[input]\ndelimiter = \"ü\"\n", "this takes one character of ASCII that is not a letter"},
    };
    for (const auto& [text, said] : rows) {
        write("job.toml", text);
        result = translate("a\n", {"--job", "job.toml"});
        EXPECT_EQ(result.status, 2) << text;
        EXPECT_TRUE(contains(result.err, said)) << text << result.err;
    }
}

} // namespace kvt::test
