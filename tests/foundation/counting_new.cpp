#include "counting_new.h"

#include <cstdint>
#include <cstdlib>
#include <limits>

namespace kvt_test {
namespace {

constexpr std::size_t unlimited = std::numeric_limits<std::size_t>::max();

thread_local std::ptrdiff_t living = 0;
thread_local std::size_t request = 0;
thread_local std::size_t budget = unlimited;

void* allocate(std::size_t bytes) {
    request = bytes;
    if (budget != unlimited) {
        if (budget == 0) {
            throw std::bad_alloc();
        }
        --budget;
    }
    // No machine has half the address space; the sanitizers' malloc would end the program over the question.
    void* const block = bytes <= PTRDIFF_MAX / 2 ? std::malloc(bytes == 0 ? 1 : bytes) : nullptr;
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    ++living;
    return block;
}

void release(void* block) noexcept {
    if (block != nullptr) {
        --living;
        std::free(block);
    }
}

} // namespace

std::ptrdiff_t livingBlocks() noexcept {
    return living;
}

std::size_t lastRequest() noexcept {
    return request;
}

FailingAllocations::FailingAllocations(std::size_t succeeding) noexcept {
    budget = succeeding;
}

FailingAllocations::~FailingAllocations() {
    budget = unlimited;
}

} // namespace kvt_test

void* operator new(std::size_t bytes) {
    return kvt_test::allocate(bytes);
}

void* operator new[](std::size_t bytes) {
    return kvt_test::allocate(bytes);
}

void operator delete(void* block) noexcept {
    kvt_test::release(block);
}

void operator delete[](void* block) noexcept {
    kvt_test::release(block);
}

void operator delete(void* block, std::size_t) noexcept {
    kvt_test::release(block);
}

void operator delete[](void* block, std::size_t) noexcept {
    kvt_test::release(block);
}
