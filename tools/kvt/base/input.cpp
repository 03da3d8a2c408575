#include "base/input.h"

#include "base/failure.h"
#include "base/text.h"

#include <cerrno>
#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>

namespace host {

namespace {

const std::string standardInput = "-";

int openForReading(const std::string& path, const std::string& name) {
    if (path == standardInput) {
        return STDIN_FILENO;
    }
    const int descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY);
    if (descriptor < 0) {
        throw systemFailure("cannot read " + name, errno);
    }
    return descriptor;
}

std::optional<std::uint64_t> remainingOf(int descriptor) {
    struct stat file {};
    if (::fstat(descriptor, &file) != 0 || !S_ISREG(file.st_mode)) {
        return std::nullopt;
    }
    const off_t position = ::lseek(descriptor, 0, SEEK_CUR);
    return position < 0 || position > file.st_size ? 0 : static_cast<std::uint64_t>(file.st_size - position);
}

} // namespace

Input::Input(const std::string& path)
    : name_(path == standardInput ? "standard input"
            : path.empty()        ? "''"
                                  : printable(path)),
      descriptor_(openForReading(path, name_)), owned_(path != standardInput), buffer_(blockSize) {
    ::posix_fadvise(descriptor_, 0, 0, POSIX_FADV_SEQUENTIAL);
}

Input::~Input() {
    if (owned_) {
        ::close(descriptor_);
    }
}

std::size_t Input::readInto(std::size_t offset) {
    for (;;) {
        const ssize_t count = ::read(descriptor_, buffer_.data() + offset, buffer_.size() - offset);
        if (count >= 0) {
            return static_cast<std::size_t>(count);
        }
        if (errno == EAGAIN) {
            pollfd waiting{descriptor_, POLLIN, 0};
            ::poll(&waiting, 1, -1);
        } else if (errno != EINTR) {
            throw systemFailure("cannot read " + name_, errno);
        }
    }
}

std::string_view Input::read() {
    return {buffer_.data(), readInto(0)};
}

std::string_view Input::readWhile(const std::function<bool(std::string_view)>& isTooShort) {
    std::size_t filled = 0;
    while (isTooShort({buffer_.data(), filled})) {
        const std::size_t count = readInto(filled);
        if (count == 0) {
            break;
        }
        filled += count;
    }
    return {buffer_.data(), filled};
}

std::optional<std::uint64_t> Input::remaining() const {
    return remainingOf(descriptor_);
}

std::vector<std::string> inputsOrStandardInput(std::vector<std::string> paths) {
    if (paths.empty()) {
        paths.push_back(standardInput);
    }
    return paths;
}

std::optional<std::uint64_t> totalSize(const std::vector<std::string>& paths) {
    std::uint64_t total = 0;
    for (const std::string& path : paths) {
        if (path == standardInput) {
            const auto size = remainingOf(STDIN_FILENO);
            if (!size) {
                return std::nullopt;
            }
            total += *size;
            continue;
        }
        struct stat file {};
        if (::stat(path.c_str(), &file) != 0 || !S_ISREG(file.st_mode)) {
            return std::nullopt;
        }
        total += static_cast<std::uint64_t>(file.st_size);
    }
    return total;
}

} // namespace host
