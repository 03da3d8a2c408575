// Mapping by boost::interprocess::mapped_region, which looks neither at the length of the file nor at the room on the
// disk; both are looked at here, since touching memory that has no file behind it ends the process. It also maps a
// stretch from any offset, at an address that is as crooked as the offset; a heap there would be misaligned.
#include <kvt/mmap/mapped_region_segment.h>
#include <kvt/platform/backing_file.h>
#include <kvt/platform/page_size.h>

#include <boost/interprocess/creation_tags.hpp>
#include <boost/interprocess/errors.hpp>
#include <boost/interprocess/exceptions.hpp>
#include <boost/interprocess/file_mapping.hpp>
#include <boost/interprocess/mapped_region.hpp>

#include <memory>

namespace kvt::ex::mmap {

namespace ipc = boost::interprocess;

namespace {

int descriptorOf(const ipc::file_mapping& mapping) {
    return mapping.get_mapping_handle().handle;
}

void requireWholePagesInFile(const ipc::file_mapping& mapping, long long offset, unsigned long long size) {
    const long long end = platform::fileSize(descriptorOf(mapping));
    const bool isWithin =
        offset >= 0 && size > 0 && end >= offset && static_cast<unsigned long long>(end - offset) >= size;
    if (!isWithin || static_cast<unsigned long long>(offset) % platform::pageSize() != 0) {
        throw ipc::interprocess_exception(ipc::error_info(ipc::size_error));
    }
}

// A new heap writes to the first page, and to the last one, which got its room when the file grew.
void takeRoomForHeap(const ipc::file_mapping& mapping, long long offset) {
    const int error = platform::writeZero(descriptorOf(mapping), offset);
    if (error != 0) {
        throw ipc::interprocess_exception(ipc::error_info(error));
    }
}

} // namespace

struct mapped_region_segment::segment_state {
    long long offset = -1;
    unsigned long long size = 0;
    unsigned long long index = k_no_index;
    bool initialised = false; // the stretch holds a heap; never taken back
    std::unique_ptr<ipc::mapped_region> region;
    const ipc::file_mapping* mapping = nullptr;
};

mapped_region_segment::mapped_region_segment() : state_(std::make_unique<segment_state>()) {}

mapped_region_segment::mapped_region_segment(const ipc::file_mapping* mapping, long long offset,
                                             unsigned long long size, unsigned long long index)
    : mapped_region_segment() {
    state_->offset = offset;
    state_->size = size;
    state_->index = index;
    state_->mapping = mapping;
}

mapped_region_segment::mapped_region_segment(mapped_region_segment&& other) noexcept = default;

mapped_region_segment& mapped_region_segment::operator=(mapped_region_segment&& other) noexcept {
    state_.swap(other.state_);
    buffer_.swap(other.buffer_);
    return *this;
}

mapped_region_segment::~mapped_region_segment() = default;

void mapped_region_segment::load(bool initialised) {
    if (buffer_ != nullptr) {
        return;
    }
    segment_state& state = *state_;
    requireWholePagesInFile(*state.mapping, state.offset, state.size);
    if (!initialised && !state.initialised && state.size >= segment_heap::segment_manager::get_min_size()) {
        takeRoomForHeap(*state.mapping, state.offset);
    }
    state.region =
        std::make_unique<ipc::mapped_region>(*state.mapping, ipc::read_write, state.offset, state.size);
    state.initialised = state.initialised || initialised;
    void* const base = state.region->get_address();
    if (state.initialised) {
        buffer_ = std::make_unique<segment_heap>(ipc::open_only, base, state.size);
    } else {
        buffer_ = std::make_unique<segment_heap>(ipc::create_only, base, state.size);
        state.initialised = true;
    }
}

unsigned long long mapped_region_segment::release() {
    if (buffer_ == nullptr) {
        return 0;
    }
    // A heap with nothing in it holds nothing that would be missed.
    if (!buffer_->get_segment_manager()->all_memory_deallocated()) {
        state_->region->flush(0, 0, false);
    }
    buffer_.reset();
    state_->region.reset();
    return state_->size;
}

long long mapped_region_segment::offset() const noexcept {
    return state_ != nullptr ? state_->offset : -1;
}

unsigned long long mapped_region_segment::size() const noexcept {
    return state_ != nullptr ? state_->size : 0xFFFFFFFF;
}

unsigned long long mapped_region_segment::index() const noexcept {
    if (state_ == nullptr) {
        return k_no_index;
    }
    return state_->index;
}

segment_heap::segment_manager* mapped_region_segment::segment_manager() const noexcept {
    return buffer_ != nullptr ? buffer_->get_segment_manager() : nullptr;
}

} // namespace kvt::ex::mmap
