// What the tests of the command share: a folder for each test, and short ways to run the program in it.
#pragma once

#include <support/child_process.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string>
#include <string_view>
#include <unistd.h>
#include <utility>
#include <vector>

namespace kvt::test {

class HostTest : public ::testing::Test {
protected:
    HostTest() {
        std::string name = (std::filesystem::temp_directory_path() / "kvt-host-XXXXXX").string();
        if (::mkdtemp(name.data()) == nullptr) {
            throw std::runtime_error("cannot make a folder for the test");
        }
        folder_ = name;
    }
    ~HostTest() override { std::filesystem::remove_all(folder_); }

    std::string path(const std::string& name) const { return (folder_ / name).string(); }

    std::string write(const std::string& name, std::string_view bytes) const {
        std::ofstream(path(name), std::ios::binary) << bytes;
        return path(name);
    }

    std::string read(const std::string& name) const {
        std::ifstream in(path(name), std::ios::binary);
        return {std::istreambuf_iterator<char>(in), {}};
    }

    bool exists(const std::string& name) const { return std::filesystem::exists(path(name)); }

    /// All names in the folder: what a command has left behind.
    std::vector<std::string> names() const {
        std::vector<std::string> found;
        for (const auto& entry : std::filesystem::directory_iterator(folder_)) {
            found.push_back(entry.path().filename().string());
        }
        std::sort(found.begin(), found.end());
        return found;
    }

    ChildSetup setup(std::vector<std::string> arguments) const {
        ChildSetup made;
        made.command = std::move(arguments);
        made.command.insert(made.command.begin(), KVT_PROGRAM);
        made.folder = folder_.string();
        return made;
    }

    ChildResult kvt(std::vector<std::string> arguments, std::string input = {}) const {
        ChildSetup made = setup(std::move(arguments));
        made.input = std::move(input);
        return runChild(made);
    }

    /// What a command has written to the file "out" while its input, `piece` so far, has not ended.
    std::string answerTo(std::vector<std::string> arguments, std::string_view piece) const {
        ChildSetup made = setup(std::move(arguments));
        made.outputFile = path("out");
        bool isSent = false;
        std::string answer;
        made.makeInput = [&]() -> std::string_view {
            if (!std::exchange(isSent, true)) {
                return piece;
            }
            for (int tries = 0; tries < 500 && answer.empty(); ++tries) {
                ::usleep(10000);
                answer = read("out");
            }
            return {};
        };
        EXPECT_EQ(runChild(made).status, 0);
        return answer;
    }

    /// The same setup for a test of how much memory is used: the address sanitizer would keep what was released.
    static ChildSetup withoutQuarantine(ChildSetup made) {
        const char* const options = std::getenv("ASAN_OPTIONS");
        made.environment.emplace_back("ASAN_OPTIONS",
                                      (options == nullptr ? "" : options + std::string(":")) +
                                          "quarantine_size_mb=0:thread_local_quarantine_size_kb=0");
        return made;
    }

    /// `kvt convert --from FROM --to TO`, and more.
    ChildResult convert(const std::string& from, const std::string& to, const std::string& input,
                        std::vector<std::string> more = {}) const {
        more.insert(more.begin(), {"convert", "--from", from, "--to", to});
        return kvt(std::move(more), input);
    }

    std::filesystem::path folder_;
};

inline bool contains(std::string_view text, std::string_view part) {
    return text.find(part) != std::string_view::npos;
}

} // namespace kvt::test
