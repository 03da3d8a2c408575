#include "cli/command_line.h"

#include "base/failure.h"
#include "base/output.h"
#include "base/text.h"
#include "base/unicode_data.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "cli/suggest.h"
#include "cli/syntax.h"

#include <boost/version.hpp>
#include <CLI/CLI.hpp>

#include <vector>

namespace host {

#define KVT_COMMAND(name) CommandInfo name##Command();
#include "cli/command_list.h"
#undef KVT_COMMAND

namespace {

constexpr const char* examples = R"(kvt convert --from Shift_JIS --to UTF-8 old.txt -o new.txt
kvt encodings latin1
kvt COMMAND --help)";

constexpr const char* notes =
    R"(Data goes to standard output, everything else to standard error, both of which
are UTF-8 but for the text that 'convert', 'text' and 'match' write. A set
NO_COLOR keeps colours away.

Exit status, of every command:
  0  done
  1  done, but something was lost
  2  not done)";

std::vector<CommandInfo> allCommands() {
    std::vector<CommandInfo> commands;
#define KVT_COMMAND(name) commands.push_back(name##Command());
#include "cli/command_list.h"
#undef KVT_COMMAND
    return commands;
}

std::string versions() {
    return std::string("kvt " KVT_VERSION "\nICU ") + icuVersion() + "\nBoost " +
           std::to_string(BOOST_VERSION / 100000) + "." + std::to_string(BOOST_VERSION / 100 % 1000) + "." +
           std::to_string(BOOST_VERSION % 100) + "\n";
}

// The command whose options were being read when reading ended.
const CLI::App& innermost(const CLI::App& app) {
    const auto chosen = app.get_subcommands();
    return chosen.empty() ? app : innermost(*chosen.back());
}

std::string fullName(const CLI::App& app) {
    return app.get_parent() == nullptr ? app.get_name() : fullName(*app.get_parent()) + " " + app.get_name();
}

std::vector<std::string> optionNames(const CLI::App& app) {
    std::vector<std::string> names;
    for (const CLI::Option* option : app.get_options()) {
        for (const std::string& name : option->get_lnames()) {
            names.push_back("--" + name);
        }
        for (const std::string& name : option->get_snames()) {
            names.push_back("-" + name);
        }
    }
    return names;
}

std::vector<std::string> commandNames(const CLI::App& app) {
    std::vector<std::string> names;
    for (const CLI::App* command : app.get_subcommands({})) {
        names.push_back(command->get_name());
    }
    return names;
}

std::string listed(const std::vector<std::string>& names) {
    std::string list;
    for (const std::string& name : names) {
        list += (list.empty() ? "'" : ", '") + name + "'";
    }
    return list;
}

// What was wrong with the command line. An unknown word is the likely cause of everything else that is missing.
std::string complaint(const CLI::App& app, const CLI::ParseError& error) {
    const std::vector<std::string> unknown = app.remaining(true);
    const CLI::App& place = innermost(app);
    if (unknown.empty() && place.get_require_subcommand_min() != 0) {
        return "which command? There are " + listed(commandNames(place)) + ".";
    }
    if (unknown.empty()) {
        return error.what();
    }
    const std::string word = unknown.front().substr(0, unknown.front().find('='));
    if (word.starts_with("-")) {
        return "unknown option '" + printable(word) + "'." + didYouMean(word, optionNames(place));
    }
    const std::vector<std::string> commands = commandNames(place);
    return commands.empty() ? "unexpected argument '" + printable(word) + "'"
                            : "unknown command '" + printable(word) + "'." + didYouMean(word, commands);
}

int refuse(const CLI::App& app, const CLI::ParseError& error, Diagnostics& diagnostics) {
    diagnostics.say(complaint(app, error));
    diagnostics.line("Try '" + fullName(innermost(app)) + " --help'.");
    return NotDone;
}

} // namespace

int runCommandLine(int argc, const char* const* argv, Diagnostics& diagnostics) {
    CLI::App app("kvt converts text between character encodings and accounts for every loss", "kvt");
    Syntax root(app);
    root.setHelp(examples, notes);
    bool showVersions = false;
    app.add_flag("--version", showVersions, "Print the versions of kvt, ICU and Boost");
    const std::vector<CommandInfo> commands = allCommands();
    std::vector<const Syntax*> syntaxes;
    for (const CommandInfo& command : commands) {
        Syntax& its = root.subcommand(command.name, command.summary);
        its.setHelp(command.examples, command.notes);
        command.command->declare(its);
        syntaxes.push_back(&its);
    }
    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForHelp& call) {
        // Help for a command that there is not would be help with something else.
        const CLI::App& place = innermost(app);
        if (!place.get_subcommands({}).empty() && !place.remaining().empty()) {
            return refuse(app, call, diagnostics);
        }
        print(app.help());
        return Done;
    } catch (const CLI::ParseError& error) {
        if (showVersions && app.remaining(true).empty() && app.get_subcommands().empty()) {
            print(versions());
            return Done;
        }
        if (argc < 2) {
            diagnostics.line(app.help());
            return NotDone;
        }
        return refuse(app, error, diagnostics);
    }
    for (std::size_t index = 0; index < commands.size(); ++index) {
        if (syntaxes[index]->isChosen()) {
            return commands[index].command->run(diagnostics);
        }
    }
    return NotDone;
}

} // namespace host
