// The linker gives every call of one of these functions, in this program and in the static library that is part of
// it, the function's wrapper below (--wrap), and calls in other libraries are left alone. So the wrappers are not in
// the way of whatever a sanitizer does before main.
#include <mmap/counted_calls.h>

#include <cerrno>
#include <cstdarg>
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace kvt::test {

namespace {

thread_local CountedCalls* counting = nullptr;
thread_local std::size_t opensToFailure = 0; // 0: none fails

void note(const char* name, std::size_t written = 0) {
    // What noting itself calls is not counted.
    if (CountedCalls* const counted = std::exchange(counting, nullptr)) {
        ++counted->calls;
        counted->bytesWritten += written;
        counted->names += name;
        counted->names += ' ';
        counting = counted;
    }
}

} // namespace

CallCounter::CallCounter() {
    counted_.names.reserve(1024);
    counting = &counted_;
}

CallCounter::~CallCounter() {
    counting = nullptr;
}

FailingOpen::FailingOpen(std::size_t number) {
    opensToFailure = number;
}

FailingOpen::~FailingOpen() {
    opensToFailure = 0;
}

static bool isToFail() {
    return opensToFailure > 0 && --opensToFailure == 0;
}

} // namespace kvt::test

// Declares the wrapper of a function and the function itself, by the names that the linker gives them, and defines the
// wrapper.
#define KVT_COUNTED(result, name, written, parameters, ...)                                                  \
    extern "C" result kvt_real_##name parameters __asm__("__real_" #name);                                   \
    extern "C" result kvt_counted_##name parameters __asm__("__wrap_" #name);                                \
    result kvt_counted_##name parameters {                                                                   \
        kvt::test::note(#name, written);                                                                     \
        return kvt_real_##name(__VA_ARGS__);                                                                 \
    }

KVT_COUNTED(int, close, 0, (int descriptor), descriptor)
KVT_COUNTED(off_t, lseek, 0, (int descriptor, off_t offset, int from), descriptor, offset, from)
KVT_COUNTED(ssize_t, write, count, (int descriptor, const void* bytes, size_t count), descriptor, bytes,
            count)
KVT_COUNTED(ssize_t, pwrite, count, (int descriptor, const void* bytes, size_t count, off_t at), descriptor,
            bytes, count, at)
KVT_COUNTED(ssize_t, read, 0, (int descriptor, void* bytes, size_t count), descriptor, bytes, count)
KVT_COUNTED(ssize_t, pread, 0, (int descriptor, void* bytes, size_t count, off_t at), descriptor, bytes,
            count, at)
KVT_COUNTED(int, ftruncate, 0, (int descriptor, off_t size), descriptor, size)
KVT_COUNTED(int, posix_fallocate, 0, (int descriptor, off_t at, off_t count), descriptor, at, count)
KVT_COUNTED(int, fallocate, 0, (int descriptor, int mode, off_t at, off_t count), descriptor, mode, at, count)
KVT_COUNTED(int, fsync, 0, (int descriptor), descriptor)
KVT_COUNTED(int, fdatasync, 0, (int descriptor), descriptor)
KVT_COUNTED(int, fstat, 0, (int descriptor, struct stat* status), descriptor, status)
KVT_COUNTED(int, stat, 0, (const char* path, struct stat* status), path, status)
KVT_COUNTED(void*, mmap, 0, (void* address, size_t size, int access, int flags, int descriptor, off_t at),
            address, size, access, flags, descriptor, at)
KVT_COUNTED(int, munmap, 0, (void* address, size_t size), address, size)
KVT_COUNTED(int, msync, 0, (void* address, size_t size, int flags), address, size, flags)

extern "C" int kvt_real_open(const char* path, int flags, ...) __asm__("__real_open");
extern "C" int kvt_counted_open(const char* path, int flags, ...) __asm__("__wrap_open");
int kvt_counted_open(const char* path, int flags, ...) {
    mode_t mode = 0;
    if ((flags & O_CREAT) != 0) {
        va_list more;
        va_start(more, flags);
        mode = va_arg(more, mode_t);
        va_end(more);
    }
    kvt::test::note("open");
    if (kvt::test::isToFail()) {
        errno = EACCES;
        return -1;
    }
    return kvt_real_open(path, flags, mode);
}
