// What is different when standard error is a terminal: colour and the progress bar.

#include "host_test.h"

namespace kvt::test {

class KvtTerminal : public HostTest {
protected:
    ChildResult onTerminal(std::vector<std::string> arguments,
                           std::vector<std::pair<std::string, std::string>> environment) {
        ChildSetup made = setup(std::move(arguments));
        made.terminal = true;
        made.environment = std::move(environment);
        return runChild(made);
    }
    std::vector<std::string> longConversion() {
        if (!exists("long")) {
            write("long", std::string(64u << 20, 'x'));
        }
        return {"convert", "--from", "windows-1252", "--to", "UTF-16LE", "long", "-o", "out"};
    }
};

TEST_F(KvtTerminal, MessagesAreColouredUnlessNoColorIsSet) {
    const std::vector<std::string> failing = {"explain", "1"};
    EXPECT_TRUE(
        onTerminal(failing, {{"TERM", "xterm"}, {"NO_COLOR", ""}}).err.starts_with("\x1b[1;31mkvt:\x1b[0m "));
    EXPECT_TRUE(onTerminal(failing, {{"TERM", "xterm"}, {"NO_COLOR", "1"}}).err.starts_with("kvt: "));
    EXPECT_TRUE(onTerminal(failing, {{"TERM", "dumb"}, {"NO_COLOR", ""}}).err.starts_with("kvt: "));
    EXPECT_TRUE(kvt(failing).err.starts_with("kvt: "));
}

TEST_F(KvtTerminal, ALongInputHasABarThatIsGoneAtTheEnd) {
    const ChildResult result = onTerminal(longConversion(), {{"TERM", "xterm"}});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.out, "");
    EXPECT_TRUE(contains(result.err, "% of 64 MiB")) << result.err;
    EXPECT_TRUE(contains(result.err, "\r[")) << result.err;
    EXPECT_TRUE(result.err.ends_with("\r\x1b[K")) << result.err;
}

TEST_F(KvtTerminal, TheBarHasNoColour) {
    const ChildResult result = onTerminal(longConversion(), {{"TERM", "xterm"}, {"NO_COLOR", "1"}});
    EXPECT_TRUE(contains(result.err, "% of 64 MiB")) << result.err;
    for (std::size_t at = result.err.find('\x1b'); at != std::string::npos;
         at = result.err.find('\x1b', at + 1)) {
        EXPECT_EQ(result.err.substr(at, 3), "\x1b[K");
    }
}

TEST_F(KvtTerminal, AShortInputHasNoBar) {
    write("short", "text");
    const ChildResult result =
        onTerminal({"convert", "--from", "UTF-8", "--to", "UTF-8", "short"}, {{"TERM", "xterm"}});
    EXPECT_EQ(result.out, "text");
    EXPECT_EQ(result.err, "");
}

TEST_F(KvtTerminal, WithoutATerminalThereIsNoBar) {
    EXPECT_EQ(kvt(longConversion()).err, "");
    EXPECT_EQ(onTerminal(longConversion(), {{"TERM", "dumb"}}).err, "");
}

TEST_F(KvtTerminal, AStreamOfUnknownLengthShowsHowMuchHasPassed) {
    ChildSetup made = setup({"convert", "--from", "UTF-8", "--to", "UTF-8", "-o", "/dev/null"});
    made.terminal = true;
    made.environment = {{"TERM", "xterm"}};
    const std::string piece(1u << 20, 'x');
    int sent = 0;
    made.makeInput = [&]() -> std::string_view { return sent++ < 20 ? piece : std::string_view(); };
    const ChildResult result = runChild(made);
    EXPECT_TRUE(contains(result.err, "\r8 MiB")) << result.err;
    EXPECT_TRUE(result.err.ends_with("\r\x1b[K")) << result.err;
}

TEST_F(KvtTerminal, MessagesDoNotMixWithTheBar) {
    write("losses", std::string(16u << 20, 'x') + "\xc5\x81");
    const ChildResult result =
        onTerminal({"convert", "--from", "UTF-8", "--to", "US-ASCII", "losses", "-o", "out"},
                   {{"TERM", "xterm"}, {"NO_COLOR", "1"}});
    EXPECT_EQ(result.status, 2);
    const std::size_t message = result.err.find("kvt: losses: line 1");
    ASSERT_NE(message, std::string::npos) << result.err;
    ASSERT_GE(message, 4u);
    EXPECT_EQ(result.err.substr(message - 4, 4), "\r\x1b[K");
}

} // namespace kvt::test
