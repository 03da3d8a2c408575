#include "cli/syntax.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <sstream>

namespace host {

namespace {

// The help of CLI11 with an example before everything else.
class ExampleFirst : public CLI::Formatter {
public:
    explicit ExampleFirst(const std::string& examples) {
        std::istringstream lines(examples);
        for (std::string line; std::getline(lines, line);) {
            examples_ += "  " + line + "\n";
        }
        column_width(24);
        // In the words of those who type a command line.
        label("SUBCOMMAND", "COMMAND");
        label("Subcommands", "Commands");
        label("Positionals", "Arguments");
        label("REQUIRED", "(required)");
    }

    std::string make_help(const CLI::App* app, std::string name, CLI::AppFormatMode mode) const override {
        std::string text = "Example:\n" + examples_ + "\n" + app->get_description() + "\n\n";
        text += make_usage(app, name) + make_positionals(app) + make_groups(app, mode) +
                make_subcommands(app, mode);
        return text + "\n" + make_footer(app);
    }

    // CLI11 would show a value that may be left out as "--name{implied} WHEN".
    std::string make_option_name(const CLI::Option* option, bool isPositional) const override {
        const std::string name = CLI::Formatter::make_option_name(option, isPositional);
        const std::size_t brace = name.find('{');
        return brace == std::string::npos ? name
                                          : name.substr(0, brace) + "[=" + option->get_type_name() + "]";
    }

    // And the name of the value once more.
    std::string make_option_opts(const CLI::Option* option) const override {
        return option->get_items_expected_max() == 0 ? "" : CLI::Formatter::make_option_opts(option);
    }

    std::string make_option_desc(const CLI::Option* option) const override {
        return wrapped(option->get_description());
    }

    std::string make_subcommand(const CLI::App* command) const override {
        std::string name = "  " + command->get_name();
        name.resize(std::max(name.size() + 1, get_column_width()), ' ');
        std::string text = name;
        for (const char letter : wrapped(command->get_description()) + "\n") {
            text += letter;
            text.append(letter == '\n' ? get_column_width() : 0, ' ');
        }
        text.resize(text.size() - get_column_width());
        return text;
    }

private:
    std::string wrapped(const std::string& description) const {
        constexpr std::size_t lineLength = 80;
        const std::size_t width = lineLength - get_column_width();
        std::istringstream words(description);
        std::string text;
        std::size_t used = 0;
        for (std::string word; words >> word; used += word.size() + 1) {
            if (used + word.size() > width) {
                text += '\n';
                used = 0;
            } else if (used != 0) {
                text += ' ';
            }
            text += word;
        }
        return text;
    }

    std::string examples_;
};

SyntaxItem itemOf(const CLI::Option& option, std::vector<std::string> words) {
    SyntaxItem item;
    for (const std::string& name : option.get_snames()) {
        item.names.push_back("-" + name);
    }
    for (const std::string& name : option.get_lnames()) {
        item.names.push_back("--" + name);
    }
    if (option.get_positional()) {
        item.names = {option.get_name(true)};
    }
    // A flag whose value may be left out has no type of its own.
    item.valueIsOptional = option.get_items_expected_max() == 0;
    item.value = option.get_positional() ? "" : option.get_type_name();
    item.isRequired = option.get_required();
    item.isRepeated = option.get_items_expected_max() > 1;
    item.help = option.get_description();
    item.words = std::move(words);
    return item;
}

} // namespace

Option& Option::required() {
    option_->required();
    return *this;
}

Option& Option::hidden() {
    option_->group("");
    return *this;
}

Option& Option::takes(std::vector<std::string> words) {
    syntax_->words_[option_] = std::move(words);
    return *this;
}

bool Option::isGiven() const {
    return option_ != nullptr && option_->count() != 0;
}

Syntax::Syntax(CLI::App& app) : app_(app) {
    app_.get_help_ptr()->description("Print this help")->disable_flag_override();
}

Syntax::~Syntax() = default;

Option Syntax::flag(const std::string& names, bool& isGiven, const std::string& help) {
    return {*app_.add_flag(names, isGiven, help)->disable_flag_override(), *this};
}

Option Syntax::flag(const std::string& names, const std::string& implied, std::string& value,
                    const std::string& valueName, const std::string& help) {
    return {*app_.add_flag(names + "{" + implied + "}", value, help)->type_name(valueName), *this};
}

Option Syntax::option(const std::string& names, std::string& value, const std::string& valueName,
                      const std::string& help) {
    return {*app_.add_option(names, value, help)->type_name(valueName), *this};
}

Option Syntax::option(const std::string& names, std::vector<std::string>& values,
                      const std::string& valueName, const std::string& help) {
    // One value for each time that the option is named, whatever stands behind it.
    return {*app_.add_option(names, values, help)->type_name(valueName)->allow_extra_args(false), *this};
}

Option Syntax::option(const std::string& names, std::function<void(const std::string&)> take,
                      const std::string& valueName, const std::string& help) {
    CLI::Option* option =
        app_.add_option_function(names,
                                 std::function<void(const std::vector<std::string>&)>(
                                     [take = std::move(take)](const auto& values) { take(values.back()); }),
                                 help);
    return {*option->type_name(valueName)->allow_extra_args(false)->trigger_on_parse(), *this};
}

Option Syntax::operand(const std::string& name, std::string& value, const std::string& help) {
    return {*app_.add_option(name, value, help)->type_name(""), *this};
}

Option Syntax::operand(const std::string& name, std::vector<std::string>& values, const std::string& help) {
    return {*app_.add_option(name, values, help)->type_name(""), *this};
}

void Syntax::flagForAll(const std::string& names, bool& isGiven, const std::string& help) {
    if (subcommands_.empty()) {
        flag(names, isGiven, help);
    }
    for (const auto& command : subcommands_) {
        command->flagForAll(names, isGiven, help);
    }
}

Syntax& Syntax::subcommand(const std::string& name, const std::string& summary) {
    app_.require_subcommand(1);
    CLI::App* const command = app_.add_subcommand(name, summary)->group("Commands");
    subcommands_.push_back(std::make_unique<Syntax>(*command));
    return *subcommands_.back();
}

bool Syntax::isChosen() const {
    return app_.parsed();
}

void Syntax::setHelp(const std::string& examples, const std::string& notes) {
    examples_ = examples;
    app_.formatter(std::make_shared<ExampleFirst>(examples));
    app_.footer(notes);
}

SyntaxPage Syntax::page() const {
    SyntaxPage page;
    for (const CLI::App* app = &app_; app != nullptr; app = app->get_parent()) {
        page.name.insert(0, page.name.empty() ? app->get_name() : app->get_name() + " ");
    }
    page.summary = app_.get_description();
    page.examples = examples_;
    page.notes = app_.get_footer();
    for (const CLI::Option* option : app_.get_options()) {
        if (!option->get_group().empty()) {
            const auto words = words_.find(option);
            SyntaxItem item =
                itemOf(*option, words == words_.end() ? std::vector<std::string>() : words->second);
            (option->get_positional() ? page.operands : page.options).push_back(std::move(item));
        }
    }
    for (const auto& command : subcommands_) {
        page.commands.push_back(command->page());
    }
    return page;
}

} // namespace host
