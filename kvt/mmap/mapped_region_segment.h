// One stretch of a backing file, mapped into memory and unmapped again as often as its owner likes.
//
// A loaded segment carries a heap: named objects, and allocators for containers, all with relative pointers, so that
// the stretch may come to lie at another address each time. A segment is made by a memory_manager; it is a value that
// belongs to the caller, can be moved and not copied, and outlives its manager as long as it stays loaded.
//
//     segment.load(false);                                                    // maps it; a new one gets its heap
//     kvt::ex::mmap::segment_allocator<int> allocator(segment.segment_manager());
//     using Numbers = boost::container::deque<int, kvt::ex::mmap::segment_allocator<int>>;
//     auto* numbers = segment.segment_manager()->find_or_construct<Numbers>("numbers")(allocator);
//     segment.release();                                                      // flushes and unmaps: `numbers` is gone
//     segment.load(false);                                                    // find_or_construct finds them again
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/mmap/segment_file.h>

#include <boost/interprocess/allocators/allocator.hpp>
#include <boost/interprocess/indexes/iset_index.hpp>
#include <boost/interprocess/managed_external_buffer.hpp>
#include <boost/interprocess/mem_algo/rbtree_best_fit.hpp>
#include <boost/interprocess/offset_ptr.hpp>
#include <boost/interprocess/sync/mutex_family.hpp>

#include <memory>

namespace boost::interprocess {
class file_mapping;
}

namespace kvt::ex::mmap {

/// The heap of a segment, without any lock of its own.
using segment_heap = boost::interprocess::basic_managed_external_buffer<
    char,
    boost::interprocess::rbtree_best_fit<
        boost::interprocess::null_mutex_family,
        boost::interprocess::offset_ptr<void, long long, unsigned long long,
                                        boost::interprocess::offset_type_alignment>>,
    boost::interprocess::iset_index>;

/// An allocator for what lives in a segment; made from a segment_manager().
template <typename T>
using segment_allocator = boost::interprocess::allocator<T, segment_heap::segment_manager>;

static_assert(
    sizeof(segment_heap::memory_algorithm) == segment_file::algorithmSize &&
        sizeof(segment_heap::segment_manager) == segment_file::headSize,
    "the head of a heap is part of the form of persistent files (docs/segment_file.md); this version of "
    "Boost.Interprocess lays it out in another way, so files would not be readable across versions");

/// The index of a segment that stands in no table.
inline constexpr unsigned long long k_no_index = 0xFFFFFFFF;

/// Nothing here takes a lock: a segment and what is in it are used by one thread at a time.
///
/// The file is sparse, and room on the disk is taken when memory is written to for the first time. When the disk is
/// full at that moment, the system has no way to report it but the signal SIGBUS, which ends the process. load() takes
/// the room for the beginnings of a heap itself and fails in good order; for what a program writes afterwards no one
/// does.
///
/// All that a program writes into a segment is in the file, the bytes between the members of its own types included.
/// Boost writes four such bytes in front of each object that construct() makes in a segment, and in a program built
/// without optimisation they are what happened to lie on the stack.
class KVT_EXPORT mapped_region_segment {
public:
    /// No stretch of any file: offset -1, size 0, index k_no_index. Not to be loaded.
    mapped_region_segment();
    /// `size` bytes of the file of `mapping` at `offset`, a multiple of the page size. It is not mapped yet, and
    /// counts as holding no heap. `mapping` is not owned; it must exist whenever the segment is loaded.
    mapped_region_segment(const boost::interprocess::file_mapping* mapping, long long offset,
                          unsigned long long size, unsigned long long index);
    /// A moved-from segment may be destroyed or assigned to, and asked for its offset (-1), size (0xFFFFFFFF) and index
    /// (k_no_index).
    mapped_region_segment(mapped_region_segment&& other) noexcept;
    /// Exchanges the two: what this segment was ends with `other`.
    mapped_region_segment& operator=(mapped_region_segment&& other) noexcept;
    /// Unmaps, without a flush: what was written reaches the disk when the system sees fit.
    ~mapped_region_segment();

    /// Maps the stretch and opens its heap; does nothing on a segment that is loaded.
    ///
    /// `initialised` says that the stretch holds a heap already, which is believed: bytes that hold none are read as
    /// one: what uses it may crash, damage the file, or never end. Without it a heap is made over whatever is there,
    /// unless this segment was loaded before: then the heap of that time is opened.
    ///
    /// Throws boost::interprocess::interprocess_exception, and the segment is not loaded:
    ///   - with the code size_error, when the stretch does not lie in the file as it is, or begins at an offset that is
    ///     no multiple of the page size,
    ///   - with the system's error, when it cannot be mapped or when the disk has no room for the heap's beginnings,
    ///   - "Could not initialize buffer in basic_managed_external_buffer constructor", when the stretch is too small
    ///     for a heap.
    void load(bool initialised);

    /// Unmaps the stretch; all pointers into it become invalid. If anything is allocated in the heap, waits until all
    /// that was written is on the disk; a failure of that is not reported. This is the one way to have a segment
    /// survive a loss of power. Gives the segment's size in bytes, or 0 when it was not loaded.
    unsigned long long release();

    /// Where the stretch begins, in bytes from the beginning of the file.
    long long offset() const noexcept;
    /// How long it is, in bytes.
    unsigned long long size() const noexcept;
    /// Its index for memory_manager::open_segment, or k_no_index.
    unsigned long long index() const noexcept;
    /// The heap, null while the segment is not loaded. It stands at the beginning of the mapped memory.
    segment_heap::segment_manager* segment_manager() const noexcept;

private:
    struct KVT_HIDDEN segment_state;

    std::unique_ptr<segment_state> state_;
    std::unique_ptr<segment_heap> buffer_; // set while the segment is loaded
};

} // namespace kvt::ex::mmap
