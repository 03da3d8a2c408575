// The global allocation functions of the test program, which can be made to fail: one request after so many, or that
// one and all later ones.
#pragma once

#include <cstddef>
#include <limits>

namespace kvt::test {

/// While it lives, `succeeding` allocations of this thread go well, the next `failing` ones throw std::bad_alloc, and
/// those behind them go well again.
class FailingAllocations {
public:
    static constexpr std::size_t all = std::numeric_limits<std::size_t>::max();

    explicit FailingAllocations(std::size_t succeeding, std::size_t failing = all) noexcept;
    FailingAllocations(const FailingAllocations&) = delete;
    FailingAllocations& operator=(const FailingAllocations&) = delete;
    ~FailingAllocations();
};

} // namespace kvt::test
