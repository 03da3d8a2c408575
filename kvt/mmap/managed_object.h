// A named object in the heap of a segment, which is mapped when the object is wanted and can be sent away.
//
// The object stands under the name "segment_data"; the first access maps the segment and makes the object if there is
// none. After release_memory() its contents are in the file only, and the next access maps them again.
#pragma once

#include <kvt/mmap/mapped_region_segment.h>
#include <kvt/mmap/memory_registrar.h>
#include <kvt/mmap/segment_file.h>

#include <cstdint>
#include <cstring>
#include <memory>
#include <mutex>
#include <utility>

namespace kvt::ex::mmap {

/// `T` can be constructed from a segment_allocator<void>, and holds no plain pointers. It is never destroyed: it lives
/// on in the file. Used by one thread at a time; a moved-from managed_object may only be destroyed or assigned to.
template <typename T>
class managed_object {
    struct impl;

public:
    /// The way to the object; each use of it maps the segment if it is not mapped. References to the object are
    /// good until release_memory().
    class proxy {
    public:
        explicit proxy(managed_object& object) noexcept : impl_(object.impl_.get()) {}

        T* operator->() const { return &impl_->get(); }
        T& operator*() const { return impl_->get(); }

    private:
        impl* impl_;
    };

    /// Takes the segment, loaded or not; nothing is mapped by this.
    explicit managed_object(mapped_region_segment segment)
        : impl_(std::make_unique<impl>(std::move(segment))) {}

    /// Maps the segment and finds or makes the object, where that has not been done. Fails as
    /// mapped_region_segment::load() does, with boost::interprocess::bad_alloc when the heap has no room for the
    /// object, and with what the constructor of `T` throws; then it can be tried again.
    proxy access() {
        impl_->get();
        return proxy(*this);
    }

    /// Flushes and unmaps the segment. Gives its size in bytes, 0 when it was not mapped.
    unsigned long long release_memory() { return impl_->release_memory(); }

private:
    struct impl final : object_mgr {
        explicit impl(mapped_region_segment&& owned) : segment(std::move(owned)) {}

        T& get() {
            if (object == nullptr) {
                segment.load(false);
                segment_heap::segment_manager* const heap = segment.segment_manager();
                T* const found = heap->template find<T>(segment_file::headerName).first;
                object = found != nullptr ? found : make(heap);
            }
            return *object;
        }

        static T* make(segment_heap::segment_manager* heap) {
            T* const made =
                heap->template construct<T>(segment_file::headerName)(segment_allocator<void>(heap));
            clearDescriptionPadding(made);
            return made;
        }

        // In front of a named object stands its description. Boost copies that from the stack into the segment, and an
        // unoptimised build copies what happened to lie between its members along.
        static void clearDescriptionPadding(T* made) noexcept {
            constexpr std::uint64_t description =
                (segment_file::descriptionSize + alignof(T) - 1) / alignof(T) * alignof(T);
            char* const begin = static_cast<char*>(static_cast<void*>(made)) - description;
            std::memset(begin + segment_file::descriptionPaddingAt, 0, segment_file::descriptionPaddingSize);
        }

        unsigned long long release_memory() override {
            object = nullptr;
            return segment.release();
        }

        mapped_region_segment segment;
        std::mutex mutex;                // for a host that shares the object; the library does not take it
        T* object = nullptr;             // null until it is found
        unsigned long long reserved = 0; // without a meaning yet
    };

    std::unique_ptr<impl> impl_;
};

} // namespace kvt::ex::mmap
