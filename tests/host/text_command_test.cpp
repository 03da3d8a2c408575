// `kvt text`: the operations on lines, in any encoding.

#include "encode.h"
#include "host_test.h"

#include <csignal>
#include <map>
#include <random>

namespace kvt::test {

namespace {

using Strings = std::vector<std::string>;

// Full case folding for the characters of the random texts (CaseFolding.txt, statuses C and F).
std::u32string foldedForm(char32_t character) {
    static const std::map<char32_t, std::u32string> forms = {
        {U'S', U"s"},       {U'K', U"k"},
        {U'\u00df', U"ss"}, {U'\u017f', U"s"},
        {U'\u212a', U"k"},  {U'\u0130', U"i\u0307"},
        {U'\ufb05', U"st"}, {U'\u0390', U"\u03b9\u0308\u0301"},
    };
    const auto found = forms.find(character);
    return found == forms.end() ? std::u32string(1, character) : found->second;
}

std::u32string folded(std::u32string_view text) {
    std::u32string out;
    for (const char32_t character : text) {
        out += foldedForm(character);
    }
    return out;
}

// The matches of a needle as pairs of character positions: the leftmost runs of whole characters that fold as it
// does. None of them overlaps another.
std::vector<std::pair<std::size_t, std::size_t>> matches(const std::u32string& text,
                                                         const std::u32string& needle) {
    std::vector<std::pair<std::size_t, std::size_t>> found;
    for (std::size_t start = 0; start < text.size();) {
        std::size_t end = start + 1;
        while (end <= text.size() && folded(text.substr(start, end - start)) != folded(needle)) {
            ++end;
        }
        if (end <= text.size()) {
            found.emplace_back(start, end);
        }
        start = end <= text.size() ? end : start + 1;
    }
    return found;
}

} // namespace

class KvtText : public HostTest {
protected:
    ChildResult text(Strings arguments, const std::string& input) {
        arguments.insert(arguments.begin(), "text");
        return kvt(std::move(arguments), input);
    }
};

TEST_F(KvtText, EachOperationDoesItsWork) {
    struct Row {
        int line;
        Strings arguments;
        std::string input;
        std::string output;
    };
    const Row rows[] = {
        {__LINE__, {"upper"}, "Stra\u00dfe \ufb00 \u00e9\n", "STRASSE FF \u00c9\n"},
        {__LINE__, {"lower"}, "\u00c9TAT \u039f\u0394\u039f\u03a3\n", "\u00e9tat \u03bf\u03b4\u03bf\u03c2\n"},
        {__LINE__, {"fold"}, "Stra\u00dfe \u03c2\n", "strasse \u03c3\n"},
        {__LINE__, {"find", "an"}, "banana\n\nan\n", "1:2:1\n1:4:3\n3:1:8\n"},
        {__LINE__, {"find", "aa"}, "aaaaa", "1:1:0\n1:3:2\n"},
        {__LINE__, {"find", "\u20ac"}, "\u00e9\u20ac\n", "1:2:2\n"},
        {__LINE__, {"find", "x"}, "banana\n", ""},
        {__LINE__, {"replace", "an", "\u20ac"}, "banana\n", "b\u20ac\u20aca\n"},
        {__LINE__, {"replace", "a", "aa"}, "banana", "baanaanaa"},
        {__LINE__, {"replace", "an", ""}, "banana\nan\n", "ba\n\n"},
        {__LINE__, {"replace", "a", "1\n2"}, "xay\r\n", "x1\n2y\r\n"},
        {__LINE__, {"split", ", "}, "a, b, , c,d\n", "a\nb\n\nc,d\n"},
        {__LINE__, {"split", "\u00e9"}, "a\u00e9b\u00e8c\n", "a\nb\u00e8c\n"},
        {__LINE__, {"split", "aa"}, "xaaaay\n", "x\n\ny\n"},
        {__LINE__, {"split", ":"}, ":a:\n\n", "\na\n\n\n"},
        {__LINE__, {"split", "--skip-empty", ":"}, ":a:\n\n::\nb", "a\nb\n"},
        {__LINE__, {"split", ":"}, "a:b", "a\nb\n"},
        {__LINE__, {"strip", " \u00e9"}, " \u00e9 a \u00e9b\u00e9 \n", "a \u00e9b\n"},
        {__LINE__, {"strip", "\u00e9"}, "\u00e3a\u00e8\n", "\u00e3a\u00e8\n"},
        {__LINE__, {"strip", "--front", "x"}, "xxaxx\n", "axx\n"},
        {__LINE__, {"strip", "--back", "x"}, "xxaxx\n", "xxa\n"},
        {__LINE__, {"strip", "--front", "--back", "x"}, "xxaxx\n", "a\n"},
        {__LINE__, {"strip", "x"}, "xxx\nx", "\n"},
        {__LINE__, {"strip", ""}, " a \n", " a \n"},
        // The published values of 64-bit FNV-1a.
        {__LINE__, {"hash"}, "\na\nfoobar", "cbf29ce484222325\naf63dc4c8601ec8c\n85944171f73967e8\n"},
    };
    for (const Row& row : rows) {
        SCOPED_TRACE(row.line);
        const ChildResult result = text(row.arguments, row.input);
        EXPECT_EQ(result.status, 0);
        EXPECT_EQ(result.out, row.output);
        EXPECT_EQ(result.err, "");
        EXPECT_EQ(text(row.arguments, "").out, "");
    }
}

TEST_F(KvtText, LineEndsAreWrittenAsTheyWere) {
    const std::string ends = " a\n b\r\n c\r d\n\r\n\r e";
    EXPECT_EQ(text({"upper"}, ends).out, " A\n B\r\n C\r D\n\r\n\r E");
    EXPECT_EQ(text({"strip", " "}, ends).out, "a\nb\r\nc\rd\n\r\n\re");
    EXPECT_EQ(text({"strip", "\r\n "}, ends).out, "a\nb\r\nc\rd\n\r\n\re");
    EXPECT_EQ(text({"split", " "}, " x y\r\nz").out, "\r\nx\r\ny\r\nz\n");
    EXPECT_EQ(text({"find", "e"}, ends).out, "7:2:17\n");
}

TEST_F(KvtText, MappingThatShrinksLeavesNoZeros) {
    // The Kelvin sign has three bytes and folds to one. Zeros that the text has itself stay, all of them.
    const std::string zero(1, '\0');
    for (const auto& [input, output] : std::vector<std::pair<std::string, std::string>>{
             {"\u212a\n", "k\n"},
             {"\u212a\u212a", "kk"},
             {"\u212a" + zero + "\n", "k" + zero + "\n"},
             {zero + "\u212a" + zero + zero, zero + "k" + zero + zero},
             {"\u00e9" + zero, "\u00e9" + zero},
             {zero + zero + "\n", zero + zero + "\n"},
             // One grows and one shrinks, so that the sum stays.
             {"\u0130\u0130\u212a" + zero, "i\u0307i\u0307k" + zero},
         }) {
        EXPECT_EQ(text({"fold"}, input).out, output);
        EXPECT_EQ(text({"lower"}, input).out, output);
    }
    // U+2C65 has three bytes and U+023A, its upper case, two.
    EXPECT_EQ(text({"upper"}, "\u2c65" + zero + "\n").out, "\u023a" + zero + "\n");
    EXPECT_EQ(text({"hash", "-i"}, "\u212a").out, text({"hash"}, "k").out);
    EXPECT_EQ(text({"find", "-i", "\u212a"}, "ak\n").out, "1:2:1\n");
}

TEST_F(KvtText, CaseCanBeIgnored) {
    EXPECT_EQ(text({"find", "--ignore-case", "STRASSE"}, "x Stra\u00dfe strasse\n").out, "1:3:2\n1:10:10\n");
    EXPECT_EQ(text({"find", "-i", "stra\u00dfe"}, "\u212a STRASSE\n").out, "1:3:4\n");
    EXPECT_EQ(text({"replace", "-i", "strasse", "Weg"}, "\u212a Stra\u00dfe\u00df STRASSE\n").out,
              "\u212a Weg\u00df Weg\n");
    EXPECT_EQ(text({"split", "-i", "x"}, "aXbxc\n").out, "a\nb\nc\n");
    EXPECT_EQ(text({"hash", "-i"}, "Stra\u00dfe\nSTRASSE\n").out, text({"hash"}, "strasse\nstrasse\n").out);
    // Half of a character is not a match.
    EXPECT_EQ(text({"find", "-i", "s"}, "\u00df s\n").out, "1:3:3\n");
    EXPECT_EQ(text({"replace", "-i", "s", "-"}, "\u00dfs\u00df\n").out, "\u00df-\u00df\n");
}

TEST_F(KvtText, IgnoringCaseAgreesWithANaiveSearch) {
    const std::u32string alphabet = U"sSkt\u00df\u017f\u212a\u0130\ufb05\u0390i\u0307";
    std::mt19937 random(7);
    const auto randomText = [&](std::size_t length) {
        std::u32string made;
        for (std::size_t index = 0; index < length; ++index) {
            made += alphabet[random() % alphabet.size()];
        }
        return made;
    };
    std::size_t found = 0;
    for (int run = 0; run < 30; ++run) {
        const std::u32string needle = randomText(1 + random() % 3);
        std::string input, places, changed;
        for (std::size_t number = 1; number <= 100; ++number) {
            const std::u32string line = randomText(random() % 12);
            std::size_t done = 0;
            for (const auto& [start, end] : matches(line, needle)) {
                places += std::to_string(number) + ":" + std::to_string(start + 1) + ":" +
                          std::to_string(input.size() + utf8Of(line.substr(0, start)).size()) + "\n";
                changed += utf8Of(line.substr(done, start - done)) + "_";
                done = end;
                ++found;
            }
            changed += utf8Of(line.substr(done)) + "\n";
            input += utf8Of(line) + "\n";
        }
        EXPECT_EQ(text({"find", "-i", utf8Of(needle)}, input).out, places) << utf8Of(needle);
        EXPECT_EQ(text({"replace", "-i", utf8Of(needle), "_"}, input).out, changed) << utf8Of(needle);
    }
    EXPECT_GT(found, 1000u);
}

TEST_F(KvtText, TextIsReadAndWrittenInItsEncoding) {
    EXPECT_EQ(text({"upper", "--encoding", "windows-1252"}, "caf\xe9\r\n\x9c").out, "CAF\xc9\r\n\x8c");
    EXPECT_EQ(text({"lower", "--encoding", "KOI8-R"}, "\xed\xef\xf3\n").out, "\xcd\xcf\xd3\n");
    // The trailing byte of the first character is that of "\", and no character ends or begins within another.
    EXPECT_EQ(text({"replace", "--encoding", "Shift_JIS", "\\", "/"}, "\x83\x5c\x5c\n").out, "\x83\x5c/\n");
    EXPECT_EQ(text({"upper", "--encoding", "ISO-2022-JP"}, "a\x1b$BEl\n\x1b(Bb").out.back(), 'B');
    for (const bool big : {false, true}) {
        const std::string sixteen = big ? "UTF-16BE" : "UTF-16LE";
        const std::string thirtyTwo = big ? "UTF-32BE" : "UTF-32LE";
        // U+0A0D and U+0D0A look like line ends to code that counts bytes.
        EXPECT_EQ(
            text({"strip", " ", "--encoding", sixteen}, utf16Of(U" \u0a0d\u0d0a\U0001F600 \r\n b", big)).out,
            utf16Of(U"\u0a0d\u0d0a\U0001F600\r\nb", big));
        EXPECT_EQ(text({"upper", "--encoding", thirtyTwo}, utf32Of(U"\u00e9\n\u00df", big)).out,
                  utf32Of(U"\u00c9\nSS", big));
        // Statements about the text are plain, and count in UTF-8.
        EXPECT_EQ(text({"find", "b", "--encoding", sixteen}, utf16Of(U"\n\u20acb", big)).out, "2:2:4\n");
        EXPECT_EQ(text({"hash", "--encoding", sixteen}, utf16Of(U"\u00e9\u20ac\n", big)).out,
                  text({"hash"}, "\u00e9\u20ac\n").out);
    }
}

TEST_F(KvtText, AByteOrderMarkIsNoPartOfTheFirstLine) {
    const std::string mark = "\ufeff";
    write("one", mark + " a\n");
    write("two", mark);
    EXPECT_EQ(text({"strip", " ", "one", "two", "one"}, "").out, mark + "a\n" + mark + mark + "a\n");
    EXPECT_EQ(text({"find", "a", "one"}, "").out, "1:2:4\n");
    EXPECT_EQ(text({"hash", "two", "one"}, "").out, text({"hash"}, " a\n").out);
    EXPECT_EQ(text({"upper", "--encoding", "UTF-16LE"}, utf16Of(U"\ufeffa", false)).out,
              utf16Of(U"\ufeffA", false));
}

TEST_F(KvtText, WhatIsNoTextIsRefusedWithItsPlace) {
    struct Row {
        std::string encoding;
        std::string input;
        std::string place;
        std::string bytes;
    };
    for (const Row& row : {Row{"UTF-8", "a\nb\xff\n", "line 2, column 2, byte 3", "\\xFF"},
                           Row{"UTF-8", "a\r\n\u00e9b\xe2\x82", "line 2, column 3, byte 6", "\\xE2\\x82"},
                           Row{"Shift_JIS", "\x93\x8c\n\x85\x39", "line 2, column 1, byte 3", "\\x85"},
                           Row{"UTF-16LE", {"a\0\n\0\0\xdc", 6}, "line 2, column 1, byte 4", "\\x00\\xDC"}}) {
        const ChildResult result = text({"upper", "--encoding", row.encoding, "-o", "out"}, row.input);
        EXPECT_EQ(result.status, 2) << row.encoding;
        EXPECT_EQ(result.err, "kvt: standard input: " + row.place + ": The bytes \"" + row.bytes +
                                  "\" are not valid " + row.encoding + ".\n");
        EXPECT_TRUE(names().empty());
    }
}

TEST_F(KvtText, AResultThatTheEncodingCannotHoldIsRefusedWithItsLine) {
    write("in", "a\n\xff\n");
    const ChildResult result = text({"upper", "--encoding", "ISO-8859-1", "in", "-o", "out"}, "");
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err,
              "kvt: in: line 2: the result cannot be written. The text \"\u0178\", read as UTF-8, "
              "holds something that does not exist in ISO-8859-1.\n");
    EXPECT_EQ(names(), Strings{"in"});
    EXPECT_EQ(text({"replace", "a", "\u20ac", "--encoding", "US-ASCII"}, "xa").status, 2);
    EXPECT_EQ(text({"find", "\u20ac", "--encoding", "US-ASCII"}, "xa").status, 0);
}

TEST_F(KvtText, ArgumentsAreLookedAt) {
    for (const auto& [arguments, name] : std::vector<std::pair<Strings, std::string>>{
             {{"find", ""}, "NEEDLE"}, {{"replace", "", "x"}, "FROM"}, {{"split", ""}, "DELIMITER"}}) {
        EXPECT_EQ(text(arguments, "a").err, "kvt: " + name + " must not be empty\n");
        EXPECT_EQ(text(arguments, "a").status, 2);
    }
    for (const Strings& arguments : {Strings{"find", "\xff"}, {"replace", "a", "\xff"}, {"strip", "\xff"}}) {
        const std::string name = arguments[0] == "find" ? "NEEDLE" : arguments[0] == "strip" ? "SET" : "TO";
        EXPECT_EQ(text(arguments, "a").err,
                  "kvt: " + name + " is not UTF-8: \"\\xFF\" ends in a byte of no character\n");
        EXPECT_EQ(text(arguments, "a").status, 2);
    }
    // Words that mean something elsewhere, and what looks like an option.
    EXPECT_EQ(text({"find", "convert"}, "to convert").out, "1:4:3\n");
    EXPECT_EQ(text({"find", "upper"}, "upper").out, "1:1:0\n");
    EXPECT_EQ(text({"replace", "--", "-a", "--b"}, "x-a").out, "x--b");
    EXPECT_EQ(text({"find"}, "").status, 2);
    EXPECT_EQ(text({}, "").status, 2);
    EXPECT_EQ(text({"uper"}, "").err,
              "kvt: unknown command 'uper'. Did you mean 'upper'?\nTry 'kvt text --help'.\n");
    EXPECT_EQ(text({"upper", "--encoding", "BINARY"}, "").status, 2);
}

TEST_F(KvtText, SeveralFilesBecomeOneOutputAndEachCountsItsLines) {
    write("one", "a\nb");
    write("two", "b\n");
    EXPECT_EQ(text({"upper", "one", "-", "two"}, "c\n").out, "A\nBC\nB\n");
    EXPECT_EQ(text({"find", "b", "one", "-", "two"}, "ab\n").out,
              "one:2:1:2\nstandard input:1:2:1\ntwo:1:1:0\n");
    EXPECT_EQ(text({"find", "b", "one"}, "").out, "2:1:2\n");
    EXPECT_EQ(text({"upper", "one", "-o", "one"}, "").status, 0);
    EXPECT_EQ(read("one"), "A\nB");
    EXPECT_EQ(text({"upper", "missing"}, "").err, "kvt: cannot read missing: No such file or directory\n");
    EXPECT_EQ(text({"upper", "two", "-o", "/dev/full"}, "").status, 2);
    ChildSetup inPlace = setup({"text", "upper", "two"});
    inPlace.outputFile = path("two");
    EXPECT_EQ(runChild(inPlace).status, 2);
    EXPECT_EQ(read("two"), "b\n");
}

TEST_F(KvtText, FindSaysWhereAPlaceIsInTheFileAsItIs) {
    const std::u32string sample = U"a\r\n\u65e5\u672cx\u8a9ex\nx";
    struct Row {
        const char* encoding;
        const char* places;
    };
    for (const Row& row :
         {Row{"UTF-8", "2:3:9\n2:5:13\n3:1:15\n"}, Row{"UTF-16BE", "2:3:10\n2:5:14\n3:1:18\n"},
          Row{"UTF-32LE", "2:3:20\n2:5:28\n3:1:36\n"}, Row{"Shift_JIS", "2:3:7\n2:5:10\n3:1:12\n"},
          Row{"ISO-2022-JP", "2:3:13\n2:5:22\n3:1:24\n"}, Row{"GB18030", "2:3:7\n2:5:10\n3:1:12\n"}}) {
        const std::string bytes = convert("UTF-8", row.encoding, utf8Of(sample)).out;
        EXPECT_EQ(text({"find", "x", "--encoding", row.encoding}, bytes).out, row.places) << row.encoding;
    }
    // A mark is not a character, but it has bytes.
    EXPECT_EQ(text({"find", "x", "--encoding", "UTF-16"}, "\xff\xfe" + utf16Of(U"ax\nx", false)).out,
              "1:2:4\n2:1:8\n");
    std::string lines;
    std::string places;
    for (int line = 1; line <= 30000; ++line) {
        places += std::to_string(line) + ":3:" + std::to_string(lines.size() + 3) + "\n";
        lines += "\x83\x5c-x--\n";
    }
    EXPECT_EQ(text({"find", "x", "--encoding", "Shift_JIS"}, lines).out, places);
}

TEST_F(KvtText, LinesMayBeSplitAtEveryBlockBorder) {
    const std::string tail = "\u00e9\r\n\u20ac\r\r\n\U0001F600x";
    const std::string changed = "\u00c9\r\n\u20ac\r\r\n\U0001F600X";
    for (std::size_t before = 0; before <= tail.size() + 1; ++before) {
        const std::string lead(131072 - before, 'X');
        write("in", lead + tail);
        ASSERT_EQ(text({"upper", "in"}, "").out, lead + changed) << before;
        ASSERT_EQ(text({"find", "\u20ac", "in"}, "").out, "2:1:" + std::to_string(lead.size() + 4) + "\n")
            << before;
    }
}

TEST_F(KvtText, TextMayComeByteByByte) {
    const std::string input = "\ufeff\u00e9\r\n\u20ac\r\rb";
    std::size_t sent = 0;
    ChildSetup made = setup({"text", "split", "\u00c9", "-i"});
    made.oneByOne = true;
    made.makeInput = [&]() -> std::string_view {
        return sent == input.size() ? std::string_view() : std::string_view(input).substr(sent++, 1);
    };
    EXPECT_EQ(runChild(made).out, "\ufeff\r\n\r\n\u20ac\r\rb\n");
}

TEST_F(KvtText, CompleteLinesAreWrittenWithoutWaitingForMore) {
    EXPECT_EQ(answerTo({"text", "upper"}, "a\nb"), "A\n");
    EXPECT_EQ(read("out"), "A\nB");
}

TEST_F(KvtText, AClosedPipeEndsItQuietly) {
    ChildSetup made = setup({"text", "upper"});
    const std::string piece(1 << 10, '\n');
    std::size_t pieces = 0;
    made.makeInput = [&]() -> std::string_view { return pieces++ < 64000 ? piece : std::string_view(); };
    made.readNothing = true;
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 128 + SIGPIPE);
    EXPECT_EQ(result.err, "");
    EXPECT_LT(pieces, 64000u);
}

TEST_F(KvtText, ABigStreamPassesInBoundedMemory) {
    const std::string line =
        "Krak\u00f3w and \u0141\u00f3d\u017a, \u6771\u4eac \U0001F600: a line of text.\n";
    std::string piece;
    while (piece.size() < 250000) {
        piece += line;
    }
    const auto memory = [&](std::size_t pieces) {
        ChildSetup made = setup({"text", "replace", "line", "row"});
        std::size_t sent = 0;
        made.makeInput = [&]() -> std::string_view { return sent++ < pieces ? piece : std::string_view(); };
        std::size_t received = 0;
        made.takeOutput = [&](std::string_view bytes) { received += bytes.size(); };
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_EQ(received, pieces * (piece.size() - piece.size() / line.size()));
        return result.mostMemory;
    };
    const std::size_t small = memory(4);
    EXPECT_LT(memory(200), small + (8u << 20));
}

TEST_F(KvtText, ALineThatIsTooLongIsRefused) {
    const std::string piece(1 << 20, 'x');
    const auto run = [&](std::size_t pieces) {
        ChildSetup made = setup({"text", "hash"});
        std::size_t sent = 0;
        made.makeInput = [&]() -> std::string_view {
            return sent == 0      ? ++sent, "a\n"
               : sent++ <= pieces ? std::string_view(piece)
                                  : std::string_view();
        };
        return runChild(made);
    };
    EXPECT_EQ(run(64).status, 0);
    const ChildResult result = run(66);
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: standard input: line 2 is longer than 64 MiB\n");
}

TEST_F(KvtText, EveryOperationHasAHelpThatBeginsWithAnExample) {
    for (const std::string name : {"upper", "lower", "fold", "find", "replace", "split", "strip", "hash"}) {
        const ChildResult result = kvt({"text", name, "--help"});
        EXPECT_EQ(result.status, 0);
        EXPECT_TRUE(result.out.starts_with("Example:\n  kvt text " + name + " ")) << result.out;
        EXPECT_TRUE(contains(result.out, "Exit status:")) << result.out;
        const bool ignores = name == "find" || name == "replace" || name == "split" || name == "hash";
        EXPECT_EQ(contains(result.out, "--ignore-case "), ignores) << result.out;
    }
}

TEST_F(KvtText, StatementsMayBeRecords) {
    EXPECT_EQ(text({"find", "é", "--json", "--encoding", "ISO-8859-1"}, "a\nb\xe9\xe9\n").out,
              "{\"file\":\"standard input\",\"line\":2,\"column\":2,\"offset\":3,\"text\":\"é\"}\n"
              "{\"file\":\"standard input\",\"line\":2,\"column\":3,\"offset\":4,\"text\":\"é\"}\n");
    EXPECT_EQ(text({"find", "STRASSE", "-i", "--json"}, "Straße").out,
              "{\"file\":\"standard input\",\"line\":1,\"column\":1,\"offset\":0,\"text\":\"Straße\"}\n");
    const std::string hash = text({"hash"}, "a\n").out.substr(0, 16);
    EXPECT_EQ(text({"hash", "--json"}, "a\n").out,
              "{\"file\":\"standard input\",\"line\":1,\"hash\":\"" + hash + "\"}\n");
}

} // namespace kvt::test
