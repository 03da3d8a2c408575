// `kvt explain`: from the number of a message to its text.

#include "base/failure.h"
#include "base/messages.h"
#include "base/output.h"
#include "base/text.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "cli/output_option.h"

#include <charconv>

namespace host {

namespace {

constexpr const char* examples = R"(kvt explain 910003
kvt explain 910003 'Café' UTF-8 US-ASCII)";

constexpr const char* notes = R"(The library names its failures by number and parameters, as in
'msgnum=910005 %0=UTF-9'. This prints the text for a number, with the PARAMETERs
in the places of %0, %1 and so on; places without one are shown as they are.

Exit status:
  0  done
  2  not done: there is no text for that number, or it takes fewer parameters)";

std::string knownNumbers() {
    std::string list;
    for (const Message& message : messages()) {
        list += (list.empty() ? "" : ", ") + std::to_string(message.number);
    }
    return list;
}

const Message& messageOf(const std::string& typed) {
    std::uint32_t number = 0;
    const char* end = typed.data() + typed.size();
    const auto [stop, error] = std::from_chars(typed.data(), end, number);
    const Message* message = error == std::errc() && stop == end ? findMessage(number) : nullptr;
    if (message == nullptr) {
        throw Failure("there is no message " + printable(typed) + "; there are " + knownNumbers());
    }
    return *message;
}

class ExplainCommand : public Command {
public:
    void declare(Syntax& syntax) override {
        syntax.operand("NUMBER", number_, "Number of a message").required();
        syntax.operand("PARAMETER", parameters_, "What takes the places of %0, %1 and so on");
        declareOutput(syntax, output_);
    }

    int run(Diagnostics&) override {
        const Message& message = messageOf(number_);
        const std::size_t most = parameterCount(message);
        if (parameters_.size() > most) {
            throw Failure("message " + number_ + " takes " + counted(most, "parameter", "parameters") +
                          ", not " + std::to_string(parameters_.size()));
        }
        for (const std::string& parameter : parameters_) {
            requireUtf8("PARAMETER", parameter);
        }
        print(fill(message.text, parameters_) + "\n", output_);
        return Done;
    }

private:
    std::string number_;
    std::vector<std::string> parameters_;
    std::string output_;
};

} // namespace

CommandInfo explainCommand() {
    return {"explain", "Print the text of a message number", examples, notes,
            std::make_unique<ExplainCommand>()};
}

} // namespace host
