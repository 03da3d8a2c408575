// The border between the work and the host: how results are made and how failures become messages.
//
// Every public function hands its work to `guarded`. The work returns an Outcome of the result or of what resultOf()
// makes it from: what it knows to answer itself, good or bad, or a Failure, which the function's `words` turn into a
// message. Whatever is left, an exception from outside included, gets the function's last resort. So nothing is thrown
// at the host.
//
//     TextResult cast(const UString<0>& value, CastToTemporalType target) {
//         return guarded<UString<0>>([&] {
//             return readValue(viewOf(value)).andThen([&](const CanonicalRecord& record) { ... });
//         });
//     }
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/failure.h>

#include <cstdint>
#include <initializer_list>
#include <optional>
#include <span>
#include <string_view>
#include <tuple>
#include <type_traits>
#include <utility>

namespace kvt::ex::datetime::detail {

template <typename Value>
using Result = std::tuple<ReturnState, Value, kvt::future::optional<LogMessageInfo>>;

/// A message from its number and parameters.
LogMessageInfo message(std::uint32_t number, std::span<const std::string_view> parameters);
inline LogMessageInfo message(std::uint32_t number, std::initializer_list<std::string_view> parameters = {}) {
    return message(number, std::span(parameters.begin(), parameters.size()));
}

/// The message without anything to say: 933068.
LogMessageInfo genericMessage();

/// Selects the generic message.
struct WithGenericMessage {};

template <typename Value>
Result<Value> makeDateTimeResult(ReturnState state, Value value) {
    return Result<Value>(state, std::move(value), std::nullopt);
}
template <typename Value>
Result<Value> makeDateTimeResult(ReturnState state, Value value, LogMessageInfo info) {
    return Result<Value>(state, std::move(value), std::move(info));
}
template <typename Value>
Result<Value> makeDateTimeResult(ReturnState state, Value value, WithGenericMessage) {
    return Result<Value>(state, std::move(value), genericMessage());
}

/// Makes the message in its place: to move one takes memory.
void setMessage(kvt::future::optional<LogMessageInfo>& info, std::uint32_t number,
                std::initializer_list<std::string_view> parameters);

/// State `Failure`, an empty value, and a message.
template <typename Value>
Result<Value> failed(std::uint32_t number, std::initializer_list<std::string_view> parameters = {}) {
    Result<Value> result(ReturnState::Failure, Value(), std::nullopt);
    setMessage(std::get<2>(result), number, parameters);
    return result;
}

/// The message of a failure whose words depend on nothing but the failure: ValueUnsupported (933063),
/// IntervalUnreadable (933064), KindsNotComparable (933059), DatePartRange (933065) and those of a single function.
/// None for the others.
std::optional<LogMessageInfo> messageOf(const Failure& failure);

/// What a function answers where there are no words.
enum class LastResort {
    Generic,          ///< 933068
    UnexpectedFormat, ///< 933084
    Silence,          ///< no message
};

/// Puts the message of a last resort into `info`: none for `Silence`, and none where memory does not suffice for it.
void setLastMessage(kvt::future::optional<LogMessageInfo>& info, LastResort resort) noexcept;

/// The answer of a last resort. A function of one return, since moving the finished result could fail for lack of
/// memory.
template <typename Value>
Result<Value> lastAnswer(LastResort resort) noexcept {
    Result<Value> result(ReturnState::Failure, Value(), std::nullopt);
    setLastMessage(std::get<2>(result), resort);
    return result;
}

/// Runs `work`, which returns an Outcome of Result<Value> or of what resultOf() takes; `words` returns
/// std::optional<LogMessageInfo> for a Failure. Work that words its failures itself returns Result<Value>.
template <typename Value, typename Work, typename Words>
Result<Value> guarded(Work&& work, LastResort resort, Words&& words) {
    try {
        if constexpr (std::is_same_v<std::invoke_result_t<Work>, Result<Value>>) {
            return work();
        } else {
            auto outcome = work();
            if (outcome) {
                if constexpr (std::is_same_v<std::remove_reference_t<decltype(*outcome)>, Result<Value>>) {
                    return std::move(*outcome);
                } else {
                    return resultOf(*outcome);
                }
            }
            if (std::optional<LogMessageInfo> info = words(outcome.failure())) {
                return makeDateTimeResult(ReturnState::Failure, Value(), std::move(*info));
            }
        }
    } catch (...) {
        // Whatever it was, the host gets the last resort below.
    }
    return lastAnswer<Value>(resort);
}

template <typename Value, typename Work>
Result<Value> guarded(Work&& work, LastResort resort = LastResort::Generic) {
    return guarded<Value>(std::forward<Work>(work), resort, messageOf);
}

} // namespace kvt::ex::datetime::detail
