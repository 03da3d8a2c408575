// The global allocation functions of the test program, which replace those of the library and of the C++ run-time as
// well. They count the living blocks of each thread, remember the last request, and can be made to fail.
#pragma once

#include <cstddef>
#include <new>

namespace kvt_test {

/// Blocks that this thread allocated less those it released. Compare two readings.
std::ptrdiff_t livingBlocks() noexcept;

/// The number of bytes that this thread asked for last.
std::size_t lastRequest() noexcept;

/// While it lives, allocation number `succeeding` (from 0) of this thread and all later ones throw std::bad_alloc.
class FailingAllocations {
public:
    explicit FailingAllocations(std::size_t succeeding) noexcept;
    FailingAllocations(const FailingAllocations&) = delete;
    FailingAllocations& operator=(const FailingAllocations&) = delete;
    ~FailingAllocations();
};

/// Runs `operation` with no allocation succeeding, then with one, and so on until it goes through; after each failure
/// `check` runs with allocation restored. Returns the number of failures.
template <typename Operation, typename Check>
std::size_t failEachAllocation(Operation operation, Check check) {
    for (std::size_t succeeding = 0;; ++succeeding) {
        try {
            const FailingAllocations failing(succeeding);
            operation();
            return succeeding;
        } catch (const std::bad_alloc&) {
        }
        check(succeeding);
    }
}

} // namespace kvt_test
