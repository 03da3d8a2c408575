#include "command.h"

#include <algorithm>
#include <sstream>

namespace host {

namespace {

// CLI11's help with an example before everything else.
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

void setHelp(CLI::App& app, const std::string& examples, const std::string& notes) {
    app.formatter(std::make_shared<ExampleFirst>(examples));
    app.footer(notes);
}

} // namespace host
