// Objects that a thread keeps until its very end.
//
// A `thread_local` object with a destructor ends among the others of its thread, in an order that nobody chooses, and a
// destructor that runs later would still reach for it. What is kept here is released behind all of them. Code that runs
// later still gets a new object, which is released in turn. The main thread keeps its objects for as long as the
// process runs, so that destructors of static objects find them as well.
#pragma once

#include <memory>
#include <utility>

namespace kvt::platform {

/// Has `release` called when the calling thread has run the destructors of its `thread_local` objects. It must not
/// throw. Throws std::bad_alloc when the system has no more room for such calls.
void atThreadEnd(void (*release)());

/// The calling thread's object of type T, made when it is first asked for. Throws what T's constructor throws, and
/// std::bad_alloc.
template <typename T>
T& ofThisThread() {
    // A pointer needs no destructor, so that it can be looked at whenever code of the thread runs.
    thread_local constinit T* kept = nullptr;
    if (kept == nullptr) {
        auto made = std::make_unique<T>();
        atThreadEnd([] { delete std::exchange(kept, nullptr); });
        kept = made.release();
    }
    return *kept;
}

} // namespace kvt::platform
