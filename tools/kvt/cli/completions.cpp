#include "cli/completions.h"

#include <algorithm>
#include <functional>

namespace host {

namespace {

constexpr const char* head = "completion for kvt, made from what 'kvt --help' is made from\n";
// All encodings by their first names.
constexpr const char* encodings = "kvt encodings 2>/dev/null | sed '1d; s/ .*//'";

void forEachPage(const SyntaxPage& page, const std::function<void(const SyntaxPage&)>& use) {
    use(page);
    for (const SyntaxPage& command : page.commands) {
        forEachPage(command, use);
    }
}

std::string joined(const std::vector<std::string>& words, const std::string& separator) {
    std::string text;
    for (const std::string& word : words) {
        text += (text.empty() ? "" : separator) + word;
    }
    return text;
}

std::string replaced(std::string text, const std::string& from, const std::string& to) {
    for (std::size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size())) {
        text.replace(at, from.size(), to);
    }
    return text;
}

// In single quotes; the shells differ in how one gets into them.
std::string quoted(const std::string& text) {
    return "'" + replaced(text, "'", "'\\''") + "'";
}

std::string lastWord(const std::string& name) {
    return name.substr(name.rfind(' ') + 1);
}

std::vector<std::string> commandNames(const SyntaxPage& page) {
    std::vector<std::string> names;
    for (const SyntaxPage& command : page.commands) {
        names.push_back(lastWord(command.name));
    }
    return names;
}

bool takesFiles(const SyntaxPage& page) {
    return std::any_of(page.operands.begin(), page.operands.end(),
                       [](const SyntaxItem& operand) { return operand.names.front() == "FILE"; });
}

// ---- bash

// What completes a value, as a command that fills COMPREPLY.
std::string bashAction(const SyntaxItem& option) {
    if (!option.words.empty()) {
        return "COMPREPLY=($(compgen -W " + quoted(joined(option.words, " ")) + " -- \"$cur\"))";
    }
    if (option.value == "ENC") {
        return "COMPREPLY=($(compgen -W \"$(" + std::string(encodings) + ")\" -- \"$cur\"))";
    }
    if (option.value == "FILE" || option.value == "DIR") {
        return std::string("compopt -o filenames 2>/dev/null; COMPREPLY=($(compgen ") +
               (option.value == "DIR" ? "-d" : "-f") + " -- \"$cur\"))";
    }
    return ":";
}

std::string bashOptions(const SyntaxPage& page) {
    std::vector<std::string> names;
    for (const SyntaxItem& option : page.options) {
        names.insert(names.end(), option.names.begin(), option.names.end());
    }
    return joined(names, " ");
}

} // namespace

std::string bashCompletion(const SyntaxPage& program) {
    std::string paths;
    std::string contents;
    std::string values;
    forEachPage(program, [&](const SyntaxPage& page) {
        paths += (paths.empty() ? "" : " | ") + quoted(page.name);
        contents += "    " + quoted(page.name) + ")\n        options=" + quoted(bashOptions(page)) +
                    "\n        commands=" + quoted(joined(commandNames(page), " ")) + "\n";
        contents += std::string("        files=") + (takesFiles(page) ? "yes" : "") + "\n        ;;\n";
        for (const SyntaxItem& option : page.options) {
            if (option.value.empty()) {
                continue;
            }
            std::vector<std::string> patterns;
            for (const std::string& name : option.names) {
                // Without "=", a value that may be left out is left out.
                patterns.push_back(quoted(page.name + " " + name + (option.valueIsOptional ? "=" : "")));
                if (!option.valueIsOptional) {
                    patterns.push_back(quoted(page.name + " " + name + "="));
                }
            }
            values += "    " + joined(patterns, " | ") + ")\n        " + bashAction(option) +
                      "\n        return\n        ;;\n";
        }
    });
    return std::string("# bash ") + head + R"(
_kvt() {
    local cur=${COMP_WORDS[COMP_CWORD]} prev=${COMP_WORDS[COMP_CWORD - 1]}
    local path=kvt options= commands= files= index
    # To bash, "=" is a word of its own.
    if [[ $cur == = ]]; then
        cur=
        prev+==
    elif [[ $prev == = ]]; then
        prev=${COMP_WORDS[COMP_CWORD - 2]}=
    fi
    COMPREPLY=()
    for ((index = 1; index < COMP_CWORD; ++index)); do
        case "$path ${COMP_WORDS[index]}" in
        )" +
           paths + R"() path+=" ${COMP_WORDS[index]}" ;;
        esac
    done
    case "$path $prev" in
)" + values +
           R"(    esac
    case "$path" in
)" + contents +
           R"(    esac
    if [[ $cur == -* ]]; then
        COMPREPLY=($(compgen -W "$options" -- "$cur"))
    elif [[ -n $commands ]]; then
        COMPREPLY=($(compgen -W "$commands" -- "$cur"))
    elif [[ -n $files ]]; then
        compopt -o filenames 2>/dev/null
        COMPREPLY=($(compgen -f -- "$cur"))
    fi
}
complete -F _kvt kvt
)";
}

// ---- zsh

namespace {

// Within what _arguments is told of an option, in single quotes.
std::string zshText(const std::string& text) {
    std::string out = text;
    for (const char* special : {"\\", "[", "]", ":"}) {
        out = replaced(out, special, std::string("\\") + special);
    }
    return replaced(out, "'", "'\\''");
}

std::string zshAction(const SyntaxItem& option) {
    return !option.words.empty()    ? "(" + joined(option.words, " ") + ")"
           : option.value == "ENC"  ? "_kvt_encodings"
           : option.value == "FILE" ? "_files"
           : option.value == "DIR"  ? "_files -/"
                                    : " ";
}

std::string zshFunction(const SyntaxPage& page) {
    return "_" + replaced(page.name, " ", "_");
}

std::string zshOption(const SyntaxPage&, const SyntaxItem& option) {
    const std::string all = joined(option.names, " ");
    // An option that may come again excludes nothing.
    const std::string before = option.isRepeated ? "'*'" : "'(" + all + ")'";
    std::string out;
    for (const std::string& name : option.names) {
        const bool isLong = name.starts_with("--");
        const std::string equals = option.value.empty()     ? ""
                                   : option.valueIsOptional ? (isLong ? "=-" : "")
                                   : isLong                 ? "="
                                                            : "+";
        const std::string value =
            option.value.empty() || (option.valueIsOptional && !isLong)
                ? ""
                : (option.valueIsOptional ? "::" : ":") + zshText(option.value) + ":" + zshAction(option);
        out += " \\\n        " + before + quoted(name + equals) + "'[" + zshText(option.help) + "]" + value +
               "'";
    }
    return out;
}

std::string zshOperand(const SyntaxItem& operand) {
    const std::string& name = operand.names.front();
    return std::string(" \\\n        '") + (operand.isRepeated ? "*" : "") +
           (operand.isRequired   ? ":"
            : operand.isRepeated ? ":"
                                 : "::") +
           zshText(name) + ":" + (name == "FILE" ? "_files" : " ") + "'";
}

} // namespace

std::string zshCompletion(const SyntaxPage& program) {
    std::string out = std::string("#compdef kvt\n# zsh ") + head + R"zsh(
_kvt_encodings() {
    local -a names
    names=(${(f)"$()zsh" +
                      encodings + R"zsh()"})
    compadd -a names
}
)zsh";
    forEachPage(program, [&](const SyntaxPage& page) {
        out += "\n" + zshFunction(page) +
               "() {\n    local curcontext=$curcontext state line\n    _arguments -s -S -C";
        for (const SyntaxItem& option : page.options) {
            out += zshOption(page, option);
        }
        for (const SyntaxItem& operand : page.operands) {
            out += zshOperand(operand);
        }
        if (page.commands.empty()) {
            out += "\n}\n";
            return;
        }
        std::string choices;
        std::string cases;
        for (const SyntaxPage& command : page.commands) {
            const std::string name = lastWord(command.name);
            choices += " " + name + "\\:" + "\"" + zshText(replaced(command.summary, "\"", "")) + "\"";
            cases += "        " + name + ") " + zshFunction(command) + " ;;\n";
        }
        out += " \\\n        ':command:((" + choices.substr(1) + "))' \\\n        '*::argument:->argument'\n";
        out += "    if [[ $state == argument ]]; then\n        case $words[1] in\n" + cases +
               "        esac\n    fi\n}\n";
    });
    return out + "\n_kvt \"$@\"\n";
}

// ---- fish

namespace {

std::string fishQuoted(const std::string& text) {
    return "'" + replaced(replaced(text, "\\", "\\\\"), "'", "\\'") + "'";
}

std::string fishValue(const SyntaxItem& option) {
    if (option.value.empty() || option.valueIsOptional) {
        return option.words.empty() ? "" : " -a " + fishQuoted(joined(option.words, " "));
    }
    return !option.words.empty()    ? " -x -a " + fishQuoted(joined(option.words, " "))
           : option.value == "ENC"  ? " -x -a " + fishQuoted("(" + std::string(encodings) + ")")
           : option.value == "FILE" ? " -r -F"
           : option.value == "DIR"  ? " -x -a '(__fish_complete_directories)'"
                                    : " -x";
}

} // namespace

std::string fishCompletion(const SyntaxPage& program) {
    std::string paths;
    std::string lines;
    forEachPage(program, [&](const SyntaxPage& page) {
        paths += " " + fishQuoted(page.name);
        const std::string here =
            "complete -c kvt -n " + fishQuoted("__kvt_is_at " + replaced(page.name, " ", "_"));
        if (!takesFiles(page)) {
            lines += here + " -f\n";
        }
        for (const SyntaxPage& command : page.commands) {
            lines += here + " -a " + lastWord(command.name) + " -d " + fishQuoted(command.summary) + "\n";
        }
        for (const SyntaxItem& option : page.options) {
            lines += here;
            for (const std::string& name : option.names) {
                lines += name.starts_with("--") ? " -l " + name.substr(2) : " -s " + name.substr(1);
            }
            lines += fishValue(option) + " -d " + fishQuoted(option.help) + "\n";
        }
    });
    return std::string("# fish ") + head + "\nset -g __kvt_paths" + paths + R"(

# Whether the words so far name this command.
function __kvt_is_at
    set -l path kvt
    for word in (commandline -opc)[2..]
        if contains -- "$path $word" $__kvt_paths
            set path "$path $word"
        end
    end
    test (string replace -a ' ' _ -- $path) = $argv[1]
end

)" + lines;
}

} // namespace host
