// What `kvt sort` and `kvt unique` take of the machine, and what they leave: memory within its bound, no file of
// theirs at the end, whatever the end is.

#include "host_test.h"
#include "line_texts.h"

#include <csignal>
#include <cstdio>
#include <malloc.h>
#include <sys/stat.h>

namespace kvt::test {

class KvtSortResources : public HostTest {
protected:
    // What is resident here when a program is started counts for it, too.
    KvtSortResources() { ::malloc_trim(0); }

    // What the program takes without any lines, with a margin; the help of the commands says 32 MiB.
    static constexpr std::size_t programMemory = std::size_t{32} << 20;

    std::filesystem::path scratch() const { return folder_ / "scratch"; }

    ChildSetup inScratch(std::vector<std::string> arguments) {
        std::filesystem::create_directory(scratch());
        ChildSetup made = setup(std::move(arguments));
        made.environment = {{"TMPDIR", scratch().string()}};
        return made;
    }

    bool scratchIsEmpty() const { return std::filesystem::is_empty(scratch()); }

    // Sorts many pseudo-random lines that are never held here, and looks that they come back in order.
    ChildResult sortStream(const std::vector<std::string>& arguments, std::size_t lines) {
        ChildSetup made = inScratch(arguments);
        std::uint64_t state = 1;
        std::uint64_t sumIn = 0;
        std::string piece;
        std::size_t sent = 0;
        made.makeInput = [&]() -> std::string_view {
            piece.clear();
            for (; sent < lines && piece.size() < 60000; ++sent) {
                state = state * 6364136223846793005u + 1442695040888963407u;
                const std::uint64_t value = state >> 24;
                sumIn += value;
                char line[64];
                piece.append(line, static_cast<std::size_t>(
                                       std::snprintf(line, sizeof line, "%016llx and the rest of the line\n",
                                                     static_cast<unsigned long long>(value))));
            }
            return piece;
        };
        std::string carry, last;
        std::uint64_t sumOut = 0;
        std::size_t received = 0;
        bool ordered = true;
        made.takeOutput = [&](std::string_view bytes) {
            carry.append(bytes);
            std::size_t start = 0;
            for (std::size_t end; (end = carry.find('\n', start)) != std::string::npos; start = end + 1) {
                const std::string line = carry.substr(start, end - start);
                ordered = ordered && last <= line;
                sumOut += std::stoull(line.substr(0, 16), nullptr, 16);
                ++received;
                last = line;
            }
            carry.erase(0, start);
        };
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 0) << result.err;
        EXPECT_TRUE(ordered);
        EXPECT_EQ(received, lines);
        EXPECT_EQ(sumOut, sumIn);
        EXPECT_EQ(carry, "");
        EXPECT_TRUE(scratchIsEmpty());
        return result;
    }

    // Waits until there is a file with something in it, of whatever name.
    void waitForWorkspace() {
        for (int tries = 0; tries < 2000; ++tries) {
            for (const auto& entry : std::filesystem::directory_iterator(scratch())) {
                std::error_code error;
                if (entry.file_size(error) >= 65536) {
                    return;
                }
            }
            ::usleep(5000);
        }
        FAIL() << "no workspace";
    }
};

TEST_F(KvtSortResources, MemoryStaysWithinItsBound) {
    for (const std::size_t mebibytes : {1u, 16u}) {
        const ChildResult result =
            sortStream({"sort", "--memory", std::to_string(mebibytes) + "M"}, 1'600'000);
        EXPECT_LE(result.mostMemory, (mebibytes << 20) + programMemory) << mebibytes;
    }
}

TEST_F(KvtSortResources, AllTheMemoryThatIsGivenIsUsed) {
    // What fits needs no workspace, not even one that could be made.
    ChildSetup made = setup({"sort", "--memory", "16M"});
    made.environment = {{"TMPDIR", "/nowhere"}};
    made.input = randomLines(lineShapes().front(), 4'000'000, 3);
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(result.out == sortedSlowly(made.input));
}

TEST_F(KvtSortResources, UniqueStaysWithinItsBoundToo) {
    ChildSetup made = inScratch({"unique", "--memory", "4M"});
    // Each line comes twice, the second time long after the first.
    std::size_t next = 0;
    constexpr std::size_t different = 700'000;
    std::string piece;
    made.makeInput = [&]() -> std::string_view {
        piece.clear();
        for (; next < different * 2 && piece.size() < 60000; ++next) {
            piece += "line number " + std::to_string(next % different * 7919 % different) + " of many\n";
        }
        return piece;
    };
    std::size_t received = 0;
    std::string carry;
    bool same = true;
    made.takeOutput = [&](std::string_view bytes) {
        carry.append(bytes);
        std::size_t start = 0;
        for (std::size_t end; (end = carry.find('\n', start)) != std::string::npos; start = end + 1) {
            same = same && carry.compare(start, end - start,
                                         "line number " + std::to_string(received * 7919 % different) +
                                             " of many") == 0;
            ++received;
        }
        carry.erase(0, start);
    };
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_EQ(received, different);
    EXPECT_TRUE(same);
    EXPECT_LE(result.mostMemory, (std::size_t{4} << 20) + programMemory);
    EXPECT_TRUE(scratchIsEmpty());
}

TEST_F(KvtSortResources, AHugeLinePassesInBoundedMemory) {
    for (const bool fold : {false, true}) {
        ChildSetup made = inScratch({"sort", "--memory", "1M"});
        if (fold) {
            made.command.push_back("--fold");
        }
        // Two lines that differ in their last character only; they come the wrong way round.
        const std::string piece(1 << 20, 'Y');
        constexpr std::size_t pieces = 96;
        std::size_t sent = 0;
        made.makeInput = [&]() -> std::string_view {
            const std::size_t number = sent++;
            return number == pieces           ? "b\n"
                   : number == pieces * 2 + 1 ? "a\n"
                   : number > pieces * 2 + 1  ? std::string_view()
                                              : piece;
        };
        std::size_t received = 0;
        std::vector<std::pair<std::size_t, char>> others;
        made.takeOutput = [&](std::string_view bytes) {
            for (std::size_t at = bytes.find_first_not_of('Y'); at != std::string_view::npos;
                 at = bytes.find_first_not_of('Y', at + 1)) {
                others.emplace_back(received + at, bytes[at]);
            }
            received += bytes.size();
        };
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 0) << result.err;
        const std::size_t length = pieces << 20;
        const std::vector<std::pair<std::size_t, char>> expected = {
            {length, 'a'}, {length + 1, '\n'}, {2 * length + 2, 'b'}, {2 * length + 3, '\n'}};
        EXPECT_EQ(others, expected) << fold;
        EXPECT_LE(result.mostMemory, (std::size_t{1} << 20) + programMemory) << fold;
    }
}

TEST_F(KvtSortResources, AnInterruptedSortLeavesNothingBehind) {
    for (const char* command : {"sort", "unique"}) {
        for (const bool named : {false, true}) {
            for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGXCPU, SIGBUS}) {
                std::vector<std::string> arguments = {command, "--memory", "64K", "-o", "out"};
                if (named) {
                    arguments.insert(arguments.end(), {"--workspace", "scratch/work"});
                }
                write("out", "old");
                RunningChild child(inScratch(arguments));
                child.write(randomLines(lineShapes().front(), 300000, 1));
                waitForWorkspace();
                EXPECT_EQ(std::filesystem::exists(scratch() / "work"), named);
                for (const auto& file : std::filesystem::directory_iterator(scratch())) {
                    using std::filesystem::perms;
                    EXPECT_EQ(file.status().permissions(), perms::owner_read | perms::owner_write);
                }
                child.signal(number);
                EXPECT_EQ(child.wait(), 128 + number) << command << " " << named;
                EXPECT_TRUE(scratchIsEmpty()) << command << " " << named << " " << number;
                EXPECT_EQ(names(), (std::vector<std::string>{"out", "scratch"}));
                EXPECT_EQ(read("out"), "old");
            }
        }
    }
}

TEST_F(KvtSortResources, ASortInterruptedWhileItMergesLeavesNothingBehind) {
    write("in", randomLines(lineShapes().front(), 8'000'000, 2));
    for (int delay = 5; delay < 400; delay = delay * 3 / 2) {
        RunningChild child(inScratch({"sort", "--memory", "64K", "in", "-o", "out"}));
        ::usleep(static_cast<useconds_t>(delay) * 1000);
        child.signal(SIGTERM);
        const int status = child.wait();
        EXPECT_TRUE(status == 128 + SIGTERM || status == 0) << status;
        EXPECT_TRUE(scratchIsEmpty()) << delay;
        EXPECT_EQ(exists("out"), status == 0);
        std::filesystem::remove(path("out"));
        EXPECT_EQ(names(), (std::vector<std::string>{"in", "scratch"}));
    }
}

TEST_F(KvtSortResources, AClosedPipeLeavesNothingBehind) {
    for (const char* command : {"sort", "unique"}) {
        ChildSetup made = inScratch({command, "--memory", "64K"});
        made.input = randomLines(lineShapes().front(), 1'000'000, 3);
        made.readNothing = true;
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 128 + SIGPIPE);
        EXPECT_EQ(result.err, "");
        EXPECT_TRUE(scratchIsEmpty());
    }
}

TEST_F(KvtSortResources, AFailureLeavesNothingBehind) {
    ChildSetup made = inScratch({"sort", "--memory", "64K", "--fold", "-o", "out"});
    made.input = randomLines(lineShapes().front(), 300000, 4) + "\xff";
    EXPECT_EQ(runChild(made).status, 2);
    EXPECT_TRUE(scratchIsEmpty());
    made = inScratch({"sort", "--memory", "64K", "-o", "/dev/full"});
    made.input = randomLines(lineShapes().front(), 300000, 4);
    const ChildResult full = runChild(made);
    EXPECT_EQ(full.status, 2);
    EXPECT_EQ(full.err, "kvt: cannot write /dev/full: No space left on device\n");
    EXPECT_TRUE(scratchIsEmpty());
    EXPECT_EQ(names(), std::vector<std::string>{"scratch"});
}

TEST_F(KvtSortResources, AWorkspaceThatCannotBeMadeIsAFailureBeforeAnythingIsRead) {
    struct Row {
        std::string workspace;
        std::string error;
    };
    write("taken", "mine");
    std::filesystem::create_symlink("nowhere", path("link"));
    for (const Row& row :
         {Row{"missing/work", "cannot create the workspace missing/work: No such file or directory"},
          Row{"/proc/work", "cannot create the workspace /proc/work: No such file or directory"},
          Row{"taken", "the workspace taken exists already; it is a file that is made and removed"},
          Row{"link", "the workspace link exists already; it is a file that is made and removed"},
          Row{".", "the workspace . exists already; it is a file that is made and removed"},
          Row{"out", "the workspace needs a file of its own: out"},
          Row{"./out", "the workspace needs a file of its own: ./out"}}) {
        const ChildResult result = kvt({"sort", "--workspace", row.workspace, "-o", "out"}, "b\na\n");
        EXPECT_EQ(result.status, 2) << row.workspace;
        EXPECT_EQ(result.err, "kvt: " + row.error + "\n");
        EXPECT_EQ(read("taken"), "mine");
        EXPECT_EQ(names(), (std::vector<std::string>{"link", "taken"}));
    }
}

TEST_F(KvtSortResources, AFolderOfTemporaryFilesThatIsNotThereIsAFailureWhenItIsNeeded) {
    for (const char* command : {"sort", "unique"}) {
        ChildSetup made = setup({command, "--memory", "64K", "-o", "out"});
        made.environment = {{"TMPDIR", "/nowhere"}};
        made.input = randomLines(lineShapes().front(), 300000, 6);
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 2);
        EXPECT_TRUE(result.err.starts_with("kvt: cannot create the workspace /nowhere/.kvt-")) << result.err;
        EXPECT_TRUE(result.err.ends_with(": No such file or directory\n")) << result.err;
        EXPECT_TRUE(names().empty());
    }
}

TEST_F(KvtSortResources, ANamedWorkspaceIsGoneAtTheEnd) {
    const std::string text = randomLines(lineShapes().front(), 300000, 6);
    const ChildResult result = kvt({"sort", "--workspace", "work", "--memory", "64K"}, text);
    EXPECT_EQ(result.status, 0) << result.err;
    EXPECT_TRUE(result.out == sortedSlowly(text));
    EXPECT_TRUE(names().empty());
}

TEST_F(KvtSortResources, AWorkspaceThatMayNotGrowIsAFailure) {
    for (const std::size_t most : {std::size_t{1} << 12, std::size_t{100} << 10, std::size_t{300} << 10}) {
        ChildSetup made = inScratch({"sort", "--memory", "64K"});
        made.input = randomLines(lineShapes().front(), 2'000'000, 7);
        made.mostFileBytes = most;
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.out, "");
        EXPECT_TRUE(
            result.err.starts_with("kvt: cannot enlarge the workspace " + scratch().string() + "/.kvt-"))
            << result.err;
        EXPECT_TRUE(result.err.ends_with(".work: the disk is full, or files may not be so long\n"))
            << result.err;
        EXPECT_TRUE(scratchIsEmpty());
    }
}

TEST_F(KvtSortResources, AFullDiskIsAFailure) {
    // A small file system that only the program sees. Where that is not allowed, a limit on the length of files is as
    // good as a full disk.
    const std::string text = randomLines(lineShapes().front(), 6'000'000, 8);
    write("in", text);
    std::filesystem::create_directory(scratch());
    ChildSetup probe;
    probe.command = {"unshare", "--user", "--map-root-user", "--mount", "mount", "-t",
                     "tmpfs",   "none",   scratch().string()};
    const bool mayMount = runChild(probe).status == 0;
    for (const char* memory : {"64K", "1M"}) {
        ChildSetup made =
            setup({"sort", "--memory", memory, "--workspace", "scratch/work", "in", "-o", "out"});
        if (mayMount) {
            // The program's own status and message, then what is left on the disk.
            made.command = {
                "unshare",
                "--user",
                "--map-root-user",
                "--mount",
                "bash",
                "-c",
                "mount -t tmpfs -o size=2m none scratch && { \"$@\"; status=$?; ls -A scratch; exit "
                "$status; }",
                "bash",
                KVT_PROGRAM,
                "sort",
                "--memory",
                memory,
                "--workspace",
                "scratch/work",
                "in",
                "-o",
                "out"};
        } else {
            made.mostFileBytes = 2u << 20;
        }
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 2) << memory << " " << result.err;
        EXPECT_TRUE(contains(result.err, " the workspace scratch/work: ")) << result.err;
        EXPECT_EQ(result.out, "");
        EXPECT_TRUE(scratchIsEmpty());
        EXPECT_EQ(names(), (std::vector<std::string>{"in", "scratch"}));
    }
}

TEST_F(KvtSortResources, ProgressIsShownOnDemandAndOnATerminal) {
    write("in", "b\na\n");
    const ChildResult lines = kvt({"sort", "--progress", "in"});
    EXPECT_EQ(lines.status, 0);
    EXPECT_EQ(lines.out, "a\nb\n");
    EXPECT_EQ(lines.err, "kvt: reading 100% of 4 bytes\nkvt: writing 100% of 4 bytes\n");
    EXPECT_EQ(kvt({"unique", "--progress"}, "b\n").err,
              "kvt: reading 2 bytes\nkvt: writing 100% of 2 bytes\n");
    EXPECT_EQ(kvt({"sort", "in"}).err, "");

    write("long", randomLines(lineShapes().back(), 9u << 20, 1));
    ChildSetup made = setup({"sort", "long", "-o", "out"});
    made.terminal = true;
    made.environment = {{"TERM", "xterm"}};
    const ChildResult bar = runChild(made);
    EXPECT_EQ(bar.status, 0);
    EXPECT_TRUE(contains(bar.err, "\rreading [")) << bar.err;
    EXPECT_TRUE(contains(bar.err, "\rwriting [")) << bar.err;
    EXPECT_TRUE(contains(bar.err, "% of 9 MiB")) << bar.err;
    EXPECT_TRUE(bar.err.ends_with("\r\x1b[K")) << bar.err;
    made = setup({"sort", "in"});
    made.terminal = true;
    made.environment = {{"TERM", "xterm"}};
    EXPECT_EQ(runChild(made).err, "");
}

} // namespace kvt::test
