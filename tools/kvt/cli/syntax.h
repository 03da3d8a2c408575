// What a command takes: its options, operands and subcommands, declared before the command line is read.
//
// A Syntax refers to variables of the command, into which the reading of the command line puts what was typed. Behind
// this header, and nowhere else, is the library that reads command lines, whose own headers take long to compile.
#pragma once

#include "cli/syntax_page.h"

#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace CLI {
class App;
class Option;
} // namespace CLI

namespace host {

class Syntax;

/// An option or operand that was declared. A copy is the same option.
class Option {
public:
    Option() = default;
    Option(CLI::Option& option, Syntax& syntax) : option_(&option), syntax_(&syntax) {}

    /// It has to be given.
    Option& required();
    /// Help says nothing of it.
    Option& hidden();
    /// Its value is one of these words. For completions: the reader of the value has to look at it all the same.
    Option& takes(std::vector<std::string> words);
    /// Whether it was declared and the command line has it.
    bool isGiven() const;

private:
    CLI::Option* option_ = nullptr;
    Syntax* syntax_ = nullptr;
};

class Syntax {
public:
    /// `app` has to live as long.
    explicit Syntax(CLI::App& app);
    Syntax(const Syntax&) = delete;
    Syntax& operator=(const Syntax&) = delete;
    ~Syntax();

    /// An option without a value. `names` are such as "-i,--ignore-case"; `help` is what the help says.
    Option flag(const std::string& names, bool& isGiven, const std::string& help);
    /// An option whose value, which the help calls `valueName`, stands behind "=" or is left out: then it is `implied`.
    Option flag(const std::string& names, const std::string& implied, std::string& value,
                const std::string& valueName, const std::string& help);
    /// An option with a value, which the help calls `valueName`.
    Option option(const std::string& names, std::string& value, const std::string& valueName,
                  const std::string& help);
    /// The same for one that may be given several times.
    Option option(const std::string& names, std::vector<std::string>& values, const std::string& valueName,
                  const std::string& help);
    /// The same for one of several options whose order counts: what is typed goes to `take` at once.
    Option option(const std::string& names, std::function<void(const std::string&)> take,
                  const std::string& valueName, const std::string& help);
    /// What stands on the command line without the name of an option.
    Option operand(const std::string& name, std::string& value, const std::string& help);
    /// The same for the last one, which may be there any number of times.
    Option operand(const std::string& name, std::vector<std::string>& values, const std::string& help);

    /// The same flag for all commands below this one that do something, or for this one where there are none.
    void flagForAll(const std::string& names, bool& isGiven, const std::string& help);

    /// A command below this one, which lives as long as this one. One of them is required.
    Syntax& subcommand(const std::string& name, const std::string& summary);
    /// Whether the command line names it.
    bool isChosen() const;

    /// The help begins with `examples`, command lines with one on each line, and ends with `notes`.
    void setHelp(const std::string& examples, const std::string& notes);

    /// All that was declared, but for what is hidden.
    SyntaxPage page() const;

private:
    friend class Option;

    CLI::App& app_;
    std::vector<std::unique_ptr<Syntax>> subcommands_;
    std::string examples_;
    std::map<const CLI::Option*, std::vector<std::string>> words_;
};

} // namespace host
