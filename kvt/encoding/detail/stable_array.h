// A growing array whose elements never move, so that it is read without a lock.
#pragma once

#include <array>
#include <atomic>
#include <bit>
#include <cstddef>
#include <cstdint>

namespace kvt::ex::detail {

/// Elements are made in segments, each twice as long as the one before. Threads may look for elements at any time; what
/// one of them writes into an element is for the two to agree on.
template <typename T>
class StableArray {
public:
    StableArray() = default;
    StableArray(const StableArray&) = delete;
    StableArray& operator=(const StableArray&) = delete;
    ~StableArray() {
        for (const std::atomic<T*>& segment : segments_) {
            delete[] segment.load(std::memory_order_relaxed);
        }
    }

    /// Null where no element was made yet.
    T* find(std::uint32_t index) const noexcept {
        const Place place(index);
        T* const elements = segments_[place.segment].load(std::memory_order_acquire);
        return elements != nullptr ? elements + place.offset : nullptr;
    }

    /// The element, made with its segment if there is none. For one thread at a time. Throws std::bad_alloc.
    T& make(std::uint32_t index) {
        const Place place(index);
        T* elements = segments_[place.segment].load(std::memory_order_relaxed);
        if (elements == nullptr) {
            elements = new T[firstSegment << place.segment];
            segments_[place.segment].store(elements, std::memory_order_release);
        }
        return elements[place.offset];
    }

private:
    static constexpr std::uint64_t firstSegment = 32;

    struct Place {
        explicit Place(std::uint32_t index)
            : segment(static_cast<std::size_t>(std::bit_width(index + firstSegment) -
                                               std::bit_width(firstSegment))),
              offset(static_cast<std::size_t>(index + firstSegment - (firstSegment << segment))) {}
        std::size_t segment;
        std::size_t offset;
    };

    // As many as numbers of 32 bits fill.
    std::array<std::atomic<T*>, 28> segments_{};
};

} // namespace kvt::ex::detail
