// The backing file of a memory_manager, and the header of a persistent one. Nothing here takes a lock.
//
// The types below are the form of persistent files (docs/segment_file.md), as segment_file.h has it in numbers; what of
// it rests on Boost is asserted at the end.
#pragma once

#include <kvt/foundation/optional.h>
#include <kvt/foundation/vector.h>
#include <kvt/mmap/managed_object.h>
#include <kvt/mmap/mapped_region_segment.h>
#include <kvt/mmap/memory_manager.h>
#include <kvt/mmap/segment_file.h>

#include <boost/container/deque.hpp>
#include <boost/interprocess/file_mapping.hpp>

#include <memory>
#include <string>

namespace kvt::ex::mmap {

class memory_manager_impl {
public:
    template <typename T>
    using segment_deque = boost::container::deque<T, segment_allocator<T>>;
    using saved_words = segment_deque<unsigned long long>;

    // A row of the table of segments, as it stands in the file.
    struct segment_record {
        long long offset; // from the beginning of the file, or segment_file::noOffset
        unsigned long long size;
    };

    // The one named object of a persistent file, as it stands in the file.
    struct header_obj {
        explicit header_obj(const segment_allocator<void>& allocator)
            : segment_table(allocator), saved_queue(allocator) {}

        segment_deque<segment_record> segment_table; // in order of creation; the place is the segment's index
        segment_deque<saved_words> saved_queue;      // oldest first
    };

    memory_manager_impl() = default;
    memory_manager_impl(const std::string& path, const manager_options& options);
    memory_manager_impl(memory_manager_impl&&) noexcept = default;
    memory_manager_impl& operator=(memory_manager_impl&&) = delete;
    ~memory_manager_impl();

    const manager_options& options() const noexcept { return options_; }
    void save(const ex::vector<unsigned long long>& words);
    ex::vector<unsigned long long> restore();
    mapped_region_segment load_segment(unsigned long long index,
                                       const future::optional<unsigned long long>& size);

private:
    void openMapping(bool removeOnFailure);
    bool isHeaderUnused() const;
    void openHeader();
    header_obj& header();
    segment_record grow(unsigned long long size) const;
    mapped_region_segment segmentAt(const segment_record& record, unsigned long long index) const;
    mapped_region_segment createSegment(const future::optional<unsigned long long>& size);

    std::string path_;
    std::unique_ptr<boost::interprocess::file_mapping> mapping_; // segments hold its address
    std::unique_ptr<managed_object<header_obj>> header_;         // null while the header is not in use
    manager_options options_;
    segment_record headerPlace_{
        0, 0}; // of a persistent file; without an offset when there was no room to make it
};

#define KVT_FROZEN                                                                                           \
    "the form of persistent files depends on it (docs/segment_file.md), and this version of "                \
    "Boost.Container "                                                                                       \
    "has another layout: "
static_assert(sizeof(memory_manager_impl::segment_record) == segment_file::rowSize, "a row of the table");
static_assert(sizeof(memory_manager_impl::segment_deque<memory_manager_impl::segment_record>) ==
                  segment_file::listSize,
              KVT_FROZEN "the table of segments");
static_assert(sizeof(memory_manager_impl::segment_deque<memory_manager_impl::saved_words>) ==
                  segment_file::listSize,
              KVT_FROZEN "the queue of saved vectors");
static_assert(sizeof(memory_manager_impl::saved_words) == segment_file::listSize,
              KVT_FROZEN "a saved vector");
static_assert(memory_manager_impl::segment_deque<memory_manager_impl::segment_record>::get_block_size() ==
                  segment_file::rowsInBlock,
              KVT_FROZEN "rows in a block of the table");
static_assert(memory_manager_impl::segment_deque<memory_manager_impl::saved_words>::get_block_size() ==
                  segment_file::vectorsInBlock,
              KVT_FROZEN "vectors in a block of the queue");
static_assert(memory_manager_impl::saved_words::get_block_size() == segment_file::wordsInBlock,
              KVT_FROZEN "words in a block of a saved vector");
static_assert(sizeof(memory_manager_impl::header_obj) == segment_file::headerSize &&
                  alignof(memory_manager_impl::header_obj) == segment_file::headerAlignment,
              KVT_FROZEN "the header, which is the table and then the queue");
#undef KVT_FROZEN

} // namespace kvt::ex::mmap
