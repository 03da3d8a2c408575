#include "failing_new.h"

#include <cstdlib>
#include <new>

namespace kvt::test {
namespace {

thread_local std::size_t toSucceed = 0;
thread_local std::size_t toFail = 0;

void* allocate(std::size_t bytes) {
    if (toFail != 0) {
        if (toSucceed != 0) {
            --toSucceed;
        } else {
            toFail -= toFail == FailingAllocations::all ? 0 : 1;
            throw std::bad_alloc();
        }
    }
    void* const block = std::malloc(bytes == 0 ? 1 : bytes);
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    return block;
}

} // namespace

FailingAllocations::FailingAllocations(std::size_t succeeding, std::size_t failing) noexcept {
    toSucceed = succeeding;
    toFail = failing;
}

FailingAllocations::~FailingAllocations() {
    toFail = 0;
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
