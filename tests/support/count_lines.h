// For processes that end without their exit handlers.
#pragma once

extern "C" [[gnu::weak]] void __gcov_dump();

namespace kvt::test {

/// Where lines are counted as they run, adds those of this process to the counts, which is otherwise done at exit.
inline void countLines() {
    if (__gcov_dump != nullptr) {
        __gcov_dump();
    }
}

} // namespace kvt::test
