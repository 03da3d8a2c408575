// A file that cannot be made or cannot grow. What fails says so in the stated way, and nothing half-made stays:
// neither a file that could not be opened again nor one that is longer than its segments.
//
// A full disk is a small file system in memory, mounted where only the test's own process sees it, as root or in a
// user namespace. Where the machine allows neither, a limit on the length of files has to do, under which growing
// fails in the same place; that is tried everywhere.
#include <mmap/forked.h>
#include <mmap/segment_words.h>
#include <reference/mapped_file_reference.h>

#include <boost/interprocess/exceptions.hpp>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstddef>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <linux/capability.h>
#include <sched.h>
#include <stdexcept>
#include <string>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>
#include <utility>
#include <vector>

namespace {

using namespace kvt::test;
using boost::interprocess::interprocess_exception;
namespace fs = std::filesystem;

constexpr Word headerSize = 65536;

// Collects what is not as it should be, for the parent to show.
class Findings {
public:
    void expect(bool good, const std::string& what) {
        if (!good) {
            text_ += "not so: " + what + "\n";
        }
    }

    // Gives the system's number of the failure.
    int expectFailure(const std::string& what, const std::function<void()>& work) {
        try {
            work();
        } catch (const interprocess_exception& failure) {
            return failure.get_native_error();
        }
        text_ += "no failure: " + what + "\n";
        return 0;
    }

    const std::string& text() const { return text_; }

private:
    std::string text_;
};

// ---- Disks that can be full ----

class Disk {
public:
    Disk() = default;
    Disk(const Disk&) = delete;
    Disk& operator=(const Disk&) = delete;
    virtual ~Disk() = default;

    virtual void fill() = 0;
    virtual void makeRoom() = 0;
    /// Whether writing to a hole in a file takes room too.
    virtual bool storesPages() const = 0;
};

class SmallFileSystem final : public Disk {
public:
    /// Mounts it for this process only; false when the machine does not allow it.
    static bool mountAt(const std::string& folder) {
        const uid_t user = ::geteuid();
        const gid_t group = ::getegid();
        if (::unshare(CLONE_NEWNS) != 0) {
            if (::unshare(CLONE_NEWUSER | CLONE_NEWNS) != 0) {
                return false;
            }
            std::ofstream("/proc/self/setgroups") << "deny";
            std::ofstream("/proc/self/uid_map") << "0 " << user << " 1";
            std::ofstream("/proc/self/gid_map") << "0 " << group << " 1";
        }
        return ::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
               ::mount("kvt", folder.c_str(), "tmpfs", 0, "size=1m,mode=0700") == 0;
    }

    explicit SmallFileSystem(std::string folder) : filler_(std::move(folder) + "/filler") {}

    void fill() override {
        const int file = ::open(filler_.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
        const std::array<char, 4096> page{};
        while (::write(file, page.data(), page.size()) == static_cast<ssize_t>(page.size())) {
        }
        const int error = errno;
        ::close(file);
        if (error != ENOSPC) {
            throw std::runtime_error("the disk did not fill up");
        }
    }
    void makeRoom() override { fs::remove(filler_); }
    bool storesPages() const override { return true; }

private:
    std::string filler_;
};

class LimitedLength final : public Disk {
public:
    LimitedLength() { ::signal(SIGXFSZ, SIG_IGN); }

    void fill() override { limit(0); }
    void makeRoom() override { limit(RLIM_INFINITY); }
    bool storesPages() const override { return false; }

private:
    static void limit(rlim_t bytes) {
        rlimit limits{};
        ::getrlimit(RLIMIT_FSIZE, &limits);
        limits.rlim_cur = std::min(bytes, limits.rlim_max);
        if (::setrlimit(RLIMIT_FSIZE, &limits) != 0) {
            throw std::runtime_error("no limit on the length of files");
        }
    }
};

// ---- What has to hold on them ----

void temporaryFile(Findings& findings, Disk& disk, const std::string& path) {
    {
        disk.fill();
        memory_manager manager(path, temporaryOptions(headerSize));
        mapped_region_segment segment = manager.create_segment();
        findings.expect(segment.offset() == -1, "a segment without a place has the offset -1");
        for (const bool initialised : {false, true}) {
            findings.expectFailure("loading it", [&] { segment.load(initialised); });
            findings.expect(segment.segment_manager() == nullptr, "it stays not loaded");
            findings.expect(segment.release() == 0, "there is nothing to release");
        }
        findings.expect(fs::file_size(path) == 0, "the file is as long as before");
        disk.makeRoom();
        mapped_region_segment next = manager.create_segment();
        next.load(false);
        put(next, "words", wordsOf(1, 100));
        findings.expect(next.offset() == 0 && get(next, "words") == wordsOf(1, 100), "with room it goes on");
    }
    findings.expect(!fs::exists(path), "a temporary file goes");
}

void newPersistentFile(Findings& findings, Disk& disk, const std::string& path) {
    {
        disk.fill();
        memory_manager manager(path, persistentOptions(headerSize));
        findings.expectFailure("restore", [&] { manager.restore(); });
        findings.expectFailure("save", [&] { manager.save(toSave({1})); });
        findings.expectFailure("create_segment", [&] { manager.create_segment(); });
        findings.expectFailure("open_segment", [&] { manager.open_segment(0); });
    }
    findings.expect(!fs::exists(path), "a file without a header is not left behind");
    disk.makeRoom();
    memory_manager manager(path, persistentOptions(headerSize));
    findings.expect(manager.restore().empty(), "with room the same path is a new file");
    manager.save(toSave({1, 2}));
    findings.expect(reference::readHeader(reference::RawFile(path)).saved == std::vector<Words>{{1, 2}},
                    "which works");
}

// So that nothing that the header does takes room any more.
void storeAllPages(const std::string& path, Word count) {
    std::fstream file(path, std::ios::in | std::ios::out | std::ios::binary);
    std::string bytes(count, '\0');
    file.read(bytes.data(), static_cast<std::streamsize>(count));
    file.seekp(0);
    file.write(bytes.data(), static_cast<std::streamsize>(count));
}

void usedPersistentFile(Findings& findings, Disk& disk, const std::string& path) {
    {
        memory_manager manager(path, persistentOptions(headerSize));
        mapped_region_segment segment = manager.create_segment(8192);
        segment.load(false);
        put(segment, "words", wordsOf(7, 500));
        segment.release();
        manager.save(toSave(wordsOf(8, 300)));
        manager.save(toSave(wordsOf(9, 3)));
        storeAllPages(path, headerSize);
        const Word length = fs::file_size(path);
        disk.fill();
        mapped_region_segment failed = manager.create_segment(16384);
        findings.expect(failed.offset() == -1 && failed.index() == 1, "a segment without a place has a row");
        findings.expectFailure("loading it", [&] { failed.load(false); });
        findings.expectFailure("opening it", [&] { manager.open_segment(1); });
        findings.expect(fs::file_size(path) == length, "the file is as long as before");
        mapped_region_segment same = manager.open_segment(0);
        findings.expect(get(same, "words") == wordsOf(7, 500), "what is there can be read");
        findings.expect(taken(manager.restore()) == wordsOf(8, 300), "and restored");
        manager.save(toSave(wordsOf(10, 200)));
        disk.makeRoom();
        mapped_region_segment next = manager.create_segment(4096);
        next.load(false);
        put(next, "words", wordsOf(11, 50));
        findings.expect(next.offset() == static_cast<std::int64_t>(length),
                        "with room the next lies at the end");
    }
    const reference::Header header = reference::readHeader(reference::RawFile(path));
    const std::vector<reference::SegmentRow> rows = {
        {headerSize, 8192}, {-1, 16384}, {headerSize + 8192, 4096}};
    findings.expect(header.rows == rows, "the rows are those of the three");
    findings.expect(header.saved == std::vector<Words>{wordsOf(9, 3), wordsOf(10, 200)},
                    "two vectors are saved");
    memory_manager manager(path, persistentOptions(headerSize));
    mapped_region_segment first = manager.open_segment(0);
    mapped_region_segment last = manager.open_segment(2);
    findings.expect(get(first, "words") == wordsOf(7, 500) && get(last, "words") == wordsOf(11, 50),
                    "the file opens again");
    findings.expectFailure("opening the one without a place", [&] { manager.open_segment(1); });
}

// The segment found its place, but its heap finds no room.
void newHeap(Findings& findings, Disk& disk, const std::string& path) {
    memory_manager manager(path, temporaryOptions(headerSize));
    mapped_region_segment segment = manager.create_segment();
    disk.fill();
    const int error = findings.expectFailure("making a heap", [&] { segment.load(false); });
    findings.expect(error == ENOSPC, "the failure is the system's: " + std::to_string(error));
    findings.expect(segment.segment_manager() == nullptr && segment.release() == 0, "it stays not loaded");
    disk.makeRoom();
    segment.load(false);
    put(segment, "words", wordsOf(1, 1000));
    findings.expect(get(segment, "words") == wordsOf(1, 1000), "with room the same segment can be loaded");
}

std::string allOn(Disk& disk, const std::string& folder) {
    Findings findings;
    temporaryFile(findings, disk, folder + "/temporary");
    newPersistentFile(findings, disk, folder + "/new");
    usedPersistentFile(findings, disk, folder + "/used");
    if (disk.storesPages()) {
        newHeap(findings, disk, folder + "/heap");
    }
    return findings.text();
}

TEST(FullDisk, FailsAsStatedAndLeavesNothingHalfMade) {
    const ScratchFolder folder;
    EXPECT_EQ(inForkedProcess([&] {
                  if (SmallFileSystem::mountAt(folder.path())) {
                      SmallFileSystem disk(folder.path());
                      return allOn(disk, folder.path());
                  }
                  LimitedLength disk;
                  return allOn(disk, folder.path());
              }),
              "");
}

TEST(FullDisk, ALimitOnTheLengthOfFilesIsTheSame) {
    const ScratchFolder folder;
    EXPECT_EQ(inForkedProcess([&] {
                  LimitedLength disk;
                  return allOn(disk, folder.path());
              }),
              "");
}

// ---- Folders and files that may not be written ----

// Root may write what its owner may not, by a capability that this process gives up, with all others.
void obeyModes() {
    __user_cap_header_struct header{};
    header.version = _LINUX_CAPABILITY_VERSION_3;
    const std::array<__user_cap_data_struct, 2> none{};
    if (::syscall(SYS_capset, &header, none.data()) != 0) {
        throw std::runtime_error("cannot give up capabilities");
    }
}

std::vector<std::string> namesIn(const std::string& folder) {
    std::vector<std::string> names;
    for (const auto& entry : fs::directory_iterator(folder)) {
        names.push_back(entry.path().filename());
    }
    return names;
}

std::string contentsOf(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

const std::vector<manager_options>& bothKinds() {
    static const std::vector<manager_options> kinds = {temporaryOptions(headerSize),
                                                       persistentOptions(headerSize)};
    return kinds;
}

TEST(Unwritable, AFolderStaysEmpty) {
    const ScratchFolder folder;
    ASSERT_EQ(::chmod(folder.path().c_str(), 0555), 0);
    EXPECT_EQ(inForkedProcess([&] {
                  obeyModes();
                  Findings findings;
                  const std::string path = folder.file("backing");
                  findings.expect(::open(path.c_str(), O_CREAT | O_RDWR, 0600) < 0 && errno == EACCES,
                                  "the folder cannot be written");
                  for (const manager_options& options : bothKinds()) {
                      const int error = findings.expectFailure(
                          "making a file", [&] { const memory_manager made(path, options); });
                      findings.expect(error == ENOENT,
                                      "the failure is the system's: " + std::to_string(error));
                  }
                  findings.expect(namesIn(folder.path()).empty(), "nothing is in the folder");
                  return findings.text();
              }),
              "");
}

TEST(Unwritable, AFileKeepsWhatItHolds) {
    const ScratchFolder folder;
    const std::string path = folder.file("backing");
    const std::string contents(2 * headerSize, 'x');
    std::ofstream(path, std::ios::binary) << contents;
    ASSERT_EQ(::chmod(path.c_str(), 0444), 0);
    EXPECT_EQ(inForkedProcess([&] {
                  obeyModes();
                  Findings findings;
                  for (const manager_options& options : bothKinds()) {
                      const int error = findings.expectFailure(
                          "opening the file", [&] { const memory_manager made(path, options); });
                      findings.expect(error == EACCES,
                                      "the failure is the system's: " + std::to_string(error));
                  }
                  return findings.text();
              }),
              "");
    EXPECT_EQ(contentsOf(path), contents);
    EXPECT_EQ(namesIn(folder.path()).size(), 1U);
}

TEST(Unwritable, NeitherAFolderNorAMissingFolderIsAFile) {
    const ScratchFolder folder;
    const std::string inner = folder.file("inner");
    fs::create_directory(inner);
    for (const manager_options& options : bothKinds()) {
        EXPECT_THROW(memory_manager(inner, options), interprocess_exception);
        EXPECT_THROW(memory_manager(folder.file("missing/backing"), options), interprocess_exception);
        EXPECT_THROW(memory_manager(inner + "/", options), interprocess_exception);
        EXPECT_THROW(memory_manager("", options), interprocess_exception);
    }
    EXPECT_EQ(namesIn(folder.path()), std::vector<std::string>{"inner"});
    EXPECT_TRUE(namesIn(inner).empty());
}

TEST(Unwritable, AFolderThatBecomesSoKeepsItsFilesInUse) {
    const ScratchFolder folder;
    EXPECT_EQ(
        inForkedProcess([&] {
            obeyModes();
            Findings findings;
            const std::string path = folder.file("persistent");
            { memory_manager(path, persistentOptions(headerSize)).save(toSave({5})); }
            {
                const memory_manager temporary(folder.file("temporary"), temporaryOptions(headerSize));
                ::chmod(folder.path().c_str(), 0555);
            }
            findings.expect(fs::exists(folder.file("temporary")), "what cannot be deleted stays, in silence");
            memory_manager manager(path, persistentOptions(headerSize));
            mapped_region_segment segment = manager.create_segment();
            segment.load(false);
            put(segment, "words", wordsOf(1, 10));
            findings.expect(segment.offset() == static_cast<std::int64_t>(headerSize), "the file can grow");
            findings.expect(taken(manager.restore()) == Words{5}, "and its header change");
            return findings.text();
        }),
        "");
    ::chmod(folder.path().c_str(), 0700);
}

} // namespace
