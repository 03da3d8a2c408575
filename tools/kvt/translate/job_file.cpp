#include "translate/job_file.h"

#include "base/failure.h"
#include "base/input.h"
#include "base/text.h"
#include "base/text_units.h"
#include "cli/suggest.h"
#include "translate/plan.h"
#include "translate/step_table.h"

namespace host {
/// Thrown where the reader of TOML takes something for granted that a text does not hold to.
struct TomlSurprise {};
[[noreturn]] static void beSurprised() {
    throw TomlSurprise();
}
} // namespace host

// The reader is compiled here alone. Where it asserts, some texts get there, and a build without assertions would go on
// into what is undefined.
#undef NDEBUG
#define TOML_ASSERT(condition) ((condition) ? static_cast<void>(0) : ::host::beSurprised())
#define TOML_HEADER_ONLY 1
#define TOML_EXCEPTIONS 1
#define TOML_ENABLE_FORMATTERS 0
#include <toml++/toml.h>

#include <algorithm>
#include <cstdint>
#include <functional>
#include <optional>
#include <string_view>
#include <utility>
#include <vector>

namespace host {

namespace {

// No job is nearly as long.
constexpr std::size_t longestFile = 16 * 1024 * 1024;

std::string contents(const std::string& path) {
    Input input(path);
    std::string text;
    for (std::string_view block = input.read(); !block.empty(); block = input.read()) {
        text += block;
        if (text.size() > longestFile) {
            throw Failure(input.name() + " is too long for a job");
        }
    }
    return text;
}

// Behind the string that begins with the quote at `at`: of one line, or of several between three quotes.
std::size_t behindString(std::string_view text, std::size_t at) {
    const char quote = text[at];
    const bool isLong = text.substr(at).starts_with(std::string(3, quote));
    const std::string end(isLong ? 3 : 1, quote);
    for (at += end.size(); at < text.size(); ++at) {
        if (text.substr(at).starts_with(end)) {
            at += end.size();
            while (isLong && at < text.size() && text[at] == quote) {
                ++at; // one or two more are text
            }
            return at;
        }
        if (text[at] == '\n' && !isLong) {
            return at;
        }
        at += quote == '"' && text[at] == '\\' ? 1 : 0;
    }
    return text.size();
}

// The first character beyond ASCII that is neither in a string nor in a comment, where TOML has none. The reader of TOML
// is undefined for some of them.
std::optional<std::size_t> strayCharacter(std::string_view text) {
    for (std::size_t at = text.starts_with("\xEF\xBB\xBF") ? 3 : 0; at < text.size();) {
        if (text[at] == '"' || text[at] == '\'') {
            at = behindString(text, at);
        } else if (text[at] == '#') {
            at = std::min(text.find('\n', at), text.size());
        } else if (!isAscii(text[at])) {
            return at;
        } else {
            ++at;
        }
    }
    return std::nullopt;
}

toml::source_position positionOf(std::string_view text, std::size_t at) {
    const std::string_view before = text.substr(0, at);
    const std::string_view line = before.substr(before.rfind('\n') + 1); // npos + 1 is 0
    const auto continued = std::count_if(line.begin(), line.end(), isContinuation);
    return {static_cast<toml::source_index>(1 + std::count(before.begin(), before.end(), '\n')),
            static_cast<toml::source_index>(1 + line.size() - static_cast<std::size_t>(continued))};
}

class JobReader {
public:
    JobReader(std::string file, const std::string& zoneDatabase)
        : file_(std::move(file)), zoneDatabase_(zoneDatabase) {}

    Job read(const toml::table& document) {
        forEach(document,
                {{"input", [&](const toml::node& node) { readInput(table(node, "input")); }},
                 {"output", [&](const toml::node& node) { readOutput(table(node, "output")); }},
                 {"failures", [&](const toml::node& node) { readFailures(table(node, "failures")); }},
                 {"step", [&](const toml::node& node) { readSteps(node); }}});
        return std::move(job_);
    }

    [[noreturn]] void refuse(const toml::source_position& place, const std::string& what) const {
        throw Failure(printable(file_) + ":" + std::to_string(place.line) + ":" +
                      std::to_string(place.column) + ": " + what);
    }

private:
    using Readers = std::vector<std::pair<std::string, std::function<void(const toml::node&)>>>;

    void readInput(const toml::table& input) {
        forEach(input, {{"encoding", text(job_.input.encoding)},
                        {"delimiter", character(job_.input.delimiter)},
                        {"quote", character(job_.input.quote)},
                        {"header", flag(job_.input.hasHeader)}});
    }

    void readOutput(const toml::table& output) {
        forEach(output, {{"encoding", text(job_.output.encoding)},
                         {"delimiter", character(job_.output.delimiter)},
                         {"line-ends", word(job_.output.lineEnds, rowEndWords())},
                         {"quote-all", flag(job_.output.quoteAll)}});
    }

    void readFailures(const toml::table& failures) {
        forEach(failures,
                {{"on-error", word(job_.onError, onErrorWords())}, {"max-errors", number(job_.mostErrors)}});
    }

    void readSteps(const toml::node& node) {
        const toml::array* const steps = node.as_array();
        if (steps == nullptr) {
            refuse(node, "a step begins with '[[step]]'");
        }
        for (const toml::node& step : *steps) {
            readStep(table(step, "step"));
        }
    }

    void readStep(const toml::table& step) {
        std::string name;
        StepArguments arguments;
        for (const auto& [key, value] : step) {
            if (key.str() == "do") {
                name = textOf(value);
            } else {
                arguments.emplace_back(std::string(key.str()), argumentOf(key.str(), value));
            }
        }
        if (name.empty()) {
            refuse(step, "'do' is missing, which names the step");
        }
        try {
            job_.steps.push_back(makeStep(name, std::move(arguments), zoneDatabase_));
        } catch (const Failure& failure) {
            refuse(step, failure.what());
        }
    }

    // ---- Values

    Readers::value_type::second_type text(std::string& target) {
        return [&](const toml::node& node) { target = textOf(node); };
    }
    Readers::value_type::second_type flag(bool& target) {
        return [&](const toml::node& node) {
            const toml::value<bool>* const value = node.as_boolean();
            if (value == nullptr) {
                refuse(node, "this is true or false");
            }
            target = value->get();
        };
    }
    Readers::value_type::second_type number(std::string& target) {
        return [&](const toml::node& node) {
            const toml::value<std::int64_t>* const value = node.as_integer();
            if (value == nullptr || value->get() < 0) {
                refuse(node, "this is a whole number from 0");
            }
            target = std::to_string(value->get());
        };
    }
    Readers::value_type::second_type character(std::string& target) {
        return [&](const toml::node& node) {
            target = textOf(node);
            try {
                asciiCharacter("this", target);
            } catch (const Failure& failure) {
                refuse(node, failure.what());
            }
        };
    }
    Readers::value_type::second_type word(std::string& target, std::vector<std::string> words) {
        return [this, &target, words = std::move(words)](const toml::node& node) {
            target = textOf(node);
            if (std::find(words.begin(), words.end(), target) == words.end()) {
                std::string all;
                for (const std::string& one : words) {
                    all += (all.empty() ? "'" : ", '") + one + "'";
                }
                refuse(node, "this is one of " + all + ", not '" + printable(target) + "'");
            }
        };
    }

    std::string textOf(const toml::node& node) const {
        const toml::value<std::string>* const value = node.as_string();
        if (value == nullptr) {
            refuse(node, "this is a text in quotes");
        }
        return value->get();
    }

    // Numbers stand for their digits, and lists for what is typed in their place.
    std::string argumentOf(std::string_view key, const toml::node& node) const {
        if (const toml::value<std::int64_t>* const number = node.as_integer()) {
            return std::to_string(number->get());
        }
        const toml::array* const list = node.as_array();
        if (list == nullptr) {
            return textOf(node);
        }
        std::string texts;
        for (const toml::node& item : *list) {
            texts += texts.empty() ? "" : key == "format" ? "|" : ",";
            texts += key == "format" ? formatOf(item) : nameOf(item);
        }
        return texts;
    }

    // With each "|" doubled, which stands between formats.
    std::string formatOf(const toml::node& node) const {
        std::string format = textOf(node);
        for (std::size_t at = format.find('|'); at != std::string::npos; at = format.find('|', at + 2)) {
            format.insert(at, 1, '|');
        }
        return format;
    }

    std::string nameOf(const toml::node& node) const {
        std::string name = textOf(node);
        if (name.find(',') != std::string::npos) {
            refuse(node, "a column with a comma in its name stands in a list by its number");
        }
        return name;
    }

    const toml::table& table(const toml::node& node, const std::string& name) const {
        const toml::table* const found = node.as_table();
        if (found == nullptr) {
            refuse(node, "'" + name + "' is a table, as in '[" + name + "]'");
        }
        return *found;
    }

    void forEach(const toml::table& table, const Readers& readers) const {
        for (const auto& [key, value] : table) {
            const auto reader =
                std::find_if(readers.begin(), readers.end(),
                             [&, &name = key](const auto& other) { return other.first == name.str(); });
            if (reader == readers.end()) {
                std::vector<std::string> names;
                for (const auto& other : readers) {
                    names.push_back(other.first);
                }
                refuse(key.source().begin, "nothing is called '" + printable(key.str()) + "' here." +
                                               didYouMean(std::string(key.str()), names));
            }
            reader->second(value);
        }
    }

    [[noreturn]] void refuse(const toml::node& node, const std::string& what) const {
        refuse(node.source().begin, what);
    }

    std::string file_;
    std::string zoneDatabase_;
    Job job_;
};

} // namespace

Job readJob(std::string_view text, const std::string& file, const std::string& zoneDatabase) {
    JobReader reader(file, zoneDatabase);
    if (const auto stray = strayCharacter(text)) {
        reader.refuse(positionOf(text, *stray),
                      "a character that is not ASCII stands outside of strings and comments");
    }
    try {
        return reader.read(toml::parse(text));
    } catch (const toml::parse_error& error) {
        reader.refuse(error.source().begin, std::string(error.description()));
    } catch (const TomlSurprise&) {
        reader.refuse({1, 1}, "this is not TOML");
    }
}

Job readJobFile(const std::string& path, const std::string& zoneDatabase) {
    return readJob(contents(path), path, zoneDatabase);
}

} // namespace host
