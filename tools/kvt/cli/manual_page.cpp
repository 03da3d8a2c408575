// The notes of a command are text for a terminal: paragraphs, in which lines that begin with a blank are meant to stay
// as they are, and a list of exit statuses at the end, which becomes a section of its own.
#include "cli/manual_page.h"

#include "base/text.h"

#include <algorithm>
#include <sstream>

namespace host {

namespace {

// As text, whatever it holds.
std::string escaped(std::string_view text) {
    std::string out;
    for (const char32_t character : toUtf32(text, kvt::ex::Encoding::Utf8)) {
        switch (character) {
        case U'\\':
            out += "\\e";
            break;
        case U'-':
            out += "\\-";
            break;
        case U'\'':
            out += "\\(aq";
            break;
        case U'`':
            out += "\\(ga";
            break;
        case U'^':
            out += "\\(ha";
            break;
        case U'~':
            out += "\\(ti";
            break;
        case U'"':
            out += "\\(dq";
            break;
        default:
            out += character < 0x80 ? std::string(1, static_cast<char>(character))
                                    : "\\[u" + codePointName(character).substr(2) + "]";
        }
    }
    return out;
}

// A line of its own; a point at its start would be a command.
std::string textLine(std::string_view text) {
    return (text.starts_with('.') ? "\\&" : "") + escaped(text) + "\n";
}

std::string bold(std::string_view text) {
    return "\\fB" + escaped(text) + "\\fR";
}

std::string italic(std::string_view text) {
    return "\\fI" + escaped(text) + "\\fR";
}

// Lines that stay as they are, their blanks included.
std::string literal(const std::string& lines) {
    std::string out = ".nf\n";
    std::istringstream in(lines);
    for (std::string line; std::getline(in, line);) {
        out += textLine(line);
    }
    return out + ".fi\n";
}

// Paragraphs.
std::string body(const std::string& notes) {
    std::string out;
    std::string kept; // lines that stay as they are
    const auto flush = [&] {
        out += kept.empty() ? "" : literal(kept);
        kept.clear();
    };
    bool isNew = true;
    std::istringstream in(notes);
    for (std::string line; std::getline(in, line);) {
        if (line.empty()) {
            flush();
            isNew = true;
        } else if (line.starts_with(' ')) {
            kept += line + "\n";
        } else {
            const bool isContinued = kept.empty() && !isNew;
            flush();
            out += isContinued ? "" : ".PP\n";
            out += textLine(line);
            isNew = false;
        }
    }
    flush();
    return out;
}

constexpr std::string_view statusHeading = "Exit status";

std::size_t statusesIn(const std::string& notes) {
    const std::size_t inside = notes.rfind("\n" + std::string(statusHeading));
    return notes.starts_with(statusHeading) ? 0 : inside == std::string::npos ? notes.size() : inside + 1;
}

// "  0  done" and so on, each perhaps over several lines.
std::string statuses(const std::string& notes) {
    std::istringstream in(notes.substr(statusesIn(notes)));
    std::string line;
    std::getline(in, line);
    std::string out = ".SH EXIT STATUS\n";
    while (std::getline(in, line)) {
        const std::size_t begin = std::min(line.find_first_not_of(' '), line.size());
        const std::size_t end = std::min(line.find(' ', begin), line.size());
        if (begin == 2) {
            out += ".TP\n" + bold(line.substr(begin, end - begin)) + "\n";
            line.erase(0, std::min(line.find_first_not_of(' ', end), line.size()));
        } else {
            line.erase(0, begin);
        }
        out += textLine(line);
    }
    return out;
}

std::string synopsis(const SyntaxPage& page) {
    std::string out = ".SH SYNOPSIS\n" + bold(page.name) + " [" + italic("OPTIONS") + "]";
    if (!page.commands.empty()) {
        out += " " + italic("COMMAND");
    }
    for (const SyntaxItem& operand : page.operands) {
        const std::string name = italic(operand.names.front()) + (operand.isRepeated ? "\\|..." : "");
        out += operand.isRequired ? " " + name : " [" + name + "]";
    }
    return out + "\n";
}

std::string item(const SyntaxItem& option, bool isOperand) {
    std::string names;
    for (const std::string& name : option.names) {
        names += (names.empty() ? "" : ", ") + (isOperand ? italic(name) : bold(name));
    }
    if (!option.value.empty()) {
        names += option.valueIsOptional ? "[=" + italic(option.value) + "]" : " " + italic(option.value);
    }
    return ".TP\n" + names + "\n" + textLine(option.help.empty() ? std::string("\\&") : option.help);
}

} // namespace

std::string manualPageName(const SyntaxPage& page) {
    std::string name = page.name;
    std::replace(name.begin(), name.end(), ' ', '-');
    return name;
}

std::string manualPage(const SyntaxPage& page, const SyntaxPage* parent, const PageFoot& foot) {
    std::string title = manualPageName(page);
    std::transform(title.begin(), title.end(), title.begin(),
                   [](char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; });
    std::string out =
        ".TH " + escaped(title) + " 1 " + foot.date + " \"" + foot.version + "\" \"Commands of kvt\"\n";
    out += ".SH NAME\n" + escaped(manualPageName(page)) + " \\- " + escaped(page.summary) + "\n";
    out += synopsis(page);
    out += ".SH DESCRIPTION\n" + textLine(page.summary + ".") +
           body(page.notes.substr(0, statusesIn(page.notes)));
    if (!page.operands.empty()) {
        out += ".SH ARGUMENTS\n";
        for (const SyntaxItem& operand : page.operands) {
            out += item(operand, true);
        }
    }
    out += ".SH OPTIONS\n";
    for (const SyntaxItem& option : page.options) {
        out += item(option, false);
    }
    if (!page.commands.empty()) {
        out += ".SH COMMANDS\n";
        for (const SyntaxPage& command : page.commands) {
            out += ".TP\n.BR " + escaped(manualPageName(command)) + " (1)\n" + textLine(command.summary);
        }
    }
    if (statusesIn(page.notes) != page.notes.size()) {
        out += statuses(page.notes);
    }
    out += ".SH EXAMPLES\n" + literal(page.examples);
    if (parent != nullptr) {
        out += ".SH SEE ALSO\n.BR " + escaped(manualPageName(*parent)) + " (1)\n";
    }
    return out;
}

} // namespace host
