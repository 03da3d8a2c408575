#include "base/output.h"

#include "base/failure.h"
#include "base/interrupt.h"
#include "base/text.h"

#include <cerrno>
#include <fcntl.h>
#include <filesystem>
#include <optional>
#include <poll.h>
#include <sys/stat.h>
#include <unistd.h>
#include <utility>

namespace host {

namespace {

namespace fs = std::filesystem;

// Writes all of `bytes`; gives 0 or the number of the error.
int writeAll(int descriptor, std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
        if (written >= 0) {
            bytes.remove_prefix(static_cast<std::size_t>(written));
        } else if (errno == EAGAIN) {
            // The descriptor was made non-blocking before we got it.
            pollfd waiting{descriptor, POLLOUT, 0};
            ::poll(&waiting, 1, -1);
        } else if (errno != EINTR) {
            return errno;
        }
    }
    return 0;
}

// Sends the data to the device. Pipes and the like have no device behind them, which is not a failure.
int synchronise(int descriptor) {
    return ::fsync(descriptor) == 0 || errno == EINVAL || errno == EROFS || errno == ENOTSUP ? 0 : errno;
}

bool isSameFile(int left, int right) {
    struct stat a {};
    struct stat b {};
    return ::fstat(left, &a) == 0 && ::fstat(right, &b) == 0 && S_ISREG(a.st_mode) && a.st_dev == b.st_dev &&
           a.st_ino == b.st_ino;
}

class StandardOutput : public Output {
public:
    void write(std::string_view bytes) override { check(writeAll(STDOUT_FILENO, bytes)); }

    // A full disk may show only when the file is closed. The descriptor itself stays open, so that no other file
    // can take its number.
    void commit() override {
        const int copy = ::dup(STDOUT_FILENO);
        check(copy >= 0 && ::close(copy) == 0 ? 0 : errno);
    }

    bool writesInPlaceTo(int descriptor) const override { return isSameFile(STDOUT_FILENO, descriptor); }

private:
    static void check(int error) {
        if (error == EPIPE) {
            throw ClosedPipe{};
        }
        if (error != 0) {
            throw systemFailure("cannot write to standard output", error);
        }
    }
};

// An output behind a descriptor of its own.
class DescriptorOutput : public Output {
public:
    DescriptorOutput(const DescriptorOutput&) = delete;
    DescriptorOutput& operator=(const DescriptorOutput&) = delete;
    ~DescriptorOutput() override { release(); }

    void write(std::string_view bytes) override {
        const int error = writeAll(descriptor_, bytes);
        if (error == EPIPE) {
            throw ClosedPipe{};
        }
        check(error);
    }

protected:
    DescriptorOutput(int descriptor, std::string shownPath)
        : descriptor_(descriptor), shownPath_(std::move(shownPath)) {}

    void finish() {
        check(synchronise(descriptor_));
        check(release());
    }

    void check(int error) const {
        if (error != 0) {
            throw systemFailure("cannot write " + printable(shownPath_), error);
        }
    }

    int descriptor() const { return descriptor_; }

private:
    int release() {
        const int descriptor = std::exchange(descriptor_, -1);
        return descriptor < 0 || ::close(descriptor) == 0 || errno == EINTR ? 0 : errno;
    }

    int descriptor_;
    std::string shownPath_;
};

// A stream that was open before the program began.
class OpenDescriptor : public DescriptorOutput {
public:
    OpenDescriptor(int descriptor, const std::string& path)
        : DescriptorOutput(::fcntl(descriptor, F_DUPFD_CLOEXEC, STDERR_FILENO + 1), path) {
        check(this->descriptor() < 0 ? errno : 0);
    }
    void commit() override { finish(); }
    bool writesInPlaceTo(int other) const override { return isSameFile(descriptor(), other); }
};

class DeviceOutput : public DescriptorOutput {
public:
    explicit DeviceOutput(const std::string& path)
        : DescriptorOutput(::open(path.c_str(), O_WRONLY | O_CLOEXEC | O_NOCTTY), path) {
        check(descriptor() < 0 ? errno : 0);
    }
    void commit() override { finish(); }
    bool writesInPlaceTo(int) const override { return false; }
};

// An open temporary file, known to the signal handler.
struct Temporary {
    std::string path;
    int descriptor = -1;
    std::unique_ptr<RemovedOnInterrupt> guard;
};

// The name is short whatever the target is called, and O_EXCL makes it ours: no link is followed that somebody put there.
// The umask takes from the mode what it takes from that of any new file.
Temporary createTemporary(const fs::path& target, mode_t mode) {
    const fs::path folder = target.has_parent_path() ? target.parent_path() : fs::path(".");
    SignalsHeldBack heldBack;
    for (unsigned attempt = 0;; ++attempt) {
        Temporary made;
        made.path = (folder / (".kvt-" + std::to_string(::getpid()) + "-" + std::to_string(attempt) + ".tmp"))
                        .string();
        made.descriptor = ::open(made.path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode);
        if (made.descriptor < 0 && (errno != EEXIST || attempt == 1000)) {
            throw systemFailure("cannot create " + printable(target.string()), errno);
        }
        if (made.descriptor >= 0) {
            made.guard = std::make_unique<RemovedOnInterrupt>(made.path);
            return made;
        }
    }
}

class AtomicFile : public DescriptorOutput {
public:
    AtomicFile(const fs::path& target, std::optional<mode_t> mode, const std::string& shownPath)
        : AtomicFile(target, createTemporary(target, mode.value_or(0666)), shownPath) {
        // A file that is replaced keeps its permissions, as it would if it were written in place. At no time before has
        // anybody more of them.
        if (mode) {
            ::fchmod(descriptor(), *mode);
        }
    }

    AtomicFile(const AtomicFile&) = delete;
    AtomicFile& operator=(const AtomicFile&) = delete;

    ~AtomicFile() override {
        if (temporary_.guard) {
            SignalsHeldBack heldBack;
            ::unlink(temporary_.path.c_str());
            temporary_.guard.reset();
        }
    }

    void commit() override {
        finish();
        SignalsHeldBack heldBack;
        check(::rename(temporary_.path.c_str(), target_.c_str()) == 0 ? 0 : errno);
        temporary_.guard.reset();
    }

    bool writesInPlaceTo(int) const override { return false; }

private:
    AtomicFile(fs::path target, Temporary temporary, const std::string& shownPath)
        : DescriptorOutput(temporary.descriptor, shownPath), target_(std::move(target)),
          temporary_(std::move(temporary)) {}

    fs::path target_;
    Temporary temporary_;
};

// The descriptor that a path such as /dev/stdout, /dev/fd/3 or a link to one of them names. What is open there is a
// stream, be it a file: to put another file in its place would take it from whoever opened it.
std::optional<int> descriptorNamed(fs::path path) {
    std::error_code error;
    for (int links = 0; links < 40; ++links) {
        const fs::path folder = path.parent_path();
        const std::string name = path.filename().string();
        if ((folder == "/dev/fd" || folder == "/proc/self/fd") && !name.empty() && name.size() <= 6 &&
            name.find_first_not_of("0123456789") == std::string::npos) {
            return std::stoi(name);
        }
        if (!fs::is_symlink(fs::symlink_status(path, error))) {
            break;
        }
        const fs::path next = fs::read_symlink(path, error);
        path = next.is_absolute() ? next : folder / next;
    }
    return std::nullopt;
}

// In a folder that all may write to but nobody may clear, as /tmp, a link may be somebody's trap: it is followed only if it
// belongs to us or to the owner of the folder, as the kernel has it where it is asked to protect links.
void requireTrusted(const fs::path& link) {
    const fs::path folder = link.has_parent_path() ? link.parent_path() : fs::path(".");
    struct stat linkItself {};
    struct stat around {};
    if (::lstat(link.c_str(), &linkItself) != 0 || ::stat(folder.c_str(), &around) != 0) {
        return;
    }
    const bool isOpenToAll = (around.st_mode & S_ISVTX) != 0 && (around.st_mode & S_IWOTH) != 0;
    if (isOpenToAll && linkItself.st_uid != ::geteuid() && linkItself.st_uid != around.st_uid) {
        throw systemFailure("cannot write " + printable(link.string()) +
                                ": it is a link of somebody else, in a folder that all may write to",
                            EACCES);
    }
}

// Where a chain of symbolic links leads to, whether or not there is something at its end.
fs::path followLinks(fs::path path) {
    std::error_code error;
    for (int links = 0; links < 40 && fs::is_symlink(fs::symlink_status(path, error)); ++links) {
        requireTrusted(path);
        const fs::path next = fs::read_symlink(path, error);
        if (error) {
            break;
        }
        path = next.is_absolute() ? next : path.parent_path() / next;
    }
    return path;
}

} // namespace

bool isStandardOutput(const std::string& path) {
    return path.empty() || path == "-" || descriptorNamed(path) == STDOUT_FILENO;
}

bool isSamePlace(const std::string& left, const std::string& right) {
    std::error_code error;
    // Without the first step, a name alone of what is not there stays as it is.
    const auto place = [&](const std::string& path) {
        return fs::weakly_canonical(fs::absolute(path, error), error);
    };
    return place(left) == place(right);
}

std::unique_ptr<Output> openOutput(const std::string& path) {
    if (isStandardOutput(path)) {
        return std::make_unique<StandardOutput>();
    }
    if (const std::optional<int> descriptor = descriptorNamed(path)) {
        return std::make_unique<OpenDescriptor>(*descriptor, path);
    }
    struct stat existing {};
    if (::stat(path.c_str(), &existing) != 0) {
        if (errno != ENOENT) {
            throw systemFailure("cannot write " + printable(path), errno);
        }
        return std::make_unique<AtomicFile>(followLinks(path), std::nullopt, path);
    }
    if (S_ISDIR(existing.st_mode)) {
        throw systemFailure("cannot write " + printable(path), EISDIR);
    }
    if (!S_ISREG(existing.st_mode)) {
        return std::make_unique<DeviceOutput>(path);
    }
    // Without this, a file that is protected against writing would be replaced all the same.
    if (::access(path.c_str(), W_OK) != 0) {
        throw systemFailure("cannot write " + printable(path), errno);
    }
    return std::make_unique<AtomicFile>(followLinks(path), existing.st_mode & 07777, path);
}

void print(std::string_view text, const std::string& path) {
    const std::unique_ptr<Output> output = openOutput(path);
    output->write(text);
    output->commit();
}

} // namespace host
