#include "sort/workspace.h"

#include "base/failure.h"
#include "base/memory_pages.h"
#include "base/text.h"

#include <boost/interprocess/exceptions.hpp>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>
#include <utility>

namespace host {

namespace {

// What the heap of a segment needs for itself, amply.
constexpr std::uint64_t heapBytes = 4096;
// The disk is asked for this much at once.
constexpr std::uint64_t reserveStep = 1024 * 1024;

std::string temporaryFolder() {
    const char* folder = std::getenv("TMPDIR");
    return folder != nullptr && *folder != '\0' ? folder : "/tmp";
}

} // namespace

Workspace::Workspace(std::string path) : path_(std::move(path)) {
    if (!path_.empty()) {
        open();
    }
}

Workspace::~Workspace() {
    remove();
}

// O_EXCL makes the file ours, so that nothing of anybody's is emptied and removed.
void Workspace::createFile() {
    const bool named = !path_.empty();
    for (unsigned attempt = 0;; ++attempt) {
        if (!named) {
            path_ = temporaryFolder() + "/.kvt-" + std::to_string(::getpid()) + "-" +
                    std::to_string(attempt) + ".work";
        }
        descriptor_ = ::open(path_.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
        if (descriptor_ >= 0) {
            return;
        }
        if (named && errno == EEXIST) {
            throw Failure("the workspace " + printable(path_) +
                          " exists already; it is a file that is made and removed");
        }
        if (named || errno != EEXIST || attempt == 1000) {
            throw systemFailure("cannot create the workspace " + printable(path_), errno);
        }
    }
}

void Workspace::open() {
    SignalsHeldBack heldBack;
    createFile();
    try {
        guard_ = std::make_unique<RemovedOnInterrupt>(path_);
        manager_.emplace(path_, kvt::ex::mmap::manager_options{});
    } catch (const boost::interprocess::interprocess_exception& failure) {
        remove();
        throw Failure("cannot use the workspace " + printable(path_) + ": " + failure.what());
    } catch (const Failure&) {
        remove();
        throw;
    }
}

void Workspace::remove() {
    if (descriptor_ < 0) {
        return;
    }
    SignalsHeldBack heldBack;
    manager_.reset();
    ::unlink(path_.c_str());
    guard_.reset();
    ::close(std::exchange(descriptor_, -1));
}

std::unique_ptr<Stretch> Workspace::allocate(std::uint64_t bytes) {
    if (!manager_) {
        open();
    }
    try {
        return std::unique_ptr<Stretch>(new Stretch(*this, bytes));
    } catch (const boost::interprocess::interprocess_exception& failure) {
        // A segment for which the file could not grow lies nowhere in it.
        const bool hasNoRoom = failure.get_error_code() == boost::interprocess::size_error;
        throw Failure("cannot enlarge the workspace " + printable(path_) + ": " +
                      (hasNoRoom ? "the disk is full, or files may not be so long" : failure.what()));
    }
}

void Workspace::letGo(std::string_view bytes) const {
    auto found = stretches_.upper_bound(bytes.data());
    if (found == stretches_.begin()) {
        return;
    }
    --found;
    // A page that is looked at may bring those before it along, which were let go of already.
    constexpr std::uint64_t broughtAlong = 128 * 1024;
    const auto offset = static_cast<std::uint64_t>(bytes.data() - found->first);
    if (offset + bytes.size() <= found->second) {
        const std::uint64_t before = std::min(offset, broughtAlong);
        advisePages(bytes.data() - before, bytes.size() + before, MADV_DONTNEED, systemPageSize());
    }
}

Stretch::Stretch(Workspace& owner, std::uint64_t size)
    : owner_(owner), segment_(owner.manager_->create_segment(size + heapBytes)), size_(size) {
    segment_.load(false);
    data_ = static_cast<char*>(segment_.segment_manager()->allocate(size));
    owner_.stretches_.emplace(data_, size_);
}

Stretch::~Stretch() {
    owner_.stretches_.erase(data_);
    // Where the file system cannot do this, the room comes back with the whole file. Doing it bit by bit, as a stretch
    // is read, would wait for pages that are just being written.
    ::fallocate(owner_.descriptor_, FALLOC_FL_PUNCH_HOLE | FALLOC_FL_KEEP_SIZE, segment_.offset(),
                static_cast<off_t>(segment_.size()));
}

void Stretch::reserve(std::uint64_t bytes) {
    if (bytes <= reserved_) {
        return;
    }
    const std::uint64_t upTo = std::min((bytes / reserveStep + 1) * reserveStep, size_);
    const auto base = reinterpret_cast<const char*>(segment_.segment_manager());
    const off_t start = segment_.offset() + (data_ - base);
    int error = EINTR;
    while (error == EINTR) {
        error = ::posix_fallocate(owner_.descriptor_, start + static_cast<off_t>(reserved_),
                                  static_cast<off_t>(upTo - reserved_));
    }
    if (error != 0) {
        throw systemFailure("cannot write the workspace " + printable(owner_.path_), error);
    }
    reserved_ = upTo;
}

} // namespace host
