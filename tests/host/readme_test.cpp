// The README shows the command at work, and examples/demo.sh does too. What they show is what happens.

#include "host_test.h"

#include <sstream>

namespace kvt::test {

namespace {

// The blocks that are fenced as "console", each as its text.
std::vector<std::string> consoleBlocks(const std::string& file) {
    std::ifstream in(file);
    std::vector<std::string> blocks;
    bool inside = false;
    for (std::string line; std::getline(in, line);) {
        if (line == "```console") {
            inside = true;
            blocks.emplace_back();
        } else if (line == "```") {
            inside = false;
        } else if (inside) {
            blocks.back() += line + "\n";
        }
    }
    return blocks;
}

// A script that prints each command of a block as it is shown and then runs it, so that its output is the block.
std::string scriptOf(const std::string& block) {
    std::string script = "exec 2>&1\nstatus=0\n";
    std::istringstream lines(block);
    for (std::string line; std::getline(lines, line);) {
        if (line.starts_with("$ ")) {
            script +=
                "cat <<'SHOWN'\n" + line + "\nSHOWN\n(exit $status)\n" + line.substr(2) + "\nstatus=$?\n";
        }
    }
    return script;
}

} // namespace

class KvtShown : public HostTest {
protected:
    ChildResult shell(const std::string& script, const std::string& in) {
        ChildSetup made;
        made.command = {"bash", "-c", script};
        made.folder = in;
        const std::string programs = std::filesystem::path(KVT_PROGRAM).parent_path().string();
        made.environment = {
            {"PATH", programs + ":" + std::getenv("PATH")}, {"LC_ALL", "C.UTF-8"}, {"KVT", KVT_PROGRAM}};
        return runChild(made);
    }
};

TEST_F(KvtShown, TheReadmeShowsWhatHappens) {
    const std::vector<std::string> blocks = consoleBlocks(KVT_SOURCE_DIR "/README.md");
    ASSERT_GE(blocks.size(), 5u);
    // The commands may write files, so that they work on a copy of the data.
    std::filesystem::create_directory(path("examples"));
    std::filesystem::copy(KVT_SOURCE_DIR "/examples/data", path("examples/data"));
    for (const std::string& block : blocks) {
        EXPECT_EQ(shell(scriptOf(block), folder_.string()).out, block);
    }
}

TEST_F(KvtShown, TheDemoRuns) {
    const ChildResult result = shell(KVT_SOURCE_DIR "/examples/demo.sh", folder_.string());
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(result.err, "");
    for (const char* encoding : {"windows-1252", "Shift_JIS", "KOI8-R", "UTF-16BE"}) {
        EXPECT_TRUE(contains(result.out, encoding)) << encoding;
    }
    // Some of every text, as it came out, and some of what was lost.
    for (const char* part : {"M\u00fcnchen", "\u6771\u4eac", "\u041c\u043e\u0441\u043a\u0432\u0430",
                             "\u0141\u00f3d\u017a", "LATIN CAPITAL LETTER L WITH STROKE"}) {
        EXPECT_TRUE(contains(result.out, part)) << part;
    }
    EXPECT_TRUE(names().empty());
}

TEST_F(KvtShown, TheDemoTakesTheProgramOrItsBuildFolder) {
    for (const std::string& argument :
         {std::string(KVT_PROGRAM),
          std::filesystem::path(KVT_PROGRAM).parent_path().parent_path().parent_path().string()}) {
        EXPECT_EQ(
            shell("unset KVT; " KVT_SOURCE_DIR "/examples/demo.sh '" + argument + "' >/dev/null", "/").status,
            0)
            << argument;
    }
}

} // namespace kvt::test
