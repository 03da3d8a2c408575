// Memory that is going to be written, and that the process may never have touched.
#pragma once

#include <cstddef>

namespace kvt::platform {

/// Bytes from which on `fetchPages` is worth its call.
constexpr std::size_t manyNewBytes = 256 * 1024;

/// Has the system put pages behind memory of the caller that is written next, all at once. Left alone, it stops the
/// writer at each page that is touched for the first time, which takes longer than a conversion of what is written there.
/// What stands in the memory stays. Where the system cannot do it, nothing happens.
void fetchPages(void* begin, std::size_t bytes);

} // namespace kvt::platform
