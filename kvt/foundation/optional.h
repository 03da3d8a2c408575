// The optional value of the public signatures: the standard one under the library's own name.
#pragma once

#include <optional>

namespace kvt::future {

/// A value with an engaged flag.
template <typename T>
using optional = std::optional<T>;

} // namespace kvt::future
