// The handle: takes the mutex and passes on.
#include <kvt/mmap/detail/memory_manager_impl.h>
#include <kvt/mmap/memory_manager.h>

namespace kvt::ex {

namespace detail {
template class PimplShared<mmap::memory_manager_impl, std::mutex>;
}

namespace mmap {

namespace {
using Lock = std::lock_guard<std::mutex>;
}

const unsigned long long manager_options::k_default_segment_size;

memory_manager::memory_manager(const std::string& path, const manager_options& options)
    : PimplShared(memory_manager_impl(path, options)) {}

const manager_options& memory_manager::options() const {
    const Lock lock(d().mutex);
    return d().impl.options();
}

bool memory_manager::persistent() const {
    const Lock lock(d().mutex);
    return d().impl.options().persistent;
}

void memory_manager::save(const ex::vector<unsigned long long>& words) {
    const Lock lock(d().mutex);
    d().impl.save(words);
}

ex::vector<unsigned long long> memory_manager::restore() {
    const Lock lock(d().mutex);
    return d().impl.restore();
}

mapped_region_segment memory_manager::load_segment(unsigned long long index,
                                                   future::optional<unsigned long long> size) {
    const Lock lock(d().mutex);
    return d().impl.load_segment(index, size);
}

} // namespace mmap

} // namespace kvt::ex
