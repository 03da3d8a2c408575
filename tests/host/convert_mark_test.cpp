// `kvt convert --bom`.

#include "encode.h"
#include "host_test.h"

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

TEST_F(KvtConvertMark, KeepIsTheDefaultAndConvertsItLikeAnyCharacter) {
    for (const Marked& from : markedEncodings()) {
        for (const char* option : {"", "--bom=keep"}) {
            std::vector<std::string> options;
            if (*option != '\0') {
                options.push_back(option);
            }
            EXPECT_EQ(convert(from.name, "UTF-16BE", from.mark + from.a, options).out,
                      std::string("\xfe\xff\0a", 4))
                << from.name;
            EXPECT_EQ(convert(from.name, "UTF-16BE", from.a, options).out, std::string("\0a", 2))
                << from.name;
        }
    }
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
    EXPECT_EQ(convert("UTF-8", "UTF-8", "", {"one", "two"}).out, "\uFEFF1\uFEFF2");
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
                                       "a");
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.err, "U+FEFF ZERO WIDTH NO-BREAK SPACE (EF BB BF)")) << result.err;
    EXPECT_TRUE(contains(result.err, "This is a byte order mark; '--bom strip' leaves it out."))
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
    for (const char* policy : {"keep", "strip", "add"}) {
        const ChildResult result = convert("UTF-8", "UTF-16LE",
                                           "\uFEFF"
                                           "a",
                                           {"--bom", policy, "--verify"});
        EXPECT_EQ(result.status, 0) << policy << result.err;
    }
}

} // namespace kvt::test
