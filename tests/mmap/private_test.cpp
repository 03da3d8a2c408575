// Behind the exported interface: the mutex that cannot be taken, and the file system's calls one by one.

#include "scratch.h"

#include <kvt/mmap/detail/memory_manager_impl.h>
#include <kvt/mmap/memory_manager.h>
#include <kvt/platform/backing_file.h>
#include <kvt/platform/page_size.h>

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <fcntl.h>
#include <functional>
#include <limits>
#include <pthread.h>
#include <string>
#include <sys/inotify.h>
#include <system_error>
#include <unistd.h>

namespace kvt::test {
namespace {

using ex::mmap::memory_manager;

// ---- The mutex ---------------------------------------------------------------------------------------------------

// A handle whose mutex is made one that reports a second lock to its owner, and is held by this thread.
class Locked : public memory_manager {
public:
    explicit Locked(const std::string& path) : memory_manager(path, {65536, true}) {
        remake(PTHREAD_MUTEX_ERRORCHECK);
        ::pthread_mutex_lock(native());
    }
    Locked(const Locked&) = delete;
    Locked& operator=(const Locked&) = delete;
    ~Locked() {
        ::pthread_mutex_unlock(native());
        remake(PTHREAD_MUTEX_NORMAL);
    }

private:
    pthread_mutex_t* native() { return d().mutex.native_handle(); }
    void remake(int kind) {
        pthread_mutexattr_t attributes;
        ::pthread_mutexattr_init(&attributes);
        ::pthread_mutexattr_settype(&attributes, kind);
        ::pthread_mutex_destroy(native());
        ::pthread_mutex_init(native(), &attributes);
        ::pthread_mutexattr_destroy(&attributes);
    }
};

TEST(MemoryManagerMutex, EveryMemberTakesItAndPassesItsFailureOn) {
    const Scratch scratch;
    Locked manager(scratch.file());
    const struct {
        const char* name;
        std::function<void()> call;
    } members[] = {
        {"options", [&] { manager.options(); }},
        {"persistent", [&] { manager.persistent(); }},
        {"save", [&] { manager.save({1}); }},
        {"restore", [&] { manager.restore(); }},
        {"open_segment", [&] { manager.open_segment(0); }},
        {"create_segment", [&] { manager.create_segment(); }},
    };
    for (const auto& member : members) {
        try {
            member.call();
            ADD_FAILURE() << member.name << " did not take the mutex";
        } catch (const std::system_error& failure) {
            EXPECT_EQ(failure.code(), std::errc::resource_deadlock_would_occur) << member.name;
        }
    }
    EXPECT_EQ(lengthOf(scratch.file()), 65536u);
}

// ---- Files -------------------------------------------------------------------------------------------------------

class Opened {
public:
    explicit Opened(const std::string& path) : descriptor_(::open(path.c_str(), O_RDWR | O_CREAT, 0600)) {}
    Opened(const Opened&) = delete;
    Opened& operator=(const Opened&) = delete;
    ~Opened() { ::close(descriptor_); }
    operator int() const { return descriptor_; }

private:
    int descriptor_;
};

class BackingFile : public testing::Test {
protected:
    Scratch scratch;
    const std::string path = scratch.file();
};

TEST(PageSize, IsTheSystems) {
    EXPECT_EQ(platform::pageSize(), page());
}

TEST_F(BackingFile, IsMadeEmptyOrEmptied) {
    EXPECT_TRUE(platform::makeEmptyFile(path.c_str()));
    EXPECT_EQ(lengthOf(path), 0u);
    write(path, "text");
    EXPECT_TRUE(platform::makeEmptyFile(path.c_str()));
    EXPECT_EQ(lengthOf(path), 0u);
    EXPECT_FALSE(platform::makeEmptyFile(scratch.folder().c_str()));
    EXPECT_FALSE(platform::makeEmptyFile(scratch.file("missing/file").c_str()));
}

TEST_F(BackingFile, IsMadeAtOnceWhereThereIsNone) {
    EXPECT_FALSE(platform::makeFileAtOnce(path.c_str(), 0));
    EXPECT_FALSE(platform::makeFileAtOnce(path.c_str(), std::numeric_limits<std::uint64_t>::max()));
    EXPECT_TRUE(scratch.isEmpty());
    if (platform::makeFileAtOnce(path.c_str(), 100001)) { // not every file system can
        EXPECT_EQ(contentsOf(path), std::string(100001, '\0'));
    }
    write(path, "text");
    EXPECT_FALSE(platform::makeFileAtOnce(path.c_str(), 100)) << "there is a file";
    EXPECT_EQ(contentsOf(path), "text");
    EXPECT_FALSE(platform::makeFileAtOnce(scratch.file("missing/file").c_str(), 100));
}

// What happened to files in a folder, in the system's own words.
class Watched {
public:
    explicit Watched(const std::string& folder) : queue_(::inotify_init1(IN_NONBLOCK | IN_CLOEXEC)) {
        ::inotify_add_watch(queue_, folder.c_str(), IN_CREATE | IN_MODIFY);
    }
    Watched(const Watched&) = delete;
    Watched& operator=(const Watched&) = delete;
    ~Watched() { ::close(queue_); }

    std::uint32_t eventsOf(const std::string& name) const {
        alignas(inotify_event) char buffer[4096];
        std::uint32_t all = 0;
        for (ssize_t bytes = 0; (bytes = ::read(queue_, buffer, sizeof buffer)) > 0;) {
            for (const char* at = buffer; at < buffer + bytes;) {
                inotify_event event;
                std::memcpy(&event, at, sizeof event);
                all |=
                    name == at + sizeof event ? event.mask : 0; // a file without a name yet goes by another
                at += sizeof event + event.len;
            }
        }
        return all;
    }

private:
    int queue_;
};

TEST_F(BackingFile, NewPersistentFileIsNeverSeenWithAnotherLength) {
    const std::string other = scratch.file("other");
    const bool possible = platform::makeFileAtOnce(other.c_str(), 65536);
    const Watched watched(scratch.folder());
    const memory_manager manager(path, {65536, true});
    EXPECT_EQ(watched.eventsOf("file"), possible ? IN_CREATE : IN_CREATE | IN_MODIFY);
}

TEST_F(BackingFile, GrowsByZerosFromWhereItEnded) {
    EXPECT_EQ(platform::growFile(path.c_str(), 10), -1) << "it has to be there";
    write(path, "text");
    EXPECT_EQ(platform::growFile(path.c_str(), 10), 4);
    EXPECT_EQ(contentsOf(path), "text" + std::string(10, '\0'));
    EXPECT_EQ(platform::growFile(path.c_str(), 0), 14);
    EXPECT_EQ(platform::growFile(path.c_str(), std::numeric_limits<std::int64_t>::max()), -1);
    EXPECT_EQ(platform::growFile(path.c_str(), std::numeric_limits<std::uint64_t>::max()), -1);
    EXPECT_EQ(contentsOf(path), "text" + std::string(10, '\0'));
}

TEST_F(BackingFile, TellsItsLength) {
    write(path, "text");
    EXPECT_EQ(platform::fileSize(Opened(path)), 4);
    EXPECT_EQ(platform::fileSize(-1), -1);
}

TEST_F(BackingFile, ByteThatIsWrittenTakesRoomForItsPageOnly) {
    write(path, "");
    platform::growFile(path.c_str(), 1 << 20);
    const std::uint64_t before = roomOf(path);
    {
        const Opened file(path);
        EXPECT_EQ(platform::writeZero(file, 262144), 0);
        ASSERT_EQ(::fsync(file), 0);
    }
    EXPECT_GT(roomOf(path), before);
    EXPECT_LE(roomOf(path), before + 65536);
    EXPECT_EQ(contentsOf(path), std::string(1 << 20, '\0'));
    EXPECT_EQ(platform::writeZero(-1, 0), EBADF);
    EXPECT_EQ(platform::writeZero(Opened(path), -1), EINVAL);
}

TEST_F(BackingFile, ZerosAreToldFromTheRest) {
    constexpr std::uint64_t length = 3 << 20;
    write(path, "");
    platform::growFile(path.c_str(), length);
    const Opened file(path);
    EXPECT_TRUE(platform::holdsZerosOnly(file, 0, length));
    EXPECT_TRUE(platform::holdsZerosOnly(file, 0, length - 4096)) << "a hole that goes on behind the stretch";
    EXPECT_TRUE(platform::holdsZerosOnly(file, 5, 0));
    for (const std::uint64_t at : {std::uint64_t(0), std::uint64_t(32), std::uint64_t(65535),
                                   std::uint64_t(65536), length / 2 + 7, length - 1}) {
        const auto position = static_cast<off_t>(at);
        ASSERT_EQ(::pwrite(file, "x", 1, position), 1);
        EXPECT_FALSE(platform::holdsZerosOnly(file, 0, length)) << at;
        EXPECT_TRUE(platform::holdsZerosOnly(file, 0, at)) << at;
        EXPECT_FALSE(platform::holdsZerosOnly(file, position, 1)) << at;
        EXPECT_TRUE(platform::holdsZerosOnly(file, position + 1, length - at - 1)) << at;
        ASSERT_EQ(::pwrite(file, "", 1, position), 1);
    }
    EXPECT_TRUE(platform::holdsZerosOnly(file, 0, length)) << "zeros that were written are zeros";
}

TEST_F(BackingFile, IsKeptFromOtherPrograms) {
    const Opened file(path);
    ASSERT_EQ(::fcntl(file, F_GETFD) & FD_CLOEXEC, 0);
    platform::closeOnExec(file);
    EXPECT_EQ(::fcntl(file, F_GETFD) & FD_CLOEXEC, FD_CLOEXEC);
}

} // namespace
} // namespace kvt::test
