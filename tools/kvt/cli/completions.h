// Completions of the command line for three shells, from what the commands declare.
//
// A value is completed by what the help calls it: FILE and DIR are paths, ENC is an encoding, which the program is
// asked for, and words that were declared are themselves. What stands without an option is a path where it is a FILE.
#pragma once

#include "cli/syntax_page.h"

#include <string>

namespace host {

/// Each gives a script as the shell loads it from its folder of completions.
std::string bashCompletion(const SyntaxPage& program);
std::string zshCompletion(const SyntaxPage& program);
std::string fishCompletion(const SyntaxPage& program);

} // namespace host
