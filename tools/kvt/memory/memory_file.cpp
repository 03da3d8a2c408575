// A reader that follows the lists of a file by their pointers. Header keeps all reading within the header segment, and
// Deque looks the numbers of a list over before it goes through its elements.
#include "memory/memory_file.h"

#include "base/failure.h"

#include <kvt/mmap/segment_file.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <string_view>

namespace host {

namespace {

static_assert(std::endian::native == std::endian::little, "the file is little-endian");

namespace form = kvt::ex::mmap::segment_file;
constexpr std::string_view headerName = form::headerName;

constexpr const char* noHeap = "it does not begin with a heap; it is no persistent file of segments";

std::string bytesText(std::uint64_t count) {
    return std::to_string(count) + " bytes";
}

// The header segment, with all reading kept within it.
class Header {
public:
    Header(const ByteSource& bytes, std::uint64_t size) : bytes_(bytes), size_(size) {}

    std::uint64_t size() const { return size_; }

    void require(bool holds, const char* what) const {
        if (!holds) {
            throw Failure(std::string("the header segment is damaged: ") + what);
        }
    }

    bool fits(std::uint64_t offset, std::uint64_t count) const {
        return offset <= size_ && count <= size_ - offset;
    }

    void read(std::uint64_t offset, char* out, std::uint64_t count) const {
        require(fits(offset, count), "something reaches beyond its end");
        bytes_.read(offset, out, count);
    }

    std::uint64_t word(std::uint64_t offset) const {
        std::uint64_t value = 0;
        read(offset, reinterpret_cast<char*>(&value), sizeof value);
        return value;
    }

    /// Where the pointer at `offset` leads to; nothing for the null pointer, whose value is 1.
    std::optional<std::uint64_t> pointer(std::uint64_t offset) const {
        const std::uint64_t distance = word(offset);
        if (distance == form::nullPointer) {
            return std::nullopt;
        }
        const std::uint64_t target = offset + distance;
        require(target < size_, "a pointer leads out of it");
        return target;
    }

    std::uint64_t pointerThatIs(std::uint64_t offset) const {
        const std::optional<std::uint64_t> target = pointer(offset);
        require(target.has_value(), "a pointer is missing");
        return *target;
    }

private:
    const ByteSource& bytes_;
    std::uint64_t size_;
};

// The elements of a deque by their places. Blocks of elements stand in any order; the map lists them.
class Deque {
public:
    Deque(const Header& header, std::uint64_t at, std::uint64_t elementSize, std::uint64_t inBlock)
        : header_(header), elementSize_(elementSize), inBlock_(inBlock) {
        header.require(header.fits(at, form::listSize), "a list reaches beyond its end");
        const std::optional<std::uint64_t> map = header.pointer(at + form::mapAt);
        if (!map) {
            return;
        }
        const std::uint64_t mapSize = header.word(at + form::mapEntriesAt);
        header.require(mapSize <= header.size() / 8 && header.fits(*map, mapSize * 8), "a list has no map");
        const Position start = position(at + form::beginAt, *map, mapSize);
        const Position finish = position(at + form::endAt, *map, mapSize);
        header.require(
            start.index < inBlock_ && finish.index < inBlock_ &&
                (start.node < finish.node || (start.node == finish.node && start.index <= finish.index)),
            "a list ends before it begins");
        firstNode_ = start.node;
        firstIndex_ = start.index;
        count_ = (finish.node - start.node) / 8 * inBlock_ + finish.index - start.index;
        // Each element has bytes of its own.
        header.require(count_ <= header.size() / elementSize_, "a list is longer than the segment");
    }

    std::uint64_t count() const { return count_; }

    /// Calls use(place) for each element.
    template <typename Use>
    void forEach(const Use& use) const {
        std::uint64_t block = 0;
        for (std::uint64_t element = 0; element < count_; ++element) {
            const std::uint64_t index = firstIndex_ + element;
            if (element == 0 || index % inBlock_ == 0) {
                block = header_.pointerThatIs(firstNode_ + index / inBlock_ * 8);
                header_.require(header_.fits(block, inBlock_ * elementSize_),
                                "a list reaches beyond its end");
            }
            use(block + index % inBlock_ * elementSize_);
        }
    }

private:
    struct Position {
        std::uint64_t node;  ///< of the map
        std::uint64_t index; ///< in the block of that node
    };

    // An iterator: the element, the beginning and the end of its block, and the block's node in the map.
    Position position(std::uint64_t at, std::uint64_t map, std::uint64_t mapSize) const {
        const std::uint64_t current = header_.pointerThatIs(at);
        const std::uint64_t first = header_.pointerThatIs(at + 8);
        const std::uint64_t last = first + inBlock_ * elementSize_;
        const std::uint64_t node = header_.pointerThatIs(at + 24);
        header_.require(header_.fits(first, inBlock_ * elementSize_) && first <= current && current < last &&
                            (current - first) % elementSize_ == 0,
                        "a list points beside its elements");
        header_.require(map <= node && node < map + mapSize * 8 && (node - map) % 8 == 0 &&
                            header_.pointerThatIs(node) == first,
                        "a list points beside its map");
        return {node, (current - first) / elementSize_};
    }

    const Header& header_;
    std::uint64_t elementSize_;
    std::uint64_t inBlock_;
    std::uint64_t firstNode_ = 0;
    std::uint64_t firstIndex_ = 0;
    std::uint64_t count_ = 0;
};

bool isZeros(const ByteSource& bytes, std::uint64_t offset, std::uint64_t size) {
    std::array<char, 65536> block;
    while (size > 0) {
        const std::size_t count = std::min<std::uint64_t>(size, block.size());
        bytes.read(offset, block.data(), count);
        if (std::any_of(block.begin(), block.begin() + static_cast<std::ptrdiff_t>(count),
                        [](char byte) { return byte != 0; })) {
            return false;
        }
        offset += count;
        size -= count;
    }
    return true;
}

std::uint64_t wordAt(const ByteSource& bytes, std::uint64_t offset) {
    std::uint64_t value = 0;
    bytes.read(offset, reinterpret_cast<char*>(&value), sizeof value);
    return value;
}

// Whether the beginning of a heap is at `offset`, with at least `size` bytes of file behind it.
bool hasHeapMarks(const ByteSource& bytes, std::uint64_t offset, std::uint64_t size) {
    if (size < form::firstBlockAt || wordAt(bytes, offset + form::extraBytesAt) != form::extraBytes) {
        return false;
    }
    const std::uint64_t heapSize = wordAt(bytes, offset + form::heapSizeAt);
    return heapSize >= form::firstBlockAt &&
           wordAt(bytes, offset + form::allocatedAt) <= heapSize - form::firstBlockAt;
}

void readHeapSizes(const ByteSource& bytes, SegmentReport& segment) {
    segment.state = SegmentState::Heap;
    segment.allocated = wordAt(bytes, segment.offset + form::allocatedAt);
    segment.free = segment.size - segment.allocated - form::firstBlockAt;
}

SegmentReport inspectHeader(const ByteSource& bytes, std::optional<std::uint64_t> segmentSize) {
    if (bytes.size() < form::firstBlockAt) {
        throw Failure("it is too short for a persistent file of segments: " + bytesText(bytes.size()));
    }
    SegmentReport header;
    if (segmentSize && *segmentSize > bytes.size()) {
        throw Failure("it has " + bytesText(bytes.size()) + ", less than the header segment of " +
                      bytesText(*segmentSize));
    }
    if (isZeros(bytes, 0, form::firstBlockAt) && isZeros(bytes, 0, segmentSize.value_or(bytes.size()))) {
        header.size = segmentSize.value_or(bytes.size());
        return header;
    }
    if (!hasHeapMarks(bytes, 0, bytes.size())) {
        throw Failure(noHeap);
    }
    header.size = wordAt(bytes, form::heapSizeAt);
    // Executable files have the mark as well, and look like a file that was cut; but for what a count would be.
    if (header.size > bytes.size() && wordAt(bytes, form::namedObjectsAt) > 1) {
        throw Failure(noHeap);
    }
    if (segmentSize && *segmentSize != header.size) {
        throw Failure("its header segment has " + bytesText(header.size) + ", not " +
                      bytesText(*segmentSize));
    }
    if (header.size > bytes.size()) {
        throw Failure("it has " + bytesText(bytes.size()) + ", less than its header segment of " +
                      bytesText(header.size));
    }
    readHeapSizes(bytes, header);
    return header;
}

// Where the one object of the header segment is.
std::uint64_t findHeaderObject(const Header& header) {
    const std::uint64_t count = header.word(form::namedObjectsAt);
    if (count == 0) {
        throw Failure(
            "its first heap has no table of segments; it is no persistent file, or its header was not "
            "finished");
    }
    header.require(count == 1, "it has more than one object");
    const std::uint64_t node = header.pointerThatIs(form::namedObjectsAt + form::treeRootAt);
    header.require(node >= form::headSize, "its object lies in its head");
    const std::uint64_t description = node + form::nodeSize;
    const std::uint64_t value = description + form::descriptionSize;
    std::array<char, headerName.size()> name{};
    header.read(value + form::headerSize, name.data(), name.size());
    std::uint16_t nameLength = 0;
    header.read(description + form::nameLengthAt, reinterpret_cast<char*>(&nameLength), sizeof nameLength);
    header.require(header.word(description + form::objectSizeAt) == form::headerSize &&
                       nameLength == headerName.size() &&
                       std::string_view(name.data(), name.size()) == headerName,
                   "its object is not the table of segments");
    return value;
}

void inspectSegment(const ByteSource& bytes, SegmentReport& segment) {
    if (segment.offset > bytes.size() || segment.size > bytes.size() - segment.offset) {
        segment.state = SegmentState::CutOff;
    } else if (hasHeapMarks(bytes, segment.offset, segment.size) &&
               wordAt(bytes, segment.offset + form::heapSizeAt) == segment.size) {
        readHeapSizes(bytes, segment);
    } else if (!isZeros(bytes, segment.offset, std::min(segment.size, form::firstBlockAt))) {
        segment.state = SegmentState::Damaged;
    }
}

void inspectTable(const ByteSource& bytes, const Header& header, std::uint64_t table,
                  MemoryFileReport& report) {
    constexpr auto noOffset = static_cast<std::uint64_t>(form::noOffset);
    std::uint64_t end = header.size();
    const Deque rows(header, table, form::rowSize, form::rowsInBlock);
    rows.forEach([&](std::uint64_t row) {
        SegmentReport segment;
        segment.offset = header.word(row + form::rowOffsetAt);
        segment.size = header.word(row + form::rowLengthAt);
        if (segment.offset == noOffset) {
            segment.state = SegmentState::NotMade;
        } else {
            header.require(segment.offset >= end && segment.size <= noOffset - segment.offset,
                           "its table has segments in one another's place");
            end = segment.offset + segment.size;
            inspectSegment(bytes, segment);
        }
        report.segments.push_back(segment);
    });
}

void inspectQueue(const Header& header, std::uint64_t queue, MemoryFileReport& report) {
    const Deque saved(header, queue, form::listSize, form::vectorsInBlock);
    report.savedVectors = saved.count();
    saved.forEach([&](std::uint64_t at) {
        report.savedWords += Deque(header, at, form::wordSize, form::wordsInBlock).count();
    });
}

std::uint64_t unaccountedBytes(const MemoryFileReport& report) {
    std::uint64_t left = report.fileSize - report.header.size;
    for (const SegmentReport& segment : report.segments) {
        if (segment.state == SegmentState::CutOff) {
            left -= std::min(left, report.fileSize - std::min(segment.offset, report.fileSize));
        } else if (segment.state != SegmentState::NotMade) {
            left -= segment.size;
        }
    }
    return left;
}

} // namespace

MemoryFileReport inspectMemoryFile(const ByteSource& bytes, std::optional<std::uint64_t> segmentSize) {
    MemoryFileReport report;
    report.fileSize = bytes.size();
    report.header = inspectHeader(bytes, segmentSize);
    if (report.header.state == SegmentState::Heap) {
        const Header header(bytes, report.header.size);
        const std::uint64_t object = findHeaderObject(header);
        inspectTable(bytes, header, object + form::tableAt, report);
        inspectQueue(header, object + form::queueAt, report);
    }
    report.unaccounted = unaccountedBytes(report);
    return report;
}

} // namespace host
