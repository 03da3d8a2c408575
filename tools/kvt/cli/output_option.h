// -o, which is the same for all commands.
#pragma once

#include "cli/syntax.h"

#include <string>

namespace host {

/// Declares it; the path goes into `path`, as for openOutput().
inline void declareOutput(Syntax& syntax, std::string& path) {
    syntax.option("-o,--output", path, "FILE", "Where the output goes; '-' is standard output, the default");
}

} // namespace host
