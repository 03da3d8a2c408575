// How a backing file is opened, grows and goes.
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
    const bool absent = isAbsent(path_);
    bool hasItsLength = false;
    bool made = false;
    if (!options_.persistent || absent) {
        hasItsLength = options_.persistent && platform::makeFileAtOnce(path_.c_str(), options_.segment_size);
        made = hasItsLength || platform::makeEmptyFile(path_.c_str());
    }
    openMapping(absent && made);
    if (options_.persistent) {
        header_ = std::make_unique<managed_object<header_obj>>(absent ? headerOfNewFile(hasItsLength)
                                                                      : headerOfOldFile());
    }
}

memory_manager_impl::~memory_manager_impl() {
    if (mapping_ == nullptr) {
        return; // moved from, or never opened
    }
    header_.reset();
    const bool worthless = withoutHeader_ && platform::fileSize(descriptorOf(*mapping_)) == 0;
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

mapped_region_segment memory_manager_impl::headerOfNewFile(bool hasItsLength) {
    if (hasItsLength) {
        return segmentAt({0, options_.segment_size}, k_no_index);
    }
    mapped_region_segment segment = createSegment({});
    withoutHeader_ = segment.offset() < 0;
    return segment;
}

// A stretch that is zeros all over has no heap in it: it is left for the first access to make one.
mapped_region_segment memory_manager_impl::headerOfOldFile() {
    const int file = descriptorOf(*mapping_);
    mapped_region_segment segment = segmentAt({0, options_.segment_size}, 0);
    const long long length = platform::fileSize(file);
    const bool isWhole =
        segment.size() > 0 && length >= 0 && static_cast<unsigned long long>(length) >= segment.size();
    if (!isWhole || !platform::holdsZerosOnly(file, 0, segment.size())) {
        segment.load(true);
    }
    return segment;
}

mapped_region_segment memory_manager_impl::segmentAt(const segment_record& record,
                                                     unsigned long long index) const {
    return mapped_region_segment(mapping_.get(), record.offset, record.size, index);
}

// The end of the file, and not the table, says where the segment goes.
mapped_region_segment memory_manager_impl::createSegment(const future::optional<unsigned long long>& size) {
    segment_record record{};
    record.size = size ? roundedToPages(*size) : options_.segment_size;
    record.offset = platform::growFile(path_.c_str(), record.size);
    unsigned long long index = k_no_index;
    if (header_ != nullptr) {
        auto& table = header_->access()->segment_table;
        index = table.size();
        table.push_back(record);
    }
    return segmentAt(record, index);
}

mapped_region_segment memory_manager_impl::load_segment(unsigned long long index,
                                                        const future::optional<unsigned long long>& size) {
    if (header_ != nullptr) {
        const auto& table = header_->access()->segment_table;
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
    if (header_ == nullptr) {
        return;
    }
    auto& queue = header_->access()->saved_queue;
    queue.emplace_back(saved_words::allocator_type(queue.get_allocator()));
    queue.back().assign(words.begin(), words.end());
}

ex::vector<unsigned long long> memory_manager_impl::restore() {
    if (header_ == nullptr) {
        return {};
    }
    auto& queue = header_->access()->saved_queue;
    if (queue.empty()) {
        return {};
    }
    ex::vector<unsigned long long> words(queue.front().begin(), queue.front().end());
    queue.pop_front();
    return words;
}

} // namespace kvt::ex::mmap
