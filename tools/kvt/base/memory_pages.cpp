// Pages by madvise and mmap.
#include "base/memory_pages.h"

#include <new>
#include <sys/mman.h>
#include <unistd.h>

namespace host {

bool advisePages(const char* begin, std::uint64_t size, int advice, std::uint64_t pageSize) {
    const std::uint64_t address = reinterpret_cast<std::uintptr_t>(begin);
    const std::uint64_t first = (address + pageSize - 1) / pageSize * pageSize;
    const std::uint64_t last = (address + size) / pageSize * pageSize;
    return first >= last || ::madvise(reinterpret_cast<void*>(first), last - first, advice) == 0;
}

std::uint64_t systemPageSize() {
    static const auto size = static_cast<std::uint64_t>(::sysconf(_SC_PAGESIZE));
    return size;
}

MemoryBlock::MemoryBlock(std::size_t size) : size_(size), memory_(nullptr) {
    constexpr std::uint64_t largePage = 2 * 1024 * 1024;
    void* const memory =
        ::mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
    if (memory == MAP_FAILED) {
        throw std::bad_alloc();
    }
    memory_ = static_cast<char*>(memory);
    // What is looked at in no order that the processor could foresee is found with fewer steps in large pages.
    if (size >= 8 * largePage) {
        advisePages(memory_, size, MADV_HUGEPAGE, largePage);
    }
}

MemoryBlock::~MemoryBlock() {
    ::munmap(memory_, size_);
}

void MemoryBlock::giveBack() const {
    ::madvise(memory_, size_, MADV_DONTNEED);
}

} // namespace host
