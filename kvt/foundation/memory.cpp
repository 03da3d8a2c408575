// The one place where memory that crosses module boundaries is allocated and released.
#include <kvt/foundation/memory.h>

#include <new>

namespace kvt::ex {

BasicDllAllocator<DefaultAllocator>&
BasicDllAllocator<DefaultAllocator>::operator=(const BasicDllAllocator&) noexcept {
    return *this;
}

BasicDllAllocator<DefaultAllocator>&
BasicDllAllocator<DefaultAllocator>::operator=(BasicDllAllocator&&) noexcept {
    return *this;
}

void* BasicDllAllocator<DefaultAllocator>::allocate(std::size_t bytes) {
    return ::operator new(bytes);
}

void BasicDllAllocator<DefaultAllocator>::deallocate(void* p, std::size_t) noexcept {
    ::operator delete(p);
}

} // namespace kvt::ex
