// What hosts go on calling, without anything behind it.
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

unsigned long long MemoryRegistrar::freeMemory(unsigned long long) {
    return 0;
}

const long long FileManager::npos;
const unsigned long long FileManager::alignment;
const long long FileManager::growth_size;
const long long FileManager::max_file_size;

} // namespace kvt::ex
