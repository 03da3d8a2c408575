// What a command is to the program: a name, its help, options that it declares to CLI11, and a function to run.
//
// A new command is one file, `NAME_command.cpp`, that defines `CommandInfo NAMECommand()`, one line in
// command_list.h, and the file's name in CMakeLists.txt.
#pragma once

#include "diagnostics.h"

#include <CLI/CLI.hpp>

#include <memory>
#include <string>

namespace host {

class Command {
public:
    virtual ~Command() = default;
    /// Declares options and positional arguments on the command's own `app`.
    virtual void declare(CLI::App& app) = 0;
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

/// Gives `app` a help that begins with `examples` and ends with `notes`.
void setHelp(CLI::App& app, const std::string& examples, const std::string& notes);

} // namespace host
