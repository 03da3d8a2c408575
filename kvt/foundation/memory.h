// Allocation that stays on the library's side of a module boundary.
//
// A host may be linked with another allocator than the library. What one side allocates the other must not
// release; the classes here reach the global allocation functions *of the library*, wherever they are called from.
#pragma once

#include <kvt/foundation/export.h>

#include <cstddef>

namespace kvt::ex {

/// The policy "the library's global operator new and operator delete". It has no state.
class DefaultAllocator {};

template <typename Policy>
class BasicDllAllocator;

/// Allocates and releases raw memory inside the library. Stateless: all objects are interchangeable.
template <>
class KVT_EXPORT BasicDllAllocator<DefaultAllocator> : public DefaultAllocator {
public:
    BasicDllAllocator() = default;
    BasicDllAllocator(const BasicDllAllocator&) = default;
    BasicDllAllocator(BasicDllAllocator&&) = default;
    ~BasicDllAllocator() = default;
    /// Assignment has nothing to assign; both forms return the object.
    BasicDllAllocator& operator=(const BasicDllAllocator&) noexcept;
    BasicDllAllocator& operator=(BasicDllAllocator&&) noexcept;

protected:
    /// `bytes` bytes of memory, aligned for every fundamental type. The caller owns them and gives them back to
    /// `deallocate`. Throws std::bad_alloc when memory runs out.
    static void* allocate(std::size_t bytes);

    /// Releases what `allocate` returned. A null `p` is allowed; `bytes` is not looked at.
    static void deallocate(void* p, std::size_t bytes) noexcept;
};

/// An allocator that also knows the element type.
template <typename T, typename Allocator = BasicDllAllocator<DefaultAllocator>>
class TypedAllocator : public Allocator {
public:
    using value_type = T;
};

} // namespace kvt::ex
