// diff, diffAsNumber and compare.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/arithmetic.h>
#include <kvt/datetime/detail/interval.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/detail/wall_clock.h>

namespace kvt::ex::datetime {

namespace detail {

// Made in its place.
static TextResult resultOf(const Difference& difference) {
    TextBuffer text;
    writeInterval(text, difference.parts());
    return TextResult(ReturnState::Success, UStringView<0>(text.view()), std::nullopt);
}

} // namespace detail

namespace {

using detail::CanonicalRecord;
using detail::Outcome;
using detail::WallClock;

/// Two values that can be compared, in UTC where they have an offset.
struct Pair {
    // Not defaulted: that would clear both clocks before they are written.
    Pair() noexcept {} // NOLINT(modernize-use-equals-default)

    WallClock first;
    WallClock second;
    bool haveDates = false;
};

bool areComparable(TemporalType first, TemporalType second) noexcept {
    return first == second || (first == TemporalType::Date && second == TemporalType::Datetime) ||
           (first == TemporalType::Datetime && second == TemporalType::Date);
}

// Reads both values, the second one first: its parts are checked before those of the first, but it is the first one
// that is named if neither is a value.
Outcome<Pair> readPair(const UString<0>& first, const UString<0>& second) {
    return detail::parseCanonical(detail::viewOf(second), false).andThen([&](const CanonicalRecord& right) {
        return detail::readValue(detail::viewOf(first)).andThen([&](const CanonicalRecord& left) {
            Outcome<Pair> pair; // in its place, with one return: a copy would have to wait for the clocks
            if (right.type == TemporalType::Unsupported) {
                pair = detail::ValueUnsupported{detail::viewOf(second)};
            } else if (!areComparable(left.type, right.type)) {
                pair = detail::KindsNotComparable{detail::viewOf(first), detail::viewOf(second)};
            } else {
                detail::setUtcClock(pair->first, left);
                detail::setUtcClock(pair->second, right);
                pair->haveDates = !detail::isTimeKind(right.type);
            }
            return pair;
        });
    });
}

double secondsBetween(const Pair& pair) {
    return detail::nanosecondsAsDouble(pair.first - pair.second) / 1e9;
}

// The divisions are made one by one, so that all builds round alike.
double inUnit(double seconds, UnitType unit) noexcept {
    switch (unit) {
    case UnitType::Weeks:
        return seconds / 60.0 / 60.0 / 24.0 / 7.0;
    case UnitType::Days:
        return seconds / 60.0 / 60.0 / 24.0;
    case UnitType::Hours:
        return seconds / 60.0 / 60.0;
    case UnitType::Minutes:
        return seconds / 60.0;
    default:
        return seconds;
    }
}

Outcome<double> numberBetween(const Pair& pair, UnitType unit) {
    if (unit > UnitType::Seconds) {
        return detail::Unexpected{};
    }
    if (unit > UnitType::Months) {
        return inUnit(secondsBetween(pair), unit);
    }
    return detail::diffParts(pair.first, pair.second, pair.haveDates)
        .andThen([&](const detail::Difference& difference) {
            return difference.inMonths() / (unit == UnitType::Years ? 12.0 : 1.0);
        });
}

} // namespace

TextResult diff(const UString<0>& first, const UString<0>& second) {
    return detail::guarded<UString<0>>([&] {
        return readPair(first, second).andThen([](const Pair& pair) {
            return detail::diffParts(pair.first, pair.second, pair.haveDates);
        });
    });
}

NumberResult diffAsNumber(const UString<0>& first, const UString<0>& second, UnitType unit) {
    return detail::guarded<double>([&] {
        return readPair(first, second)
            .andThen([&](const Pair& pair) { return numberBetween(pair, unit); })
            .andThen([](double number) { return detail::makeDateTimeResult(ReturnState::Success, number); });
    });
}

int compare(const UString<0>& first, const UString<0>& second) {
    const Outcome<Pair> pair = readPair(first, second);
    if (!pair) {
        return -3;
    }
    return pair->first < pair->second ? -1 : pair->second < pair->first ? 1 : 0;
}

} // namespace kvt::ex::datetime
