// `kvt wwjd encode` and `kvt wwjd decode`.

#include "encode.h"
#include "host_test.h"

namespace kvt::test {

class KvtWwjd : public HostTest {
protected:
    ChildResult encode(const std::string& input, std::vector<std::string> more = {}) {
        more.insert(more.begin(), {"wwjd", "encode"});
        return kvt(std::move(more), input);
    }
    ChildResult decode(const std::string& input, std::vector<std::string> more = {}) {
        more.insert(more.begin(), {"wwjd", "decode"});
        return kvt(std::move(more), input);
    }
};

TEST_F(KvtWwjd, EncodesAndDecodes) {
    struct Row {
        std::string text;
        std::string wwjd;
    };
    for (const Row& row : {Row{"", ""}, Row{"a b", "a<space>b"}, Row{"\u00e9", "<u00e9>"}, Row{"<", "<lt>"},
                           Row{"\U0001F600", "<ud83d><ude00>"},
                           Row{"[1, \"x\"]\n", "<openbracket>1<comma><space><quote>x<quote>"
                                               "<closebracket><lf>"},
                           Row{std::string("a\0b", 3), std::string("a\0b", 3)}}) {
        const ChildResult encoded = encode(row.text);
        EXPECT_EQ(encoded.status, 0);
        EXPECT_EQ(encoded.out, row.wwjd);
        EXPECT_EQ(encoded.err, "");
        const ChildResult decoded = decode(row.wwjd);
        EXPECT_EQ(decoded.status, 0) << decoded.err;
        EXPECT_EQ(decoded.out, row.text);
        EXPECT_EQ(decoded.err, "");
    }
}

TEST_F(KvtWwjd, WhatIsNoTokenStandsForItself) {
    for (const std::string text : {"<unknown>", "<lt", "<u12>", "<", ">", "a<b", "a\nb c"}) {
        EXPECT_EQ(decode(text).out, text);
    }
    EXPECT_EQ(decode("<<lt>>").out, "<<>");
    EXPECT_EQ(decode("a<u>b").out, "ab");
    EXPECT_EQ(decode("<u+041>").out, "A");
}

TEST_F(KvtWwjd, TokensMayBeSplitAtEveryBlockBorder) {
    const std::string tokens =
        "<closebracket><ud83d><ude00><<closebracke>><u20ac><unknown token that is long><lt";
    const std::string text = "]\U0001F600<<closebracke>>\u20ac<unknown token that is long><lt";
    for (const std::size_t border : {65536u, 131072u}) {
        for (std::size_t before = 0; before <= tokens.size() + 1; ++before) {
            const std::string lead(border - before, 'x');
            write("in", lead + tokens);
            ASSERT_EQ(decode("", {"in"}).out, lead + text) << border << " - " << before;
        }
    }
}

TEST_F(KvtWwjd, TokensMayComeByteByByte) {
    const std::string tokens = "<closebracket><ud83d><ude00><<lt><u20ac>";
    std::size_t sent = 0;
    ChildSetup made = setup({"wwjd", "decode"});
    made.oneByOne = true;
    made.makeInput = [&]() -> std::string_view {
        return sent == tokens.size() ? std::string_view() : std::string_view(tokens).substr(sent++, 1);
    };
    EXPECT_EQ(runChild(made).out, "]\U0001F600<<\u20ac");
}

TEST_F(KvtWwjd, LongTextsMakeTheRoundTrip) {
    std::u32string text;
    for (char32_t c = 1; c < 0x11000; c += c < 0x300 ? 1 : 7) {
        if (c < 0xD800 || c > 0xDFFF) {
            text += c;
            text += U"<lt> ";
        }
    }
    std::string bytes;
    while (bytes.size() < 1500000) {
        bytes += utf8Of(text);
    }
    write("in", bytes);
    EXPECT_EQ(encode("", {"in", "-o", "middle"}).status, 0);
    for (const char c : read("middle")) {
        ASSERT_TRUE(c != 0 && (c & 0x80) == 0 &&
                    std::string_view(" ,;\"'&()[]{}\\/$@\n\r\t\a\b\v\f").find(c) == std::string_view::npos);
    }
    EXPECT_EQ(decode("", {"middle", "-o", "back"}).status, 0);
    EXPECT_TRUE(read("back") == bytes);
}

TEST_F(KvtWwjd, TextThatIsNoUtf8IsRefusedWithItsPlace) {
    const ChildResult result = encode("a\nb\xff", {"-o", "out"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err,
              "kvt: standard input: line 2, column 2, byte 3: The bytes \"\\xFF\" are not valid UTF-8.\n");
    EXPECT_TRUE(names().empty());
    EXPECT_EQ(encode("\xe2\x82").status, 2);
}

TEST_F(KvtWwjd, BadWwjdTextIsRefusedWithItsPlace) {
    struct Row {
        std::string text;
        std::string place;
        std::string bytes;
    };
    for (const Row& row : {
             Row{"a\n<lt>\xe9", "line 2, column 5, byte 6", "\\xE9"},
             Row{"a\xc3\xa9<u0041>", "line 1, column 2, byte 1", "\\xC3"},
             Row{"ab<uzzzz>", "line 1, column 3, byte 2", "<uzzzz>"},
             Row{"x<ud83d>y", "line 1, column 2, byte 1", "<ud83d>"},
             Row{"x<ud83d>", "line 1, column 2, byte 1", "<ud83d>"},
             Row{"<ud83d>\nx<ud83d>", "line 1, column 1, byte 0", "<ud83d>"},
             Row{"y<ude00>z", "line 1, column 2, byte 1", "<ude00>"},
         }) {
        const ChildResult result = decode(row.text, {"-o", "out"});
        EXPECT_EQ(result.status, 2) << row.text;
        EXPECT_EQ(result.err, "kvt: standard input: " + row.place + ": The bytes \"" + row.bytes +
                                  "\" are not valid zqt-wwjd.\n");
        EXPECT_TRUE(names().empty());
    }
}

TEST_F(KvtWwjd, FilesAndFailuresAreAsInConvert) {
    write("one", "a ");
    write("two", "b ");
    EXPECT_EQ(encode("c ", {"one", "-", "two"}).out, "a<space>c<space>b<space>");
    EXPECT_EQ(encode("", {"missing"}).err, "kvt: cannot read missing: No such file or directory\n");
    EXPECT_EQ(encode("", {"missing"}).status, 2);
    EXPECT_EQ(encode("a", {"-o", "/dev/full"}).status, 2);
    // A token that ends with its file does not go on in the next.
    write("open", "<l");
    write("close", "t>");
    EXPECT_EQ(decode("", {"open", "close"}).out, "<lt>");
}

} // namespace kvt::test
