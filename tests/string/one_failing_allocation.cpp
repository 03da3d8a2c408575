#include "one_failing_allocation.h"

#include <cstdlib>
#include <limits>
#include <new>

namespace kvt::test {
namespace {

constexpr std::size_t never = std::numeric_limits<std::size_t>::max();

thread_local std::size_t count = 0;
thread_local std::size_t failing = never;
thread_local bool reached = false;

void* allocate(std::size_t bytes) {
    if (count++ == failing) {
        reached = true;
        throw std::bad_alloc();
    }
    void* const block = std::malloc(bytes == 0 ? 1 : bytes);
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    return block;
}

} // namespace

std::size_t allocationCount() noexcept {
    return count;
}

OneFailingAllocation::OneFailingAllocation(std::size_t index) noexcept {
    reached = false;
    failing = count + index;
}

OneFailingAllocation::~OneFailingAllocation() {
    failing = never;
}

bool OneFailingAllocation::happened() noexcept {
    return reached;
}

} // namespace kvt::test

void* operator new(std::size_t bytes) {
    return kvt::test::allocate(bytes);
}

void* operator new[](std::size_t bytes) {
    return kvt::test::allocate(bytes);
}

void operator delete(void* block) noexcept {
    std::free(block);
}

void operator delete[](void* block) noexcept {
    std::free(block);
}

void operator delete(void* block, std::size_t) noexcept {
    std::free(block);
}

void operator delete[](void* block, std::size_t) noexcept {
    std::free(block);
}
