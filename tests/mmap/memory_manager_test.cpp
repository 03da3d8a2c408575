// A file of segments: what makes it, what it looks like from outside, where segments lie, and when it goes. What
// goes wrong on the way stands in memory_manager_failure_test.cpp.

#include "manager_fixture.h"
#include "scratch.h"
#include <support/private_member.h>

#include <kvt/mmap/memory_manager.h>

#include <boost/interprocess/exceptions.hpp>
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <string>
#include <sys/mman.h>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

namespace kvt::test {

struct LoadSegment {
    using Type = ex::mmap::mapped_region_segment (ex::mmap::memory_manager::*)(
        unsigned long long index, future::optional<unsigned long long> size);
    friend Type memberOf(LoadSegment);
};
template struct Opens<LoadSegment, &ex::mmap::memory_manager::load_segment>;

namespace {

namespace fs = std::filesystem;
namespace ipc = boost::interprocess;
using ex::mmap::k_no_index;
using ex::mmap::manager_options;
using ex::mmap::mapped_region_segment;
using ex::mmap::memory_manager;
using Words = ex::vector<unsigned long long>;

mapped_region_segment loadSegment(memory_manager& manager, std::uint64_t index,
                                  future::optional<unsigned long long> size = {}) {
    return (manager.*memberOf(LoadSegment()))(index, size);
}

std::string rangeFailure(memory_manager& manager, std::uint64_t index) {
    try {
        manager.open_segment(index);
    } catch (const std::out_of_range& failure) {
        return failure.what();
    }
    return "none";
}

const std::string indexOutOfRange = "memory_manager: segment index out of range";

// ---- Options -----------------------------------------------------------------------------------------------------

TEST(ManagerOptions, AreAnAggregateWithDefaults) {
    static_assert(std::is_aggregate_v<manager_options>);
    static_assert(std::is_same_v<decltype(manager_options::segment_size), unsigned long long>);
    static_assert(std::is_same_v<decltype(manager_options::persistent), bool>);
    static_assert(manager_options::k_default_segment_size == 16777216);
    const manager_options defaults;
    EXPECT_EQ(defaults.segment_size, manager_options::k_default_segment_size);
    EXPECT_FALSE(defaults.persistent);
}

TEST_F(MemoryManager, SizesAreRoundedUpToWholePages) {
    const std::uint64_t one = page();
    const struct {
        int line;
        std::uint64_t given;
        std::uint64_t rounded;
    } rows[] = {
        {__LINE__, 0, 0},
        {__LINE__, 1, one},
        {__LINE__, one - 1, one},
        {__LINE__, one, one},
        {__LINE__, one + 1, 2 * one},
        {__LINE__, 2 * one, 2 * one},
        {__LINE__, 16777215, 16777216},
        {__LINE__, 16777216, 16777216},
        {__LINE__, allOnes - one + 1, allOnes - one + 1},
        {__LINE__, allOnes, 0}, // the arithmetic wraps
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(testing::Message() << "row at line " << row.line << ": " << row.given);
        memory_manager manager(path, temporary(row.given));
        EXPECT_EQ(manager.options().segment_size, row.rounded);
        EXPECT_FALSE(manager.options().persistent);
        EXPECT_EQ(manager.create_segment(row.given).size(), row.rounded);
        EXPECT_EQ(manager.create_segment().size(), row.rounded);
    }
}

TEST_F(MemoryManager, AnswersWhetherItIsPersistent) {
    EXPECT_FALSE(memory_manager(path, temporary()).persistent());
    const memory_manager manager(path, persistent());
    EXPECT_TRUE(manager.persistent());
    EXPECT_TRUE(manager.options().persistent);
}

// ---- Temporary files ---------------------------------------------------------------------------------------------

TEST_F(MemoryManager, TemporaryFileIsThereWhileAHandleIs) {
    {
        const memory_manager manager(path, temporary());
        EXPECT_TRUE(fs::exists(path));
        EXPECT_EQ(lengthOf(path), 0u);
    }
    EXPECT_TRUE(scratch.isEmpty());
}

TEST_F(MemoryManager, TemporaryEmptiesAFileThatIsThere) {
    write(path, std::string(100000, 'x'));
    {
        memory_manager manager(path, temporary());
        EXPECT_EQ(lengthOf(path), 0u);
        EXPECT_EQ(manager.create_segment().offset(), 0);
    }
    EXPECT_FALSE(fs::exists(path));
}

TEST_F(MemoryManager, FilesCanBeReadAndWrittenByTheirOwnerOnly) {
    const memory_manager manager(path, temporary());
    const memory_manager other(scratch.file("other"), persistent());
    const auto expected = fs::perms::owner_read | fs::perms::owner_write;
    EXPECT_EQ(fs::status(path).permissions(), expected);
    EXPECT_EQ(fs::status(scratch.file("other")).permissions(), expected);
}

TEST_F(MemoryManager, FileStaysWithThisProgram) {
    memory_manager manager(path, temporary());
    mapped_region_segment segment = manager.create_segment();
    segment.load(false);
    int found = 0;
    for (const auto& entry : fs::directory_iterator("/proc/self/fd")) {
        std::error_code gone;
        if (fs::read_symlink(entry.path(), gone) == path) {
            ++found;
            EXPECT_TRUE((::fcntl(std::stoi(entry.path().filename()), F_GETFD) & FD_CLOEXEC) != 0);
        }
    }
    EXPECT_EQ(found, 1) << "one open file for the life of the manager";
}

TEST_F(MemoryManager, TemporarySegmentsLieOneAfterTheOtherFromZeroWithoutAnIndex) {
    memory_manager manager(path, temporary(2 * page()));
    std::uint64_t end = 0;
    for (const std::uint64_t size : std::array<std::uint64_t, 5>{1, page(), 3 * page() + 1, 5, page() * 40}) {
        const mapped_region_segment segment = manager.create_segment(size);
        EXPECT_EQ(segment.offset(), static_cast<std::int64_t>(end)) << size;
        EXPECT_EQ(segment.index(), k_no_index);
        EXPECT_EQ(segment.segment_manager(), nullptr) << "mapped already";
        end += segment.size();
        EXPECT_EQ(lengthOf(path), end);
    }
}

TEST_F(MemoryManager, TemporaryMakesANewSegmentWhateverTheIndex) {
    memory_manager manager(path, temporary());
    std::int64_t expected = 0;
    for (const std::uint64_t index : std::array<std::uint64_t, 5>{0, 0, 1, k_no_index, allOnes}) {
        const mapped_region_segment segment = manager.open_segment(index);
        EXPECT_EQ(segment.offset(), expected) << index;
        EXPECT_EQ(segment.index(), k_no_index);
        EXPECT_EQ(segment.segment_manager(), nullptr);
        expected += 65536;
    }
    EXPECT_EQ(loadSegment(manager, 7, 1).size(), page());
}

TEST_F(MemoryManager, TemporarySavesNothing) {
    memory_manager manager(path, temporary());
    manager.save({1, 2, 3});
    EXPECT_EQ(lengthOf(path), 0u);
    EXPECT_TRUE(manager.restore().empty());
}

// ---- Persistent files --------------------------------------------------------------------------------------------

TEST_F(MemoryManager, NewPersistentFileHasTheLengthOfItsHeaderSegmentAndNoHeap) {
    for (const std::uint64_t size : std::array<std::uint64_t, 3>{1, 5 * page() - 1, 65536}) {
        const std::string file = scratch.file(std::to_string(size));
        {
            const memory_manager manager(file, persistent(size));
            EXPECT_EQ(lengthOf(file), manager.options().segment_size);
            EXPECT_GE(lengthOf(file), size);
        }
        const std::uint64_t rounded = (size + page() - 1) / page() * page();
        EXPECT_EQ(contentsOf(file), std::string(rounded, '\0'))
            << "the file stays, and nobody asked for the header";
    }
}

TEST_F(MemoryManager, NewFilesTakeNoRoomForWhatNobodyWroteTo) {
    memory_manager manager(path, persistent(std::uint64_t(1) << 30));
    EXPECT_EQ(lengthOf(path), std::uint64_t(1) << 30);
    EXPECT_LE(roomOf(path), 64 * 1024u);
    mapped_region_segment segment = manager.create_segment(std::uint64_t(1) << 32);
    segment.load(false);
    EXPECT_EQ(lengthOf(path), (std::uint64_t(1) << 30) + (std::uint64_t(1) << 32));
    EXPECT_LE(roomOf(path), 256 * 1024u);
}

// A first touch of a hole by mapped memory has the system read in a long stretch of zeros around it, which takes
// milliseconds.
TEST_F(MemoryManager, NewHeapBringsNoMoreIntoMemoryThanItsEnds) {
    memory_manager manager(path, temporary(manager_options::k_default_segment_size));
    manager.create_segment();
    mapped_region_segment segment = manager.create_segment();
    segment.load(false);
    std::vector<unsigned char> inMemory(segment.size() / page());
    ASSERT_EQ(::mincore(segment.segment_manager(), segment.size(), inMemory.data()), 0);
    const auto pages =
        std::count_if(inMemory.begin(), inMemory.end(), [](unsigned char flags) { return (flags & 1) != 0; });
    EXPECT_GE(pages, 2);
    EXPECT_LE(pages, 64);
}

TEST_F(MemoryManager, PersistentSegmentsGetIndicesAndAreFoundAgain) {
    const std::array<std::uint64_t, 4> sizes = {1, 3 * page(), 65536, page() + 1};
    std::vector<std::int64_t> offsets;
    {
        memory_manager manager(path, persistent());
        for (std::uint64_t i = 0; i < sizes.size(); ++i) {
            mapped_region_segment segment = manager.create_segment(sizes[i]);
            EXPECT_EQ(segment.index(), i);
            EXPECT_EQ(segment.segment_manager(), nullptr);
            segment.load(false);
            put(segment, 100 + i);
            offsets.push_back(segment.offset());
        }
        EXPECT_EQ(manager.create_segment().index(), 4u);
        EXPECT_EQ(offsets[0], 65536) << "index 0 is the first segment after the header segment";
        EXPECT_EQ(offsets[1], 65536 + static_cast<std::int64_t>(page()));
    }
    for (int run = 0; run < 2; ++run) {
        memory_manager manager(path, persistent());
        for (std::uint64_t i = 0; i < sizes.size(); ++i) {
            const mapped_region_segment segment = manager.open_segment(i);
            EXPECT_EQ(segment.index(), i);
            EXPECT_EQ(segment.offset(), offsets[i]);
            EXPECT_EQ(segment.size(), (sizes[i] + page() - 1) / page() * page());
            ASSERT_NE(segment.segment_manager(), nullptr) << "comes loaded";
            EXPECT_EQ(get(segment), 100 + i);
        }
        EXPECT_EQ(rangeFailure(manager, 5), indexOutOfRange);
    }
}

TEST_F(MemoryManager, EndOfTheFileSaysWhereASegmentGoes) {
    memory_manager manager(path, persistent());
    const std::int64_t first = manager.create_segment(page()).offset();
    fs::resize_file(path, lengthOf(path) + 10 * page());
    const std::int64_t second = manager.create_segment(page()).offset();
    EXPECT_EQ(second, first + static_cast<std::int64_t>(11 * page()));
    EXPECT_EQ(manager.open_segment(0).offset(), first);
    EXPECT_EQ(mappingFailure([&] { EXPECT_EQ(manager.open_segment(1).offset(), second); }), "none");
}

TEST_F(MemoryManager, IndexBeyondTheTableThrowsAndMakesNothing) {
    memory_manager manager(path, persistent());
    for (std::uint64_t rows = 0; rows < 3; ++rows) {
        const std::uint64_t before = lengthOf(path);
        for (const std::uint64_t index :
             std::array<std::uint64_t, 5>{rows, rows + 1, k_no_index - 1, k_no_index + 1, allOnes}) {
            EXPECT_EQ(rangeFailure(manager, index), indexOutOfRange) << index;
        }
        EXPECT_EQ(lengthOf(path), before);
        EXPECT_EQ(manager.open_segment(k_no_index).index(), rows) << "no index: a new one";
    }
}

TEST_F(MemoryManager, SizeIsRoundedForANewSegmentAndIgnoredForOneThatExists) {
    memory_manager manager(path, persistent());
    EXPECT_EQ(loadSegment(manager, k_no_index, 1).size(), page());
    EXPECT_EQ(loadSegment(manager, k_no_index, page() + 1).size(), 2 * page());
    EXPECT_EQ(loadSegment(manager, k_no_index).size(), 65536u);
    const std::uint64_t length = lengthOf(path);
    EXPECT_EQ(loadSegment(manager, 0, 1 << 20).size(), page());
    EXPECT_EQ(loadSegment(manager, 1, 0).size(), 2 * page());
    EXPECT_EQ(lengthOf(path), length);
}

TEST_F(MemoryManager, FileMadeAndNeverUsedOpensAsANewOne) {
    for (int round = 0; round < 3; ++round) {
        const memory_manager manager(path, persistent());
    }
    EXPECT_EQ(contentsOf(path), std::string(65536, '\0'));
    {
        memory_manager manager(path, persistent());
        EXPECT_EQ(manager.create_segment().index(), 0u);
        manager.save({5});
    }
    memory_manager manager(path, persistent());
    EXPECT_EQ(manager.restore(), Words({5}));
    EXPECT_EQ(manager.open_segment(0).offset(), 65536);
}

// What lies in the part that is mapped can be read; changing the heap would reach beyond it.
TEST_F(MemoryManager, SmallerHeaderSizeMapsLessWithoutComplaint) {
    {
        memory_manager manager(path, persistent(16 * page()));
        mapped_region_segment segment = manager.create_segment();
        segment.load(false);
        put(segment, 4);
    }
    memory_manager manager(path, persistent(page()));
    EXPECT_EQ(manager.options().segment_size, page());
    EXPECT_EQ(get(manager.open_segment(0)), 4u);
}

TEST_F(MemoryManager, LargerHeaderSizeThanTheFileFailsInTheConstructor) {
    {
        memory_manager manager(path, persistent(16 * page()));
        manager.save({1, 2});
    }
    for (const std::uint64_t size :
         std::array<std::uint64_t, 3>{17 * page(), 16 * page() + 1, std::uint64_t(1) << 40}) {
        expectOutsideTheFile([&] { const memory_manager manager(path, persistent(size)); });
    }
    EXPECT_EQ(lengthOf(path), 16 * page());
    EXPECT_EQ(memory_manager(path, persistent(16 * page())).restore(), Words({1, 2}));
}

TEST_F(MemoryManager, FileShorterThanItsHeaderFailsInTheConstructorAndStays) {
    for (const std::uint64_t length : std::array<std::uint64_t, 4>{0, 1, page(), 65535}) {
        write(path, std::string(length, '\0'));
        expectOutsideTheFile([&] { const memory_manager manager(path, persistent()); });
        EXPECT_EQ(contentsOf(path), std::string(length, '\0'));
    }
}

TEST_F(MemoryManager, EmptyHeaderSegmentIsNoHeader) {
    {
        memory_manager manager(path, persistent(0));
        EXPECT_EQ(manager.options().segment_size, 0u);
        EXPECT_EQ(lengthOf(path), 0u);
        expectOutsideTheFile([&] { manager.restore(); });
    }
    expectOutsideTheFile([&] { const memory_manager manager(path, persistent(0)); });
}

// ---- save and restore --------------------------------------------------------------------------------------------

Words wordsOf(std::uint64_t seed, std::size_t count) {
    Words words;
    for (std::size_t i = 0; i < count; ++i) {
        words.push_back(seed * 1000003 + i * i);
    }
    return words;
}

TEST_F(MemoryManager, RestoreGivesWhatWasSavedOldestFirst) {
    memory_manager manager(path, persistent());
    manager.save({1});
    manager.save({2, 22});
    manager.save({3, 33, 333});
    EXPECT_EQ(manager.restore(), Words({1}));
    EXPECT_EQ(manager.restore(), Words({2, 22}));
    EXPECT_EQ(manager.restore(), Words({3, 33, 333}));
    EXPECT_EQ(manager.restore(), Words());
}

TEST_F(MemoryManager, QueueLivesOnInTheFile) {
    std::uint64_t saved = 0;
    std::uint64_t restored = 0;
    for (int run = 0; run < 20; ++run) {
        memory_manager manager(path, persistent(std::uint64_t(1) << 20));
        for (int i = 0; i < 7; ++i, ++saved) {
            manager.save(wordsOf(saved, saved * 5 % 300)); // over blocks of rows and of words
        }
        for (int i = 0; i < 5; ++i, ++restored) {
            ASSERT_EQ(manager.restore(), wordsOf(restored, restored * 5 % 300)) << restored;
        }
    }
    memory_manager manager(path, persistent(std::uint64_t(1) << 20));
    for (; restored < saved; ++restored) {
        ASSERT_EQ(manager.restore(), wordsOf(restored, restored * 5 % 300)) << restored;
    }
    EXPECT_TRUE(manager.restore().empty());
}

TEST_F(MemoryManager, EmptyVectorIsSavedAsSuch) {
    memory_manager manager(path, persistent());
    manager.save({});
    manager.save({4});
    EXPECT_EQ(manager.restore(), Words());
    EXPECT_EQ(manager.restore(), Words({4}));
}

TEST_F(MemoryManager, RestoreFreesTheRoomInTheHeader) {
    memory_manager manager(path, persistent(65536));
    for (std::uint64_t round = 0; round < 200; ++round) {
        manager.save(wordsOf(round, 5000)); // more than half of what there is
        ASSERT_EQ(manager.restore(), wordsOf(round, 5000));
    }
}

TEST_F(MemoryManager, FullHeaderFailsToSaveAndKeepsTheRest) {
    memory_manager manager(path, persistent(page()));
    manager.save({1, 2, 3});
    try {
        manager.save(wordsOf(1, 100000));
        FAIL() << "there is no room for that";
    } catch (const ipc::bad_alloc& failure) {
        EXPECT_STREQ(failure.what(), "boost::interprocess::bad_alloc");
    }
    EXPECT_EQ(manager.restore(), Words({1, 2, 3}));
    const Words rest = manager.restore(); // some of the words, or none
    const Words all = wordsOf(1, 100000);
    ASSERT_LT(rest.size(), all.size());
    EXPECT_TRUE(std::equal(rest.begin(), rest.end(), all.begin()));
    EXPECT_TRUE(manager.restore().empty());
    manager.save({7});
    EXPECT_EQ(manager.restore(), Words({7}));
}

TEST_F(MemoryManager, FullHeaderFailsToMakeASegmentForWhichTheFileHasGrown) {
    std::uint64_t rows = 0;
    std::uint64_t length = 0;
    {
        memory_manager manager(path, persistent(page()));
        for (;; ++rows) {
            length = lengthOf(path);
            try {
                const mapped_region_segment segment = manager.create_segment(page());
                EXPECT_EQ(segment.index(), rows);
                EXPECT_EQ(segment.offset(), static_cast<std::int64_t>(length));
            } catch (const ipc::bad_alloc& failure) {
                EXPECT_STREQ(failure.what(), "boost::interprocess::bad_alloc");
                break;
            }
        }
        EXPECT_GT(rows, 32u);
        EXPECT_EQ(lengthOf(path), length + page()) << "bytes that are no one's";
        EXPECT_THROW(manager.create_segment(page()), ipc::bad_alloc);
        EXPECT_EQ(lengthOf(path), length + 2 * page());
    }
    memory_manager manager(path, persistent(page()));
    EXPECT_EQ(manager.open_segment(rows - 1).offset(), static_cast<std::int64_t>(length - page()));
    EXPECT_EQ(rangeFailure(manager, rows), indexOutOfRange);
}

// ---- Handles -----------------------------------------------------------------------------------------------------

TEST_F(MemoryManager, CopiesShareOneFileUntilTheLastGoes) {
    auto first = std::make_unique<memory_manager>(path, temporary());
    memory_manager second(*first);
    first->create_segment();
    EXPECT_EQ(second.create_segment().offset(), 65536);
    EXPECT_EQ(&first->options(), &second.options());
    first.reset();
    EXPECT_TRUE(fs::exists(path));
    {
        memory_manager third(std::move(second));
        EXPECT_EQ(third.create_segment().offset(), 2 * 65536);
    }
    EXPECT_FALSE(fs::exists(path)) << "a moved-from handle holds nothing";
}

TEST_F(MemoryManager, AssignmentLetsGoOfTheOldFile) {
    memory_manager left(scratch.file("left"), temporary());
    memory_manager right(scratch.file("right"), temporary());
    left = right;
    EXPECT_FALSE(fs::exists(scratch.file("left")));
    EXPECT_EQ(&left.options(), &right.options());
    memory_manager third(scratch.file("third"), temporary());
    left = std::move(third);
    EXPECT_TRUE(fs::exists(scratch.file("right")));
    EXPECT_TRUE(fs::exists(scratch.file("third")));
    third = right; // a moved-from handle can be assigned to
    EXPECT_EQ(&third.options(), &right.options());
}

TEST_F(MemoryManager, HandleIsOnePointerOnOneBlock) {
    static_assert(sizeof(memory_manager) == sizeof(void*));
    static_assert(std::is_base_of_v<ex::detail::PimplShared<ex::mmap::memory_manager_impl, std::mutex>,
                                    memory_manager>);
    static_assert(std::is_nothrow_copy_constructible_v<memory_manager>);
    static_assert(std::is_nothrow_move_constructible_v<memory_manager>);
    static_assert(std::is_nothrow_copy_assignable_v<memory_manager>);
    static_assert(std::is_nothrow_move_assignable_v<memory_manager>);
}

TEST_F(MemoryManager, LoadedSegmentOutlivesItsManagerAndItsFile) {
    mapped_region_segment segment;
    {
        memory_manager manager(path, temporary());
        segment = manager.create_segment(1 << 20);
        segment.load(false);
        put(segment, 3);
    }
    EXPECT_FALSE(fs::exists(path)) << "deleted although it is mapped";
    EXPECT_EQ(get(segment), 3u);
    std::memset(segment.segment_manager()->allocate(500000), 7, 500000);
    EXPECT_TRUE(segment.segment_manager()->check_sanity());
    EXPECT_EQ(segment.release(), std::uint64_t(1) << 20);
}

TEST_F(MemoryManager, DeletionThatFailsIsIgnored) {
    auto manager = std::make_unique<memory_manager>(path, temporary());
    fs::remove(path);
    fs::create_directory(path);
    manager.reset();
    EXPECT_TRUE(fs::is_directory(path));
}

TEST_F(MemoryManager, ThreadsShareHandlesTableAndQueue) {
    constexpr int threads = 8;
    constexpr int rounds = 50;
    {
        const memory_manager manager(path, persistent(std::uint64_t(1) << 20));
        std::vector<std::thread> workers;
        workers.reserve(threads);
        for (int i = 0; i < threads; ++i) {
            workers.emplace_back([handle = memory_manager(manager), i]() mutable {
                for (int round = 0; round < rounds; ++round) {
                    memory_manager own(handle);
                    mapped_region_segment segment = own.create_segment(page());
                    segment.load(false);
                    put(segment, segment.index());
                    own.save({static_cast<std::uint64_t>(i), static_cast<std::uint64_t>(round)});
                    EXPECT_TRUE(own.persistent());
                }
            });
        }
        for (std::thread& worker : workers) {
            worker.join();
        }
    }
    memory_manager manager(path, persistent(std::uint64_t(1) << 20));
    for (std::uint64_t index = 0; index < threads * rounds; ++index) {
        ASSERT_EQ(get(manager.open_segment(index)), index);
    }
    EXPECT_EQ(rangeFailure(manager, threads * rounds), indexOutOfRange);
    std::array<std::uint64_t, threads> next{};
    for (int i = 0; i < threads * rounds; ++i) {
        const Words words = manager.restore();
        ASSERT_EQ(words.size(), 2u);
        ASSERT_EQ(words[1], next.at(words[0])++) << "each thread's own come in their order";
    }
    EXPECT_TRUE(manager.restore().empty());
}

} // namespace
} // namespace kvt::test
