#include "date/outcome.h"

#include "base/messages.h"
#include "base/text.h"
#include "date/pattern_words.h"

#include <kvt/datetime/message_numbers.h>

#include <charconv>
#include <utility>

namespace host {

namespace {

using kvt::ex::datetime::LogMessageInfo;
using kvt::ex::datetime::ReturnState;
namespace message_number = kvt::ex::datetime::message_number;

// The library names its functions as a host's language does.
constexpr std::pair<const char*, const char*> functionNames[] = {{"@DateTimeParse()", "'parse'"},
                                                                 {"@DateTimeFormat()", "'format'"}};

std::string inUsersWords(const std::string& parameter) {
    for (const auto& [name, word] : functionNames) {
        if (parameter == name) {
            return word;
        }
    }
    return parameter;
}

template <typename Result>
DateOutcome outcomeWithMessage(const Result& result, nlohmann::ordered_json value) {
    DateOutcome outcome{std::get<0>(result), nullptr, std::nullopt};
    if (outcome.isGood()) {
        outcome.result = std::move(value);
    }
    if (const auto& message = std::get<2>(result)) {
        DateMessage& copy = outcome.message.emplace(DateMessage{message->messageNumber, {}});
        for (const kvt::ex::UString<0>& parameter : message->parameters) {
            copy.parameters.push_back(inUsersWords(parameter.toStdString()));
        }
    }
    return outcome;
}

} // namespace

DateOutcome outcomeOf(const kvt::ex::datetime::TextResult& result) {
    DateOutcome outcome = outcomeWithMessage(result, std::get<1>(result).toStdString());
    // The library has no message for a result beyond the last day that a value can hold.
    return outcome.isGood() && std::get<1>(result).isEmpty()
               ? failedOutcome("There is no value for the result: it lies outside the years 1000 to 9999.")
               : outcome;
}

DateOutcome outcomeOf(const kvt::ex::datetime::NumberResult& result) {
    return outcomeWithMessage(result, std::get<1>(result));
}

DateOutcome failedOutcome(std::string why) {
    return {ReturnState::Failure, nullptr, std::nullopt, {}, std::move(why)};
}

const char* stateName(ReturnState state) {
    switch (state) {
    case ReturnState::Error:
        return "Error";
    case ReturnState::Failure:
        return "Failure";
    case ReturnState::Repaired:
        return "Repaired";
    case ReturnState::Success:
        return "Success";
    }
    return "unknown";
}

std::string resultText(const DateOutcome& outcome) {
    if (outcome.result.is_string()) {
        return outcome.result.get<std::string>();
    }
    if (outcome.result.is_number_float()) {
        char digits[400]; // a double without an exponent may be that long
        const auto [end, error] = std::to_chars(digits, digits + sizeof digits, outcome.result.get<double>(),
                                                std::chars_format::fixed);
        return error == std::errc() ? std::string(digits, end) : outcome.result.dump();
    }
    return outcome.result.dump();
}

std::string failureSentence(const DateOutcome& outcome) {
    if (!outcome.message) {
        return outcome.withoutMessage.empty() ? "It failed without a message about why, in the state " +
                                                    std::string(stateName(outcome.state)) + "."
                                              : outcome.withoutMessage;
    }
    if (!outcome.message->text.empty()) {
        return outcome.message->text;
    }
    std::vector<std::string> shown;
    for (const std::string& parameter : outcome.message->parameters) {
        shown.push_back(printable(parameter));
    }
    const std::string text = describe(outcome.message->number, shown);
    if (outcome.message->number != message_number::unknownFlag || shown.size() != 2) {
        return text;
    }
    return text + " There are " + (shown[1] == functionNames[0].second ? readFlags() : writtenFlags()) + ".";
}

std::string failureText(const DateOutcome& outcome) {
    return failureSentence(outcome) +
           (outcome.message ? " (" + std::to_string(outcome.message->number) + ")" : "");
}

std::vector<std::string> markedFormat(const DateOutcome& outcome) {
    if (!outcome.message || outcome.message->number != message_number::formatMismatch ||
        outcome.message->parameters.size() != 2) {
        return {};
    }
    const std::string matched = printable(outcome.message->parameters[0]);
    const std::size_t width = toUtf32(matched, kvt::ex::Encoding::Utf8).size();
    return {matched + printable(outcome.message->parameters[1]), std::string(width, ' ') + "^"};
}

void addTo(nlohmann::ordered_json& object, const DateOutcome& outcome) {
    object["state"] = stateName(outcome.state);
    object["result"] = outcome.result;
    if (outcome.isGood()) {
        return;
    }
    nlohmann::ordered_json message;
    message["number"] = outcome.message ? nlohmann::ordered_json(outcome.message->number) : nullptr;
    message["text"] = failureSentence(outcome);
    message["parameters"] = outcome.message ? outcome.message->parameters : std::vector<std::string>();
    object["message"] = std::move(message);
}

std::string jsonLine(const nlohmann::ordered_json& object) {
    return object.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n";
}

} // namespace host
