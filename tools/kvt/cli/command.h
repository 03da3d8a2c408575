// What a command is to the program: a name, its help, options that it declares, and a function to run.
//
// A new command is one file, `NAME_command.cpp`, that defines `CommandInfo NAMECommand()`, one line in
// command_list.h, and the file's name in CMakeLists.txt.
#pragma once

#include "base/diagnostics.h"
#include "cli/syntax.h"

#include <memory>
#include <string>

namespace host {

class Command {
public:
    virtual ~Command() = default;
    /// Declares options, operands and subcommands.
    virtual void declare(Syntax& syntax) = 0;
    /// Does the work after the command line was read; gives an ExitStatus. Throws Failure, ClosedPipe and what the
    /// library throws.
    virtual int run(Diagnostics& diagnostics) = 0;
};

struct CommandInfo {
    std::string name;
    /// One line for the list of commands and the head of the help.
    std::string summary;
    /// Command lines, one on each line; the help begins with them.
    std::string examples;
    /// What the help says behind the options, exit statuses included.
    std::string notes;
    std::unique_ptr<Command> command;
};

} // namespace host
