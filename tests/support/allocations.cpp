#include <support/allocations.h>

#include <cstdint>
#include <cstdlib>

namespace kvt::test {
namespace {

thread_local std::ptrdiff_t living = 0;
thread_local std::size_t requests = 0;
thread_local std::size_t request = 0;
thread_local std::size_t toSucceed = 0;
thread_local std::size_t toFail = 0;
thread_local bool failed = false;

// Whether this request is one of those that are to fail.
bool isRefused() noexcept {
    if (toFail == 0) {
        return false;
    }
    if (toSucceed != 0) {
        --toSucceed;
        return false;
    }
    toFail -= toFail == FailingAllocations::all ? 0 : 1;
    failed = true;
    return true;
}

void* allocate(std::size_t bytes) {
    ++requests;
    request = bytes;
    // No machine has half the address space; the sanitizers' malloc would end the program over the question.
    void* const block =
        !isRefused() && bytes <= PTRDIFF_MAX / 2 ? std::malloc(bytes == 0 ? 1 : bytes) : nullptr;
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

std::size_t allocationCount() noexcept {
    return requests;
}

std::size_t lastRequest() noexcept {
    return request;
}

FailingAllocations::FailingAllocations(std::size_t succeeding, std::size_t failing) noexcept {
    failed = false;
    toSucceed = succeeding;
    toFail = failing;
}

FailingAllocations::~FailingAllocations() {
    toFail = 0;
}

bool FailingAllocations::happened() noexcept {
    return failed;
}

} // namespace kvt::test

void* operator new(std::size_t bytes) {
    return kvt::test::allocate(bytes);
}

void* operator new[](std::size_t bytes) {
    return kvt::test::allocate(bytes);
}

// The C++ run-time makes these of the ones above, a sanitizer does not.
void* operator new(std::size_t bytes, const std::nothrow_t&) noexcept {
    try {
        return kvt::test::allocate(bytes);
    } catch (const std::bad_alloc&) {
        return nullptr;
    }
}

void* operator new[](std::size_t bytes, const std::nothrow_t& nothrow) noexcept {
    return operator new(bytes, nothrow);
}

void operator delete(void* block) noexcept {
    kvt::test::release(block);
}

void operator delete[](void* block) noexcept {
    kvt::test::release(block);
}

void operator delete(void* block, std::size_t) noexcept {
    kvt::test::release(block);
}

void operator delete[](void* block, std::size_t) noexcept {
    kvt::test::release(block);
}
