// Manual pages and completions as they are built: complete, well formed, and, where the shells are here, at work.

#include "host_test.h"

#include <regex>
#include <sstream>

namespace kvt::test {

namespace {

namespace fs = std::filesystem;

std::string contentOf(const fs::path& file) {
    std::ifstream in(file, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), {}};
}

std::vector<fs::path> manualPages() {
    std::vector<fs::path> pages;
    for (const auto& entry : fs::directory_iterator(fs::path(KVT_PAGES_DIR) / "man1")) {
        pages.push_back(entry.path());
    }
    std::sort(pages.begin(), pages.end());
    return pages;
}

// "date parse" of kvt-date-parse.1.
std::vector<std::string> commandOf(const fs::path& page) {
    std::vector<std::string> words;
    std::istringstream name(page.stem().string());
    for (std::string word; std::getline(name, word, '-');) {
        words.push_back(word);
    }
    words.erase(words.begin());
    return words;
}

std::string replaced(std::string text, const std::string& from, const std::string& to) {
    for (std::size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size())) {
        text.replace(at, from.size(), to);
    }
    return text;
}

std::vector<std::string> linesOf(const std::string& text) {
    std::vector<std::string> lines;
    std::istringstream in(text);
    for (std::string line; std::getline(in, line);) {
        lines.push_back(line);
    }
    return lines;
}

} // namespace

class KvtPages : public HostTest {
protected:
    ChildResult run(std::vector<std::string> command) {
        ChildSetup made;
        made.command = std::move(command);
        made.folder = folder_.string();
        const std::string programs = fs::path(KVT_PROGRAM).parent_path().string();
        made.environment = {{"PATH", programs + ":" + std::getenv("PATH")}, {"LC_ALL", "C.UTF-8"}};
        return runChild(made);
    }

    bool isHere(const std::string& program) { return run({"sh", "-c", "command -v " + program}).status == 0; }
};

TEST_F(KvtPages, EveryCommandHasAManualPageWithAllItsOptions) {
    // What begins a line of the list of options.
    const std::regex option("(^|\n)  (-[A-Za-z])?,?(--[a-z-]+)?");
    std::size_t options = 0;
    for (const fs::path& file : manualPages()) {
        std::vector<std::string> arguments = commandOf(file);
        arguments.push_back("--help");
        const std::string help = kvt(arguments).out;
        const std::string page = contentOf(file);
        ASSERT_TRUE(help.starts_with("Example:")) << file;
        for (auto found = std::sregex_iterator(help.begin(), help.end(), option);
             found != std::sregex_iterator(); ++found) {
            for (const std::size_t group : {2u, 3u}) {
                const std::string name = (*found)[group];
                if (!name.empty()) {
                    ++options;
                    EXPECT_TRUE(contains(page, "\\fB" + replaced(name, "-", "\\-") + "\\fR"))
                        << file << ": " << name;
                }
            }
        }
        EXPECT_TRUE(contains(page, ".SH EXIT STATUS\n.TP\n\\fB0\\fR\n")) << file;
        EXPECT_TRUE(contains(page, ".SH EXAMPLES\n")) << file;
        for (const std::string& line : linesOf(page)) {
            EXPECT_FALSE(line.starts_with("Exit status")) << file;
        }
    }
    EXPECT_GT(options, 150u);
    // Every command that the help lists has one.
    const std::string help = kvt({"--help"}).out;
    const std::regex command("\n  ([a-z]+) ");
    const std::string list = help.substr(help.find("\nCommands:\n"));
    for (auto found = std::sregex_iterator(list.begin(), list.end(), command);
         found != std::sregex_iterator(); ++found) {
        EXPECT_TRUE(fs::exists(fs::path(KVT_PAGES_DIR) / "man1" / ("kvt-" + (*found)[1].str() + ".1")))
            << (*found)[1];
    }
    EXPECT_TRUE(contains(contentOf(fs::path(KVT_PAGES_DIR) / "man1/kvt.1"), ".BR kvt\\-match (1)\n"));
    EXPECT_TRUE(contains(contentOf(fs::path(KVT_PAGES_DIR) / "man1/kvt-date-zone.1"),
                         ".BR kvt\\-date\\-zone\\-get (1)\n"));
}

TEST_F(KvtPages, ManualPagesAreWellFormed) {
    const bool hasMandoc = isHere("mandoc");
    const bool hasMan = isHere("man");
    if (!hasMandoc && !hasMan) {
        GTEST_SKIP() << "neither mandoc nor man is here";
    }
    for (const fs::path& page : manualPages()) {
        if (hasMandoc) {
            const ChildResult result = run({"mandoc", "-Tlint", "-W", "warning", page.string()});
            EXPECT_EQ(result.out + result.err, "") << page;
        }
        if (hasMan) {
            const ChildResult result = run({"man", "--warnings", "--local-file", page.string()});
            EXPECT_EQ(result.err, "") << page;
            EXPECT_TRUE(contains(result.out, "EXIT STATUS")) << page;
        }
    }
}

TEST_F(KvtPages, BashCompletesCommandsOptionsAndValues) {
    fs::create_directory(path("folder"));
    write("file one", "");
    write("first", "");
    // Each word as bash cuts it: "=" is one of its own. The last one is being completed.
    const std::string script = "source '" KVT_PAGES_DIR R"(/bash/kvt' || exit 1
words() {
    COMP_WORDS=("$@")
    COMP_CWORD=$(($# - 1))
    COMPREPLY=()
    _kvt kvt
    (IFS='|'; echo "${COMPREPLY[*]}")
}
complete -p kvt
words kvt ma
words kvt date z
words kvt date zone ''
words kvt match --dia
words kvt match --dialect ''
words kvt match --dialect = le
words kvt sort --progress =
words kvt sort --progress fi
words kvt sort -
words kvt convert --from windows-125
words kvt convert --to = KOI8
words kvt sort fi
words kvt sort --key ''
words kvt tzdata --output f
words kvt sort -o fir
words kvt --ver
words kvt nosuch ''
words kvt match sort --dia
words kvt convert --bom ''
words kvt translate --on-error ''
words kvt translate --line-ends c
)";
    const ChildResult result = run({"bash", "--norc", "-c", script});
    EXPECT_EQ(result.err, "");
    const std::vector<std::string> lines = linesOf(result.out);
    ASSERT_EQ(lines.size(), 22u) << result.out;
    EXPECT_EQ(lines[0], "complete -F _kvt kvt");
    EXPECT_EQ(lines[1], "match");
    EXPECT_EQ(lines[2], "zone");
    EXPECT_EQ(lines[3], "get|set|remove");
    EXPECT_EQ(lines[4], "--dialect");
    EXPECT_EQ(lines[5], "perl|legacy");
    EXPECT_EQ(lines[6], "legacy");
    EXPECT_EQ(lines[7], "auto|always|never");
    // There, a value stands behind "=" only.
    EXPECT_TRUE(contains(lines[8], "first") && contains(lines[8], "file")) << lines[8];
    EXPECT_TRUE(contains(lines[9], "--reverse|") && contains(lines[9], "-k|")) << lines[9];
    EXPECT_TRUE(contains(lines[10], "windows-1252")) << lines[10];
    EXPECT_TRUE(contains(lines[11], "KOI8-R")) << lines[11];
    EXPECT_TRUE(contains(lines[12], "first")) << lines[12];
    EXPECT_EQ(lines[13], "");
    EXPECT_EQ(lines[14], "folder");
    EXPECT_EQ(lines[15], "first");
    EXPECT_EQ(lines[16], "--version");
    EXPECT_TRUE(contains(lines[17], "convert|")) << lines[17];
    EXPECT_EQ(lines[18], "--dialect");
    EXPECT_EQ(lines[19], "skip|keep|strip|add");
    EXPECT_EQ(lines[20], "stop|keep|empty|skip");
    EXPECT_EQ(lines[21], "crlf");
}

TEST_F(KvtPages, ZshReadsItsCompletion) {
    if (!isHere("zsh")) {
        GTEST_SKIP() << "zsh is not here";
    }
    const std::string file = KVT_PAGES_DIR "/zsh/_kvt";
    const ChildResult result = run({"zsh", "-f", "-n", file});
    EXPECT_EQ(result.status, 0);
    EXPECT_EQ(result.err, "");
    EXPECT_TRUE(contentOf(file).starts_with("#compdef kvt\n"));
    // Each command calls a function that there is.
    const std::string text = contentOf(file);
    const std::regex call("\\) (_kvt_[a-z_]+) ;;");
    for (auto found = std::sregex_iterator(text.begin(), text.end(), call); found != std::sregex_iterator();
         ++found) {
        EXPECT_TRUE(contains(text, "\n" + (*found)[1].str() + "() {\n")) << (*found)[1];
    }
}

TEST_F(KvtPages, FishCompletesCommandsOptionsAndValues) {
    if (!isHere("fish")) {
        GTEST_SKIP() << "fish is not here";
    }
    const std::string file = KVT_PAGES_DIR "/fish/kvt.fish";
    EXPECT_EQ(run({"fish", "--no-execute", file}).err, "");
    const auto completed = [&](const std::string& line) {
        std::string names;
        for (const std::string& found : linesOf(
                 run({"fish", "--no-config", "-c", "source " + file + "; complete -C '" + line + "'"}).out)) {
            names += (names.empty() ? "" : "|") + found.substr(0, found.find('\t'));
        }
        return names;
    };
    EXPECT_EQ(completed("kvt ma"), "match");
    EXPECT_EQ(completed("kvt date z"), "zone");
    EXPECT_EQ(completed("kvt match --dial"), "--dialect");
    EXPECT_EQ(completed("kvt match --dialect "), "legacy|perl");
    EXPECT_TRUE(contains(completed("kvt convert --from windows-125"), "windows-1252"));
}

} // namespace kvt::test
