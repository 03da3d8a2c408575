// The text comes back through a pipe, and how the process ended through waitpid.
#include <mmap/forked.h>

#include <support/count_lines.h>

#include <array>
#include <cstddef>
#include <exception>
#include <stdexcept>
#include <string_view>
#include <sys/wait.h>
#include <unistd.h>

namespace kvt::test {

namespace {

void writeAll(int descriptor, std::string_view text) {
    while (!text.empty()) {
        const ssize_t written = ::write(descriptor, text.data(), text.size());
        if (written <= 0) {
            ::_exit(121);
        }
        text.remove_prefix(static_cast<std::size_t>(written));
    }
}

[[noreturn]] void runAndTell(const std::function<std::string()>& work, int descriptor) {
    try {
        writeAll(descriptor, work());
    } catch (const std::exception& failure) {
        writeAll(descriptor, std::string("threw ") + failure.what());
    }
    countLines();
    ::_exit(0);
}

} // namespace

std::string inForkedProcess(const std::function<std::string()>& work) {
    std::array<int, 2> ends{};
    if (::pipe(ends.data()) != 0) {
        throw std::runtime_error("pipe failed");
    }
    const pid_t process = ::fork();
    if (process < 0) {
        throw std::runtime_error("fork failed");
    }
    if (process == 0) {
        ::close(ends[0]);
        runAndTell(work, ends[1]);
    }
    ::close(ends[1]);
    std::string text;
    std::array<char, 4096> piece;
    for (ssize_t count; (count = ::read(ends[0], piece.data(), piece.size())) > 0;) {
        text.append(piece.data(), static_cast<std::size_t>(count));
    }
    ::close(ends[0]);
    int status = 0;
    ::waitpid(process, &status, 0);
    if (WIFSIGNALED(status)) {
        text += " ended by signal " + std::to_string(WTERMSIG(status));
    } else if (WEXITSTATUS(status) != 0) {
        text += " ended with status " + std::to_string(WEXITSTATUS(status));
    }
    return text;
}

} // namespace kvt::test
