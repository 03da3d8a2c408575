// `kvt convert --bom`.

#include "encode.h"
#include "host_test.h"

#include <tuple>

namespace kvt::test {

namespace {

struct Marked {
    const char* name;
    std::string mark;
    std::string a;
};

const std::vector<Marked>& markedEncodings() {
    static const std::vector<Marked> all = {
        {"UTF-8", "\xef\xbb\xbf", "a"},
        {"UTF-16LE", "\xff\xfe", std::string("a\0", 2)},
        {"UTF-16BE", "\xfe\xff", std::string("\0a", 2)},
        {"UTF-32LE", std::string("\xff\xfe\0\0", 4), std::string("a\0\0\0", 4)},
        {"UTF-32BE", std::string("\0\0\xfe\xff", 4), std::string("\0\0\0a", 4)},
        {"GB18030", "\x84\x31\x95\x33", "a"},
        {"CESU-8", "\xef\xbb\xbf", "a"},
        {"SCSU", "\x0e\xfe\xff", "a"},
    };
    return all;
}

} // namespace

class KvtConvertMark : public HostTest {};

TEST_F(KvtConvertMark, KeepConvertsItLikeAnyCharacter) {
    for (const Marked& from : markedEncodings()) {
        EXPECT_EQ(convert(from.name, "UTF-16BE", from.mark + from.a, {"--bom=keep"}).out,
                  std::string("\xfe\xff\0a", 4))
            << from.name;
        EXPECT_EQ(convert(from.name, "UTF-16BE", from.a, {"--bom=keep"}).out, std::string("\0a", 2))
            << from.name;
    }
}

TEST_F(KvtConvertMark, ItIsSkippedByDefault) {
    for (const Marked& from : markedEncodings()) {
        EXPECT_EQ(convert(from.name, "UTF-8", from.mark + from.a).out, "a") << from.name;
        EXPECT_EQ(convert(from.name, "windows-1252", from.mark + from.a + from.mark).status, 2) << from.name;
    }
    // Where it cannot be cut off it is a character.
    EXPECT_EQ(convert("UTF-7", "UTF-8", "+/v8-a").out, "\uFEFFa");
}

TEST_F(KvtConvertMark, ANameWithoutAnOrderObeysTheMark) {
    for (const auto& [order, name] : {std::pair{"UTF-16LE", "UTF-16"},
                                      {"UTF-16BE", "utf16"},
                                      {"UTF-32LE", "UTF-32"},
                                      {"UTF-32BE", "utf_32"}}) {
        const std::string text = convert("UTF-8", order, "a\u0141\n", {"--bom", "add"}).out;
        const ChildResult result = convert(name, "UTF-8", text, {"--verify"});
        EXPECT_EQ(result.out, "a\u0141\n") << order << result.err;
        EXPECT_EQ(convert(name, "UTF-8", text, {"--bom", "keep"}).out, "\uFEFFa\u0141\n") << order;
        EXPECT_EQ(convert(name, "UTF-8", text, {"--dry-run"}).status, 0) << order;
        EXPECT_EQ(kvt({"text", "find", "\u0141", "--encoding", name}, text).out,
                  "1:2:" + std::to_string(text.size() / 2) + "\n") // behind the mark and "a"
            << order;
        EXPECT_EQ(kvt({"match", "^a", "--encoding", name}, text).out, text) << order;
        EXPECT_EQ(kvt({"text", "upper", "--encoding", name}, text).out,
                  convert("UTF-8", order, "A\u0141\n", {"--bom", "add"}).out)
            << order;
    }
    // Little-endian without one; each file for itself.
    EXPECT_EQ(convert("UTF-16", "UTF-8", std::string("a\0", 2)).out, "a");
    write("big", std::string("\xfe\xff\0b", 4));
    write("little", std::string("\xff\xfe"
                                "c\0",
                                4));
    write("plain", std::string("d\0", 2));
    EXPECT_EQ(convert("UTF-16", "UTF-8", "", {"big", "little", "plain", "big", "--verify"}).out, "bcdb");
    const ChildResult lost =
        convert("UTF-16", "US-ASCII", "", {"little", write("far", std::string("\xfe\xff\x01\x41", 4))});
    EXPECT_TRUE(contains(lost.err, "column 1, byte 2")) << lost.err;
}

TEST_F(KvtConvertMark, AMarkOfTheOtherOrderIsRefusedWithTheNameThatFits) {
    for (const auto& [name, mark, part] :
         {std::tuple{"UTF-16LE", std::string("\xfe\xff\0a", 4), "UTF-16BE or UTF-16 would fit"},
          {"UTF-16BE",
           std::string("\xff\xfe"
                       "a\0",
                       4),
           "UTF-16LE or UTF-16 would fit"},
          {"UTF-32LE", std::string("\0\0\xfe\xff", 4), "UTF-32BE or UTF-32 would fit"},
          {"UTF-32BE", std::string("\xff\xfe\0\0", 4), "UTF-32LE or UTF-32 would fit"}}) {
        for (const std::vector<std::string>& arguments :
             {std::vector<std::string>{"convert", "--from", name, "--to", "UTF-8", "-o", "out"},
              {"convert", "--from", name, "--to", "UTF-8", "--dry-run"},
              {"text", "upper", "--encoding", name, "-o", "out"},
              {"match", "a", "--encoding", name, "-o", "out"}}) {
            const ChildResult result = kvt(arguments, mark);
            EXPECT_TRUE(contains(result.err, part)) << name << result.err;
            EXPECT_EQ(result.status, 2) << name;
            EXPECT_TRUE(names().empty()) << name;
        }
    }
}

TEST_F(KvtConvertMark, OtherCommandsSkipItToo) {
    EXPECT_EQ(kvt({"number"}, "\uFEFF1.50\n").out, "1.5\n");
    EXPECT_EQ(kvt({"wwjd", "encode"}, "\uFEFFa b").out, "a<space>b");
    write("one", "\uFEFFb\na\n");
    write("two", "\uFEFF"
                 "a\n");
    EXPECT_EQ(kvt({"sort", "one", "two"}).out, "\uFEFFa\na\nb\n");
    EXPECT_EQ(kvt({"unique", "--count", "one", "two"}).out, "\uFEFF1\tb\n2\ta\n");
    EXPECT_EQ(kvt({"sort", "--fold"}, "b\na\n").out, "a\nb\n");
    const ChildResult bad = kvt({"sort", "--fold"}, "\uFEFF"
                                                    "ab\xff\n");
    EXPECT_TRUE(contains(bad.err, "line 1, column 3, byte 5")) << bad.err;
}

TEST_F(KvtConvertMark, StripDropsItAtTheStartOnly) {
    for (const Marked& from : markedEncodings()) {
        const ChildResult result =
            convert(from.name, "UTF-8", from.mark + from.mark + from.a + from.mark, {"--bom", "strip"});
        EXPECT_EQ(result.status, 0) << from.name << result.err;
        EXPECT_EQ(result.out, "\uFEFFa\uFEFF") << from.name;
        EXPECT_EQ(convert(from.name, "UTF-8", from.mark, {"--bom", "strip"}).out, "") << from.name;
        EXPECT_EQ(convert(from.name, "UTF-8", from.a, {"--bom", "strip"}).out, "a") << from.name;
    }
}

TEST_F(KvtConvertMark, AddWritesExactlyOne) {
    for (const Marked& to : markedEncodings()) {
        EXPECT_EQ(convert("UTF-8", to.name, "a", {"--bom", "add"}).out, to.mark + to.a) << to.name;
        EXPECT_EQ(convert("UTF-8", to.name,
                          "\uFEFF"
                          "a",
                          {"--bom", "add"})
                      .out,
                  to.mark + to.a)
            << to.name;
        EXPECT_EQ(convert("US-ASCII", to.name, "a", {"--bom", "add"}).out, to.mark + to.a) << to.name;
        EXPECT_EQ(convert("UTF-8", to.name, "", {"--bom", "add"}).out, to.mark) << to.name;
    }
}

TEST_F(KvtConvertMark, EachFilesMarkIsDroppedButOneIsAdded) {
    write("one", "\uFEFF1");
    write("two", "\uFEFF2");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "", {"one", "two", "--bom", "add"}).out, "\uFEFF12");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "", {"one", "two", "--bom", "strip"}).out, "12");
    EXPECT_EQ(convert("UTF-8", "UTF-8", "", {"one", "two", "--bom", "keep"}).out, "\uFEFF1\uFEFF2");
}

TEST_F(KvtConvertMark, AddingToAnEncodingWithoutOneIsRefused) {
    for (const char* to : {"windows-1252", "Shift_JIS", "US-ASCII", "UTF-7", "BOCU-1"}) {
        const ChildResult result = convert("UTF-8", to, "a", {"--bom", "add", "-o", "out"});
        EXPECT_EQ(result.status, 2) << to;
        EXPECT_EQ(result.err, std::string("kvt: --bom add: ") + to + " has no byte order mark\n");
        EXPECT_TRUE(names().empty());
    }
}

TEST_F(KvtConvertMark, StrippingWhereItCannotBeCutOffIsRefused) {
    for (const char* from : {"UTF-7", "BOCU-1"}) {
        const ChildResult result = convert(from, "UTF-8", "a", {"--bom", "strip"});
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.err, std::string("kvt: a byte order mark cannot be cut off ") + from +
                                  ", where its bytes depend on what follows\n");
    }
    // An encoding that cannot hold it has nothing to strip.
    EXPECT_EQ(convert("windows-1252", "UTF-8", "\xef\xbb\xbf", {"--bom", "strip"}).out, "\u00ef\u00bb\u00bf");
}

TEST_F(KvtConvertMark, AKeptMarkThatTheTargetCannotHoldIsALossWithAHint) {
    const ChildResult result = convert("UTF-8", "windows-1252",
                                       "\uFEFF"
                                       "a",
                                       {"--bom", "keep"});
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.err, "U+FEFF ZERO WIDTH NO-BREAK SPACE (EF BB BF)")) << result.err;
    EXPECT_TRUE(contains(result.err, "This is a byte order mark, which is left out without '--bom keep'."))
        << result.err;
    EXPECT_EQ(convert("UTF-8", "windows-1252",
                      "\uFEFF"
                      "a",
                      {"--bom", "strip"})
                  .out,
              "a");
}

TEST_F(KvtConvertMark, ACharacterLikeTheMarkWithinTheTextIsALossWithoutTheHint) {
    const ChildResult result = convert("UTF-8", "windows-1252",
                                       "a\uFEFF"
                                       "b");
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.err, "U+FEFF ZERO WIDTH NO-BREAK SPACE (EF BB BF)")) << result.err;
    EXPECT_FALSE(contains(result.err, "byte order mark")) << result.err;
}

TEST_F(KvtConvertMark, OffsetsCountTheMarkThatWasDropped) {
    const ChildResult result = convert("UTF-8", "US-ASCII",
                                       "\uFEFF"
                                       "a\u0141",
                                       {"--bom", "strip", "--on-error", "replace"});
    EXPECT_EQ(result.out, "a?");
    EXPECT_TRUE(contains(result.err, "line 1, column 2, byte 4")) << result.err;
}

TEST_F(KvtConvertMark, AMarkThatComesInPiecesIsFound) {
    const std::string bytes = "\uFEFF"
                              "ab";
    std::size_t sent = 0;
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-8", "--bom", "strip"});
    made.oneByOne = true;
    made.makeInput = [&]() -> std::string_view {
        return sent == bytes.size() ? std::string_view() : std::string_view(bytes).substr(sent++, 1);
    };
    EXPECT_EQ(runChild(made).out, "ab");
}

TEST_F(KvtConvertMark, VerifyKnowsAboutMarks) {
    for (const char* policy : {"skip", "keep", "strip", "add"}) {
        const ChildResult result = convert("UTF-8", "UTF-16LE",
                                           "\uFEFF"
                                           "a",
                                           {"--bom", policy, "--verify"});
        EXPECT_EQ(result.status, 0) << policy << result.err;
    }
}

} // namespace kvt::test
