// To be loaded before the C library by LD_PRELOAD: calls that fail as they do on bad disks, full quotas and network file
// systems, which a test cannot have. KVT_FAULT names the call.
#include <cerrno>
#include <cstdlib>
#include <dlfcn.h>
#include <fcntl.h>
#include <pthread.h>
#include <string_view>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace {

bool isFaulty(std::string_view call) {
    const char* const fault = std::getenv("KVT_FAULT");
    return fault != nullptr && fault == call;
}

// At the first call only.
bool isFaultyOnce(std::string_view call) {
    static bool wasFaulty = false;
    const bool isFirst = !wasFaulty && isFaulty(call);
    wasFaulty = wasFaulty || isFirst;
    return isFirst;
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

// The first of standard input ends by a signal before there is anything to read, or finds nothing yet where the input
// does not wait.
ssize_t read(int descriptor, void* buffer, size_t bytes) {
    if (descriptor == STDIN_FILENO && (isFaultyOnce("read") || isFaultyOnce("early read"))) {
        errno = isFaulty("read") ? EINTR : EAGAIN;
        return -1;
    }
    return ::syscall(SYS_read, descriptor, buffer, bytes);
}

// The same of what is written: by a signal, or where there is no room yet.
ssize_t write(int descriptor, const void* buffer, size_t bytes) {
    if (isFaultyOnce("write") || isFaultyOnce("early write")) {
        errno = isFaulty("write") ? EINTR : EAGAIN;
        return -1;
    }
    return ::syscall(SYS_write, descriptor, buffer, bytes);
}

// A file of which nothing can be read, one that became shorter, and a signal.
ssize_t pread(int descriptor, void* buffer, size_t bytes, off_t offset) {
    if (isFaulty("pread")) {
        errno = EIO;
        return -1;
    }
    if (isFaulty("short pread")) {
        return 0;
    }
    if (isFaultyOnce("interrupted pread")) {
        errno = EINTR;
        return -1;
    }
    return ::syscall(SYS_pread64, descriptor, buffer, bytes, offset);
}

// A new name for what was written.
int rename(const char* from, const char* to) {
    if (isFaulty("rename")) {
        errno = EIO;
        return -1;
    }
    return static_cast<int>(::syscall(SYS_renameat2, AT_FDCWD, from, AT_FDCWD, to, 0));
}

// No folder can be made.
char* mkdtemp(char* path) {
    if (isFaulty("mkdtemp")) {
        errno = ENOSPC;
        return nullptr;
    }
    using Make = char* (*)(char*);
    static const auto make = reinterpret_cast<Make>(::dlsym(RTLD_NEXT, "mkdtemp"));
    return make(path);
}

// There are as many threads as there may be.
int pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*run)(void*), void* argument) {
    using Create = int (*)(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*);
    static const auto create = reinterpret_cast<Create>(::dlsym(RTLD_NEXT, "pthread_create"));
    return isFaulty("pthread_create") ? EAGAIN : create(thread, attributes, run, argument);
}

} // extern "C"
