// One stretch of a file: loading, releasing, moving, and the heap in it.

#include "scratch.h"

#include <kvt/mmap/mapped_region_segment.h>

#include <boost/container/deque.hpp>
#include <boost/interprocess/file_mapping.hpp>
#include <gtest/gtest.h>

#include <array>
#include <cstdint>
#include <functional>
#include <type_traits>
#include <utility>

namespace kvt::test {
namespace {

namespace ipc = boost::interprocess;
using ex::mmap::k_no_index;
using ex::mmap::mapped_region_segment;
using ex::mmap::segment_allocator;
using ex::mmap::segment_heap;

using Numbers = boost::container::deque<std::uint64_t, segment_allocator<std::uint64_t>>;

// A file of `pages` pages that are zeros, mapped by nobody yet.
class MappedRegionSegment : public testing::Test {
protected:
    static constexpr int pages = 8;

    MappedRegionSegment() {
        write(path, std::string(pages * page(), '\0'));
        mapping = ipc::file_mapping(path.c_str(), ipc::read_write);
    }

    mapped_region_segment segmentAt(std::int64_t offset, std::uint64_t size,
                                    std::uint64_t index = k_no_index) {
        return {&mapping, offset, size, index};
    }
    mapped_region_segment pageAt(std::uint64_t number, std::uint64_t count = 1) {
        return segmentAt(static_cast<std::int64_t>(number * page()), count * page());
    }

    Scratch scratch;
    const std::string path = scratch.file();
    ipc::file_mapping mapping;
};

Numbers& numbersOf(mapped_region_segment& segment) {
    segment_heap::segment_manager* const heap = segment.segment_manager();
    return *heap->find_or_construct<Numbers>("numbers")(segment_allocator<void>(heap));
}

// Moves, in a way that leaves open to whoever reads along what becomes of the source: that is what is tested.
const std::function<mapped_region_segment(mapped_region_segment&)> takenFrom =
    [](mapped_region_segment& source) { return mapped_region_segment(std::move(source)); };
const std::function<void(mapped_region_segment&, mapped_region_segment&)> moveAssign =
    [](mapped_region_segment& target, mapped_region_segment& source) { target = std::move(source); };

void expectMovedFrom(const mapped_region_segment& segment) {
    EXPECT_EQ(segment.offset(), -1);
    EXPECT_EQ(segment.size(), 0xFFFFFFFFu);
    EXPECT_EQ(segment.index(), 0xFFFFFFFFu);
    EXPECT_EQ(segment.segment_manager(), nullptr);
}

TEST(MappedRegionSegmentType, IsMovedWithoutFailureAndNeverCopied) {
    static_assert(!std::is_copy_constructible_v<mapped_region_segment>);
    static_assert(!std::is_copy_assignable_v<mapped_region_segment>);
    static_assert(std::is_nothrow_move_constructible_v<mapped_region_segment>);
    static_assert(std::is_nothrow_move_assignable_v<mapped_region_segment>);
    static_assert(sizeof(mapped_region_segment) == 2 * sizeof(void*));
    static_assert(sizeof(segment_heap) == sizeof(void*));
    static_assert(std::is_same_v<decltype(k_no_index), const unsigned long long>);
    EXPECT_EQ(k_no_index, 0xFFFFFFFFu);
}

TEST(MappedRegionSegmentType, DefaultIsNoStretchOfAnyFile) {
    mapped_region_segment segment;
    EXPECT_EQ(segment.offset(), -1);
    EXPECT_EQ(segment.size(), 0u);
    EXPECT_EQ(segment.index(), k_no_index);
    EXPECT_EQ(segment.segment_manager(), nullptr);
    EXPECT_EQ(segment.release(), 0u);
}

TEST_F(MappedRegionSegment, AnswersWithWhatItWasMadeOf) {
    const mapped_region_segment segment = segmentAt(8192, 4096, 77);
    EXPECT_EQ(segment.offset(), 8192);
    EXPECT_EQ(segment.size(), 4096u);
    EXPECT_EQ(segment.index(), 77u);
    EXPECT_EQ(segment.segment_manager(), nullptr);
}

TEST_F(MappedRegionSegment, LoadMakesAHeapOverTheWholeStretch) {
    mapped_region_segment segment = pageAt(1, 3);
    segment.load(false);
    ASSERT_NE(segment.segment_manager(), nullptr);
    EXPECT_EQ(segment.segment_manager()->get_size(), 3 * page());
    EXPECT_TRUE(segment.segment_manager()->all_memory_deallocated());
    EXPECT_TRUE(segment.segment_manager()->check_sanity());
}

TEST_F(MappedRegionSegment, StretchMayBeginAtAnyPage) {
    for (std::uint64_t number = 0; number < pages; ++number) {
        mapped_region_segment segment = pageAt(number);
        segment.load(false);
        numbersOf(segment).push_back(number);
    }
    for (std::uint64_t number = 0; number < pages; ++number) {
        mapped_region_segment segment = pageAt(number);
        segment.load(true);
        ASSERT_EQ(numbersOf(segment).size(), 1u) << "page " << number;
        EXPECT_EQ(numbersOf(segment).front(), number);
    }
}

TEST_F(MappedRegionSegment, SecondLoadDoesNothingWhateverItsArgument) {
    for (const bool first : {false, true}) {
        for (const bool second : {false, true}) {
            mapped_region_segment prepared = pageAt(0);
            prepared.load(false);
            prepared.release();
            mapped_region_segment segment = pageAt(0);
            segment.load(first);
            auto* const heap = segment.segment_manager();
            numbersOf(segment).push_back(5);
            segment.load(second);
            EXPECT_EQ(segment.segment_manager(), heap) << first << second;
            EXPECT_EQ(numbersOf(segment).size(), 1u) << first << second;
        }
    }
}

TEST_F(MappedRegionSegment, ReleaseOfOneNeverLoadedIsZeroAndTouchesNothing) {
    mapped_region_segment segment = pageAt(2);
    EXPECT_EQ(segment.release(), 0u);
    EXPECT_EQ(contentsOf(path), std::string(pages * page(), '\0'));
}

TEST_F(MappedRegionSegment, ReleaseGivesTheSizeOnce) {
    mapped_region_segment segment = pageAt(2, 2);
    segment.load(false);
    EXPECT_EQ(segment.release(), 2 * page());
    EXPECT_EQ(segment.segment_manager(), nullptr);
    EXPECT_EQ(segment.release(), 0u);
    EXPECT_EQ(segment.size(), 2 * page());
}

TEST_F(MappedRegionSegment, LoadAfterReleaseOpensTheHeapEvenWhenToldToMakeOne) {
    mapped_region_segment segment = pageAt(0, 4);
    segment.load(false);
    for (std::uint64_t i = 0; i < 500; ++i) {
        numbersOf(segment).push_back(i * i);
    }
    for (const bool initialised : {false, true, false}) {
        segment.release();
        segment.load(initialised);
        const Numbers& numbers = numbersOf(segment);
        ASSERT_EQ(numbers.size(), 500u);
        for (std::uint64_t i = 0; i < 500; ++i) {
            ASSERT_EQ(numbers[i], i * i);
        }
    }
}

TEST_F(MappedRegionSegment, ContentsDoNotDependOnTheAddress) {
    mapped_region_segment first = pageAt(0, 4);
    first.load(false);
    numbersOf(first).assign(300, 9);
    mapped_region_segment second = pageAt(0, 4); // the same bytes, at another address at the same time
    second.load(true);
    ASSERT_NE(first.segment_manager(), second.segment_manager());
    EXPECT_EQ(numbersOf(second).size(), 300u);
    EXPECT_EQ(numbersOf(second)[299], 9u);
    numbersOf(second).push_back(10);
    EXPECT_EQ(numbersOf(first).back(), 10u);
}

TEST_F(MappedRegionSegment, NewSegmentOverAnOldHeapMakesANewOne) {
    mapped_region_segment old = pageAt(0);
    old.load(false);
    numbersOf(old).push_back(1);
    old.release();
    mapped_region_segment fresh = pageAt(0);
    fresh.load(false);
    EXPECT_TRUE(fresh.segment_manager()->all_memory_deallocated());
}

TEST_F(MappedRegionSegment, BytesWithoutAHeapAreBelievedToBeOne) {
    mapped_region_segment segment = pageAt(3);
    segment.load(true);
    ASSERT_NE(segment.segment_manager(), nullptr);
    EXPECT_EQ(segment.segment_manager()->get_size(), 0u);
}

TEST_F(MappedRegionSegment, MovedFromAnswersWithFixedValues) {
    mapped_region_segment source = segmentAt(0, page(), 3);
    source.load(false);
    auto* const heap = source.segment_manager();
    const mapped_region_segment target = takenFrom(source);
    expectMovedFrom(source);
    EXPECT_EQ(source.release(), 0u);
    EXPECT_EQ(target.index(), 3u);
    EXPECT_EQ(target.size(), page());
    EXPECT_EQ(target.segment_manager(), heap);
}

TEST_F(MappedRegionSegment, MoveAssignmentExchangesTheTwo) {
    mapped_region_segment left = segmentAt(0, page(), 1);
    mapped_region_segment right = segmentAt(static_cast<std::int64_t>(page()), 2 * page(), 2);
    left.load(false);
    auto* const heap = left.segment_manager();
    moveAssign(right, left);
    EXPECT_EQ(right.index(), 1u);
    EXPECT_EQ(right.segment_manager(), heap);
    EXPECT_EQ(left.index(), 2u);
    EXPECT_EQ(left.size(), 2 * page());
    EXPECT_EQ(left.segment_manager(), nullptr);
    left.load(false); // what came over is as good as before
    EXPECT_EQ(left.segment_manager()->get_size(), 2 * page());

    const mapped_region_segment taken = takenFrom(left);
    moveAssign(left, right);
    expectMovedFrom(right);
    EXPECT_EQ(left.segment_manager(), heap);
}

TEST_F(MappedRegionSegment, TooSmallForAHeapFailsAndCanBeToldByTheText) {
    const std::uint64_t least = segment_heap::segment_manager::get_min_size();
    ASSERT_GT(least, 8u);
    ASSERT_LE(least, page());
    for (const std::uint64_t size : std::array<std::uint64_t, 4>{1, 64, least - 8, least - 1}) {
        mapped_region_segment segment = segmentAt(0, size);
        for (int attempt = 0; attempt < 2; ++attempt) {
            EXPECT_EQ(mappingFailure([&] { segment.load(false); }),
                      "Could not initialize buffer in basic_managed_external_buffer constructor")
                << size;
            EXPECT_EQ(segment.segment_manager(), nullptr);
            EXPECT_EQ(segment.release(), 0u);
        }
    }
    mapped_region_segment justEnough = segmentAt(0, least);
    EXPECT_EQ(mappingFailure([&] { justEnough.load(false); }), "none");
}

TEST_F(MappedRegionSegment, StretchOutsideTheFileFailsBeforeItIsTouched) {
    const auto end = static_cast<std::int64_t>(pages * page());
    const auto onePage = static_cast<std::int64_t>(page());
    const struct {
        int line;
        std::int64_t offset;
        std::uint64_t size;
    } rows[] = {
        {__LINE__, -1, page()},
        {__LINE__, -onePage, page()},
        {__LINE__, end, page()},
        {__LINE__, end - onePage, page() + 1},
        {__LINE__, end + onePage, page()},
        {__LINE__, 0, pages * page() + 1},
        {__LINE__, onePage, ~std::uint64_t(0)},
        {__LINE__, 0, 0},
        {__LINE__, end, 0},
    };
    for (const auto& row : rows) {
        for (const bool initialised : {false, true}) {
            SCOPED_TRACE(testing::Message() << "row at line " << row.line << ", " << initialised);
            mapped_region_segment segment = segmentAt(row.offset, row.size);
            expectOutsideTheFile([&] { segment.load(initialised); });
            EXPECT_EQ(segment.segment_manager(), nullptr);
        }
    }
}

TEST_F(MappedRegionSegment, FailedLoadWorksOnceTheFileIsLongEnough) {
    mapped_region_segment segment = pageAt(pages, 2);
    expectOutsideTheFile([&] { segment.load(false); });
    std::filesystem::resize_file(path, (pages + 2) * page());
    segment.load(false);
    EXPECT_EQ(segment.segment_manager()->get_size(), 2 * page());
}

TEST_F(MappedRegionSegment, FileThatIsNotOpenCannotBeLoadedFrom) {
    const ipc::file_mapping closed;
    mapped_region_segment segment(&closed, 0, page(), k_no_index);
    expectOutsideTheFile([&] { segment.load(false); });
}

TEST_F(MappedRegionSegment, FileOpenForReadingFailsWithTheSystemsError) {
    const ipc::file_mapping readOnly(path.c_str(), ipc::read_only);
    mapped_region_segment segment(&readOnly, 0, page(), k_no_index);
    ipc::error_code_t code = ipc::no_error;
    EXPECT_EQ(mappingFailure([&] { segment.load(true); }, &code), "Permission denied");
    EXPECT_EQ(code, ipc::security_error);
    EXPECT_EQ(segment.segment_manager(), nullptr);
}

TEST_F(MappedRegionSegment, HeapThatIsFullFailsWithBadAlloc) {
    mapped_region_segment segment = pageAt(0);
    segment.load(false);
    try {
        segment.segment_manager()->allocate(page());
        FAIL() << "more than there is was allocated";
    } catch (const ipc::bad_alloc& failure) {
        EXPECT_STREQ(failure.what(), "boost::interprocess::bad_alloc");
    }
}

} // namespace
} // namespace kvt::test
