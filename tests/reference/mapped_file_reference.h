// The form of a backing file, read from the bytes alone: by pread, word by word, following the self-relative
// pointers without mapping anything. It uses no code of the library or of Boost.
//
// What a reader returns has been checked on the way: the blocks of a heap lie end to end, their marks agree with
// each other and with the tree of free ones and the counts in the heap's first words, and every pointer leads to a
// place inside its heap. Where something is wrong, std::runtime_error says what and where.
//
// Positions are bytes from the start of the file.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace kvt::test::reference {

using Position = std::uint64_t;

class RawFile {
public:
    explicit RawFile(const std::string& path);
    RawFile(const RawFile&) = delete;
    RawFile& operator=(const RawFile&) = delete;
    ~RawFile();

    std::uint64_t size() const;
    /// What the file takes on the disk, in bytes.
    std::uint64_t stored() const;
    std::string bytes(Position position, std::uint64_t count) const;
    bool zero(Position position, std::uint64_t count) const;
    /// Eight bytes, the lowest first.
    std::uint64_t word(Position position) const;
    std::vector<std::uint64_t> words(Position position, std::uint64_t count) const;
    /// Where the self-relative pointer at `position` leads; nothing for a null pointer.
    std::optional<Position> pointer(Position position) const;

private:
    int descriptor_;
};

/// A piece of a heap, allocated or free; `position` is that of its own mark, in front of what the user gets.
struct Block {
    Position position;
    std::uint64_t size;
    bool allocated;
};

struct NamedObject {
    std::string name;
    Position position;
    std::uint64_t size;
    std::uint64_t alignment;
};

struct Heap {
    Position position = 0;
    std::uint64_t freeBlocks = 0; ///< as the tree counts them
    std::uint64_t extraBytes = 0;
    std::uint64_t allocated = 0;
    std::uint64_t size = 0;
    std::uint64_t uniqueObjects = 0;
    std::vector<NamedObject> objects; ///< by length of the name, then by its bytes
    std::vector<Block> blocks;        ///< in order of position

    /// The object of that name; std::runtime_error when there is none.
    const NamedObject& object(const std::string& name) const;
    /// The allocated block in which `count` bytes from `position` on lie; std::runtime_error when they do not.
    const Block& holder(Position position, std::uint64_t count) const;
};

Heap readHeap(const RawFile& file, Position position);

struct Deque {
    std::vector<Position> elements;
    std::uint64_t blockElements = 0; ///< elements that a block has room for; 0 while there is no block
    std::vector<Position> blocks;    ///< those in use, in order
};

Deque readDeque(const RawFile& file, const Heap& heap, Position position, std::uint64_t elementSize);

struct SegmentRow {
    std::int64_t offset;
    std::uint64_t size;

    friend bool operator==(const SegmentRow&, const SegmentRow&) = default;
};

/// The first segment of a persistent file whose header has been in use.
struct Header {
    Heap heap;
    NamedObject object;
    Deque table;
    Deque queue;
    std::vector<SegmentRow> rows;
    std::vector<Deque> vectors;
    std::vector<std::vector<std::uint64_t>> saved; ///< oldest first
};

Header readHeader(const RawFile& file);

/// The words of a named object that is an array of them.
std::vector<std::uint64_t> readWords(const RawFile& file, const NamedObject& object);

} // namespace kvt::test::reference
