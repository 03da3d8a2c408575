// The global allocation functions of the test program, which replace those of the library and of the C++ run-time as
// well. For each thread they count requests and living blocks, and they can be made to fail. A program has them when
// it is linked with allocations.cpp.
#pragma once

#include <cstddef>
#include <limits>
#include <new>

namespace kvt::test {

/// Blocks that this thread allocated less those it released. Compare two readings.
std::ptrdiff_t livingBlocks() noexcept;

/// Requests of this thread so far, failed ones included. Compare two readings.
std::size_t allocationCount() noexcept;

/// The number of bytes that this thread asked for last.
std::size_t lastRequest() noexcept;

/// While it lives, `succeeding` requests of this thread are granted, the next `failing` ones throw std::bad_alloc, and
/// those after them are granted again.
class FailingAllocations {
public:
    static constexpr std::size_t all = std::numeric_limits<std::size_t>::max();

    explicit FailingAllocations(std::size_t succeeding, std::size_t failing = all) noexcept;
    FailingAllocations(const FailingAllocations&) = delete;
    FailingAllocations& operator=(const FailingAllocations&) = delete;
    ~FailingAllocations();

    /// Whether a request has failed in the scope that was opened last on this thread; it may have ended since.
    static bool happened() noexcept;
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

} // namespace kvt::test
