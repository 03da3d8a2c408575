#include <kvt/mmap/memory_registrar.h>

namespace kvt::ex {

mmap::object_mgr::~object_mgr() = default;

MemoryRegistrar& MemoryRegistrar::operator=(const MemoryRegistrar&) noexcept {
    return *this;
}

MemoryRegistrar& MemoryRegistrar::operator=(MemoryRegistrar&&) noexcept {
    return *this;
}

void MemoryRegistrar::registerManager(mmap::object_mgr*) {}

void MemoryRegistrar::deregisterManager(mmap::object_mgr*) {}

std::uint64_t MemoryRegistrar::freeMemory(std::uint64_t) {
    return 0;
}

const std::int64_t FileManager::npos;
const std::uint64_t FileManager::alignment;
const std::int64_t FileManager::growth_size;
const std::int64_t FileManager::max_file_size;

} // namespace kvt::ex
