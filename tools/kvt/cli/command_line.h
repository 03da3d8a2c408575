// The command line as a whole: which command, and what to say when it cannot be understood.
#pragma once

#include "base/diagnostics.h"
#include "cli/syntax_page.h"

namespace host {

/// Reads the command line and runs the command. Gives an ExitStatus; throws as a Command does.
int runCommandLine(int argc, const char* const* argv, Diagnostics& diagnostics);

/// What the program takes, with all its commands.
SyntaxPage describeCommandLine();

} // namespace host
