#include "infer/twice_read.h"

#include "base/failure.h"

#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace host {

namespace {

bool isPlainFile(int descriptor) {
    struct stat status {};
    return ::fstat(descriptor, &status) == 0 && S_ISREG(status.st_mode);
}

// In the folder for temporary files, without a name from the start.
int openUnnamed() {
    const char* const folder = std::getenv("TMPDIR");
    std::string path = std::string(folder != nullptr && *folder != '\0' ? folder : "/tmp") + "/kvt-XXXXXX";
    const int descriptor = ::mkostemp(path.data(), O_CLOEXEC);
    if (descriptor < 0) {
        throw systemFailure(path, errno);
    }
    ::unlink(path.c_str());
    return descriptor;
}

void writeAll(int descriptor, std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
        if (written >= 0) {
            bytes.remove_prefix(static_cast<std::size_t>(written));
        } else if (errno != EINTR) {
            throw systemFailure("a copy of the input", errno);
        }
    }
}

} // namespace

TwiceRead::TwiceRead(const std::string& path) : input_(path), path_(path) {
    if (path == "-" || !isPlainFile(input_.descriptor())) {
        copy_ = openUnnamed();
        path_ = "/dev/fd/" + std::to_string(copy_);
    }
}

std::string_view TwiceRead::next() {
    const std::string_view bytes = input_.read();
    if (copy_ >= 0) {
        writeAll(copy_, bytes);
    }
    return bytes;
}

TwiceRead::~TwiceRead() {
    if (copy_ >= 0) {
        ::close(copy_);
    }
}

} // namespace host
