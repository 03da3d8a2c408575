// The backing file of a memory_manager, and the header of a persistent one. Nothing here takes a lock.
#pragma once

#include <kvt/foundation/optional.h>
#include <kvt/foundation/vector.h>
#include <kvt/mmap/managed_object.h>
#include <kvt/mmap/mapped_region_segment.h>
#include <kvt/mmap/memory_manager.h>

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
        long long offset; // from the beginning of the file; -1: the file could not grow for it
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
    mapped_region_segment headerOfNewFile(bool hasItsLength);
    mapped_region_segment headerOfOldFile();
    mapped_region_segment segmentAt(const segment_record& record, unsigned long long index) const;
    mapped_region_segment createSegment(const future::optional<unsigned long long>& size);

    std::string path_;
    std::unique_ptr<boost::interprocess::file_mapping> mapping_; // segments hold its address
    std::unique_ptr<managed_object<header_obj>> header_;         // null for a temporary file
    manager_options options_;
    bool withoutHeader_ = false; // a new persistent file for whose header segment there was no room
};

#define KVT_FROZEN                                                                                           \
    "the form of persistent files depends on it, and this version of Boost.Container has another layout: "
static_assert(sizeof(memory_manager_impl::segment_record) == 16,
              "a row of the table is 16 bytes in persistent files");
static_assert(sizeof(memory_manager_impl::segment_deque<memory_manager_impl::segment_record>) == 96,
              KVT_FROZEN "the table of segments is a deque of 96 bytes");
static_assert(sizeof(memory_manager_impl::segment_deque<memory_manager_impl::saved_words>) == 96,
              KVT_FROZEN "the queue of saved vectors is a deque of 96 bytes");
static_assert(sizeof(memory_manager_impl::saved_words) == 96,
              KVT_FROZEN "a saved vector is a deque of 96 bytes");
static_assert(memory_manager_impl::segment_deque<memory_manager_impl::segment_record>::get_block_size() == 32,
              KVT_FROZEN "a block of the table holds 32 rows");
static_assert(memory_manager_impl::segment_deque<memory_manager_impl::saved_words>::get_block_size() == 5,
              KVT_FROZEN "a block of the queue holds 5 vectors");
static_assert(memory_manager_impl::saved_words::get_block_size() == 64,
              KVT_FROZEN "a block of a saved vector holds 64 words");
static_assert(sizeof(memory_manager_impl::header_obj) == 192 && alignof(memory_manager_impl::header_obj) == 8,
              KVT_FROZEN "the header is 192 bytes, aligned to 8: the table, then the queue");
#undef KVT_FROZEN

} // namespace kvt::ex::mmap
