// Advice to the system about the pages of a piece of memory.
#pragma once

#include <cstddef>
#include <cstdint>

namespace host {

/// madvise() on the pages of `pageSize` bytes that lie wholly within the bytes; whether there were none or it worked.
bool advisePages(const char* begin, std::uint64_t size, int advice, std::uint64_t pageSize);

/// Bytes of a page of this machine.
std::uint64_t systemPageSize();

/// Memory that the system finds when it is written to for the first time, however much was asked for.
class MemoryBlock {
public:
    /// Throws std::bad_alloc.
    explicit MemoryBlock(std::size_t size);
    MemoryBlock(const MemoryBlock&) = delete;
    MemoryBlock& operator=(const MemoryBlock&) = delete;
    ~MemoryBlock();

    char* get() const { return memory_; }
    /// Gives the memory back until it is written to again.
    void giveBack() const;

private:
    std::size_t size_;
    char* memory_;
};

} // namespace host
