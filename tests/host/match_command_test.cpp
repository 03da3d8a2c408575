// `kvt match`: which lines, which groups, in which encoding, and how it ends.

#include "encode.h"
#include "host_test.h"

#include <algorithm>
#include <csignal>
#include <random>
#include <regex>

namespace kvt::test {

namespace {

using namespace std::string_literals;
using Strings = std::vector<std::string>;

// What a command line prints for an input.
struct InputRow {
    int line;
    Strings arguments;
    std::string input;
    std::string output;
};

} // namespace

class KvtMatch : public HostTest {
protected:
    ChildResult match(Strings arguments, const std::string& input) {
        arguments.insert(arguments.begin(), "match");
        return kvt(std::move(arguments), input);
    }
};

TEST_F(KvtMatch, PrintsTheLinesOrTheGroups) {
    const InputRow rows[] = {
        {__LINE__, {"b"}, "abc\nxyz\nb\n", "abc\nb\n"},
        {__LINE__, {"z"}, "abc\n", ""},
        {__LINE__, {"^b"}, "ab\nba\n", "ba\n"},
        {__LINE__, {"^$"}, "a\n\nb\n", "\n"},
        {__LINE__, {""}, "a\n\n", "a\n\n"},
        {__LINE__, {"A"}, "a\n", ""},
        {__LINE__, {"a.c"}, "a\nc\nabc\n", "abc\n"},
        {__LINE__, {"(\\d)\\1"}, "12\n33\n", "33\n"},
        {__LINE__, {"\u20ac"}, "\u20ac 5\n5\n", "\u20ac 5\n"},
        {__LINE__, {"b"}, "ab", "ab\n"},
        {__LINE__, {"b"}, "b\r\nc\rb\rb\n\rb", "b\r\nb\rb\nb\n"},
        {__LINE__, {"--", "-a"}, "x-a\n", "x-a\n"},
        {__LINE__, {"^a.b$"}, "b\na\0b\r\n\0\n"s, "a\0b\r\n"s},
        {__LINE__, {"--groups", "\\x00(b)"}, "a\0b\n"s, "1:2:1:0:2:\0b\n1:3:2:1:1:b\n"s},
        {__LINE__, {"--dialect", "legacy", "b$"}, "b\0\na\0b"s, "a\0b\n"s},
        {__LINE__,
         {"--groups", "a(b)?c"},
         "x\nxac abc\nabc\n",
         "2:2:3:0:2:ac\n2:-:-:1:-:\n3:1:10:0:3:abc\n3:2:11:1:1:b\n"},
        {__LINE__, {"--groups", "(x*)"}, "a\n", "1:1:0:0:0:\n1:1:0:1:0:\n"},
        {__LINE__, {"--groups", "\u00e9(.)"}, "\u20ac\u00e9x\n", "1:2:3:0:2:\u00e9x\n1:3:5:1:1:x\n"},
        {__LINE__, {"--groups", "b"}, "a\r\nb\r\n", "2:1:3:0:1:b\n"},
        {__LINE__, {"--dialect", "perl", "a|b"}, "b\n", "b\n"},
        {__LINE__, {"--dialect", "legacy", "a|b"}, "b\na|b\n", "a|b\n"},
        {__LINE__, {"--dialect", "legacy", "f(x)$"}, "f(x)+\ny=f(x)\n", "y=f(x)\n"},
        {__LINE__, {"--dialect", "legacy", "--groups", "(.)"}, "\n(a) (b)\n", "2:1:1:0:3:(a)\n"},
        {__LINE__, {"--unicode", "(a)|b"}, "x\nb\n", "b\n"},
        {__LINE__, {"--unicode", "^..$"}, "😀é\nabc\n", "😀é\n"},
        {__LINE__, {"--dialect", "legacy", "x*"}, "\na\n", "a\n"},
        {__LINE__, {"--dialect", "legacy", "{2}$"}, "a{2}\naa\n", "a{2}\n"},
    };
    for (const InputRow& row : rows) {
        SCOPED_TRACE(row.line);
        const ChildResult result = match(row.arguments, row.input);
        EXPECT_EQ(result.status, 0);
        EXPECT_EQ(result.out, row.output);
        EXPECT_EQ(result.err, "");
        EXPECT_EQ(match(row.arguments, "").out, "");
    }
}

TEST_F(KvtMatch, LinesAreReadAndPrintedInTheirEncoding) {
    EXPECT_EQ(match({"\u00e9$", "--encoding", "windows-1252"}, "caf\xe9\r\n\x9c\n\xe9").out,
              "caf\xe9\r\n\xe9\n");
    EXPECT_EQ(match({"\u043c", "--encoding", "KOI8-R"}, "\xed\n\xcd\n").out, "\xcd\n");
    // The trailing byte of the first character is that of "\".
    EXPECT_EQ(match({"\\\\", "--encoding", "Shift_JIS"}, "\x83\x5c\n\x5c\n").out, "\x5c\n");
    EXPECT_EQ(match({"\u6771", "--encoding", "ISO-2022-JP"}, "a\n\x1b$BEl\x1b(B\nb\n").out,
              "\x1b$BEl\x1b(B\n");
    for (const bool big : {false, true}) {
        const std::string encoding = big ? "UTF-16BE" : "UTF-16LE";
        EXPECT_EQ(
            match({"b|\U0001F600", "--encoding", encoding}, utf16Of(U"a\n\U0001F600\r\n\u0a0d b", big)).out,
            utf16Of(U"\U0001F600\r\n\u0a0d b\n", big));
        // What is said of the groups is UTF-8, with the bytes of the file.
        EXPECT_EQ(
            match({"--groups", "\u20ac(.)", "--encoding", encoding}, utf16Of(U"\u00e9\u20acb", big)).out,
            "1:2:2:0:2:\u20acb\n1:3:4:1:1:b\n");
    }
}

TEST_F(KvtMatch, AByteOrderMarkGoesBeforeTheFirstLineThatIsPrinted) {
    const std::string mark = "\ufeff";
    write("one", mark + "a\nb\na\n");
    write("two", mark + "b\n");
    EXPECT_EQ(match({"^a", "one"}, "").out, mark + "a\na\n");
    EXPECT_EQ(match({"^b", "one"}, "").out, mark + "b\n");
    EXPECT_EQ(match({"a", "two"}, "").out, "");
    EXPECT_EQ(match({"b", "one", "two"}, "").out, mark + "b\n" + mark + "b\n");
    EXPECT_EQ(match({"--groups", "^a", "one"}, "").out, "1:1:3:0:1:a\n3:1:7:0:1:a\n");
    EXPECT_EQ(match({"a", "--encoding", "UTF-16LE"}, utf16Of(U"\ufeffb\na", false)).out,
              utf16Of(U"\ufeffa\n", false));
}

TEST_F(KvtMatch, SeveralFilesBecomeOneOutputAndEachCountsItsLines) {
    write("one", "a\nb");
    write("two", "b\n");
    EXPECT_EQ(match({"b", "one", "-", "two"}, "c\nbb\n").out, "b\nbb\nb\n");
    EXPECT_EQ(match({"--groups", "b", "one", "-", "two"}, "ab\n").out,
              "one:2:1:2:0:1:b\nstandard input:1:2:1:0:1:b\ntwo:1:1:0:0:1:b\n");
    EXPECT_EQ(match({"--groups", "b", "one"}, "").out, "2:1:2:0:1:b\n");
    EXPECT_EQ(match({"b", "one", "-o", "one"}, "").status, 0);
    EXPECT_EQ(read("one"), "b\n");
    EXPECT_EQ(match({"b", "missing"}, "").err, "kvt: cannot read missing: No such file or directory\n");
    EXPECT_EQ(match({"b", "two", "-o", "/dev/full"}, "").status, 2);
    ChildSetup inPlace = setup({"match", "b", "two"});
    inPlace.outputFile = path("two");
    EXPECT_EQ(runChild(inPlace).status, 2);
    EXPECT_EQ(read("two"), "b\n");
}

TEST_F(KvtMatch, APatternThatCannotBeCompiledIsRefused) {
    struct Row {
        Strings arguments;
        std::string begin;
        std::string end;
    };
    for (const Row& row : {Row{{"a(b"}, "Unmatched marking parenthesis", "'a(b>>>HERE>>>'.\n"},
                           Row{{"[\n"}, "Unmatched [", "'[\\x0A>>>HERE>>>'.\n"},
                           Row{{"--dialect", "legacy", "{[a"}, "Unmatched [", "'\\{[a>>>HERE>>>'.\n"}}) {
        write("in", "a\n");
        Strings arguments = row.arguments;
        arguments.insert(arguments.end(), {"in", "-o", "out"});
        const ChildResult result = match(arguments, "");
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.out, "");
        EXPECT_TRUE(result.err.starts_with("kvt: REGEX cannot be compiled: " + row.begin)) << result.err;
        EXPECT_TRUE(result.err.ends_with(row.end)) << result.err;
        EXPECT_EQ(names(), Strings{"in"});
    }
}

TEST_F(KvtMatch, ALineThatTakesTooLongEndsItWithItsPlace) {
    for (const Strings& dialect : {Strings{}, {"--dialect", "legacy"}}) {
        const std::string stars = "a*a*a*a*a*a*a*a*a*a*a*a*a*a*a*c";
        Strings arguments = {stars, "-o", "out"};
        arguments.insert(arguments.end(), dialect.begin(), dialect.end());
        const ChildResult result = match(arguments, "c\r\n" + std::string(60, 'a') + "\n");
        EXPECT_EQ(result.status, 2);
        EXPECT_TRUE(result.err.starts_with("kvt: standard input: line 2: REGEX gives up: The complexity "))
            << result.err;
        EXPECT_TRUE(names().empty());
    }
}

TEST_F(KvtMatch, ArgumentsAreLookedAt) {
    EXPECT_EQ(match({"\xff"}, "a").err,
              "kvt: REGEX is not UTF-8: \"\\xFF\" ends in a byte of no character\n");
    EXPECT_EQ(match({"\xff"}, "a").status, 2);
    EXPECT_EQ(match({"a", "--replace", "é\xe2\x82"}, "a").err,
              "kvt: TEXT is not UTF-8: \"é\\xE2\\x82\" ends in bytes of no character\n");
    EXPECT_EQ(match({"a", "--dialect", "lgacy"}, "a").err,
              "kvt: --dialect takes one of perl, legacy, not 'lgacy'. Did you mean 'legacy'?\n");
    EXPECT_EQ(match({"a", "--encoding", "BINARY"}, "").status, 2);
    EXPECT_EQ(match({"a", "--encoding", "windos-1252"}, "").err,
              "kvt: \"windos-1252\" is not the name of an encoding that can be used here. "
              "Did you mean 'windows-1252'?\n");
    EXPECT_EQ(match({"convert"}, "to convert\n").out, "to convert\n");
}

TEST_F(KvtMatch, WhatIsNoTextIsRefusedWithItsPlace) {
    const ChildResult result = match({"a", "-o", "out"}, "a\nb\xff\n");
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err,
              "kvt: standard input: line 2, column 2, byte 3: The bytes \"\\xFF\" are not valid UTF-8.\n");
    EXPECT_TRUE(names().empty());
    EXPECT_EQ(
        match({"a", "--encoding", "Shift_JIS"}, "\x93\x8c\n\x85\x39").err,
        "kvt: standard input: line 2, column 1, byte 3: The bytes \"\\x85\" are not valid Shift_JIS.\n");
}

TEST_F(KvtMatch, LinesMayBeSplitAtEveryBlockBorder) {
    const std::string tail = "\u00e9\r\nb\r\r\n\U0001F600x";
    for (std::size_t before = 0; before <= tail.size() + 1; ++before) {
        const std::string lead(131072 - before, 'X');
        write("in", lead + tail);
        ASSERT_EQ(match({"X\u00e9$|x$", "in"}, "").out, lead + "\u00e9\r\n\U0001F600x\n") << before;
        ASSERT_EQ(match({"--groups", "^b", "in"}, "").out,
                  "2:1:" + std::to_string(lead.size() + 4) + ":0:1:b\n")
            << before;
    }
}

// Lines in which the pattern cannot match are not looked at one by one, but counted they are.
TEST_F(KvtMatch, LinesThatArePassedOverAreCounted) {
    std::mt19937 random(51);
    const std::regex date("\\d{4}-\\d\\d");
    const Strings pieces = {"\n", "\r",      "\r\n",       "\n",    "\r\r\n", "a",
                            "12", "\u00e9 ", "2020-01-31", "2020-", " - "};
    for (int round = 0; round < 6; ++round) {
        std::string text;
        // The last rounds have no CR, and few lines that match.
        while (text.size() < 300000) {
            const std::string& piece = pieces[random() % pieces.size()];
            text += round > 3 && (piece.find('\r') != std::string::npos || random() % 50 > 0) ? "x\n" : piece;
        }
        std::string expected;
        std::size_t number = 0;
        std::size_t found = 0;
        for (std::size_t at = 0; at < text.size();) {
            const std::size_t end = std::min(text.find_first_of("\r\n", at), text.size());
            const std::size_t endLength = text.compare(end, 2, "\r\n") == 0 ? 2 : end < text.size() ? 1 : 0;
            const std::string line = text.substr(at, end - at);
            ++number;
            if (std::regex_search(line, date)) {
                ++found;
                expected += std::to_string(number) + ":" + line +
                            (endLength == 0 ? "\n" : text.substr(end, endLength));
            }
            at = end + endLength;
        }
        ASSERT_GT(found, 100U);
        // Of the second one no beginning is known.
        for (const char* pattern : {"\\d{4}-\\d\\d", "(?=\\d{4}-\\d\\d)."}) {
            ASSERT_EQ(match({"-n", pattern}, text).out, expected) << round << pattern;
            ASSERT_EQ(match({"-c", pattern}, text).out, std::to_string(found) + "\n") << round << pattern;
        }
    }
}

TEST_F(KvtMatch, CompleteLinesAreWrittenWithoutWaitingForMore) {
    EXPECT_EQ(answerTo({"match", "a"}, "a\nab"), "a\n");
    EXPECT_EQ(read("out"), "a\nab\n");
}

TEST_F(KvtMatch, LinesAreCountedNumberedAndTurnedRound) {
    const std::string text = "\uFEFFone\r\ntwo\nTHREE\nfour";
    EXPECT_EQ(kvt({"match", "o"}, text).out, "\uFEFFone\r\ntwo\nfour\n");
    EXPECT_EQ(kvt({"match", "-v", "o"}, text).out, "\uFEFFTHREE\n");
    EXPECT_EQ(kvt({"match", "-n", "o"}, text).out, "\uFEFF1:one\r\n2:two\n4:four\n");
    EXPECT_EQ(kvt({"match", "-vn", "o"}, text).out, "\uFEFF3:THREE\n");
    EXPECT_EQ(kvt({"match", "-c", "o"}, text).out, "3\n");
    EXPECT_EQ(kvt({"match", "-cv", "o"}, text).out, "1\n");
    EXPECT_EQ(kvt({"match", "-c", "x"}, text).out, "0\n");
    EXPECT_EQ(kvt({"match", "-i", "^t"}, text).out, "\uFEFFtwo\nTHREE\n");
    EXPECT_EQ(kvt({"match", "--ignore-case", "e$|R$"}, text).out, "\uFEFFone\r\nTHREE\nfour\n");
    write("one", "a\n");
    write("two", "b\nc\n");
    EXPECT_EQ(kvt({"match", "--count", ".", "one", "two"}).out, "one:1\ntwo:2\n");
    const std::string wide = convert("UTF-8", "UTF-16LE", "a\nb\n").out;
    EXPECT_EQ(kvt({"match", "-c", "b", "--encoding", "UTF-16LE"}, wide).out, "1\n");
    EXPECT_EQ(kvt({"match", "-n", "b", "--encoding", "UTF-16LE"}, wide).out,
              convert("UTF-8", "UTF-16LE", "2:b\n").out);
    EXPECT_EQ(kvt({"match", "--groups", "-v", "b"}, text).status, 2);
    EXPECT_EQ(kvt({"match", "--dialect", "legacy", "-i", "b"}, text).status, 2);
    EXPECT_EQ(kvt({"match", "-i", "(b"}, text).err, kvt({"match", "(b"}, text).err);
}

TEST_F(KvtMatch, WhatMatchedIsPrintedAlone) {
    const InputRow rows[] = {
        {__LINE__, {"a"}, "banana\nx\na", "a\na\na\na\n"},
        {__LINE__, {"^a"}, "aaa\r\n", "a\r\n"},
        {__LINE__, {"\\ba"}, "aa a\n", "a\na\n"},
        {__LINE__, {"(?<=a)."}, "abac\n", "b\nc\n"},
        {__LINE__, {"x*"}, "axx\n", "xx\n"},
        {__LINE__, {"-n", "\\d+"}, "1 22\n\n3\n", "1:1\n1:22\n3:3\n"},
        {__LINE__, {"-i", "a"}, "aA\n", "a\nA\n"},
        {__LINE__, {"é|€"}, "é€\n", "é\n€\n"},
        {__LINE__, {"--unicode", "."}, "é😀x\n", "é\n😀\nx\n"},
        {__LINE__, {"--unicode", "-i", "ł"}, "Łł\n", "Ł\nł\n"},
        {__LINE__, {"--unicode", "^.*$"}, "a b\n", "a b\n"},
        {__LINE__, {"--unicode", "(?<=😀)\\w+"}, "😀Ła\n", "Ła\n"},
    };
    for (const InputRow& row : rows) {
        Strings arguments = row.arguments;
        arguments.insert(arguments.begin(), "--only-matching");
        const ChildResult result = match(arguments, row.input);
        EXPECT_EQ(result.out, row.output) << row.line << ": " << result.err;
        EXPECT_EQ(result.status, 0) << row.line;
    }
    EXPECT_EQ(match({"--only-matching", "ł", "--encoding", "ISO-8859-2"}, "\xb3 \xb3").out, "\xb3\n\xb3\n");
    EXPECT_EQ(match({"--only-matching", "a", "--encoding", "UTF-16"}, utf16Of(U"\ufeffxa\n", true)).out,
              utf16Of(U"\ufeffa\n", true));
}

TEST_F(KvtMatch, MatchesAreReplaced) {
    struct Row {
        int line;
        std::string pattern;
        std::string text;
        Strings more;
        std::string input;
        std::string output;
    };
    const Row rows[] = {
        {__LINE__, "(\\d+)-(\\d+)", "$2/$1", {}, "x 1-2, 3-4!\nnone\n", "x 2/1, 4/3!\n"},
        {__LINE__, "(\\d+)-(\\d+)", "$2/$1", {"--all-lines"}, "x 1-2\r\nnone\n", "x 2/1\r\nnone\n"},
        {__LINE__, "(\\d+)-(\\d+)", "<$0>", {"--only-matching"}, "x 1-2, 3-4\n", "<1-2>\n<3-4>\n"},
        {__LINE__, "a", "$$1", {}, "a\n", "$1\n"},
        {__LINE__, "(a)", "${1}0", {}, "a\n", "a0\n"},
        {__LINE__, "(a)|b", "[$1]", {}, "ab\n", "[a][]\n"},
        {__LINE__, "^", "> ", {}, "a\n\n", "> a\n> \n"},
        {__LINE__, "$", ";", {}, "a\nb", "a;\nb;\n"},
        {__LINE__, "x*", "-", {}, "éx\n", "-é--\n"},
        {__LINE__, "a", "", {"-n"}, "ba\nab\n", "1:b\n2:b\n"},
        {__LINE__, ".", "$0$0", {"--unicode"}, "éb\n", "éébb\n"},
        {__LINE__, "(?<year>\\d+)", "$1!", {"--unicode"}, "in 2020\n", "in 2020!\n"},
    };
    for (const Row& row : rows) {
        Strings arguments = {row.pattern, "--replace", row.text};
        arguments.insert(arguments.end(), row.more.begin(), row.more.end());
        const ChildResult result = match(arguments, row.input);
        EXPECT_EQ(result.out, row.output) << row.line << ": " << result.err;
        EXPECT_EQ(result.status, 0) << row.line;
    }
    EXPECT_EQ(match({"a", "--replace", "ł", "--encoding", "ISO-8859-2"}, "a\n").out, "\xb3\n");
    EXPECT_EQ(
        match({"a", "--replace", "ł", "--encoding", "ISO-8859-1"}, "b\na\n").err,
        "kvt: standard input: line 2: the result cannot be written. The text \"ł\", read as UTF-8, holds "
        "something that does not exist in ISO-8859-1.\n");
}

TEST_F(KvtMatch, AReplacementNamesGroupsThatThereAre) {
    const std::string form =
        "kvt: --replace takes $0, $1 and so on for groups, ${1} before a digit, and $$ for a dollar, not '";
    for (const auto& [text, error] : std::vector<std::pair<std::string, std::string>>{
             {"$2", "kvt: --replace names '$2', and REGEX has 1 group\n"},
             {"x${99}", "kvt: --replace names '${99}', and REGEX has 1 group\n"},
             {"$99999999999999999999",
              "kvt: --replace names '$99999999999999999999', and REGEX has 1 group\n"},
             {"5 $", form + "$'\n"},
             {"$a", form + "$a'\n"},
             {"${1", form + "${1'\n"}}) {
        for (const Strings& dialect : {Strings{}, {"--unicode"}}) {
            Strings arguments = {"(a)", "--replace", text, "-o", "out"};
            arguments.insert(arguments.end(), dialect.begin(), dialect.end());
            const ChildResult result = match(arguments, "a\n");
            EXPECT_EQ(result.err, error);
            EXPECT_EQ(result.status, 2);
            EXPECT_FALSE(exists("out"));
        }
    }
    EXPECT_TRUE(contains(match({"a", "--replace", "$1"}, "").err, "REGEX has no groups\n"));
}

TEST_F(KvtMatch, GroupsAreRowsOrRecords) {
    EXPECT_EQ(match({"--tsv", "(\\w+)=(\\w*)( !)?"}, "a=1 b=\nx\nc=3 !\n").out, "a\t1\t\nb\t\t\nc\t3\t !\n");
    EXPECT_EQ(match({"--tsv", "a."}, "abac\n").out, "ab\nac\n");
    EXPECT_EQ(match({"--tsv", "(.*):(.*)"}, "a\tb:c\\d\n").out, "a\\tb\tc\\\\d\n");
    EXPECT_EQ(match({"--tsv", "-n", "(a)(b)"}, "ab\nabab\r\n").out, "1\ta\tb\n2\ta\tb\r\n2\ta\tb\r\n");
    EXPECT_EQ(match({"--tsv", "(.+) (.+)", "--encoding", "KOI8-R"}, "\xc1 \xc2\n").out, "\xc1\t\xc2\n");
    EXPECT_EQ(match({"--json", "(a)(b)?", "--encoding", "ISO-8859-1"}, "\xe9"
                                                                       "a\nab\n")
                  .out,
              "{\"file\":\"standard "
              "input\",\"line\":1,\"column\":2,\"offset\":1,\"length\":1,\"text\":\"a\",\"groups\":["
              "{\"column\":2,\"offset\":1,\"length\":1,\"text\":\"a\"},null]}\n"
              "{\"file\":\"standard "
              "input\",\"line\":2,\"column\":1,\"offset\":3,\"length\":2,\"text\":\"ab\",\"groups\":["
              "{\"column\":1,\"offset\":3,\"length\":1,\"text\":\"a\"},{\"column\":2,\"offset\":4,\"length\":"
              "1,\"text\":\"b\"}]}\n");
    EXPECT_EQ(match({"--groups", "--unicode", "(.)x"}, "€éx\n").out, "1:2:3:0:2:éx\n1:2:3:1:1:é\n");
}

TEST_F(KvtMatch, NoCharacterIsCutInTwo) {
    for (const Strings& form :
         std::vector<Strings>{{"--only-matching"}, {"--replace", "x"}, {"--tsv"}, {"--groups"}, {"--json"}}) {
        for (const std::string pattern : {"a(.)", "(.)$", "[é]"}) {
            Strings arguments = form;
            arguments.push_back(pattern);
            const ChildResult result = match(arguments, "ab\naé\n");
            EXPECT_EQ(result.status, 2) << pattern;
            EXPECT_EQ(
                result.err,
                "kvt: standard input: line 2: REGEX matches a part of a character; with --unicode it takes "
                "whole ones\n");
            EXPECT_EQ(result.out, "");
            arguments.push_back("--unicode");
            EXPECT_EQ(match(arguments, "ab\naé\n").status, 0) << pattern;
        }
    }
    EXPECT_EQ(match({"a.$"}, "aé\nab\n").out, "ab\n");
    EXPECT_EQ(match({"--unicode", "a.$"}, "aé\nab\n").out, "aé\nab\n");
}

TEST_F(KvtMatch, UnicodePatternsHaveTheirOwnFaults) {
    for (const auto& [pattern, words] : std::vector<std::pair<std::string, std::string>>{
             {"a(b", "parentheses do not go in pairs, behind 'a(b'"},
             {"[a", "']' is missing, behind '[a'"},
             {"\\p{Nosuch}", "there is no such property of characters"},
             {"\\y", "a backslash stands before what has no meaning behind it, behind '\\y'"},
             {"a{2,1}", "the most repetitions are fewer than the least"},
             {"(a)\\2", "a reference names a group that there is not"}}) {
        const ChildResult result = match({"--unicode", pattern}, "a\n");
        EXPECT_EQ(result.status, 2);
        EXPECT_TRUE(result.err.starts_with("kvt: REGEX cannot be compiled: " + words)) << result.err;
    }
    const ChildResult result = match({"--unicode", "(a*)*b"}, std::string(60, 'a') + "\n");
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(result.err.starts_with("kvt: standard input: line 1: REGEX gives up: The line takes too m"))
        << result.err;
    EXPECT_EQ(match({"--unicode", ""}, "a\n\n").out, "a\n\n");
}

TEST_F(KvtMatch, OptionsThatExcludeEachOtherAreNamed) {
    for (const Strings& pair : std::vector<Strings>{{"--count", "--tsv"},
                                                    {"--groups", "--json"},
                                                    {"--tsv", "--only-matching"},
                                                    {"--json", "--replace"},
                                                    {"--only-matching", "--invert-match"},
                                                    {"--replace", "--invert-match"},
                                                    {"--groups", "--line-number"},
                                                    {"--unicode", "--dialect"}}) {
        Strings arguments = {"a"};
        for (const std::string& option : pair) {
            arguments.push_back(option == "--replace"   ? "--replace=x"
                                : option == "--dialect" ? "--dialect=perl"
                                                        : option);
        }
        const ChildResult result = match(arguments, "");
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.err, "kvt: " + pair[0] + " and " + pair[1] + " do not go together\n");
    }
    EXPECT_EQ(match({"a", "--all-lines"}, "").status, 2);
    EXPECT_EQ(match({"a", "--dialect", "legacy", "--only-matching"}, "").err,
              "kvt: --only-matching goes with the dialect 'perl' or --unicode only\n");
}

TEST_F(KvtMatch, ALongLineWithManyMatchesTakesNoLongerForEach) {
    const std::string line(3'000'000, 'a');
    for (const Strings& dialect : {Strings{}, {"--unicode"}}) {
        Strings arguments = {"a", "--replace", "b"};
        arguments.insert(arguments.end(), dialect.begin(), dialect.end());
        EXPECT_TRUE(match(arguments, line).out == std::string(line.size(), 'b') + "\n");
    }
}

TEST_F(KvtMatch, AClosedPipeEndsItQuietly) {
    ChildSetup made = setup({"match", "$"});
    const std::string piece(1 << 10, '\n');
    std::size_t pieces = 0;
    made.makeInput = [&]() -> std::string_view { return pieces++ < 64000 ? piece : std::string_view(); };
    made.readNothing = true;
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 128 + SIGPIPE);
    EXPECT_EQ(result.err, "");
    EXPECT_LT(pieces, 64000u);
}

TEST_F(KvtMatch, ABigStreamPassesInBoundedMemory) {
    const std::string line =
        "Krak\u00f3w and \u0141\u00f3d\u017a, \u6771\u4eac \U0001F600: a line of text.\n";
    std::string piece;
    std::size_t lines = 0;
    for (; piece.size() < 250000; ++lines) {
        piece += line;
    }
    const auto memory = [&](std::size_t pieces) {
        ChildSetup made = withoutQuarantine(setup({"match", "line"}));
        std::size_t sent = 0;
        made.makeInput = [&]() -> std::string_view { return sent++ < pieces ? piece : std::string_view(); };
        std::size_t received = 0;
        made.takeOutput = [&](std::string_view bytes) { received += bytes.size(); };
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_EQ(received, pieces * piece.size());
        return result.mostMemory;
    };
    const std::size_t small = memory(4);
    EXPECT_LT(memory(100), small + (8u << 20));
}

} // namespace kvt::test
