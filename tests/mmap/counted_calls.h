// Counts the calls to the operating system by which the library reaches files and memory.
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

} // namespace kvt::test
