// `kvt convert --verify`.

#include "encode.h"
#include "host_test.h"

namespace kvt::test {

class KvtConvertVerify : public HostTest {};

TEST_F(KvtConvertVerify, SaysSoWhenNothingWasLost) {
    const ChildResult result = convert("Shift_JIS", "UTF-16BE", "\x93\x8c\x8b\x9e", {"--verify"});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.out, utf16Of(U"\u6771\u4eac", true));
    EXPECT_EQ(result.err, "kvt: verify: nothing was lost: the output converts back to the same text\n");
    EXPECT_EQ(convert("UTF-8", "UTF-16LE", "", {"--verify"}).status, 0);
}

TEST_F(KvtConvertVerify, SaysWhereTheTextsPart) {
    const ChildResult result =
        convert("UTF-8", "US-ASCII", "ab\u0141c", {"--verify", "--on-error", "replace"});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "ab?c");
    EXPECT_TRUE(contains(result.err,
                         "kvt: verify: the output does not convert back to the same text: at character 3, "
                         "U+0141 comes back as U+003F\n"))
        << result.err;
    const ChildResult shorter =
        convert("UTF-8", "US-ASCII", "ab\u200b", {"--verify", "--on-error", "replace"});
    EXPECT_EQ(shorter.status, 1);
    EXPECT_TRUE(contains(shorter.err, "at character 3, U+200B comes back as the end of the text"))
        << shorter.err;
}

TEST_F(KvtConvertVerify, BadBytesAreNotTheSameTextForBeingReplaced) {
    const ChildResult result = convert("UTF-8", "UTF-16LE", "a\xff", {"--verify", "--on-error", "replace"});
    EXPECT_EQ(result.status, 1);
    EXPECT_FALSE(contains(result.err, "nothing was lost")) << result.err;
    EXPECT_TRUE(contains(result.err, "in which bad bytes were replaced")) << result.err;
}

TEST_F(KvtConvertVerify, FindsChangesThatNoConverterReports) {
    // The tables of Shift_JIS map a private character to the numero sign, one way only.
    const ChildResult stopped = convert("UTF-8", "Shift_JIS", "a\uF86F", {"--verify", "-o", "out"});
    EXPECT_EQ(stopped.status, 2);
    EXPECT_EQ(stopped.err,
              "kvt: verify: the output does not convert back to the same text: at character 2, U+F86F "
              "comes back as U+2116\n");
    EXPECT_FALSE(exists("out"));
    const ChildResult replaced =
        convert("UTF-8", "Shift_JIS", "a\uF86F", {"--verify", "-o", "out", "--on-error", "replace"});
    EXPECT_EQ(replaced.status, 1);
    EXPECT_EQ(replaced.err, stopped.err);
    EXPECT_EQ(read("out"), "a\x87\x82");
}

// Danda twice comes back as one double danda.
const char* const dandas = "a\n\u0964\u0964";

TEST_F(KvtConvertVerify, IsDoneUnaskedWhereTheEncodingDoesNotComeBack) {
    const ChildResult stopped = convert("UTF-8", "ISCII,version=0", dandas, {"-o", "out"});
    EXPECT_EQ(stopped.status, 2);
    EXPECT_EQ(stopped.err,
              "kvt: verify: the output does not convert back to the same text: at character 3, U+0964 "
              "comes back as U+0965\n"
              "     ISCII,version=0 is always verified: not all that is written in it can be read.\n");
    EXPECT_FALSE(exists("out"));
    const ChildResult replaced =
        convert("UTF-8", "ISCII,version=0", dandas, {"-o", "out", "--on-error", "replace"});
    EXPECT_EQ(replaced.status, 1);
    EXPECT_EQ(replaced.err, stopped.err);
    EXPECT_TRUE(exists("out"));

    const ChildResult same = convert("UTF-8", "ISCII,version=0", "a \u0939\u093f\u0928\u094d\n");
    EXPECT_EQ(same.status, 0);
    EXPECT_EQ(same.err, "");
    std::u32string all;
    for (char32_t character = 0x20; character < 0x3000; ++character) {
        all += character;
    }
    const ChildResult compound =
        convert("UTF-8", "x11-compound-text", utf8Of(all), {"--on-error", "replace"});
    EXPECT_TRUE(contains(compound.err, "x11-compound-text is always verified")) << compound.err;
    EXPECT_EQ(convert("UTF-8", "x11-compound-text", "caf\u00e9").status, 0);
}

TEST_F(KvtConvertVerify, IsDoneUnaskedByADryRunAndByWhatWritesLines) {
    EXPECT_EQ(convert("UTF-8", "ISCII,version=0", dandas, {"--dry-run"}).status, 1);
    EXPECT_EQ(convert("UTF-8", "ISCII,version=0", "a\n\u0964", {"--dry-run"}).status, 0);

    const std::string one = convert("UTF-8", "ISCII,version=0", "\u0964").out;
    const ChildResult written =
        kvt({"text", "replace", "x", "\u0964", "--encoding", "ISCII,version=0", "-o", "out"},
            "a\nx" + one + "\n");
    EXPECT_EQ(written.status, 2);
    EXPECT_EQ(written.err,
              "kvt: the result cannot be written in ISCII,version=0: the output does not convert back to the "
              "same text: at character 3, U+0964 comes back as U+0965\n");
    EXPECT_FALSE(exists("out"));
    EXPECT_EQ(kvt({"text", "upper", "--encoding", "ISCII,version=0"}, "a\n" + one).status, 0);
}

TEST_F(KvtConvertVerify, WorksAcrossBlocksAndFiles) {
    std::u32string text;
    for (int index = 0; index < 100000; ++index) {
        text += U"\u00e9\u6771\U0001F600a\n";
    }
    write("one", utf8Of(text));
    write("two", utf8Of(text + U"\u0142"));
    for (const char* to : {"UTF-16BE", "UTF-32LE", "GB18030", "UTF-7", "SCSU", "BOCU-1"}) {
        const ChildResult result = convert("UTF-8", to, "", {"--verify", "one", "two", "-o", "out"});
        EXPECT_EQ(result.status, 0) << to << ": " << result.err;
    }
    const ChildResult lossy =
        convert("UTF-8", "GBK", "", {"--verify", "one", "two", "-o", "out", "--on-error", "replace"});
    EXPECT_EQ(lossy.status, 1);
    EXPECT_TRUE(contains(lossy.err, "at character 3, U+1F600 comes back as")) << lossy.err;
}

} // namespace kvt::test
