// The end of a thread by the destructor of a thread-specific key, which the system calls behind the destructors of
// `thread_local` objects, and again when one of these calls has asked for more.
#include <kvt/platform/thread_end.h>

#include <new>
#include <pthread.h>

namespace kvt::platform {
namespace {

/// The calls that are due at the end of a thread, the last one first.
struct Due {
    void (*release)();
    std::unique_ptr<Due> next;
};

extern "C" void releaseAll(void* first) {
    for (std::unique_ptr<Due> due(static_cast<Due*>(first)); due != nullptr; due = std::move(due->next)) {
        due->release();
    }
}

pthread_key_t dueKey() {
    static const pthread_key_t key = [] {
        pthread_key_t made{};
        if (pthread_key_create(&made, &releaseAll) != 0) {
            throw std::bad_alloc();
        }
        return made;
    }();
    return key;
}

} // namespace

void atThreadEnd(void (*release)()) {
    const pthread_key_t key = dueKey();
    auto due = std::make_unique<Due>(Due{release, nullptr});
    auto* const others = static_cast<Due*>(pthread_getspecific(key));
    if (pthread_setspecific(key, due.get()) != 0) {
        throw std::bad_alloc();
    }
    due.release()->next.reset(others);
}

} // namespace kvt::platform
