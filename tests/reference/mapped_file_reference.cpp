// Sizes and places here are numbers on purpose: they are what the form of the file is, whatever a compiler or another
// version of Boost would make of the types behind it.
#include <reference/mapped_file_reference.h>

#include <algorithm>
#include <fcntl.h>
#include <set>
#include <stdexcept>
#include <sys/stat.h>
#include <unistd.h>

namespace kvt::test::reference {

namespace {

constexpr std::uint64_t unit = 16;           // blocks are multiples of it, and begin at multiples of it
constexpr std::uint64_t algorithmBytes = 56; // the tree of free blocks, and three words
constexpr std::uint64_t markBytes = 16;      // in front of each block
constexpr std::uint64_t overlap = 8;         // of the next mark, which an allocated block may use as its own
constexpr std::uint64_t nodeBytes = 24;      // parent, left and right of a node in a tree
constexpr std::uint64_t nullPointer = 1;
constexpr std::uint64_t colourBit = 2; // in the pointer to the parent
constexpr std::uint64_t allocatedBit = std::uint64_t{1} << 63;
constexpr std::uint64_t previousAllocatedBit = std::uint64_t{1} << 62;

[[noreturn]] void amiss(const std::string& what, Position position) {
    throw std::runtime_error(what + " at " + std::to_string(position));
}

void require(bool good, const char* what, Position position) {
    if (!good) {
        amiss(what, position);
    }
}

Position roundedUp(Position position, std::uint64_t multiple) {
    return (position + multiple - 1) / multiple * multiple;
}

struct stat statusOf(int descriptor) {
    struct stat status {};
    if (::fstat(descriptor, &status) != 0) {
        throw std::runtime_error("fstat failed");
    }
    return status;
}

// A tree as it stands in the heap's first words: how many nodes, and a head that is a node itself, whose parent is the
// root, and whose left and right are the first and the last node.
struct Tree {
    std::uint64_t count;
    std::vector<Position> nodes; // in order
};

std::optional<Position> parentOf(const RawFile& file, Position node) {
    const std::uint64_t offset = file.word(node) & ~colourBit;
    return offset == nullPointer ? std::nullopt : std::optional(node + offset);
}

void walk(const RawFile& file, std::optional<Position> node, Position parent, std::vector<Position>& nodes) {
    if (!node) {
        return;
    }
    require(nodes.size() < 1'000'000, "a tree without an end", *node);
    require(parentOf(file, *node) == parent, "a node that does not know its parent", *node);
    walk(file, file.pointer(*node + 8), *node, nodes);
    nodes.push_back(*node);
    walk(file, file.pointer(*node + 16), *node, nodes);
}

Tree readTree(const RawFile& file, Position position) {
    Tree tree{file.word(position), {}};
    const Position head = position + 8;
    if (const auto root = parentOf(file, head)) {
        walk(file, root, head, tree.nodes);
    }
    require(tree.nodes.size() == tree.count, "a tree with another count of nodes", position);
    require(file.pointer(head + 8) == (tree.nodes.empty() ? head : tree.nodes.front()),
            "a tree whose first node is another", position);
    require(file.pointer(head + 16) == (tree.nodes.empty() ? head : tree.nodes.back()),
            "a tree whose last node is another", position);
    return tree;
}

// From block to block, as each one's own size leads.
std::vector<Block> readBlocks(const RawFile& file, const Heap& heap) {
    const Position first = roundedUp(heap.position + algorithmBytes + heap.extraBytes, unit);
    const Position end = first + ((heap.position + heap.size - first) / unit - 1) * unit;
    std::vector<Block> blocks;
    bool previousAllocated = true;
    for (Position position = first; position != end;) {
        require(position < end, "a block beyond the end", position);
        const std::uint64_t mark = file.word(position + 8);
        const std::uint64_t units = mark & (previousAllocatedBit - 1);
        const bool allocated = (mark & allocatedBit) != 0;
        require(units >= 2, "a block without a size", position);
        require(((mark & previousAllocatedBit) != 0) == previousAllocated,
                "a block that is wrong about the one before it", position);
        require(allocated || previousAllocated, "two free blocks side by side", position);
        blocks.push_back({position, units * unit, allocated});
        position += units * unit;
        if (!allocated && position < end) {
            require(file.word(position) == units, "a free block whose size does not stand behind it",
                    position);
        }
        previousAllocated = allocated;
    }
    const std::uint64_t distance = (end - first) / unit;
    require(file.word(first) == distance, "a first block that does not know the end", first);
    require((file.word(end + 8) & (previousAllocatedBit - 1)) == distance, "an end without the distance",
            end);
    require((file.word(end + 8) & allocatedBit) != 0, "an end that is free", end);
    return blocks;
}

void checkFreeBlocks(const RawFile& file, const Heap& heap, const Tree& tree) {
    std::set<Position> inTree;
    std::uint64_t lastSize = 0;
    for (const Position node : tree.nodes) {
        const std::uint64_t size = file.word(node - 8) & (previousAllocatedBit - 1);
        require(size >= lastSize, "free blocks out of order", node);
        lastSize = size;
        inTree.insert(node - markBytes);
    }
    std::set<Position> inRow;
    std::uint64_t allocated = 0;
    for (const Block& block : heap.blocks) {
        if (block.allocated) {
            allocated += block.size;
        } else {
            inRow.insert(block.position);
        }
    }
    require(inTree == inRow, "a tree of free blocks with others than there are", heap.position);
    require(allocated == heap.allocated, "another count of allocated bytes", heap.position);
}

// A named object: the node, a head of 16 bytes, the object at its alignment, the name, a zero.
NamedObject readObject(const RawFile& file, const Heap& heap, Position node) {
    const Position head = node + nodeBytes;
    const std::uint64_t marks = file.word(head + 8);
    const std::uint64_t nameLength = marks & 0xFFFF;
    NamedObject object;
    object.size = file.word(head);
    object.alignment = marks >> 16 & 0xFF;
    require((marks >> 24 & 0xFF) == 0x21, "an object that is not one with a name of char", node);
    require(object.alignment != 0, "an object without an alignment", node);
    object.position = head + roundedUp(markBytes, object.alignment);
    const Position name = object.position + object.size;
    object.name = file.bytes(name, nameLength);
    require(file.zero(name + nameLength, 1), "a name without an end", node);
    require(heap.holder(node, name + nameLength + 1 - node).position + markBytes == node,
            "an object that does not begin its block", node);
    return object;
}

} // namespace

RawFile::RawFile(const std::string& path) : descriptor_(::open(path.c_str(), O_RDONLY | O_CLOEXEC)) {
    if (descriptor_ < 0) {
        throw std::runtime_error("cannot open " + path);
    }
}

RawFile::~RawFile() {
    ::close(descriptor_);
}

std::uint64_t RawFile::size() const {
    return static_cast<std::uint64_t>(statusOf(descriptor_).st_size);
}

std::uint64_t RawFile::stored() const {
    return static_cast<std::uint64_t>(statusOf(descriptor_).st_blocks) * 512;
}

std::string RawFile::bytes(Position position, std::uint64_t count) const {
    std::string bytes(count, '\0');
    const ssize_t got = ::pread(descriptor_, bytes.data(), count, static_cast<off_t>(position));
    require(got >= 0 && static_cast<std::uint64_t>(got) == count, "no such bytes", position);
    return bytes;
}

bool RawFile::zero(Position position, std::uint64_t count) const {
    const std::string there = bytes(position, count);
    return std::all_of(there.begin(), there.end(), [](char c) { return c == '\0'; });
}

std::uint64_t RawFile::word(Position position) const {
    return words(position, 1).front();
}

std::vector<std::uint64_t> RawFile::words(Position position, std::uint64_t count) const {
    const std::string there = bytes(position, 8 * count);
    std::vector<std::uint64_t> values;
    values.reserve(count);
    for (std::size_t at = 0; at < there.size(); at += 8) {
        std::uint64_t value = 0;
        for (std::size_t i = 8; i-- > 0;) {
            value = value << 8 | static_cast<unsigned char>(there[at + i]);
        }
        values.push_back(value);
    }
    return values;
}

std::optional<Position> RawFile::pointer(Position position) const {
    const std::uint64_t offset = word(position);
    return offset == nullPointer ? std::nullopt : std::optional(position + offset);
}

const NamedObject& Heap::object(const std::string& name) const {
    const auto found = std::find_if(objects.begin(), objects.end(),
                                    [&](const NamedObject& object) { return object.name == name; });
    if (found == objects.end()) {
        amiss("no object named " + name, position);
    }
    return *found;
}

const Block& Heap::holder(Position from, std::uint64_t count) const {
    const auto after =
        std::upper_bound(blocks.begin(), blocks.end(), from,
                         [](Position place, const Block& block) { return place < block.position; });
    require(after != blocks.begin(), "nothing allocated", from);
    const Block& block = *std::prev(after);
    require(block.allocated && from >= block.position + markBytes, "nothing allocated", from);
    require(from + count <= block.position + block.size + overlap, "more than what is allocated", from);
    return block;
}

Heap readHeap(const RawFile& file, Position position) {
    Heap heap;
    heap.position = position;
    const Tree freeBlocks = readTree(file, position);
    heap.freeBlocks = freeBlocks.count;
    heap.extraBytes = file.word(position + 32);
    heap.allocated = file.word(position + 40);
    heap.size = file.word(position + 48);
    require(position + heap.size <= file.size(), "a heap beyond the end of the file", position);
    heap.blocks = readBlocks(file, heap);
    checkFreeBlocks(file, heap, freeBlocks);
    for (const Position node : readTree(file, position + 56).nodes) {
        heap.objects.push_back(readObject(file, heap, node));
    }
    heap.uniqueObjects = readTree(file, position + 88).count;
    return heap;
}

// Twelve words: two pointers to the heap (of two allocators), the map and its length, and then first and end of the
// elements, each as the place itself, begin and end of its block, and its entry in the map.
Deque readDeque(const RawFile& file, const Heap& heap, Position position, std::uint64_t elementSize) {
    require(file.pointer(position) == heap.position && file.pointer(position + 8) == heap.position,
            "a deque that allocates elsewhere", position);
    Deque deque;
    const auto map = file.pointer(position + 16);
    const std::uint64_t mapLength = file.word(position + 24);
    const auto at = [&](std::uint64_t word) { return file.pointer(position + 32 + 8 * word); };
    if (!map) {
        require(mapLength == 0, "a deque without a map, but with its length", position);
        for (std::uint64_t word = 0; word < 8; ++word) {
            require(!at(word), "a deque without a map, but with elements", position);
        }
        return deque;
    }
    heap.holder(*map, mapLength * 8);
    for (std::uint64_t word = 0; word < 8; ++word) {
        require(at(word).has_value(), "a deque with a null place", position);
    }
    const Position firstEntry = *at(3);
    const Position lastEntry = *at(7);
    const std::uint64_t blockBytes = *at(2) - *at(1);
    require(*at(6) - *at(5) == blockBytes && blockBytes % elementSize == 0, "blocks of another size",
            position);
    require(firstEntry >= *map && firstEntry <= lastEntry && lastEntry < *map + mapLength * 8,
            "a deque that leaves its map", position);
    require(file.pointer(firstEntry) == at(1) && file.pointer(lastEntry) == at(5), "a map that disagrees",
            position);
    deque.blockElements = blockBytes / elementSize;
    for (Position entry = firstEntry; entry <= lastEntry; entry += 8) {
        const auto block = file.pointer(entry);
        require(block.has_value(), "a map without a block", entry);
        heap.holder(*block, blockBytes);
        deque.blocks.push_back(*block);
        const Position from = entry == firstEntry ? *at(0) : *block;
        const Position to = entry == lastEntry ? *at(4) : *block + blockBytes;
        require(from >= *block && from <= to && to <= *block + blockBytes, "elements out of their block",
                entry);
        for (Position element = from; element < to; element += elementSize) {
            deque.elements.push_back(element);
        }
    }
    return deque;
}

Header readHeader(const RawFile& file) {
    Header header;
    header.heap = readHeap(file, 0);
    header.object = header.heap.object("segment_data");
    require(header.object.size == 192 && header.object.alignment == 8, "another header",
            header.object.position);
    header.table = readDeque(file, header.heap, header.object.position, 16);
    header.queue = readDeque(file, header.heap, header.object.position + 96, 96);
    for (const Position row : header.table.elements) {
        header.rows.push_back({static_cast<std::int64_t>(file.word(row)), file.word(row + 8)});
    }
    for (const Position element : header.queue.elements) {
        header.vectors.push_back(readDeque(file, header.heap, element, 8));
        std::vector<std::uint64_t> words;
        for (const Position word : header.vectors.back().elements) {
            words.push_back(file.word(word));
        }
        header.saved.push_back(words);
    }
    return header;
}

std::vector<std::uint64_t> readWords(const RawFile& file, const NamedObject& object) {
    return file.words(object.position, object.size / 8);
}

} // namespace kvt::test::reference
