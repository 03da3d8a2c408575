// The character set of the process's locale.
#pragma once

#include <cstdint>
#include <string>

namespace kvt::platform {

struct CodeSet {
    /// The number of the code page, 0 when the system does not name its character set by one.
    std::uint32_t codePage;
    /// The name as the system spells it.
    std::string name;
};

/// Sets the process's LC_CTYPE locale from its environment and gives that locale's character set. The plain "C"
/// locale says nothing about text; it counts as UTF-8, and LC_CTYPE is set accordingly.
CodeSet processCodeSet();

} // namespace kvt::platform
