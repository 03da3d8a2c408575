// What a date and time function answered, in plain values, so that a test compares all of it at once and prints what
// differs:
//
//     EXPECT_EQ(answerOf(cast("abc", CastToTemporalType::Date)), failure(933063, {"abc"}));
#pragma once

#include <kvt/datetime/datetime_parts.h>

#include <gtest/gtest.h>

#include <cstdint>
#include <ostream>
#include <string>
#include <tuple>
#include <vector>

namespace kvt::test {

struct Answer {
    kvt::ex::datetime::ReturnState state;
    std::string text;
    double number = 0.0;
    std::uint32_t message = 0; ///< 0 for none
    std::vector<std::string> parameters;

    friend bool operator==(const Answer&, const Answer&) = default;
    friend std::ostream& operator<<(std::ostream& stream, const Answer& answer) {
        static const char* const names[] = {"Error", "Failure", "Repaired", "Success"};
        stream << names[static_cast<unsigned>(answer.state)] << " [" << answer.text << "] " << answer.number << " "
               << answer.message;
        for (const std::string& parameter : answer.parameters) {
            stream << " {" << parameter << "}";
        }
        return stream;
    }
};

template <typename Result>
Answer answerWithoutValue(const Result& result) {
    Answer answer{std::get<0>(result), "", 0.0, 0, {}};
    if (const auto& message = std::get<2>(result)) {
        answer.message = message->messageNumber;
        for (const auto& parameter : message->parameters) {
            answer.parameters.push_back(parameter.toStdString());
        }
    }
    return answer;
}

inline Answer answerOf(const kvt::ex::datetime::TextResult& result) {
    Answer answer = answerWithoutValue(result);
    answer.text = std::get<1>(result).toStdString();
    return answer;
}

inline Answer answerOf(const kvt::ex::datetime::NumberResult& result) {
    Answer answer = answerWithoutValue(result);
    answer.number = std::get<1>(result);
    return answer;
}

inline Answer success(std::string text) {
    return {kvt::ex::datetime::ReturnState::Success, std::move(text), 0.0, 0, {}};
}

inline Answer success(double number) {
    return {kvt::ex::datetime::ReturnState::Success, "", number, 0, {}};
}

inline Answer repaired(std::string text) {
    return {kvt::ex::datetime::ReturnState::Repaired, std::move(text), 0.0, 0, {}};
}

inline Answer failure(std::uint32_t message, std::vector<std::string> parameters = {}) {
    return {kvt::ex::datetime::ReturnState::Failure, "", 0.0, message, std::move(parameters)};
}

/// Failure without any message.
inline Answer silentFailure() {
    return failure(0);
}

inline Answer genericFailure() {
    return failure(933068);
}

inline Answer outOfRange(std::string value, std::string part, std::string lowest, std::string highest) {
    return failure(933065, {std::move(value), std::move(part), std::move(lowest), std::move(highest)});
}

inline std::string textOf(const kvt::ex::datetime::TextResult& result) {
    return std::get<1>(result).toStdString();
}

inline kvt::ex::UString<0> ustring(const std::string& text) {
    return kvt::ex::UString<0>(kvt::ex::UStringView<0>(text));
}

} // namespace kvt::test
