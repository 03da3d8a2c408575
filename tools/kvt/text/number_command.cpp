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

enum class NumberFault { None, NotANumber, OutsideTheRange };

// Lines that are not numbers may be many: nothing is thrown, and nothing worded.
template <typename Number>
NumberFault read(std::string_view text, Number& number) {
    // std::from_chars knows no plus sign, and it takes the payload of a NaN, which would be lost.
    std::string_view unsignedText = trimmed(text);
    const bool plus = unsignedText.starts_with('+');
    unsignedText.remove_prefix(plus ? 1 : 0);
    const char* const end = unsignedText.data() + unsignedText.size();
    number = 0;
    const std::from_chars_result result = std::from_chars(unsignedText.data(), end, number);
    if (result.ec == std::errc::invalid_argument || result.ptr != end || unsignedText.ends_with(')') ||
        (plus && unsignedText.starts_with('-'))) {
        return NumberFault::NotANumber;
    }
    // Not all run-times report what has become infinite or zero.
    const std::string_view digits = unsignedText.substr(0, unsignedText.find_first_of("eE"));
    const bool spelt = digits.find_first_of("0123456789") == std::string_view::npos;
    const bool vanished = number == 0 && digits.find_first_of("123456789") != std::string_view::npos;
    const bool isOutside = result.ec != std::errc() || vanished || (std::isinf(number) && !spelt);
    return isOutside ? NumberFault::OutsideTheRange : NumberFault::None;
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
                    throw Failure("argument " + std::to_string(index + 1) + ": " + reason());
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
        const std::size_t before = out.size();
        fault_ = appendShortest(text, out);
        const bool isNumber = fault_ == NumberFault::None;
        if (!isNumber) {
            failed_ = text;
        }
        if (json_) {
            nlohmann::ordered_json object;
            if (line) {
                object["line"] = *line;
            }
            object["value"] = text;
            object["result"] = isNumber ? nlohmann::ordered_json(out.substr(before)) : nullptr;
            if (!isNumber) {
                object["message"] = reason();
            }
            out.resize(before);
            out += object.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace);
        }
        out += '\n';
        return isNumber;
    }

    std::string_view kind() const override {
        return fault_ == NumberFault::NotANumber ? "not a number" : "outside the range";
    }
    std::string reason() const override {
        const std::string value = "\"" + printable(failed_) + "\" is ";
        return fault_ == NumberFault::NotANumber
                   ? value + "not a number"
                   : value + "outside the range of " + (single_ ? "single" : "double") + "-precision numbers";
    }

    NumberFault appendShortest(std::string_view text, std::string& out) const {
        return single_ ? appendShortest<float>(text, out) : appendShortest<double>(text, out);
    }

    template <typename Number>
    NumberFault appendShortest(std::string_view text, std::string& out) const {
        Number number = 0;
        const NumberFault fault = read(text, number);
        if (fault != NumberFault::None) {
            return fault;
        }
        std::array<char, kvt::ex::floatTextBuffer> digits;
        out.append(digits.data(), write(number, digits.data()));
        return NumberFault::None;
    }

    std::uint64_t write(double number, char* digits) const {
        return xml_ ? kvt::ex::double_to_string_xml(number, digits)
                    : kvt::ex::double_to_string(number, digits);
    }
    // XML has no form in single precision, and only values without digits would differ in it.
    std::uint64_t write(float number, char* digits) const {
        return xml_ && !std::isfinite(number)
                   ? kvt::ex::double_to_string_xml(static_cast<double>(number), digits)
                   : kvt::ex::float_to_string(number, digits);
    }

    std::vector<std::string> numbers_;
    ValueLines lines_;
    NumberFault fault_ = NumberFault::None;
    std::string failed_; ///< the value that failed last
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
