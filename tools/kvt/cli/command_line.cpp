#include "cli/command_line.h"

#include "base/failure.h"
#include "base/output.h"
#include "base/text.h"
#include "base/text_units.h"
#include "base/unicode_data.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "cli/suggest.h"
#include "cli/syntax.h"

#include <boost/version.hpp>
#include <CLI/CLI.hpp>

#include <algorithm>
#include <vector>

namespace host {

#define KVT_COMMAND(name) CommandInfo name##Command();
#include "cli/command_list.h"
#undef KVT_COMMAND

namespace {

constexpr const char* examples = R"(kvt convert --from Shift_JIS --to UTF-8 old.txt -o new.txt
kvt infer people.csv -o people.toml
kvt translate --job people.toml people.csv -o clean.csv
kvt COMMAND --help)";

constexpr const char* summary = "kvt translates text, dates and tables, and accounts for every loss";

constexpr const char* notes =
    R"(Data goes to standard output, everything else to standard error, both of which
are UTF-8 but for text that stays in the encoding in which it was read. With
--quiet, of the latter only the reason why something is not done is left. A set
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

// The option or operand about which `error` is; null where it is about none.
const CLI::Option* concerned(const CLI::App& app, const CLI::ParseError& error) {
    const std::string text = error.what();
    const std::string name = text.substr(0, text.find_first_of(": "));
    for (const CLI::Option* option : app.get_options()) {
        if (option->get_name() == name || option->check_name(name) || option->check_name("--" + name) ||
            option->check_name("-" + name)) {
            return option;
        }
    }
    return nullptr;
}

// What is wrong where all words are known.
std::string complaintAboutKnown(const CLI::App& place, const CLI::ParseError& error) {
    const CLI::Option* option = concerned(place, error);
    if (option == nullptr) {
        return "the options do not go together";
    }
    const std::string name = option->get_name();
    if (dynamic_cast<const CLI::RequiredError*>(&error) != nullptr) {
        return name + " is required";
    }
    if (option->get_items_expected_max() == 0) {
        return name + " takes no value";
    }
    return option->count() > 1 ? name + " is given more than once"
                               : name + " takes a value: " + name + " " + option->get_type_name();
}

// Of short options in one word, the first that there is not.
std::string firstUnknown(const std::string& word, const CLI::App& app) {
    const bool isCluster = word.size() > 2 && word[0] == '-' && word[1] != '-';
    const std::vector<std::string> names = optionNames(app);
    for (std::size_t at = 1; isCluster && at < word.size(); ++at) {
        const std::string name = std::string("-") + word[at];
        if (std::find(names.begin(), names.end(), name) == names.end()) {
            return isAscii(word[at]) ? name : word;
        }
    }
    return word;
}

// What is wrong about a word that is neither an option nor wanted.
std::string complaintAbout(const std::string& word, const CLI::App& place) {
    const std::vector<std::string> commands = commandNames(place);
    if (!word.starts_with("-") || word == "-") {
        return commands.empty() ? "unexpected argument '" + printable(word) + "'"
                                : "unknown command '" + printable(word) + "'." + didYouMean(word, commands);
    }
    const std::string option = firstUnknown(word, place);
    return "unknown option '" + printable(option) + "'." + didYouMean(option, optionNames(place));
}

// What was wrong with the command line. An unknown word is the likely cause of everything else that is missing.
std::string complaint(const CLI::App& app, const CLI::ParseError& error) {
    std::vector<std::string> unknown = app.remaining(true);
    std::erase(unknown, "--"); // which is in it where nothing stands behind
    const CLI::App& place = innermost(app);
    if (!unknown.empty()) {
        return complaintAbout(unknown.front().substr(0, unknown.front().find('=')), place);
    }
    return place.get_require_subcommand_min() != 0
               ? "which command? There are " + listed(commandNames(place)) + "."
               : complaintAboutKnown(place, error);
}

int refuse(const CLI::App& app, const CLI::ParseError& error, Diagnostics& diagnostics) {
    diagnostics.fail(complaint(app, error));
    diagnostics.line("Try '" + fullName(innermost(app)) + " --help'.");
    return NotDone;
}

// The program with all its commands, as it is declared.
struct Program {
    CLI::App app{summary, "kvt"};
    Syntax root{app};
    bool showVersions = false;
    bool isQuiet = false;
    std::vector<CommandInfo> commands = allCommands();
    std::vector<const Syntax*> syntaxes;

    Program() {
        root.setHelp(examples, notes);
        root.flag("--version", showVersions, "Print the versions of kvt, ICU and Boost");
        for (const CommandInfo& command : commands) {
            Syntax& its = root.subcommand(command.name, command.summary);
            its.setHelp(command.examples, command.notes);
            command.command->declare(its);
            syntaxes.push_back(&its);
        }
        root.flagForAll("-q,--quiet", isQuiet, "Say nothing but why it is not done");
    }
};

} // namespace

int runCommandLine(int argc, const char* const* argv, Diagnostics& diagnostics) {
    Program program;
    CLI::App& app = program.app;
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
        if (program.showVersions && app.remaining(true).empty() && app.get_subcommands().empty()) {
            print(versions());
            return Done;
        }
        if (argc < 2) {
            diagnostics.line(app.help());
            return NotDone;
        }
        return refuse(app, error, diagnostics);
    }
    if (program.isQuiet) {
        diagnostics.beQuiet();
    }
    for (std::size_t index = 0; index < program.commands.size(); ++index) {
        if (program.syntaxes[index]->isChosen()) {
            return program.commands[index].command->run(diagnostics);
        }
    }
    return NotDone;
}

SyntaxPage describeCommandLine() {
    return Program().root.page();
}

} // namespace host
