#include "base/interrupt.h"

#include "base/failure.h"

#include <array>
#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <fcntl.h>
#include <string_view>
#include <unistd.h>

namespace host {

namespace {

// SIGXCPU comes when a limit on the processor's time is reached, SIGBUS when a mapped file is cut short or the disk under
// it fails.
constexpr std::array endingSignals = {SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGXCPU, SIGBUS};

// Read by the signal handler: paths of files to remove, null where a slot is free.
std::array<std::atomic<const char*>, 4> removals{};
static_assert(std::atomic<const char*>::is_always_lock_free, "the handler must not wait for a lock");

// Nothing but calls that a signal handler may make.
extern "C" void removeAndDie(int number, siginfo_t* info, void*) {
    for (const auto& path : removals) {
        if (const char* name = path.load(); name != nullptr) {
            ::unlink(name);
        }
    }
    // A page of a mapped file that is not there any more, and not somebody who sent the signal.
    if (number == SIGBUS && info->si_code == BUS_ADRERR) {
        constexpr std::string_view said =
            "kvt: a file that is in use was cut short, or the disk under it fails\n";
        constexpr int notDone = 2;
        [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, said.data(), said.size());
        ::_exit(notDone);
    }
    std::signal(number, SIG_DFL);
    std::raise(number);
}

// As it was found: whoever had it ignored wants no signal.
void (*pipeSignalBefore)(int) = SIG_DFL;

sigset_t endingSet() {
    sigset_t set;
    sigemptyset(&set);
    for (const int number : endingSignals) {
        sigaddset(&set, number);
    }
    return set;
}

void catchEndingSignals() {
    struct sigaction action {};
    action.sa_sigaction = removeAndDie;
    action.sa_flags = SA_SIGINFO;
    action.sa_mask = endingSet();
    for (const int number : endingSignals) {
        struct sigaction before {};
        sigaction(number, nullptr, &before);
        // A signal that was ignored when the program was started (as by nohup) stays so.
        if (before.sa_handler != SIG_IGN) {
            sigaction(number, &action, nullptr);
        }
    }
}

// A file that is opened where a standard stream was closed would be written to in its place. Each is opened the
// wrong way round, so that its use fails.
void takeStandardDescriptors() {
    for (int descriptor = STDIN_FILENO; descriptor <= STDERR_FILENO; ++descriptor) {
        if (::fcntl(descriptor, F_GETFD) == -1 && errno == EBADF) {
            ::open("/dev/null", descriptor == STDIN_FILENO ? O_WRONLY : O_RDONLY);
        }
    }
}

} // namespace

Failure systemFailure(const std::string& what, int errorNumber) {
    return Failure(what + ": " + std::strerror(errorNumber));
}

void prepareProcess() {
    takeStandardDescriptors();
    pipeSignalBefore = std::signal(SIGPIPE, SIG_IGN);
    std::signal(SIGXFSZ, SIG_IGN);
    catchEndingSignals();
}

void dieOfClosedPipe() {
    if (pipeSignalBefore != SIG_IGN) {
        std::signal(SIGPIPE, SIG_DFL);
        std::raise(SIGPIPE);
    }
}

RemovedOnInterrupt::RemovedOnInterrupt(std::string path) : path_(std::move(path)), slot_(-1) {
    for (std::size_t slot = 0; slot < removals.size(); ++slot) {
        const char* free = nullptr;
        if (removals[slot].compare_exchange_strong(free, path_.c_str())) {
            slot_ = static_cast<int>(slot);
            return;
        }
    }
    throw Failure("too many files are being written at once");
}

RemovedOnInterrupt::~RemovedOnInterrupt() {
    removals[static_cast<std::size_t>(slot_)].store(nullptr);
}

SignalsHeldBack::SignalsHeldBack() {
    const sigset_t set = endingSet();
    sigprocmask(SIG_BLOCK, &set, nullptr);
}

SignalsHeldBack::~SignalsHeldBack() {
    const sigset_t set = endingSet();
    sigprocmask(SIG_UNBLOCK, &set, nullptr);
}

} // namespace host
