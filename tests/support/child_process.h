// Runs a program and reports how it ended and what it wrote. Input can be made and output read piece by piece: streams
// of any length pass without being held; a stream can be left unread, and standard error can be a terminal.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <sys/types.h>
#include <utility>
#include <vector>

namespace kvt::test {

struct ChildSetup {
    std::vector<std::string> command;
    std::string folder;                                           ///< to run in; empty: this one
    std::vector<std::pair<std::string, std::string>> environment; ///< added to ours
    std::string input;                                            ///< all of standard input
    std::function<std::string_view()> makeInput; ///< in its place: pieces, an empty one at the end
    bool oneByOne = false; ///< a piece is written only when the one before has been read
    std::function<void(std::string_view)> takeOutput; ///< gets standard output in place of ChildResult::out
    std::string outputFile;        ///< standard output is written to it, without emptying it
    bool appendOutput = false;     ///< opens outputFile for appending
    bool noOutput = false;         ///< standard output is closed before the start
    bool readNothing = false;      ///< standard output is a pipe that nobody reads
    bool terminal = false;         ///< standard error is a terminal
    std::size_t mostFileBytes = 0; ///< no file may become longer; 0: no limit
    bool modesHold = false; ///< the superuser, too, can do with a file what its mode allows, and no more
    int ignoredSignal = 0;  ///< a signal that the program is to find ignored
};

struct ChildResult {
    int status = -1; ///< exit status, or 128 and the number of the signal that ended it
    std::string out;
    std::string err;
    std::size_t mostMemory = 0; ///< resident bytes at the highest
};

ChildResult runChild(const ChildSetup& setup);

/// A program that is still running, for tests that disturb it. Its output goes to /dev/null.
class RunningChild {
public:
    explicit RunningChild(const ChildSetup& setup);
    RunningChild(const RunningChild&) = delete;
    RunningChild& operator=(const RunningChild&) = delete;
    /// Kills it when it still runs.
    ~RunningChild();

    /// Writes to its standard input, which stays open.
    void write(std::string_view bytes);
    void signal(int number);
    /// Waits for its end. Returns a status as in ChildResult.
    int wait();

private:
    pid_t process_;
    int input_;
};

} // namespace kvt::test
