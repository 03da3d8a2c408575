// The story and the reference of the commands show the command at work, and examples/demo.sh performs the story. What
// they show is what happens.

#include "host_test.h"

#include <sstream>

namespace kvt::test {

namespace {

// What counts of a page: headings, and the blocks that are fenced as "console".
struct Part {
    enum Kind { Heading, Block } kind;
    std::string text; ///< a heading with its marks; a block with the end of each line
};

std::vector<Part> partsOf(const std::filesystem::path& file) {
    std::ifstream in(file);
    std::vector<Part> parts;
    bool isConsole = false;
    bool isOther = false;
    for (std::string line; std::getline(in, line);) {
        if (line.starts_with("```")) {
            isOther = !isConsole && !isOther && line != "```console";
            isConsole = line == "```console";
            if (isConsole) {
                parts.push_back({Part::Block, ""});
            }
        } else if (isConsole) {
            parts.back().text += line + "\n";
        } else if (!isOther && line.starts_with("#")) {
            parts.push_back({Part::Heading, line});
        }
    }
    return parts;
}

// A script that prints each command of a block as it is shown and then runs it, so that its output is the block. A
// command begins with "$ "; where it ends in a backslash it goes on with "> ". A status that is not 0 is shown.
std::string scriptOf(const std::string& block) {
    std::string script = "exec 2>&1\n";
    std::istringstream lines(block);
    for (std::string line; std::getline(lines, line);) {
        if (!line.starts_with("$ ")) {
            continue;
        }
        std::string shown = line;
        std::string command = line.substr(2);
        while (command.ends_with('\\') && std::getline(lines, line)) {
            shown += "\n" + line;
            command += "\n" + line.substr(2);
        }
        script += "cat <<'SHOWN'\n" + shown + "\nSHOWN\n" + command +
                  "\nstatus=$?; [ $status -eq 0 ] || echo \"[exit status $status]\"\n";
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

    // The commands may write files, so that they work on a copy of the data.
    void expectBlocksToHappen(const std::filesystem::path& page, std::size_t fewest) {
        std::filesystem::create_directory(path("examples"));
        std::filesystem::copy(KVT_SOURCE_DIR "/examples/data", path("examples/data"));
        std::size_t blocks = 0;
        for (const Part& part : partsOf(page)) {
            if (part.kind == Part::Block) {
                ++blocks;
                EXPECT_EQ(shell(scriptOf(part.text), folder_.string()).out, part.text) << page;
            }
        }
        EXPECT_GE(blocks, fewest) << page;
    }
};

TEST_F(KvtShown, TheTutorialShowsWhatHappens) {
    expectBlocksToHappen(KVT_SOURCE_DIR "/docs/tutorial.md", 5);
}

TEST_F(KvtShown, TheStoryShowsWhatHappens) {
    expectBlocksToHappen(KVT_SOURCE_DIR "/docs/story.md", 5);
}

TEST_F(KvtShown, ThePageOfCommandsShowsWhatHappens) {
    expectBlocksToHappen(KVT_SOURCE_DIR "/docs/commands.md", 10);
}

TEST_F(KvtShown, NoOtherPageShowsWhatIsNotRun) {
    std::vector<std::filesystem::path> pages = {KVT_SOURCE_DIR "/README.md",
                                                KVT_SOURCE_DIR "/CONTRIBUTING.md"};
    for (const auto& entry : std::filesystem::directory_iterator(KVT_SOURCE_DIR "/docs")) {
        const std::string name = entry.path().filename().string();
        if (name.ends_with(".md") && name != "commands.md" && name != "story.md" && name != "tutorial.md") {
            pages.push_back(entry.path());
        }
    }
    for (const std::filesystem::path& page : pages) {
        for (const Part& part : partsOf(page)) {
            EXPECT_NE(part.kind, Part::Block) << page;
        }
    }
}

TEST_F(KvtShown, TheDemoIsTheTutorialAndTheStory) {
    std::string story;
    for (const char* const page : {KVT_SOURCE_DIR "/docs/tutorial.md", KVT_SOURCE_DIR "/docs/story.md"}) {
        for (const Part& part : partsOf(page)) {
            if (part.kind == Part::Block) {
                story += "\n" + part.text;
            } else if (part.text.starts_with("## ")) {
                story += "\n==" + part.text.substr(2) + "\n";
            }
        }
    }
    const ChildResult result = shell(KVT_SOURCE_DIR "/examples/demo.sh", folder_.string());
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.err, "");
    EXPECT_EQ(result.out, story);
    EXPECT_TRUE(names().empty());
    // Each of the commands that it is about has its part in it.
    for (const char* part :
         {"$ kvt infer ", "$ kvt translate ", "$ kvt convert ", "kvt match ", "kvt date parse ",
          "$ kvt date why ", "$ kvt sort ", "$ kvt unique ", "losses.jsonl"}) {
        EXPECT_TRUE(contains(story, part)) << part;
    }
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
