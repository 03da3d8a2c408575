// A value, or why there is none: how a failure travels inside, and the one way of passing it on. Nothing is thrown on
// the way of a value; each step that can fail returns an Outcome, and andThen() goes on with the value or hands the
// failure to whoever called, up to the public function that words it (result.h).
//
//     return readValue(text).andThen([&](const CanonicalRecord& record) {
//         return addInterval(record.count, interval);
//     });
#pragma once

#include <type_traits>
#include <utility>
#include <variant>

namespace kvt::ex::datetime::detail {

template <typename Value, typename Cause>
class Outcome;

template <typename Type>
inline constexpr bool isOutcome = false;
template <typename Value, typename Cause>
inline constexpr bool isOutcome<Outcome<Value, Cause>> = true;

/// Made from a value or from a cause; the two are never the same type.
template <typename Value, typename Cause>
class [[nodiscard]] Outcome {
public:
    /// With a value to be filled in.
    Outcome() = default;
    Outcome(Value value) : state_(std::in_place_index<0>, std::move(value)) {}
    template <typename Given, std::enable_if_t<std::is_constructible_v<Cause, Given&&> &&
                                                   !std::is_convertible_v<Given&&, Value> &&
                                                   !isOutcome<std::remove_cvref_t<Given>>,
                                               int> = 0>
    Outcome(Given&& cause) : state_(std::in_place_index<1>, std::forward<Given>(cause)) {}

    explicit operator bool() const noexcept { return state_.index() == 0; }

    /// Only with a value.
    Value& operator*() noexcept { return *std::get_if<0>(&state_); }
    const Value& operator*() const noexcept { return *std::get_if<0>(&state_); }
    Value* operator->() noexcept { return std::get_if<0>(&state_); }
    const Value* operator->() const noexcept { return std::get_if<0>(&state_); }

    /// Only without one.
    Cause& failure() noexcept { return *std::get_if<1>(&state_); }
    const Cause& failure() const noexcept { return *std::get_if<1>(&state_); }

    /// The next step, which takes the value and returns an Outcome with the same cause or, where it cannot fail, what
    /// it makes. Without a value there is no step, and the failure is the outcome of both.
    template <typename Step>
    auto andThen(Step&& step) && {
        using Made = std::invoke_result_t<Step, Value&>;
        using Next = typename NextOutcome<Made>::Type;
        return *this ? Next(std::forward<Step>(step)(**this)) : Next(std::move(failure()));
    }

private:
    template <typename Made>
    struct NextOutcome {
        using Type = Outcome<Made, Cause>;
    };
    template <typename Other>
    struct NextOutcome<Outcome<Other, Cause>> {
        using Type = Outcome<Other, Cause>;
    };

    std::variant<Value, Cause> state_;
};

} // namespace kvt::ex::datetime::detail
