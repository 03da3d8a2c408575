// Streams: characters across the borders of blocks, bounded memory, pipes that close.

#include "encode.h"
#include "host_test.h"

#include <csignal>

namespace kvt::test {

class KvtConvertStream : public HostTest {
protected:
    // Runs a stream of `pieces` times `piece` through a conversion; checks that the output is as many times
    // `expected`, and gives the highest memory use.
    std::size_t stream(std::vector<std::string> arguments, const std::string& piece,
                       const std::string& expected, std::size_t pieces, int status) {
        ChildSetup made = setup(std::move(arguments));
        std::size_t sent = 0;
        made.makeInput = [&]() -> std::string_view { return sent++ < pieces ? piece : std::string_view(); };
        std::size_t received = 0;
        bool same = true;
        made.takeOutput = [&](std::string_view bytes) {
            while (!bytes.empty()) {
                const std::size_t at = received % expected.size();
                const std::size_t count = std::min(bytes.size(), expected.size() - at);
                same = same && bytes.substr(0, count) == std::string_view(expected).substr(at, count);
                received += count;
                bytes.remove_prefix(count);
            }
        };
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, status) << result.err;
        EXPECT_EQ(received, expected.size() * pieces);
        EXPECT_TRUE(same);
        return result.mostMemory;
    }
};

TEST_F(KvtConvertStream, CharactersMayBeSplitAtEveryBlockBorder) {
    const std::u32string text = U"\U0001F600\u20ac\u00e9a";
    std::u32string tail;
    for (int index = 0; index < 20; ++index) {
        tail += text;
    }
    for (const std::size_t border : {65536u, 131072u, 262144u}) {
        for (std::size_t length = border - 3; length <= border + 3; ++length) {
            const std::u32string all = std::u32string(length - 12, U'x') + tail;
            write("in", utf8Of(all));
            EXPECT_EQ(convert("UTF-8", "UTF-16BE", "", {"in"}).out, utf16Of(all, true)) << length;
            EXPECT_EQ(convert("UTF-8", "UTF-8", "", {"in"}).out, utf8Of(all)) << length;
            const std::u32string half = std::u32string(length / 2 - 12, U'x') + tail;
            write("in", utf16Of(half, false));
            EXPECT_EQ(convert("UTF-16LE", "UTF-8", "", {"in"}).out, utf8Of(half)) << length;
        }
    }
}

TEST_F(KvtConvertStream, DoubleByteCharactersMayBeSplitAtEveryBlockBorder) {
    for (std::size_t length = 131072 - 3; length <= 131072 + 3; ++length) {
        const std::string lead(length, 'x');
        EXPECT_EQ(convert("Shift_JIS", "UTF-8", lead + "\x93\x8c\x8b\x9e").out, lead + "\u6771\u4eac")
            << length;
        EXPECT_EQ(convert("GB18030", "UTF-8", lead + "\x90\x30\x81\x30z").out, lead + "\U00010000z")
            << length;
        EXPECT_EQ(convert("ISO-2022-JP", "UTF-8", lead + "\x1b$BEl\x1b(Ba").out, lead + "\u6771" + "a")
            << length;
    }
}

TEST_F(KvtConvertStream, ABigStreamPassesInBoundedMemory) {
    const std::u32string line =
        U"Krak\u00f3w and \u0141\u00f3d\u017a, \u6771\u4eac \U0001F600: a line of text.\n";
    std::u32string text;
    while (text.size() < 250000) {
        text += line;
    }
    const std::string piece = utf8Of(text);
    const std::string expected = utf16Of(text, false);
    const std::vector<std::string> command = {"convert", "--from", "UTF-8", "--to", "UTF-16LE", "--verify"};
    const std::size_t small = stream(command, piece, expected, 8, 0);
    const std::size_t big = stream(command, piece, expected, 300'000'000 / piece.size(), 0);
    EXPECT_LT(big, small + (32u << 20));
}

TEST_F(KvtConvertStream, ABigStreamOfLossesPassesInBoundedMemory) {
    // Every character is lost, there are more different ones than the ledger lists, and there is no line end.
    std::u32string text;
    for (char32_t c = 0x4E00; c < 0x9000; ++c) {
        text += c;
    }
    const std::string piece = utf8Of(text);
    const std::string expected(text.size(), '?');
    const std::vector<std::string> command = {"convert",  "--from",     "UTF-8",  "--to",
                                              "US-ASCII", "--on-error", "replace"};
    const std::size_t small = stream(command, piece, expected, 60, 1);
    const std::size_t big = stream(command, piece, expected, 240, 1);
    EXPECT_LT(big, small + (32u << 20));
}

TEST_F(KvtConvertStream, WhatIsThereIsConvertedWithoutWaitingForMore) {
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-16LE", "--bom", "strip"});
    made.outputFile = path("out");
    int sent = 0;
    std::string answer;
    made.makeInput = [&]() -> std::string_view {
        if (sent++ == 0) {
            return "abcd";
        }
        // The input stays open until the answer is there, or for so long that it will not come.
        for (int tries = 0; tries < 500 && answer.empty(); ++tries) {
            ::usleep(10000);
            answer = read("out");
        }
        return {};
    };
    EXPECT_EQ(runChild(made).status, 0);
    EXPECT_EQ(answer, utf16Of(U"abcd", false));
}

TEST_F(KvtConvertStream, AClosedPipeEndsItQuietly) {
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-16LE"});
    const std::string piece(1 << 16, 'x');
    std::size_t pieces = 0;
    made.makeInput = [&]() -> std::string_view { return pieces++ < 1000 ? piece : std::string_view(); };
    made.readNothing = true;
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 128 + SIGPIPE);
    EXPECT_EQ(result.err, "");
    EXPECT_LT(pieces, 1000u);
}

TEST_F(KvtConvertStream, AClosedPipeLeavesNoReportBehind) {
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "US-ASCII", "--report", "losses"});
    made.input = "\u0141";
    made.readNothing = true;
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 128 + SIGPIPE);
    EXPECT_EQ(result.err, "");
    EXPECT_TRUE(names().empty());
}

TEST_F(KvtConvertStream, OtherCommandsEndQuietlyToo) {
    for (const std::vector<std::string>& arguments : {std::vector<std::string>{"encodings"},
                                                      {"encodings", "--json"},
                                                      {"--help"},
                                                      {"--version"},
                                                      {"explain", "910002"}}) {
        ChildSetup made = setup(arguments);
        made.readNothing = true;
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 128 + SIGPIPE) << arguments.front();
        EXPECT_EQ(result.err, "") << arguments.front();
    }
}

TEST_F(KvtConvertStream, AClosedStandardOutputIsAFailure) {
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-8", "in"});
    write("in", "text");
    made.noOutput = true;
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err, "kvt: cannot write to standard output: Bad file descriptor\n");
    EXPECT_EQ(read("in"), "text");
}

} // namespace kvt::test
