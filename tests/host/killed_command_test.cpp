// A command that is killed at any moment leaves the output as it was, or whole, and never a part of it. A file that it
// has mapped and that another program cuts short ends it with words and not by a signal.
//
// Sixty kills in the normal run; KVT_KILLS=1000 asks for as many, and KVT_FIGURES for a file of what came of them.
#include "host_test.h"

#include <chrono>
#include <csignal>
#include <random>

namespace kvt::test {
namespace {

class KvtKilled : public HostTest {};

std::string manyRows() {
    std::mt19937_64 random(20260101);
    std::string text;
    while (text.size() < 1'000'000) {
        text += std::to_string(random()) + ",\xC3\xA9t\xC3\xA9,\"a \"\"b\"\", c\"," +
                std::to_string(random() % 100) + "\n";
    }
    return text;
}

int killsAskedFor() {
    const char* const asked = std::getenv("KVT_KILLS");
    return asked != nullptr ? std::atoi(asked) : 60;
}

TEST_F(KvtKilled, LeavesTheOutputAsItWasOrWhole) {
    using Clock = std::chrono::steady_clock;
    write("in.csv", manyRows());
    const std::vector<std::vector<std::string>> commands = {
        {"convert", "--from", "UTF-8", "--to", "UTF-16LE", "in.csv", "-o", "out"},
        {"translate", "--no-header", "--drop", "2", "in.csv", "-o", "out"},
        {"sort", "--memory", "64K", "in.csv", "-o", "out"},
    };
    std::mt19937_64 random(20260102);
    const int kills = killsAskedFor();
    int untouched = 0;
    int whole = 0;
    for (std::size_t which = 0; which < commands.size(); ++which) {
        const auto begin = Clock::now();
        const ChildResult undisturbed = kvt(commands[which]);
        ASSERT_EQ(undisturbed.status, 0) << undisturbed.err;
        const auto duration = Clock::now() - begin;
        const std::string expected = read("out");
        ASSERT_FALSE(expected.empty());
        const int share = kills / static_cast<int>(commands.size()) +
                          (which < static_cast<std::size_t>(kills) % commands.size() ? 1 : 0);
        for (int round = 0; round < share; ++round) {
            write("out", "old");
            RunningChild child(setup(commands[which]));
            const double part = static_cast<double>(random() % 1000) / 800; // also behind the end
            ::usleep(static_cast<useconds_t>(
                part * static_cast<double>(
                           std::chrono::duration_cast<std::chrono::microseconds>(duration).count())));
            child.signal(SIGKILL);
            child.wait();
            const std::string left = read("out");
            untouched += left == "old" ? 1 : 0;
            whole += left == expected ? 1 : 0;
            ASSERT_TRUE(left == "old" || left == expected)
                << commands[which][0] << ", round " << round << ": " << left.size() << " of "
                << expected.size() << " bytes";
        }
    }
    if (const char* const figures = std::getenv("KVT_FIGURES"); figures != nullptr) {
        std::ofstream(figures) << "kills\tas it was\twhole\tanything else\n"
                               << kills << "\t" << untouched << "\t" << whole << "\t"
                               << kills - untouched - whole << "\n";
    }
    std::cout << kills << " kills: " << untouched << " outputs as they were, " << whole << " whole\n";
    // Both have to occur, or the moments were no moments of the work.
    EXPECT_GT(untouched, 0);
    EXPECT_GT(whole, 0);
}

TEST_F(KvtKilled, AWorkspaceThatIsCutShortIsAFailureInWords) {
    std::string lines;
    for (std::mt19937_64 random(3); lines.size() < 2'000'000;) {
        lines += std::to_string(random()) + "\n";
    }
    RunningChild child(setup({"sort", "--workspace", "work", "--memory", "256K", "-o", "out"}));
    child.write(lines);
    ASSERT_TRUE(exists("work"));
    std::filesystem::resize_file(path("work"), 0);
    try {
        child.write(lines);
    } catch (const std::runtime_error&) { // it has ended before it read all
    }
    EXPECT_EQ(child.wait(), 2); // and not by the signal
    EXPECT_FALSE(exists("out"));
}

} // namespace
} // namespace kvt::test
