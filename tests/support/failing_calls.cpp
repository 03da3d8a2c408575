// To be loaded before the C library by LD_PRELOAD: calls that fail as they do on bad disks, full quotas and network file
// systems, which a test cannot have. KVT_FAULT names the call.
#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <string_view>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace {

bool isFaulty(std::string_view call) {
    const char* const fault = std::getenv("KVT_FAULT");
    return fault != nullptr && fault == call;
}

bool isWrittenFile(int descriptor) {
    struct stat file {};
    return ::fstat(descriptor, &file) == 0 && S_ISREG(file.st_mode) &&
           (::fcntl(descriptor, F_GETFL) & O_ACCMODE) == O_WRONLY;
}

} // namespace

extern "C" {

// A write that was put off has failed since.
int fsync(int descriptor) {
    if (isFaulty("fsync")) {
        errno = EIO;
        return -1;
    }
    return static_cast<int>(::syscall(SYS_fsync, descriptor));
}

// What was written finds no room where it is sent at last. The descriptor is closed all the same.
int close(int descriptor) {
    const bool fails = isFaulty("close") && isWrittenFile(descriptor);
    const int result = static_cast<int>(::syscall(SYS_close, descriptor));
    if (fails) {
        errno = ENOSPC;
        return -1;
    }
    return result;
}

// The first of standard input ends by a signal before there is anything to read.
ssize_t read(int descriptor, void* buffer, size_t bytes) {
    static bool wasInterrupted = false;
    if (!wasInterrupted && descriptor == STDIN_FILENO && isFaulty("read")) {
        wasInterrupted = true;
        errno = EINTR;
        return -1;
    }
    return ::syscall(SYS_read, descriptor, buffer, bytes);
}

} // extern "C"
