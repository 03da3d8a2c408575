// The global allocation functions of the test program, which are those of the library as well. They count, and can be
// made to fail once: just one allocation, so that what runs because of that failure has memory again.
#pragma once

#include <cstddef>

namespace kvt::test {

/// Allocations of this thread so far. Compare two readings.
std::size_t allocationCount() noexcept;

/// While it lives, allocation number `index` (from 0) of this thread throws std::bad_alloc.
class OneFailingAllocation {
public:
    explicit OneFailingAllocation(std::size_t index) noexcept;
    OneFailingAllocation(const OneFailingAllocation&) = delete;
    OneFailingAllocation& operator=(const OneFailingAllocation&) = delete;
    ~OneFailingAllocation();

    /// Whether the allocation of the object made last on this thread was reached.
    static bool happened() noexcept;
};

} // namespace kvt::test
