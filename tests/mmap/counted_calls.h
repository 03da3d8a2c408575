// Counts the calls to the operating system by which the library reaches files and memory, and can let one fail.
#pragma once

#include <cstddef>
#include <string>

namespace kvt::test {

struct CountedCalls {
    std::size_t calls = 0;
    std::size_t bytesWritten = 0;
    std::string names; ///< in order, each with a blank behind it
};

/// Counts on this thread from its construction on.
class CallCounter {
public:
    CallCounter();
    CallCounter(const CallCounter&) = delete;
    CallCounter& operator=(const CallCounter&) = delete;
    ~CallCounter();

    const CountedCalls& sofar() const { return counted_; }

private:
    CountedCalls counted_;
};

/// Lets one call of open() on this thread fail with EACCES: the one of this number, from 1. Once at a time.
class FailingOpen {
public:
    explicit FailingOpen(std::size_t number);
    FailingOpen(const FailingOpen&) = delete;
    FailingOpen& operator=(const FailingOpen&) = delete;
    ~FailingOpen();
};

} // namespace kvt::test
