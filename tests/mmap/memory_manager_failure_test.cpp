// Files that cannot be opened, and files that cannot grow: what is thrown, and what is left.

#include "manager_fixture.h"
#include "scratch.h"

#include <kvt/mmap/memory_manager.h>

#include <boost/interprocess/exceptions.hpp>
#include <gtest/gtest.h>

#include <array>
#include <csignal>
#include <cstdint>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace kvt::test {
namespace {

namespace fs = std::filesystem;
namespace ipc = boost::interprocess;
using ex::mmap::mapped_region_segment;
using ex::mmap::memory_manager;
using Words = ex::vector<unsigned long long>;
using MemoryManagerFailure = MemoryManager;

// Files of this process cannot grow beyond a length, for as long as this lives.
class FileLengthLimit {
public:
    explicit FileLengthLimit(std::uint64_t bytes) : handler_(std::signal(SIGXFSZ, SIG_IGN)) {
        ::getrlimit(RLIMIT_FSIZE, &before_);
        const rlimit limit{bytes, before_.rlim_max};
        ::setrlimit(RLIMIT_FSIZE, &limit);
    }
    FileLengthLimit(const FileLengthLimit&) = delete;
    FileLengthLimit& operator=(const FileLengthLimit&) = delete;
    ~FileLengthLimit() {
        ::setrlimit(RLIMIT_FSIZE, &before_);
        std::signal(SIGXFSZ, handler_);
    }

private:
    rlimit before_{};
    void (*handler_)(int);
};

TEST_F(MemoryManagerFailure, FileThatCannotBeOpenedFailsAndLeavesNothing) {
    write(scratch.file("plain"), "text");
    fs::create_directory(scratch.file("folder"));
    const struct {
        int line;
        ipc::error_code_t code;
        std::string path;
        std::string text;
    } rows[] = {
        {__LINE__, ipc::not_found_error, scratch.file("missing/file"), "No such file or directory"},
        {__LINE__, ipc::is_directory_error, scratch.file("folder"), "Is a directory"},
        {__LINE__, ipc::system_error, scratch.file("plain/file"), "Not a directory"},
        {__LINE__, ipc::not_found_error, "", "No such file or directory"},
        {__LINE__, ipc::path_error, scratch.file(std::string(300, 'n')), "File name too long"},
        {__LINE__, ipc::not_found_error, "/proc/kvt", "No such file or directory"},
    };
    for (const auto& row : rows) {
        for (const bool persists : {false, true}) {
            SCOPED_TRACE(testing::Message()
                         << "row at line " << row.line << ": " << row.path << ", " << persists);
            ipc::error_code_t code = ipc::no_error;
            EXPECT_EQ(mappingFailure(
                          [&] {
                              const memory_manager manager(row.path, {65536, persists});
                          },
                          &code),
                      row.text);
            EXPECT_EQ(code, row.code);
        }
    }
    EXPECT_EQ(contentsOf(scratch.file("plain")), "text");
    EXPECT_TRUE(fs::is_directory(scratch.file("folder")));
    EXPECT_EQ(std::distance(fs::directory_iterator(scratch.folder()), fs::directory_iterator()), 2);
}

TEST_F(MemoryManagerFailure, SegmentForWhichTheFileCannotGrowIsNowhereAndSoIsItsRow) {
    memory_manager manager(path, persistent());
    const std::uint64_t length = lengthOf(path);
    {
        const FileLengthLimit limit(length + page());
        mapped_region_segment lost = manager.create_segment(8 * page());
        EXPECT_EQ(lost.offset(), -1);
        EXPECT_EQ(lost.size(), 8 * page());
        EXPECT_EQ(lost.index(), 0u);
        expectOutsideTheFile([&] { lost.load(false); });
        EXPECT_EQ(lengthOf(path), length);
    }
    mapped_region_segment next = manager.create_segment(8 * page());
    EXPECT_EQ(next.offset(), static_cast<std::int64_t>(length));
    EXPECT_EQ(next.index(), 1u);
    next.load(false);
    put(next, 9);
    expectOutsideTheFile([&] { manager.open_segment(0); });
    EXPECT_EQ(get(manager.open_segment(1)), 9u) << "the row of the lost one does not reach into it";
}

TEST_F(MemoryManagerFailure, SegmentBeyondAllFilesIsNowhere) {
    memory_manager manager(path, temporary());
    manager.create_segment();
    for (const std::uint64_t size :
         std::array<std::uint64_t, 3>{std::uint64_t(1) << 62, std::uint64_t(1) << 63, allOnes - page() + 1}) {
        mapped_region_segment segment = manager.create_segment(size);
        EXPECT_EQ(segment.offset(), -1) << size;
        expectOutsideTheFile([&] { segment.load(false); });
        EXPECT_EQ(lengthOf(path), 65536u);
    }
}

TEST_F(MemoryManagerFailure, SegmentWithoutSizeTakesNothingFromItsNeighbours) {
    memory_manager manager(path, temporary());
    mapped_region_segment before = manager.create_segment(page());
    before.load(false);
    const std::string bytes = contentsOf(path);
    mapped_region_segment none = manager.create_segment(0);
    EXPECT_EQ(none.size(), 0u);
    EXPECT_EQ(contentsOf(path), bytes);
    mapped_region_segment after = manager.create_segment(page());
    EXPECT_EQ(after.offset(), static_cast<std::int64_t>(page()));
    expectOutsideTheFile([&] { none.load(false); });
}

// The end of the file decides where a segment lies, and a heap that does not begin at a page would be misaligned.
TEST_F(MemoryManagerFailure, SegmentBehindStrayBytesIsNotLoadedAndTheFileStaysAsItIs) {
    for (const std::uint64_t stray : {std::uint64_t(1), std::uint64_t(3), std::uint64_t(16), page() - 1}) {
        for (const bool persists : {false, true}) {
            SCOPED_TRACE(testing::Message() << stray << ", " << persists);
            fs::remove(path);
            memory_manager manager(path, {65536, persists});
            manager.restore();
            const std::uint64_t length = lengthOf(path) + stray;
            std::ofstream(path, std::ios::binary | std::ios::app) << std::string(stray, 'x');
            mapped_region_segment segment = manager.create_segment(2 * page());
            EXPECT_EQ(segment.offset(), static_cast<std::int64_t>(length));
            const std::string bytes = contentsOf(path);
            for (const bool initialised : {false, true}) {
                expectOutsideTheFile([&] { segment.load(initialised); });
                EXPECT_EQ(segment.segment_manager(), nullptr);
                EXPECT_EQ(segment.release(), 0u);
            }
            if (persists) {
                expectOutsideTheFile([&] { manager.open_segment(0); });
            }
            EXPECT_EQ(contentsOf(path), bytes);
        }
    }
}

TEST_F(MemoryManagerFailure, GrowthNeedsTheFileUnderItsName) {
    memory_manager manager(path, persistent());
    manager.save({6});
    fs::remove(path);
    mapped_region_segment segment = manager.create_segment();
    EXPECT_EQ(segment.offset(), -1);
    expectOutsideTheFile([&] { segment.load(false); });
    EXPECT_EQ(manager.restore(), Words({6})) << "the header is open for the life of the manager";
}

TEST_F(MemoryManagerFailure, NewFileWithoutRoomForItsHeaderFailsAtItsFirstUseAndIsNotLeftBehind) {
    {
        const FileLengthLimit limit(page());
        memory_manager manager(path, persistent());
        expectOutsideTheFile([&] { manager.save({1}); });
        expectOutsideTheFile([&] { manager.restore(); });
        expectOutsideTheFile([&] { manager.create_segment(); });
        expectOutsideTheFile([&] { manager.open_segment(0); });
    }
    EXPECT_TRUE(scratch.isEmpty());
}

// What opening a manager comes to for a user who is not root, for one who has all rights, and for one who gets none to
// new files. It runs in a process apart.
bool isDenied(const std::string& path, bool persists) {
    const pid_t child = ::fork();
    if (child == 0) {
        ::umask(0777);
        const bool other = ::geteuid() != 0 || ::setuid(65534) == 0;
        const std::string text = mappingFailure([&] {
            const memory_manager manager(path, {65536, persists});
        });
        ::_exit(other && text == "Permission denied" ? 0 : 1);
    }
    int status = -1;
    return child > 0 && ::waitpid(child, &status, 0) == child && status == 0;
}

TEST_F(MemoryManagerFailure, FileThatWasMadeButCannotBeOpenedIsRemoved) {
    fs::permissions(scratch.folder(), fs::perms::all);
    for (const bool persists : {false, true}) {
        EXPECT_TRUE(isDenied(path, persists)) << persists;
        EXPECT_TRUE(scratch.isEmpty()) << persists;
    }
}

TEST_F(MemoryManagerFailure, FileThatWasThereAndCannotBeOpenedStays) {
    write(path, "text");
    fs::permissions(scratch.folder(), fs::perms::all);
    fs::permissions(path, fs::perms::none);
    for (const bool persists : {false, true}) {
        EXPECT_TRUE(isDenied(path, persists)) << persists;
    }
    fs::permissions(path, fs::perms::owner_read);
    EXPECT_EQ(contentsOf(path), "text");
}

TEST_F(MemoryManagerFailure, UnwritableFolderLeavesNothing) {
    fs::permissions(scratch.folder(), fs::perms::owner_all | fs::perms::others_read | fs::perms::others_exec);
    if (::geteuid() != 0) {
        fs::permissions(scratch.folder(), fs::perms::owner_read | fs::perms::owner_exec);
    }
    for (const bool persists : {false, true}) {
        EXPECT_TRUE(isDenied(path, persists)) << persists;
        EXPECT_TRUE(scratch.isEmpty()) << persists;
    }
    fs::permissions(scratch.folder(), fs::perms::owner_all);
}

} // namespace
} // namespace kvt::test
