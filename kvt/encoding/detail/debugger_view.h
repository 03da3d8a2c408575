// What a debugger reads to name an encoding, since it cannot call anything in a core dump.
//
// The object is exported so that it is found in a stripped library, too. Its layout is known to tools/gdb/kvt_gdb.py.
#pragma once

#include <kvt/foundation/export.h>

#include <deque>
#include <string>
#include <string_view>

namespace kvt::ex::detail {

struct DebuggerView {
    /// The names of the fixed ids, that of the system's encoding among them.
    const std::string_view* fixedNames;
    /// The names of the ids above them, in order.
    const std::deque<std::string>* dynamicNames;
};

/// Null pointers until the registry is built.
KVT_EXPORT extern DebuggerView encodingNames;

} // namespace kvt::ex::detail
