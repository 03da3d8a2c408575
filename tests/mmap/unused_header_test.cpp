// The header of a persistent file that nobody has used yet. Its stretch is zeros, and the first one that wants it makes
// a heap of them; whoever comes later, with a manager that is older perhaps, finds that heap.

#include "manager_fixture.h"
#include "scratch.h"

#include <kvt/mmap/memory_manager.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <string>

namespace kvt::test {
namespace {

namespace fs = std::filesystem;
using ex::mmap::mapped_region_segment;
using ex::mmap::memory_manager;
using Words = ex::vector<unsigned long long>;
using UnusedHeader = MemoryManager;

TEST_F(UnusedHeader, IsMadeByTheOneOfTwoManagersThatWantsItFirst) {
    for (const bool byTheSecond : {false, true}) {
        SCOPED_TRACE(byTheSecond);
        fs::remove(path);
        memory_manager first(path, persistent());
        memory_manager second(path, persistent());
        memory_manager& makes = byTheSecond ? second : first;
        memory_manager& finds = byTheSecond ? first : second;
        makes.save({1, 2});
        mapped_region_segment segment = makes.create_segment();
        segment.load(false);
        put(segment, 7);
        finds.save({3});
        EXPECT_EQ(get(finds.open_segment(0)), 7u);
        EXPECT_EQ(makes.restore(), Words({1, 2}));
        EXPECT_EQ(finds.restore(), Words({3}));
    }
}

TEST_F(UnusedHeader, StaysUnusedUntilItIsWanted) {
    { const memory_manager manager(path, persistent()); }
    { const memory_manager manager(path, persistent()); }
    EXPECT_EQ(contentsOf(path), std::string(65536, '\0'));
}

// As a file that was made by another program, for which no byte was ever written.
TEST_F(UnusedHeader, MayBeAHoleUpToTheEndOfTheFile) {
    {
        memory_manager manager(path, persistent());
        manager.save({5, 6});
    }
    const std::string made = contentsOf(path);
    const std::string other = scratch.file("hole");
    for (const std::uint64_t length : {65536U, 3 * 65536U}) {
        SCOPED_TRACE(length);
        fs::remove(other);
        write(other, "");
        fs::resize_file(other, length);
        {
            memory_manager manager(other, persistent());
            manager.save({5, 6});
        }
        EXPECT_EQ(contentsOf(other), made + std::string(length - 65536, '\0'));
        EXPECT_EQ(memory_manager(other, persistent()).restore(), Words({5, 6}));
    }
}

} // namespace
} // namespace kvt::test
