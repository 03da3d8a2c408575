// The page size by sysconf.
#include <kvt/platform/page_size.h>

#include <unistd.h>

namespace kvt::platform {

std::uint64_t pageSize() {
    static const auto size = static_cast<std::uint64_t>(sysconf(_SC_PAGESIZE));
    return size;
}

} // namespace kvt::platform
