// What a persistent file of a memory_manager holds, read from its bytes alone.
//
// The library trusts such a file, maps it for writing, and changes it when it opens it. Here nothing is believed and
// nothing is written: every number is checked before it is used, so that no file, whatever is in it, leads outside
// of itself or around in circles. docs/segment_file.md describes the form of the file, and <kvt/mmap/segment_file.h>
// has its numbers.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace host {

/// The bytes of a file.
class ByteSource {
public:
    virtual ~ByteSource() = default;
    virtual std::uint64_t size() const = 0;
    /// Copies `count` bytes from `offset` on, which lie within the size. Throws Failure.
    virtual void read(std::uint64_t offset, char* out, std::size_t count) const = 0;
};

enum class SegmentState {
    Heap,    ///< has a heap
    Unused,  ///< was created, and never loaded
    NotMade, ///< has a row in the table and no place, since the file could not grow
    CutOff,  ///< reaches beyond the end of the file
    Damaged, ///< holds something else than a heap
};

struct SegmentReport {
    std::uint64_t offset = 0; ///< of no meaning for one that was not made
    std::uint64_t size = 0;
    SegmentState state = SegmentState::Unused;
    std::uint64_t allocated = 0; ///< bytes, the heap's own blocks included; for Heap only
    std::uint64_t free = 0;      ///< likewise
};

struct MemoryFileReport {
    std::uint64_t fileSize = 0;
    SegmentReport header;
    std::vector<SegmentReport> segments; ///< by index
    std::uint64_t savedVectors = 0;
    std::uint64_t savedWords = 0;  ///< in all of them
    std::uint64_t unaccounted = 0; ///< bytes of the file that belong to no segment
};

/// `segmentSize` is what the header segment should have, where that is known. Throws Failure, with a text that goes on
/// behind the name of the file, when the bytes are not such a file.
MemoryFileReport inspectMemoryFile(const ByteSource& bytes, std::optional<std::uint64_t> segmentSize);

} // namespace host
