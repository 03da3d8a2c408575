// `kvt match`: which lines, which groups, in which encoding, and how it ends.

#include "encode.h"
#include "host_test.h"

#include <csignal>

namespace kvt::test {

namespace {

using namespace std::string_literals;
using Strings = std::vector<std::string>;

} // namespace

class KvtMatch : public HostTest {
protected:
    ChildResult match(Strings arguments, const std::string& input) {
        arguments.insert(arguments.begin(), "match");
        return kvt(std::move(arguments), input);
    }
};

TEST_F(KvtMatch, PrintsTheLinesOrTheGroups) {
    struct Row {
        int line;
        Strings arguments;
        std::string input;
        std::string output;
    };
    const Row rows[] = {
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
        {__LINE__, {"--groups", "\\x00(b)"}, "a\0b\n"s, "1:0:1:2:\0b\n1:1:2:1:b\n"s},
        {__LINE__, {"--dialect", "legacy", "b$"}, "b\0\na\0b"s, "a\0b\n"s},
        {__LINE__,
         {"--groups", "a(b)?c"},
         "x\nxac abc\nabc\n",
         "2:0:1:2:ac\n2:1:-:-:\n3:0:0:3:abc\n3:1:1:1:b\n"},
        {__LINE__, {"--groups", "(x*)"}, "a\n", "1:0:0:0:\n1:1:0:0:\n"},
        {__LINE__, {"--groups", "\u00e9(.)"}, "\u20ac\u00e9x\n", "1:0:3:3:\u00e9x\n1:1:5:1:x\n"},
        {__LINE__, {"--groups", "b"}, "a\r\nb\r\n", "2:0:0:1:b\n"},
        {__LINE__, {"--dialect", "perl", "a|b"}, "b\n", "b\n"},
        {__LINE__, {"--dialect", "legacy", "a|b"}, "b\na|b\n", "a|b\n"},
        {__LINE__, {"--dialect", "legacy", "f(x)$"}, "f(x)+\ny=f(x)\n", "y=f(x)\n"},
        {__LINE__, {"--dialect", "legacy", "--groups", "(.)"}, "\n(a) (b)\n", "2:0:0:3:(a)\n"},
        {__LINE__, {"--dialect", "legacy", "x*"}, "\na\n", "a\n"},
        {__LINE__, {"--dialect", "legacy", "{2}$"}, "a{2}\naa\n", "a{2}\n"},
    };
    for (const Row& row : rows) {
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
        // What is said of the groups is UTF-8, and counts in it.
        EXPECT_EQ(
            match({"--groups", "\u20ac(.)", "--encoding", encoding}, utf16Of(U"\u00e9\u20acb", big)).out,
            "1:0:2:4:\u20acb\n1:1:5:1:b\n");
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
    EXPECT_EQ(match({"--groups", "^a", "one"}, "").out, "1:0:0:1:a\n3:0:0:1:a\n");
    EXPECT_EQ(match({"a", "--encoding", "UTF-16LE"}, utf16Of(U"\ufeffb\na", false)).out,
              utf16Of(U"\ufeffa\n", false));
}

TEST_F(KvtMatch, SeveralFilesBecomeOneOutputAndEachCountsItsLines) {
    write("one", "a\nb");
    write("two", "b\n");
    EXPECT_EQ(match({"b", "one", "-", "two"}, "c\nbb\n").out, "b\nbb\nb\n");
    EXPECT_EQ(match({"--groups", "b", "one", "-", "two"}, "ab\n").out,
              "one:2:0:0:1:b\nstandard input:1:0:1:1:b\ntwo:1:0:0:1:b\n");
    EXPECT_EQ(match({"--groups", "b", "one"}, "").out, "2:0:0:1:b\n");
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
    EXPECT_EQ(match({"\xff"}, "a").err, "kvt: The bytes \"\\xFF\" are not valid UTF-8.\n");
    EXPECT_EQ(match({"\xff"}, "a").status, 2);
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
        ASSERT_EQ(match({"--groups", "^b", "in"}, "").out, "2:0:0:1:b\n") << before;
    }
}

TEST_F(KvtMatch, CompleteLinesAreWrittenWithoutWaitingForMore) {
    ChildSetup made = setup({"match", "a"});
    made.outputFile = path("out");
    int sent = 0;
    std::string answer;
    made.makeInput = [&]() -> std::string_view {
        if (sent++ == 0) {
            return "a\nab";
        }
        for (int tries = 0; tries < 500 && answer.empty(); ++tries) {
            ::usleep(10000);
            answer = read("out");
        }
        return {};
    };
    EXPECT_EQ(runChild(made).status, 0);
    EXPECT_EQ(answer, "a\n");
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
        ChildSetup made = setup({"match", "line"});
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
