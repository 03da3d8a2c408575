// New pages by madvise. Whether the memory is new is seen by its last page: an allocator hands out what was used before
// from its begin on.
#include <kvt/platform/new_pages.h>

#include <kvt/platform/page_size.h>

#include <sys/mman.h>

#include <cstdint>

namespace kvt::platform {
namespace {

constexpr std::uintptr_t largePage = 2 * 1024 * 1024;

// Longer memory has left the processor's caches before it is written, so that its large pages are made one by one then.
constexpr std::size_t mostAtOnce = 16 * 1024 * 1024;

struct Pages {
    std::uintptr_t first;
    std::uintptr_t end;

    std::size_t bytes() const { return end > first ? end - first : 0; }
    void* begin() const { return reinterpret_cast<void*>(first); }
};

// The pages that lie wholly within the bytes.
Pages wholePages(void* begin, std::size_t bytes, std::uintptr_t pageBytes) {
    const auto address = reinterpret_cast<std::uintptr_t>(begin);
    return {(address + pageBytes - 1) / pageBytes * pageBytes, (address + bytes) / pageBytes * pageBytes};
}

bool isThere(std::uintptr_t page, std::size_t pageBytes) {
    unsigned char there = 1;
    return ::mincore(reinterpret_cast<void*>(page), pageBytes, &there) != 0 || (there & 1) != 0;
}

} // namespace

void fetchPages(void* begin, std::size_t bytes) {
    const std::size_t pageBytes = pageSize();
    const Pages pages = wholePages(begin, bytes, pageBytes);
    if (bytes < manyNewBytes || pages.bytes() == 0 || isThere(pages.end - pageBytes, pageBytes)) {
        return;
    }
    const Pages large = wholePages(begin, bytes, largePage);
    if (large.bytes() > 0) {
        ::madvise(large.begin(), large.bytes(), MADV_HUGEPAGE);
    }
#ifdef MADV_POPULATE_WRITE
    if (bytes <= mostAtOnce) {
        ::madvise(pages.begin(), pages.bytes(), MADV_POPULATE_WRITE);
    }
#endif
}

} // namespace kvt::platform
