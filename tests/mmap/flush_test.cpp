// What is put on the disk, and when: this program's msync stands before the system's and writes down each call.

#include "scratch.h"

#include <kvt/mmap/memory_manager.h>

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <dlfcn.h>
#include <sys/mman.h>
#include <utility>
#include <vector>

namespace {

struct Flush {
    void* address;
    std::size_t bytes;
    int flags;
};

std::vector<Flush> flushes;
bool failToFlush = false;

} // namespace

extern "C" int msync(void* address, std::size_t bytes, int flags) {
    flushes.push_back({address, bytes, flags});
    if (failToFlush) {
        errno = EIO;
        return -1;
    }
    using System = int (*)(void*, std::size_t, int);
    System system = nullptr;
    void* const found = ::dlsym(RTLD_NEXT, "msync");
    std::memcpy(&system, &found, sizeof system);
    return system(address, bytes, flags);
}

namespace kvt::test {
namespace {

using ex::mmap::mapped_region_segment;
using ex::mmap::memory_manager;

class Flushing : public testing::Test {
protected:
    Flushing() {
        flushes.clear();
        failToFlush = false;
    }
    ~Flushing() override { failToFlush = false; }

    mapped_region_segment loaded() {
        mapped_region_segment segment = manager.create_segment();
        segment.load(false);
        return segment;
    }

    void expectOneOf(void* address, std::uint64_t bytes) {
        ASSERT_EQ(flushes.size(), 1u);
        EXPECT_EQ(flushes[0].address, address);
        EXPECT_EQ(flushes[0].bytes, bytes);
        EXPECT_EQ(flushes[0].flags, MS_SYNC);
        flushes.clear();
    }

    Scratch scratch;
    memory_manager manager{scratch.file(), {65536, true}};
};

TEST_F(Flushing, ReleaseOfAnEmptyHeapFlushesNothing) {
    mapped_region_segment never = loaded();
    EXPECT_EQ(never.release(), 65536u);
    mapped_region_segment emptied = loaded();
    void* const bytes = emptied.segment_manager()->allocate(100);
    std::memset(bytes, 1, 100);
    emptied.segment_manager()->deallocate(bytes);
    EXPECT_EQ(emptied.release(), 65536u);
    EXPECT_TRUE(flushes.empty());
}

TEST_F(Flushing, ReleaseOfAHeapWithSomethingInItFlushesTheWholeSegmentAndWaits) {
    mapped_region_segment segment = loaded();
    for (int round = 0; round < 3; ++round) {
        segment.segment_manager()->allocate(1);
        void* const base = segment.segment_manager();
        EXPECT_EQ(segment.release(), 65536u);
        expectOneOf(base, 65536);
        EXPECT_EQ(segment.release(), 0u);
        EXPECT_TRUE(flushes.empty());
        segment.load(false);
    }
}

TEST_F(Flushing, NamedObjectsCountAsSomething) {
    mapped_region_segment segment = loaded();
    segment.segment_manager()->construct<int>("number")(1);
    void* const base = segment.segment_manager();
    segment.release();
    expectOneOf(base, 65536);
}

TEST_F(Flushing, FailureToFlushIsIgnored) {
    mapped_region_segment segment = loaded();
    *segment.segment_manager()->construct<int>("number")(1) = 5;
    failToFlush = true;
    EXPECT_EQ(segment.release(), 65536u);
    EXPECT_EQ(flushes.size(), 1u);
    segment.load(false);
    EXPECT_EQ(*segment.segment_manager()->find<int>("number").first, 5);
}

TEST_F(Flushing, NothingElseFlushes) {
    {
        mapped_region_segment segment = loaded();
        segment.segment_manager()->allocate(1000);
        mapped_region_segment moved(std::move(segment));
        segment = mapped_region_segment();
        manager.open_segment(0);
    } // destroyed with something in it
    {
        memory_manager other(scratch.file("other"), {65536, true});
        other.save({1, 2, 3});
        other.restore();
        other.save({4});
    } // taken down with something in its header
    EXPECT_TRUE(flushes.empty());
    memory_manager other(scratch.file("other"), {65536, true});
    EXPECT_EQ(other.restore(), ex::vector<unsigned long long>({4}));
}

} // namespace
} // namespace kvt::test
