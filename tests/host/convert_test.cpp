// `kvt convert` on texts without losses: where input comes from and output goes, and what is refused.

#include "encode.h"
#include "host_test.h"

namespace kvt::test {

class KvtConvert : public HostTest {};

TEST_F(KvtConvert, GoesFromStandardInputToStandardOutput) {
    const ChildResult result = convert("windows-1252", "UTF-8", "Caf\xe9, 5 \x80\n");
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.out, "Caf\u00e9, 5 \u20ac\n");
    EXPECT_EQ(result.err, "");
}

TEST_F(KvtConvert, ConvertsBetweenManyEncodings) {
    const std::u32string text = U"Tokyo \u6771\u4eac, \u041c\u043e\u0441\u043a\u0432\u0430, \U0001F600\n";
    struct Row {
        const char* name;
        std::string bytes;
    };
    const std::vector<Row> rows = {
        {"UTF-8", utf8Of(text)},           {"UTF-16LE", utf16Of(text, false)},
        {"UTF-16BE", utf16Of(text, true)}, {"UTF-32LE", utf32Of(text, false)},
        {"UTF-32BE", utf32Of(text, true)},
    };
    for (const Row& from : rows) {
        for (const Row& to : rows) {
            const ChildResult result = convert(from.name, to.name, from.bytes);
            EXPECT_EQ(result.status, 0) << from.name << " to " << to.name << ": " << result.err;
            EXPECT_EQ(result.out, to.bytes) << from.name << " to " << to.name;
        }
    }
    EXPECT_EQ(convert("Shift_JIS", "UTF-8", "\x93\x8c\x8b\x9e").out, "\u6771\u4eac");
    EXPECT_EQ(convert("KOI8-R", "UTF-8", "\xed\xcf\xd3\xcb\xd7\xc1").out,
              "\u041c\u043e\u0441\u043a\u0432\u0430");
    EXPECT_EQ(convert("UTF-8", "ISO-2022-JP", "\u6771a").out, "\x1b$BEl\x1b(Ba");
}

TEST_F(KvtConvert, EmptyInputGivesEmptyOutput) {
    const ChildResult result = convert("UTF-8", "UTF-16LE", "");
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(convert("UTF-8", "UTF-16LE", "", {"-o", "empty"}).status, 0);
    EXPECT_TRUE(exists("empty"));
}

TEST_F(KvtConvert, FilesAreConvertedInOrderAndADashIsStandardInput) {
    write("one", "1\xe9");
    write("two", "2\xe8");
    const ChildResult result = convert("ISO-8859-1", "UTF-8", "-\xe7", {"two", "-", "one"});
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(result.out, "2\u00e8-\u00e71\u00e9");
}

TEST_F(KvtConvert, EachFileIsATextOfItsOwn) {
    // The lead byte at the end of the first file does not join the trail byte that begins the second.
    write("one", "a\xc3");
    write("two", "\xa9z");
    const ChildResult result = convert("UTF-8", "UTF-16LE", "", {"--on-error", "replace", "one", "two"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, utf16Of(U"a\uFFFD\uFFFDz", false));
    EXPECT_TRUE(contains(result.err, "bad bytes C3; first in one: line 1, column 2, byte 1")) << result.err;
    EXPECT_TRUE(contains(result.err, "bad bytes A9; first in two: line 1, column 1, byte 0")) << result.err;
    // A stateful target is back in its first state between them.
    write("three", "\u6771");
    const ChildResult stateful = convert("UTF-8", "ISO-2022-JP", "", {"three", "three"});
    EXPECT_EQ(stateful.out, "\x1b$BEl\x1b(B\x1b$BEl\x1b(B");
}

TEST_F(KvtConvert, WritesToAFile) {
    const ChildResult result = convert("UTF-8", "KOI8-R", "\u041c", {"-o", "out"});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(result.err, "");
    EXPECT_EQ(read("out"), "\xed");
    EXPECT_EQ(convert("UTF-8", "KOI8-R", "\u041c", {"-o", "-"}).out, "\xed");
    EXPECT_EQ(names(), std::vector<std::string>{"out"});
}

TEST_F(KvtConvert, NamesOfEncodingsMayBeAliases) {
    EXPECT_EQ(convert("latin1", "utf8", "\xe9").out, "\u00e9");
    // Without a byte order, UTF-16 is little-endian.
    EXPECT_EQ(convert("UTF8", "UTF-16", "a").out, std::string("a\0", 2));
}

TEST_F(KvtConvert, UnknownEncodingIsRefusedWithASuggestion) {
    for (const auto& [from, to] :
         {std::pair("windows-1253x", "UTF-8"), std::pair("UTF-8", "windows-1253x")}) {
        const ChildResult result = convert(from, to, "a", {"-o", "out"});
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(result.err,
                  "kvt: \"windows-1253x\" is not the name of an encoding that can be used here. Did you "
                  "mean 'windows-1253'?\n");
        EXPECT_FALSE(exists("out"));
    }
    EXPECT_EQ(convert("", "UTF-8", "").status, 2);
}

TEST_F(KvtConvert, ANameWithACommaIsRefusedWithWhatWasMeant) {
    for (const auto& [name, part] : {std::pair{"windows-1252,KOI8-R", "'kvt convert --dry-run' only"},
                                     {"windows-1252,foo=bar", "Did you mean 'windows-1252'?"},
                                     {"windows-1252,", "Did you mean 'windows-1252'?"},
                                     {"nosuch,KOI8-R", "\"nosuch,KOI8-R\""}}) {
        const ChildResult to = convert("UTF-8", name, "a");
        EXPECT_EQ(to.out, "") << name;
        EXPECT_TRUE(contains(to.err, part)) << to.err;
        EXPECT_EQ(to.status, 2) << name;
        EXPECT_EQ(convert(name, "UTF-8", "a").status, 2) << name;
        EXPECT_EQ(kvt({"encodings", name}).status, 2) << name;
    }
    EXPECT_EQ(convert("UTF-8", "windows-1252,foo=bar", "a", {"--dry-run"}).status, 2);
    // Some names have one.
    EXPECT_EQ(convert("UTF-8", "ibm-37_p100-1995,swaplfnl", "a").out, "\x81");
}

TEST_F(KvtConvert, EncodingsWithoutAConverterAreRefused) {
    for (const std::string name : {"binary", "zqt-binary", "zqt-wwjd"}) {
        const ChildResult result = convert("UTF-8", name, "a");
        EXPECT_EQ(result.status, 2) << name;
        EXPECT_EQ(result.out, "") << name;
        EXPECT_TRUE(contains(result.err, "\"" + name + "\" is not the name of an encoding")) << result.err;
    }
}

TEST_F(KvtConvert, UnreadableInputsAreRefused) {
    struct Row {
        std::string input;
        std::string error;
    };
    for (const Row& row : {Row{"missing", "kvt: cannot read missing: No such file or directory\n"},
                           Row{".", "kvt: cannot read .: Is a directory\n"},
                           Row{"loop", "kvt: cannot read loop: Too many levels of symbolic links\n"}}) {
        std::filesystem::remove(path("loop"));
        std::filesystem::create_symlink("loop", path("loop"));
        write("good", "good");
        const ChildResult result = convert("UTF-8", "UTF-16LE", "", {"good", row.input, "-o", "out"});
        EXPECT_EQ(result.status, 2) << row.input;
        EXPECT_EQ(result.err, row.error);
        EXPECT_EQ(names(), (std::vector<std::string>{"good", "loop"})) << row.input;
    }
}

TEST_F(KvtConvert, InputThatMayNotBeReadIsRefused) {
    // Nobody, not even root, can read the memory of a process at address 0.
    const ChildResult result = convert("UTF-8", "UTF-16LE", "", {"/proc/self/mem", "-o", "out"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot read /proc/self/mem: Input/output error\n");
    EXPECT_TRUE(names().empty());
}

TEST_F(KvtConvert, FileNamesAreShownWithoutTheirControlCharacters) {
    const ChildResult result = convert("UTF-8", "UTF-8", "", {"a\x1b[31m\xff\u00e9"});
    EXPECT_EQ(result.err, "kvt: cannot read a\\x1B[31m\\xFF\u00e9: No such file or directory\n");
}

TEST_F(KvtConvert, AFileMayHaveTheNameOfACommand) {
    write("encodings", "a");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "", {"encodings"}).out, "a");
    write("--odd", "b");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "", {"--", "--odd"}).out, "b");
}

TEST_F(KvtConvert, OptionsThatContradictEachOtherAreRefused) {
    struct Row {
        std::vector<std::string> options;
        std::string error;
    };
    const std::vector<Row> rows = {
        {{"--on-error", "stpo"},
         "kvt: --on-error takes one of stop, replace, report, transliterate, not 'stpo'. Did you mean "
         "'stop'?\n"},
        {{"--bom", "remove"}, "kvt: --bom takes one of skip, keep, strip, add, not 'remove'.\n"},
        {{"--bom", "\x1B[2J"}, "kvt: --bom takes one of skip, keep, strip, add, not '\\x1B[2J'.\n"},
        {{"--report", "r", "--on-error", "stop"},
         "kvt: --report goes with --on-error report or transliterate only\n"},
        {{"--report", "-"}, "kvt: the report goes to a file or, without --report, to standard error\n"},
        {{"--report", "same", "-o", "same"}, "kvt: the report needs a file of its own: same\n"},
        {{"--report", "./in", "in"}, "kvt: the report needs a file of its own: ./in\n"},
        {{"--dry-run", "-o", "out"},
         "kvt: --dry-run writes nothing and does not go with -o, --on-error, --report or --verify\n"},
        {{"--dry-run", "--verify"},
         "kvt: --dry-run writes nothing and does not go with -o, --on-error, --report or --verify\n"},
    };
    write("in", "a");
    for (const Row& row : rows) {
        const ChildResult result = convert("UTF-8", "UTF-8", "a", row.options);
        EXPECT_EQ(result.status, 2) << row.error;
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(result.err, row.error);
        EXPECT_EQ(names(), std::vector<std::string>{"in"}) << row.error;
        EXPECT_EQ(read("in"), "a");
    }
}

} // namespace kvt::test
