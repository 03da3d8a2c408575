#include <support/child_process.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <linux/capability.h>
#include <poll.h>
#include <stdexcept>
#include <sys/ioctl.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace kvt::test {

namespace {

void check(bool good, const char* what) {
    if (!good) {
        throw std::runtime_error(std::string(what) + ": " + std::strerror(errno));
    }
}

struct Pipe {
    int reader = -1;
    int writer = -1;
};

Pipe makePipe() {
    std::array<int, 2> ends{};
    check(::pipe2(ends.data(), O_CLOEXEC) == 0, "pipe");
    return {ends[0], ends[1]};
}

Pipe makeTerminal() {
    const int master = ::posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
    check(master >= 0 && ::grantpt(master) == 0 && ::unlockpt(master) == 0, "posix_openpt");
    const int side = ::open(::ptsname(master), O_RDWR | O_NOCTTY | O_CLOEXEC);
    check(side >= 0, "open of a terminal");
    return {master, side};
}

void closeOnce(int& descriptor) {
    if (descriptor >= 0) {
        ::close(descriptor);
        descriptor = -1;
    }
}

int statusOf(int waited) {
    return WIFEXITED(waited) ? WEXITSTATUS(waited) : 128 + WTERMSIG(waited);
}

// Runs in the child; calls that fail show as a status that no program of ours has.
[[noreturn]] void become(const ChildSetup& setup, int in, int out, int err) {
    ::dup2(in, STDIN_FILENO);
    ::dup2(out, STDOUT_FILENO);
    ::dup2(err, STDERR_FILENO);
    if (setup.noOutput) {
        ::close(STDOUT_FILENO);
    }
    if (!setup.folder.empty() && ::chdir(setup.folder.c_str()) != 0) {
        ::_exit(125);
    }
    for (const auto& [name, value] : setup.environment) {
        ::setenv(name.c_str(), value.c_str(), 1);
    }
    if (setup.mostFileBytes != 0) {
        const rlimit limit{setup.mostFileBytes, setup.mostFileBytes};
        ::setrlimit(RLIMIT_FSIZE, &limit);
    }
    if (setup.modesHold && ::geteuid() == 0 && ::prctl(PR_CAPBSET_DROP, CAP_DAC_OVERRIDE) != 0) {
        ::_exit(125);
    }
    ::signal(SIGPIPE, SIG_DFL); // we ignore it ourselves
    if (setup.ignoredSignal != 0) {
        ::signal(setup.ignoredSignal, SIG_IGN);
    }
    std::vector<char*> arguments;
    for (const std::string& argument : setup.command) {
        arguments.push_back(const_cast<char*>(argument.c_str()));
    }
    arguments.push_back(nullptr);
    ::execvp(arguments[0], arguments.data());
    ::_exit(126);
}

pid_t start(const ChildSetup& setup, int in, int out, int err) {
    const pid_t process = ::fork();
    check(process >= 0, "fork");
    if (process == 0) {
        become(setup, in, out, err);
    }
    return process;
}

int openOutputFile(const ChildSetup& setup) {
    const int flags = O_WRONLY | O_CREAT | O_CLOEXEC | (setup.appendOutput ? O_APPEND : 0);
    const int descriptor = ::open(setup.outputFile.c_str(), flags, 0600);
    check(descriptor >= 0, "open of the output file");
    return descriptor;
}

// A program that ends before it has read everything must not end us.
void ignoreClosedPipes() {
    ::signal(SIGPIPE, SIG_IGN);
}

// Feeds and drains a running program until it closes its ends.
class Exchange {
public:
    Exchange(const ChildSetup& setup, ChildResult& result, int in, int out, int err)
        : setup_(setup), result_(result), in_(in), out_(out), err_(err), piece_(setup.input) {
        ::fcntl(in_, F_SETFL, O_NONBLOCK);
    }

    void run() {
        while (out_ >= 0 || err_ >= 0) {
            std::array<pollfd, 3> waiting = {{{in_, POLLOUT, 0}, {out_, POLLIN, 0}, {err_, POLLIN, 0}}};
            check(::poll(waiting.data(), waiting.size(), -1) >= 0 || errno == EINTR, "poll");
            if (waiting[0].revents != 0) {
                feed();
            }
            if (waiting[1].revents != 0) {
                drain(out_, result_.out, setup_.takeOutput);
            }
            if (waiting[2].revents != 0) {
                drain(err_, result_.err, {});
            }
        }
        closeOnce(in_);
    }

private:
    void feed() {
        int unread = 0;
        if (setup_.oneByOne && ::ioctl(in_, FIONREAD, &unread) == 0 && unread > 0) {
            ::usleep(100);
            return;
        }
        if (piece_.empty() && setup_.makeInput) {
            piece_ = setup_.makeInput();
        }
        if (piece_.empty()) {
            closeOnce(in_);
            return;
        }
        const ssize_t written = ::write(in_, piece_.data(), piece_.size());
        if (written >= 0) {
            piece_.remove_prefix(static_cast<std::size_t>(written));
        } else if (errno != EAGAIN && errno != EINTR) {
            closeOnce(in_);
        }
    }

    static void drain(int& descriptor, std::string& all, const std::function<void(std::string_view)>& take) {
        std::array<char, 65536> bytes;
        const ssize_t count = ::read(descriptor, bytes.data(), bytes.size());
        if (count <= 0) {
            // A terminal whose other side is closed reports an error, not an end.
            closeOnce(descriptor);
        } else if (take) {
            take({bytes.data(), static_cast<std::size_t>(count)});
        } else {
            all.append(bytes.data(), static_cast<std::size_t>(count));
        }
    }

    const ChildSetup& setup_;
    ChildResult& result_;
    int in_;
    int out_;
    int err_;
    std::string_view piece_;
};

} // namespace

ChildResult runChild(const ChildSetup& setup) {
    ignoreClosedPipes();
    Pipe in = makePipe();
    Pipe out;
    if (setup.outputFile.empty()) {
        out = makePipe();
    } else {
        out.writer = openOutputFile(setup);
    }
    if (setup.readNothing) {
        closeOnce(out.reader);
    }
    Pipe err = setup.terminal ? makeTerminal() : makePipe();
    const pid_t process = start(setup, in.reader, out.writer, err.writer);
    closeOnce(in.reader);
    closeOnce(out.writer);
    closeOnce(err.writer);

    ChildResult result;
    Exchange(setup, result, in.writer, out.reader, err.reader).run();
    int waited = 0;
    rusage usage{};
    check(::wait4(process, &waited, 0, &usage) == process, "wait4");
    result.status = statusOf(waited);
    result.mostMemory = static_cast<std::size_t>(usage.ru_maxrss) * 1024;
    return result;
}

RunningChild::RunningChild(const ChildSetup& setup) {
    ignoreClosedPipes();
    Pipe in = makePipe();
    int nowhere = ::open("/dev/null", O_WRONLY | O_CLOEXEC);
    process_ = start(setup, in.reader, nowhere, nowhere);
    closeOnce(in.reader);
    closeOnce(nowhere);
    input_ = in.writer;
}

RunningChild::~RunningChild() {
    closeOnce(input_);
    if (process_ > 0) {
        ::kill(process_, SIGKILL);
        wait();
    }
}

void RunningChild::write(std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t written = ::write(input_, bytes.data(), bytes.size());
        check(written > 0, "write to a program");
        bytes.remove_prefix(static_cast<std::size_t>(written));
    }
}

void RunningChild::signal(int number) {
    ::kill(process_, number);
}

int RunningChild::wait() {
    closeOnce(input_);
    int waited = 0;
    check(::waitpid(process_, &waited, 0) == process_, "waitpid");
    process_ = -1;
    return statusOf(waited);
}

} // namespace kvt::test
