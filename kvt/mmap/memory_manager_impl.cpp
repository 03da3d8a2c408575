// How a backing file is opened, grows and goes.
//
// The heap of a persistent file's header is made when the header is first wanted, and by then another manager of this
// process may have made it in the same file. So it is then, and not when the file is opened, that the bytes say whether
// there is one: header() is the only way to it.
#include <kvt/mmap/detail/memory_manager_impl.h>
#include <kvt/platform/backing_file.h>
#include <kvt/platform/page_size.h>

#include <filesystem>
#include <stdexcept>
#include <system_error>
#include <utility>

namespace kvt::ex::mmap {

namespace ipc = boost::interprocess;

namespace {

// Unsigned arithmetic: 0 stays 0 with any page size that is a power of two.
unsigned long long roundedToPages(unsigned long long bytes) {
    const unsigned long long page = platform::pageSize();
    return ((bytes - 1) / page + 1) * page;
}

bool isAbsent(const std::string& path) {
    std::error_code error;
    const auto type = std::filesystem::status(path, error).type();
    return type == std::filesystem::file_type::none || type == std::filesystem::file_type::not_found;
}

int descriptorOf(const ipc::file_mapping& mapping) {
    return mapping.get_mapping_handle().handle;
}

} // namespace

memory_manager_impl::memory_manager_impl(const std::string& path, const manager_options& options)
    : path_(path), options_(options) {
    options_.segment_size = roundedToPages(options.segment_size);
    headerPlace_.size = options_.segment_size;
    const bool absent = isAbsent(path_);
    bool hasItsLength = false;
    bool made = false;
    if (!options_.persistent || absent) {
        hasItsLength = options_.persistent && platform::makeFileAtOnce(path_.c_str(), options_.segment_size);
        made = hasItsLength || platform::makeEmptyFile(path_.c_str());
    }
    openMapping(absent && made);
    if (!options_.persistent) {
        return;
    }
    if (absent && !hasItsLength) {
        headerPlace_ = grow(options_.segment_size);
    } else if (!absent && !isHeaderUnused()) {
        openHeader(); // now, so that a file that is too short is reported by the constructor
    }
}

memory_manager_impl::~memory_manager_impl() {
    if (mapping_ == nullptr) {
        return; // moved from, or never opened
    }
    header_.reset();
    const bool worthless =
        headerPlace_.offset == segment_file::noOffset && platform::fileSize(descriptorOf(*mapping_)) == 0;
    mapping_.reset();
    if (!options_.persistent || worthless) {
        ipc::file_mapping::remove(path_.c_str());
    }
}

void memory_manager_impl::openMapping(bool removeOnFailure) {
    try {
        mapping_ = std::make_unique<ipc::file_mapping>(path_.c_str(), ipc::read_write);
    } catch (...) {
        if (removeOnFailure) {
            ipc::file_mapping::remove(path_.c_str());
        }
        throw;
    }
    platform::closeOnExec(descriptorOf(*mapping_));
}

// Whether the stretch of the header is zeros all over, so that no heap is in it yet.
bool memory_manager_impl::isHeaderUnused() const {
    const int file = descriptorOf(*mapping_);
    const long long length = platform::fileSize(file);
    const bool isWhole = headerPlace_.offset == 0 && headerPlace_.size > 0 && length >= 0 &&
                         static_cast<unsigned long long>(length) >= headerPlace_.size;
    return isWhole && platform::holdsZerosOnly(file, 0, headerPlace_.size);
}

void memory_manager_impl::openHeader() {
    mapped_region_segment segment = segmentAt(headerPlace_, k_no_index);
    segment.load(!isHeaderUnused());
    header_ = std::make_unique<managed_object<header_obj>>(std::move(segment));
}

memory_manager_impl::header_obj& memory_manager_impl::header() {
    if (header_ == nullptr) {
        openHeader();
    }
    return *header_->access();
}

memory_manager_impl::segment_record memory_manager_impl::grow(unsigned long long size) const {
    return {platform::growFile(path_.c_str(), size), size};
}

mapped_region_segment memory_manager_impl::segmentAt(const segment_record& record,
                                                     unsigned long long index) const {
    return mapped_region_segment(mapping_.get(), record.offset, record.size, index);
}

// The end of the file, and not the table, says where the segment goes.
mapped_region_segment memory_manager_impl::createSegment(const future::optional<unsigned long long>& size) {
    const segment_record record = grow(size ? roundedToPages(*size) : options_.segment_size);
    unsigned long long index = k_no_index;
    if (options_.persistent) {
        auto& table = header().segment_table;
        index = table.size();
        table.push_back(record);
    }
    return segmentAt(record, index);
}

mapped_region_segment memory_manager_impl::load_segment(unsigned long long index,
                                                        const future::optional<unsigned long long>& size) {
    if (options_.persistent) {
        const auto& table = header().segment_table;
        if (index < table.size()) {
            mapped_region_segment segment = segmentAt(table.at(index), index);
            segment.load(true);
            return segment;
        }
        if (index != k_no_index) {
            throw std::out_of_range("memory_manager: segment index out of range");
        }
    }
    return createSegment(size);
}

void memory_manager_impl::save(const ex::vector<unsigned long long>& words) {
    if (!options_.persistent) {
        return;
    }
    auto& queue = header().saved_queue;
    queue.emplace_back(saved_words::allocator_type(queue.get_allocator()));
    queue.back().assign(words.begin(), words.end());
}

ex::vector<unsigned long long> memory_manager_impl::restore() {
    if (!options_.persistent) {
        return {};
    }
    auto& queue = header().saved_queue;
    if (queue.empty()) {
        return {};
    }
    ex::vector<unsigned long long> words(queue.front().begin(), queue.front().end());
    queue.pop_front();
    return words;
}

} // namespace kvt::ex::mmap
