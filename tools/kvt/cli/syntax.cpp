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

} // namespace

Option& Option::required() {
    option_->required();
    return *this;
}

Option& Option::hidden() {
    option_->group("");
    return *this;
}

bool Option::isGiven() const {
    return option_ != nullptr && option_->count() != 0;
}

Syntax::Syntax(CLI::App& app) : app_(app) {}

Syntax::~Syntax() = default;

Option Syntax::flag(const std::string& names, bool& isGiven, const std::string& help) {
    return Option(*app_.add_flag(names, isGiven, help));
}

Option Syntax::flag(const std::string& names, const std::string& implied, std::string& value,
                    const std::string& valueName, const std::string& help) {
    return Option(*app_.add_flag(names + "{" + implied + "}", value, help)->type_name(valueName));
}

Option Syntax::option(const std::string& names, std::string& value, const std::string& valueName,
                      const std::string& help) {
    return Option(*app_.add_option(names, value, help)->type_name(valueName));
}

Option Syntax::option(const std::string& names, std::vector<std::string>& values,
                      const std::string& valueName, const std::string& help) {
    // One value for each time that the option is named, whatever stands behind it.
    return Option(*app_.add_option(names, values, help)->type_name(valueName)->allow_extra_args(false));
}

Option Syntax::option(const std::string& names, std::function<void(const std::string&)> take,
                      const std::string& valueName, const std::string& help) {
    return Option(
        *app_.add_option_function(names,
                                  std::function<void(const std::vector<std::string>&)>(
                                      [take = std::move(take)](const auto& values) { take(values.back()); }),
                                  help)
             ->type_name(valueName)
             ->allow_extra_args(false)
             ->trigger_on_parse());
}

Option Syntax::operand(const std::string& name, std::string& value, const std::string& help) {
    return Option(*app_.add_option(name, value, help)->type_name(""));
}

Option Syntax::operand(const std::string& name, std::vector<std::string>& values, const std::string& help) {
    return Option(*app_.add_option(name, values, help)->type_name(""));
}

Syntax& Syntax::subcommand(const std::string& name, const std::string& summary) {
    app_.require_subcommand(1);
    subcommands_.push_back(std::make_unique<Syntax>(*app_.add_subcommand(name, summary)));
    return *subcommands_.back();
}

bool Syntax::isChosen() const {
    return app_.parsed();
}

void Syntax::setHelp(const std::string& examples, const std::string& notes) {
    app_.formatter(std::make_shared<ExampleFirst>(examples));
    app_.footer(notes);
}

} // namespace host
