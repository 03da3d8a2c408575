// Pages fetched before they are written: what stood in the memory stays, and what follows is there.

#include <kvt/platform/new_pages.h>

#include <kvt/platform/page_size.h>

#include <gtest/gtest.h>

#include <sys/mman.h>

#include <algorithm>
#include <vector>

namespace kvt::platform {
namespace {

constexpr std::size_t mebibyte = 1024 * 1024;

/// Memory that nobody has touched yet.
class NewMemory {
public:
    explicit NewMemory(std::size_t bytes)
        : bytes_(bytes), memory_(::mmap(nullptr, bytes, PROT_READ | PROT_WRITE,
                                        MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0)) {}
    NewMemory(const NewMemory&) = delete;
    NewMemory& operator=(const NewMemory&) = delete;
    ~NewMemory() { ::munmap(memory_, bytes_); }

    char* get() const { return static_cast<char*>(memory_); }

    std::size_t pagesThere() const {
        std::vector<unsigned char> there(bytes_ / pageSize());
        EXPECT_EQ(::mincore(memory_, bytes_, there.data()), 0);
        return static_cast<std::size_t>(
            std::count_if(there.begin(), there.end(), [](unsigned char page) { return (page & 1) != 0; }));
    }

private:
    std::size_t bytes_;
    void* memory_;
};

/// Whether this system knows how; Linux has since 5.14.
bool canFetch() {
#ifdef MADV_POPULATE_WRITE
    const NewMemory memory(mebibyte);
    return ::madvise(memory.get(), mebibyte, MADV_POPULATE_WRITE) == 0;
#else
    return false;
#endif
}

TEST(NewPages, AreFetchedWhollyWithinTheBytes) {
    const std::size_t page = pageSize();
    const NewMemory memory(mebibyte);
    fetchPages(memory.get() + 1, mebibyte - 2);
    EXPECT_EQ(memory.pagesThere(), canFetch() ? mebibyte / page - 2 : 0);
}

TEST(NewPages, AFewBytesAreLeftAlone) {
    const NewMemory memory(mebibyte);
    fetchPages(memory.get(), manyNewBytes - 1);
    fetchPages(memory.get(), 0);
    EXPECT_EQ(memory.pagesThere(), 0U);
}

TEST(NewPages, WhatStoodThereStays) {
    for (const std::size_t bytes : {mebibyte, 5 * mebibyte, 40 * mebibyte}) {
        const NewMemory memory(bytes);
        std::fill_n(memory.get(), bytes / 2, 'x');
        fetchPages(memory.get(), bytes);
        fetchPages(memory.get() + 3, bytes - 3);
        EXPECT_EQ(std::count(memory.get(), memory.get() + bytes, 'x'), bytes / 2);
        EXPECT_EQ(std::count(memory.get(), memory.get() + bytes, '\0'), bytes / 2);
    }
}

TEST(NewPages, MemoryThatCannotBeWrittenIsNoFailure) {
    const NewMemory memory(mebibyte);
    ASSERT_EQ(::mprotect(memory.get(), mebibyte, PROT_NONE), 0);
    fetchPages(memory.get(), mebibyte);
    ASSERT_EQ(::mprotect(memory.get(), mebibyte, PROT_READ), 0);
    EXPECT_EQ(memory.pagesThere(), 0U);
}

} // namespace
} // namespace kvt::platform
