// The unit in which the system maps memory.
#pragma once

#include <cstdint>

namespace kvt::platform {

/// Bytes of a page; asked for once in a process.
std::uint64_t pageSize();

} // namespace kvt::platform
