// The form of a backing file, held against what an independent reader finds in its bytes.
#include <mmap/segment_words.h>
#include <reference/mapped_file_reference.h>

#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>
#include <filesystem>
#include <random>
#include <string>
#include <utility>
#include <vector>

namespace {

using namespace kvt::test;
using reference::Header;
using reference::Heap;
using reference::RawFile;
using reference::SegmentRow;

constexpr Word headerSize = 65536;

class OnDisk : public ::testing::Test {
protected:
    memory_manager persistent(Word size = headerSize) const { return {path, persistentOptions(size)}; }

    ScratchFolder folder;
    std::string path = folder.file("backing");
};

std::uint64_t count(const Heap& heap, bool allocated) {
    std::uint64_t blocks = 0;
    for (const reference::Block& block : heap.blocks) {
        blocks += block.allocated == allocated ? 1 : 0;
    }
    return blocks;
}

TEST_F(OnDisk, ANewPersistentFileIsOneStretchOfZerosUntilItsHeaderIsReached) {
    for (const auto& [asked, rounded] : {std::pair<Word, Word>{65536, 65536}, {1, 4096}, {4097, 8192}}) {
        std::filesystem::remove(path);
        memory_manager manager(path, persistentOptions(asked));
        const RawFile file(path);
        EXPECT_EQ(file.size(), rounded) << asked;
        EXPECT_TRUE(file.zero(0, rounded)) << asked;
        manager.restore();
        EXPECT_EQ(file.size(), rounded) << asked;
        EXPECT_EQ(reference::readHeader(file).heap.size, rounded) << asked;
    }
}

// What is in memory is nobody else's business, and so it stays when it is in a file.
TEST_F(OnDisk, OnlyItsOwnerMayReadOrWriteABackingFile) {
    using std::filesystem::perms;
    const auto modeOf = [&] { return std::filesystem::status(path).permissions(); };
    {
        const memory_manager manager = persistent();
        EXPECT_EQ(modeOf(), perms::owner_read | perms::owner_write);
    }
    std::filesystem::remove(path);
    const memory_manager temporary(path, manager_options{});
    EXPECT_EQ(modeOf(), perms::owner_read | perms::owner_write);
}

TEST_F(OnDisk, TheHeaderSegmentIsAHeapWithOneNamedObject) {
    memory_manager manager = persistent();
    manager.restore();
    const RawFile file(path);
    const Heap heap = reference::readHeap(file, 0);
    EXPECT_EQ(heap.extraBytes, 64U);
    EXPECT_EQ(heap.size, headerSize);
    EXPECT_EQ(heap.uniqueObjects, 0U);
    EXPECT_EQ(heap.freeBlocks, 1U);
    EXPECT_EQ(count(heap, true), 1U);
    ASSERT_EQ(heap.objects.size(), 1U);
    EXPECT_EQ(heap.objects[0].name, "segment_data");
    EXPECT_EQ(heap.objects[0].size, 192U);
    EXPECT_EQ(heap.objects[0].alignment, 8U);
    const Header header = reference::readHeader(file);
    EXPECT_TRUE(header.rows.empty());
    EXPECT_TRUE(header.saved.empty());
    EXPECT_TRUE(header.table.blocks.empty());
    EXPECT_TRUE(header.queue.blocks.empty());
}

// The whole of a header that has just been reached, word by word. docs/segment_file.md has it as its example.
TEST_F(OnDisk, EveryWordOfAnEmptyHeaderIsWhatTheFormSays) {
    memory_manager manager = persistent(4096);
    manager.restore();
    const RawFile file(path);
    const auto back = [](Word bytes) { return ~bytes + 1; };
    const std::vector<Word> words = {
        // The heap: one free block, whose node is root, first and last; the bytes after this head; the bytes
        // allocated; the size.
        1, 400 - 8, 400 - 16, 400 - 24, 64, 256, 4096,
        // Named objects: one, whose node is root, first and last.
        1, 144 - 64, 144 - 72, 144 - 80,
        // Unique objects: none, so first and last are the head itself.
        0, 1, back(8), back(16),
        // Nothing, up to a multiple of 16.
        0,
        // The first block: units of 16 to the end; 16 units, allocated, as is what comes before.
        (4096 - 128) / 16 - 1, 0xC000000000000010,
        // The node: parent, with the mark of a black one; no left, no right. Bytes of the object; its kind, its
        // alignment, the length of the name.
        back(144 - 64) | 2, 1, 1, 192, 0x2108000C,
        // segment_table: two allocators of this heap; no map of no length; no first, no end.
        back(184), back(192), 1, 0, 1, 1, 1, 1, 1, 1, 1, 1,
        // saved_queue: the same.
        back(280), back(288), 1, 0, 1, 1, 1, 1, 1, 1, 1, 1,
        // "segment_data" and a zero, the last word being the first of the next block, which lends it.
        0x5F746E656D676573, 0x0000000061746164,
        // The rest: free, what comes before is not; a black node without left and right.
        0x4000000000000000 + (4096 - 384) / 16 - 1, back(400 - 8) | 2, 1, 1};
    for (std::size_t i = 0; i < words.size(); ++i) {
        EXPECT_EQ(file.word(i * 8), words[i]) << "the word at " << i * 8;
    }
    EXPECT_TRUE(file.zero(words.size() * 8, 4080 - words.size() * 8)) << "nothing in the free block";
    // The mark at the end: the units of the free block before it; units back to the first block, allocated.
    EXPECT_EQ(file.word(4080), Word{(4096 - 384) / 16 - 1});
    EXPECT_EQ(file.word(4088), 0x8000000000000000 + (4096 - 128) / 16 - 1);
}

TEST_F(OnDisk, SegmentsFollowEachOtherAndEachHasARow) {
    memory_manager manager = persistent();
    std::mt19937 random(20240501);
    std::vector<SegmentRow> expected;
    Word end = headerSize;
    for (Word index = 0; index < 100; ++index) {
        const Word pages = 1 + random() % 5;
        const Word asked = pages * 4096 - random() % 4096;
        const mapped_region_segment segment = manager.create_segment(asked);
        EXPECT_EQ(segment.offset(), static_cast<long long>(end));
        EXPECT_EQ(segment.size(), pages * 4096);
        EXPECT_EQ(segment.index(), index);
        expected.push_back({static_cast<std::int64_t>(end), pages * 4096});
        end += pages * 4096;
        const RawFile file(path);
        ASSERT_EQ(file.size(), end);
        ASSERT_TRUE(file.zero(end - pages * 4096, pages * 4096)) << index;
        ASSERT_EQ(reference::readHeader(file).rows, expected);
    }
}

TEST_F(OnDisk, BlocksOfTheTableHold32Rows) {
    memory_manager manager = persistent();
    const RawFile file(path);
    for (std::size_t rows = 1; rows <= 131; ++rows) {
        manager.create_segment(4096);
        const Header header = reference::readHeader(file);
        ASSERT_EQ(header.rows.size(), rows);
        ASSERT_EQ(header.table.blockElements, 32U);
        ASSERT_EQ(header.table.blocks.size(), rows / 32 + 1);
    }
}

TEST_F(OnDisk, ASegmentWithoutASizeHasTheOneOfTheOptions) {
    memory_manager manager = persistent(3 * 4096 - 1);
    manager.create_segment();
    manager.create_segment(1);
    manager.create_segment();
    const std::vector<SegmentRow> expected = {{12288, 12288}, {24576, 4096}, {28672, 12288}};
    const RawFile file(path);
    EXPECT_EQ(reference::readHeader(file).rows, expected);
    EXPECT_EQ(file.size(), 40960U);
}

TEST_F(OnDisk, TheEndOfTheFileDecidesWhereTheNextSegmentLies) {
    memory_manager manager = persistent();
    manager.create_segment(4096);
    std::filesystem::resize_file(path, headerSize + 5 * 4096);
    const mapped_region_segment segment = manager.create_segment(8192);
    EXPECT_EQ(segment.offset(), static_cast<long long>(headerSize + 5 * 4096));
    const std::vector<SegmentRow> expected = {{headerSize, 4096}, {headerSize + 5 * 4096, 8192}};
    EXPECT_EQ(reference::readHeader(RawFile(path)).rows, expected);
}

TEST_F(OnDisk, BlocksOfTheQueueHoldFiveVectorsAndTheirs64Words) {
    memory_manager manager = persistent(1 << 20);
    manager.restore();
    const RawFile file(path);
    std::vector<Words> expected;
    for (const std::size_t length : std::initializer_list<std::size_t>{1, 0, 2, 63, 64, 65, 127, 128, 129,
                                                                       640, 0, 1000, 64, 1, 5000, 3}) {
        expected.push_back(wordsOf(length + 7, length));
        manager.save(toSave(expected.back()));
        const Header header = reference::readHeader(file);
        ASSERT_EQ(header.saved, expected) << length;
        ASSERT_EQ(header.queue.blockElements, 5U);
        ASSERT_EQ(header.queue.blocks.size(), expected.size() / 5 + 1);
        const reference::Deque& vector = header.vectors.back();
        if (length > 0) {
            ASSERT_EQ(vector.blockElements, 64U);
            ASSERT_EQ(vector.blocks.size(), length / 64 + 1);
        }
    }
}

TEST_F(OnDisk, RestoringTakesTheFrontAndFreesItsBlocks) {
    memory_manager manager = persistent(1 << 20);
    manager.restore();
    const RawFile file(path);
    const std::uint64_t allocatedAtFirst = reference::readHeader(file).heap.allocated;
    std::vector<Words> expected;
    for (Word tag = 0; tag < 23; ++tag) {
        expected.push_back(wordsOf(tag, tag * 37 + 1));
        manager.save(toSave(expected.back()));
    }
    std::uint64_t allocated = reference::readHeader(file).heap.allocated;
    while (!expected.empty()) {
        EXPECT_EQ(taken(manager.restore()), expected.front());
        expected.erase(expected.begin());
        const Header header = reference::readHeader(file);
        ASSERT_EQ(header.saved, expected);
        ASSERT_LT(header.heap.allocated, allocated);
        allocated = header.heap.allocated;
    }
    EXPECT_LE(allocated, allocatedAtFirst + 8 * 8 + 5 * 96 + 3 * 16) << "at most a map and one block stay";
}

TEST_F(OnDisk, TheLowestByteComesFirst) {
    memory_manager manager = persistent();
    manager.restore();
    manager.save(toSave({0x0102030405060708}));
    manager.create_segment(0x12000);
    const RawFile file(path);
    const Header header = reference::readHeader(file);
    EXPECT_EQ(file.bytes(header.vectors.at(0).elements.at(0), 8), "\x08\x07\x06\x05\x04\x03\x02\x01");
    EXPECT_EQ(file.bytes(header.table.elements.at(0), 16),
              (std::string{0, 0, 1, 0, 0, 0, 0, 0, 0, 0x20, 1, 0, 0, 0, 0, 0}));
    EXPECT_EQ(file.bytes(32, 8), (std::string{64, 0, 0, 0, 0, 0, 0, 0}));
    EXPECT_EQ(file.bytes(48, 8), (std::string{0, 0, 1, 0, 0, 0, 0, 0}));
}

TEST_F(OnDisk, ASegmentBeginsWithItsHeap) {
    memory_manager manager = persistent();
    std::vector<mapped_region_segment> segments;
    for (Word index = 0; index < 8; ++index) {
        segments.push_back(manager.create_segment((index + 1) * 8192));
        mapped_region_segment& segment = segments.back();
        segment.load(false);
        const RawFile file(path);
        const auto position = static_cast<reference::Position>(segment.offset());
        const Heap empty = reference::readHeap(file, position);
        EXPECT_EQ(empty.extraBytes, 64U);
        EXPECT_EQ(empty.allocated, 0U);
        EXPECT_EQ(empty.size, (index + 1) * 8192);
        EXPECT_EQ(empty.freeBlocks, 1U);
        EXPECT_TRUE(empty.objects.empty());
        put(segment, "first", wordsOf(index, 10 + index));
        put(segment, "another", wordsOf(index + 100, 300));
        segment.segment_manager()->destroy<Word>("first");
        put(segment, "third", wordsOf(index + 200, 5));
        const Heap heap = reference::readHeap(file, position);
        ASSERT_EQ(heap.objects.size(), 2U);
        EXPECT_EQ(reference::readWords(file, heap.object("another")), wordsOf(index + 100, 300));
        EXPECT_EQ(reference::readWords(file, heap.object("third")), wordsOf(index + 200, 5));
        EXPECT_EQ(heap.object("third").alignment, 8U);
    }
}

TEST_F(OnDisk, ATemporaryFileBeginsWithItsFirstSegment) {
    memory_manager manager(path, temporaryOptions(16384));
    EXPECT_EQ(std::filesystem::file_size(path), 0U);
    Word end = 0;
    for (const Word size : {16384U, 4096U, 20480U}) {
        mapped_region_segment segment = manager.create_segment(size);
        EXPECT_EQ(segment.offset(), static_cast<long long>(end));
        EXPECT_EQ(segment.index(), kvt::ex::mmap::k_no_index);
        segment.load(false);
        put(segment, "words", wordsOf(size, 100));
        end += size;
        const RawFile file(path);
        EXPECT_EQ(file.size(), end);
        const Heap heap = reference::readHeap(file, end - size);
        EXPECT_EQ(heap.size, size);
        EXPECT_EQ(reference::readWords(file, heap.object("words")), wordsOf(size, 100));
    }
}

// Nothing in the file says where it is mapped, or what it is called.
TEST_F(OnDisk, ACopyOfTheBytesIsAsGoodAtAnyAddress) {
    memory_manager manager = persistent();
    mapped_region_segment segment = manager.create_segment(32768);
    segment.load(false);
    put(segment, "words", wordsOf(5, 1000));
    manager.save(toSave(wordsOf(6, 100)));
    const std::string other = folder.file("copy");
    std::filesystem::copy_file(path, other);
    // The first one stays mapped, so that the copy has to lie elsewhere.
    memory_manager copy(other, persistentOptions(headerSize));
    mapped_region_segment same = copy.open_segment(0);
    ASSERT_NE(same.segment_manager(), segment.segment_manager());
    EXPECT_EQ(get(same, "words"), wordsOf(5, 1000));
    EXPECT_EQ(taken(copy.restore()), wordsOf(6, 100));
    EXPECT_EQ(reference::readHeader(RawFile(path)).saved, std::vector<Words>{wordsOf(6, 100)});
}

// A smaller view of the header shows the same header, as long as what is reached lies inside.
TEST_F(OnDisk, TheSizeOfTheHeaderSegmentStandsNowhere) {
    { persistent().restore(); }
    memory_manager manager(path, persistentOptions(4096));
    EXPECT_TRUE(manager.restore().empty());
    EXPECT_EQ(reference::readHeader(RawFile(path)).heap.size, headerSize);
    EXPECT_EQ(manager.options().segment_size, 4096U);
}

} // namespace
