// What a command takes, as plain data: what manual pages and completions are made of.
#pragma once

#include <string>
#include <vector>

namespace host {

/// An option, or an operand.
struct SyntaxItem {
    /// "-i" and "--ignore-case"; of an operand, one without hyphens.
    std::vector<std::string> names;
    /// What the help calls its value; empty for an option without one.
    std::string value;
    /// The value stands behind "=" or is left out.
    bool valueIsOptional = false;
    bool isRequired = false;
    /// It may be there several times.
    bool isRepeated = false;
    std::string help;
    /// The values that there are, where they are few.
    std::vector<std::string> words;
};

struct SyntaxPage {
    /// From the program on: "kvt date parse".
    std::string name;
    std::string summary;
    /// Command lines, one on each line.
    std::string examples;
    std::string notes;
    std::vector<SyntaxItem> options;
    std::vector<SyntaxItem> operands;
    std::vector<SyntaxPage> commands;
};

} // namespace host
