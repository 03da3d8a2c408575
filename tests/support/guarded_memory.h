// Memory that ends where the next page cannot be touched: a read or write behind its end is a signal.
#pragma once

#include <sys/mman.h>
#include <unistd.h>

#include <cstddef>
#include <stdexcept>

namespace kvt::test {

class GuardedMemory {
public:
    /// At least `size` bytes, rounded up to pages.
    explicit GuardedMemory(std::size_t size) {
        const auto page = static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
        size_ = (size + page - 1) / page * page;
        void* const memory =
            mmap(nullptr, size_ + page, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
        if (memory == MAP_FAILED || mprotect(static_cast<char*>(memory) + size_, page, PROT_NONE) != 0) {
            throw std::runtime_error("no guarded memory");
        }
        memory_ = static_cast<char*>(memory);
        mapped_ = size_ + page;
    }
    ~GuardedMemory() { munmap(memory_, mapped_); }
    GuardedMemory(const GuardedMemory&) = delete;
    GuardedMemory& operator=(const GuardedMemory&) = delete;

    char* begin() const { return memory_; }
    char* end() const { return memory_ + size_; }

private:
    char* memory_ = nullptr;
    std::size_t size_ = 0;
    std::size_t mapped_ = 0;
};

} // namespace kvt::test
