#include "translate/job_text.h"

#include <vector>

namespace host {

namespace {

using Lines = std::vector<std::string>;

std::string line(const std::string& name, const std::string& value) {
    return name + " = " + tomlString(value) + "\n";
}

void addIf(Lines& lines, const std::string& name, const std::string& value, const std::string& usual) {
    if (value != usual) {
        lines.push_back(line(name, value));
    }
}

std::string section(const std::string& name, const Lines& lines) {
    std::string text = lines.empty() ? "" : "[" + name + "]\n";
    for (const std::string& one : lines) {
        text += one;
    }
    return lines.empty() ? text : text + "\n";
}

} // namespace

std::string tomlString(std::string_view utf8) {
    std::string out = "\"";
    for (const char c : utf8) {
        constexpr std::string_view digits = "0123456789ABCDEF";
        const auto byte = static_cast<unsigned char>(c);
        if (c == '"' || c == '\\') {
            out += '\\';
            out += c;
        } else if (c == '\t') {
            out += "\\t";
        } else if (byte < 0x20 || byte == 0x7F) {
            out += "\\u00";
            out += digits[byte >> 4];
            out += digits[byte & 15];
        } else {
            out += c;
        }
    }
    return out + "\"";
}

std::string jobText(const Job& job) {
    const Job usual;
    Lines input = {line("encoding", job.input.encoding), line("delimiter", job.input.delimiter)};
    addIf(input, "quote", job.input.quote, usual.input.quote);
    if (!job.input.hasHeader) {
        input.push_back("header = false\n");
    }
    Lines output = {line("encoding", job.output.encoding)};
    addIf(output, "delimiter", job.output.delimiter, usual.output.delimiter);
    addIf(output, "line-ends", job.output.lineEnds, usual.output.lineEnds);
    if (job.output.quoteAll) {
        output.push_back("quote-all = true\n");
    }
    Lines failures;
    addIf(failures, "on-error", job.onError, usual.onError);
    if (!job.mostErrors.empty()) {
        failures.push_back("max-errors = " + job.mostErrors + "\n");
    }
    std::string text = section("input", input) + section("output", output) + section("failures", failures);
    for (const JobStep& step : job.steps) {
        Lines lines = {line("do", step.name)};
        for (const auto& [name, value] : step.arguments) {
            lines.push_back(line(name, value));
        }
        text += section("[step]", lines);
    }
    return text;
}

} // namespace host
