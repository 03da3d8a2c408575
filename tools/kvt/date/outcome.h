// What a date function gave, in one shape for all of them, and how it is shown: the result as a line of text, the
// failure as a sentence with its number, or both as a JSON object.
#pragma once

#include <kvt/datetime/datetime_parts.h>

#include <nlohmann/json.hpp>

#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace host {

struct DateMessage {
    std::uint32_t number;
    std::vector<std::string> parameters;
    std::string text = {}; ///< in place of the sentence that the number has; empty where that fits
};

struct DateOutcome {
    kvt::ex::datetime::ReturnState state;
    nlohmann::ordered_json result; ///< text or number; null where there is none
    std::optional<DateMessage> message;
    /// The format by which a value failed, where it was read by one of several; valid as long as these.
    std::string_view format = {};
    /// What is said about a failure for which the library has no message; empty where nothing more is known.
    std::string withoutMessage = {};

    bool isGood() const {
        return state == kvt::ex::datetime::ReturnState::Success ||
               state == kvt::ex::datetime::ReturnState::Repaired;
    }
};

DateOutcome outcomeOf(const kvt::ex::datetime::TextResult& result);
DateOutcome outcomeOf(const kvt::ex::datetime::NumberResult& result);
/// A failure of this program's own making, without a number.
DateOutcome failedOutcome(std::string why);

/// "Success" and so on.
const char* stateName(kvt::ex::datetime::ReturnState state);

/// The result as it stands, numbers by their shortest digits. For good outcomes.
std::string resultText(const DateOutcome& outcome);

/// The sentence about a failure.
std::string failureSentence(const DateOutcome& outcome);
/// The same with its number in brackets behind it.
std::string failureText(const DateOutcome& outcome);

/// For a value that did not fit a pattern: the pattern, and a line with a mark under the element that failed. Nothing
/// for other failures.
std::vector<std::string> markedFormat(const DateOutcome& outcome);

/// "state", "result" and, for a failure, "message" as members of `object`.
void addTo(nlohmann::ordered_json& object, const DateOutcome& outcome);

/// The object as one line. Bytes that are not UTF-8 become U+FFFD.
std::string jsonLine(const nlohmann::ordered_json& object);

} // namespace host
