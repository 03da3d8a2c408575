// `kvt number`: the shortest text of floating-point numbers.

#include "base/failure.h"
#include "base/output.h"
#include "base/text.h"
#include "base/text_units.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "text/line_reader.h"
#include "text/value_lines.h"

#include <kvt/codec/float_text.h>

#include <nlohmann/json.hpp>

#include <array>
#include <charconv>
#include <cmath>
#include <memory>
#include <optional>

namespace host {

namespace {

constexpr const char* examples = R"(kvt number 0.10000000000000001 1e3
kvt number -- -2.50e-7
printf '1e10\nInfinity\n' | kvt number --xml)";

constexpr const char* notes =
    R"(Takes each NUMBER as the nearest double-precision number and prints the fewest
digits that read back to that, one on a line; without any NUMBER, standard input
is read, one number on each line. Put '--' before the numbers when one of them
begins with '-'.

A number is decimal, with or without a sign, a fraction and an exponent, or one
of inf, infinity and nan in upper or lower case; blanks around it are passed
over. What is printed has the forms 1500, 0.0015, 1e+20 and 1e-5.

What is none, is too large for the precision, or too close to zero to be told
from it, fails. A line that fails leaves an empty line, so that lines keep their
numbers; a NUMBER that fails ends the command.

Exit status:
  0  done
  1  done, but some lines failed
  2  not done)";

// Throws Failure, with the text but no place.
template <typename Number>
Number parsed(std::string_view text) {
    // std::from_chars knows no plus sign, and it takes the payload of a NaN, which would be lost.
    std::string_view unsignedText = trimmed(text);
    const bool plus = unsignedText.starts_with('+');
    unsignedText.remove_prefix(plus ? 1 : 0);
    const char* const end = unsignedText.data() + unsignedText.size();
    Number number = 0;
    const std::from_chars_result result = std::from_chars(unsignedText.data(), end, number);
    if (result.ec == std::errc::invalid_argument || result.ptr != end || unsignedText.ends_with(')') ||
        (plus && unsignedText.starts_with('-'))) {
        throw Failure("\"" + printable(text) + "\" is not a number");
    }
    // Not all run-times report what has become infinite or zero.
    const std::string_view digits = unsignedText.substr(0, unsignedText.find_first_of("eE"));
    const bool spelt = digits.find_first_of("0123456789") == std::string_view::npos;
    const bool vanished = number == 0 && digits.find_first_of("123456789") != std::string_view::npos;
    if (result.ec != std::errc() || vanished || (std::isinf(number) && !spelt)) {
        throw Failure("\"" + printable(text) + "\" is outside the range of " +
                      (sizeof(Number) == sizeof(float) ? "single" : "double") + "-precision numbers");
    }
    return number;
}

class NumberCommand : public Command, private LineWork {
public:
    void declare(Syntax& syntax) override {
        syntax.flag("--xml", xml_, "Spell the special values as XML Schema does: INF, -INF and NaN");
        syntax.flag("--single", single_, "Read and print single-precision numbers");
        lines_.declare(syntax);
        syntax.flag("--json", json_, "Print a JSON object on a line for each number, failures included");
        syntax.operand("NUMBER", numbers_, "Numbers to print; those of standard input without any");
    }

    int run(Diagnostics& diagnostics) override {
        if (numbers_.empty()) {
            return lines_.run(*this, json_, diagnostics);
        }
        const std::unique_ptr<Output> output = openOutput(lines_.output());
        bool isGood = true;
        for (std::size_t index = 0; index < numbers_.size(); ++index) {
            std::string out;
            if (!append(numbers_[index], std::nullopt, out)) {
                if (!json_) {
                    throw Failure("argument " + std::to_string(index + 1) + ": " + reason_);
                }
                isGood = false;
            }
            output->write(out);
        }
        output->commit();
        return isGood ? Done : NotDone;
    }

private:
    // The lines of files.
    bool apply(const TextLine& line, std::string& out) override {
        return append(line.text, line.number, out);
    }

    // Appends what becomes of a number. Whether it is one.
    bool append(std::string_view text, std::optional<std::uint64_t> line, std::string& out) {
        std::optional<std::string> result;
        try {
            result = shortest(text);
        } catch (const Failure& failure) {
            reason_ = failure.what();
        }
        if (json_) {
            nlohmann::ordered_json object;
            if (line) {
                object["line"] = *line;
            }
            object["value"] = text;
            object["result"] = result ? nlohmann::ordered_json(*result) : nullptr;
            if (!result) {
                object["message"] = reason_;
            }
            out += object.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
        } else {
            out += result.value_or("");
        }
        out += '\n';
        return result.has_value();
    }

    std::string_view kind() const override {
        return reason_.ends_with("numbers") ? "outside the range" : "not a number";
    }
    std::string reason() const override { return reason_; }

    std::string shortest(std::string_view text) const {
        if (!single_) {
            const auto number = parsed<double>(text);
            return shown(xml_ ? kvt::ex::double_to_string_xml : kvt::ex::double_to_string, number);
        }
        const auto number = parsed<float>(text);
        // There is no form for XML in single precision, and only values without digits would differ in it.
        return xml_ && !std::isfinite(number)
                   ? shown(kvt::ex::double_to_string_xml, static_cast<double>(number))
                   : shown(kvt::ex::float_to_string, number);
    }

    template <typename Number>
    static std::string shown(std::uint64_t (*write)(Number, char*), Number number) {
        std::array<char, kvt::ex::floatTextBuffer> buffer;
        return {buffer.data(), write(number, buffer.data())};
    }

    std::vector<std::string> numbers_;
    ValueLines lines_;
    std::string reason_;
    bool xml_ = false;
    bool single_ = false;
    bool json_ = false;
};

} // namespace

CommandInfo numberCommand() {
    return {"number", "Print floating-point numbers with the fewest digits", examples, notes,
            std::make_unique<NumberCommand>()};
}

} // namespace host
