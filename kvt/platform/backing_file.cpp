// Backing files by the system calls of POSIX, and by what Linux adds for files with holes.
#include <kvt/platform/backing_file.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <limits>
#include <new>
#include <string>

namespace kvt::platform {
namespace {

constexpr mode_t ownerOnly = S_IRUSR | S_IWUSR;

class OpenFile {
public:
    OpenFile(const char* path, int flags, mode_t mode = 0) noexcept
        : descriptor_(::open(path, flags | O_RDWR | O_CLOEXEC, mode)) {}
    OpenFile(const OpenFile&) = delete;
    OpenFile& operator=(const OpenFile&) = delete;
    ~OpenFile() {
        if (isOpen()) {
            ::close(descriptor_);
        }
    }

    int descriptor() const noexcept { return descriptor_; }
    bool isOpen() const noexcept { return descriptor_ >= 0; }

private:
    int descriptor_;
};

// Makes the file end with a zero byte at `bytes` from `end`, its present length. All in between is a hole.
bool writeLastByte(int file, std::int64_t end, std::uint64_t bytes) noexcept {
    constexpr auto longest = static_cast<std::uint64_t>(std::numeric_limits<off_t>::max());
    if (bytes > longest - static_cast<std::uint64_t>(end)) {
        return false;
    }
    const off_t last = end + static_cast<off_t>(bytes) - 1;
    return ::lseek(file, last, SEEK_SET) == last && ::write(file, "", 1) == 1;
}

std::string folderOf(const char* path) {
    const std::string text(path);
    const auto slash = text.rfind('/');
    return slash == std::string::npos ? "." : text.substr(0, slash + 1);
}

bool isZero(char byte) noexcept {
    return byte == 0;
}

} // namespace

bool makeEmptyFile(const char* path) noexcept {
    return OpenFile(path, O_CREAT | O_TRUNC, ownerOnly).isOpen();
}

bool makeFileAtOnce(const char* path, std::uint64_t bytes) noexcept try {
    if (bytes == 0) {
        return false;
    }
    const OpenFile file(folderOf(path).c_str(), O_TMPFILE, ownerOnly);
    if (!file.isOpen() || !writeLastByte(file.descriptor(), 0, bytes)) {
        return false;
    }
    const std::string nameless = "/proc/self/fd/" + std::to_string(file.descriptor());
    return ::linkat(AT_FDCWD, nameless.c_str(), AT_FDCWD, path, AT_SYMLINK_FOLLOW) == 0;
} catch (const std::bad_alloc&) {
    return false;
}

std::int64_t growFile(const char* path, std::uint64_t bytes) noexcept {
    const OpenFile file(path, 0);
    if (!file.isOpen()) {
        return -1;
    }
    const off_t end = ::lseek(file.descriptor(), 0, SEEK_END);
    if (end < 0 || (bytes > 0 && !writeLastByte(file.descriptor(), end, bytes))) {
        return -1;
    }
    return end;
}

std::int64_t fileSize(int file) noexcept {
    struct stat status;
    return ::fstat(file, &status) == 0 ? status.st_size : -1;
}

int writeZero(int file, std::int64_t offset) noexcept {
    ssize_t written = 0;
    do {
        written = ::pwrite(file, "", 1, offset);
    } while (written < 0 && errno == EINTR);
    return written == 1 ? 0 : errno;
}

bool holdsZerosOnly(int file, std::int64_t offset, std::uint64_t bytes) noexcept {
    std::array<char, 65536> block;
    const off_t end = offset + static_cast<off_t>(bytes);
    for (off_t at = offset; at < end;) {
        const off_t written = ::lseek(file, at, SEEK_DATA);
        if (written < 0 && errno == ENXIO) {
            return true; // a hole up to the end of the file
        }
        at = std::max(at, written); // a system that does not know of holes reports less than `at`: it is read
        if (at >= end) {
            return true;
        }
        const auto wanted = static_cast<std::size_t>(std::min<off_t>(end - at, block.size()));
        const ssize_t got = ::pread(file, block.data(), wanted, at);
        if (got <= 0 || !std::all_of(block.data(), block.data() + got, isZero)) {
            return false;
        }
        at += got;
    }
    return true;
}

void closeOnExec(int file) noexcept {
    ::fcntl(file, F_SETFD, FD_CLOEXEC);
}

} // namespace kvt::platform
