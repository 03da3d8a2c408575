// The text of an interval. A reader in one pass: designators have ranks, and each one closes itself and all before
// it.

#include <kvt/datetime/detail/interval.h>
#include <kvt/datetime/detail/parts_access.h>
#include <kvt/datetime/detail/text.h>

#include <array>
#include <cmath>
#include <limits>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::size_t shortestInterval = 3; // "P1Y", and "-PT"

// In the order in which they may stand. Those from Hours on stand behind the "T".
enum Rank { Years, Months, Days, Hours, Minutes, Seconds, NoDesignator };

Rank rankOf(char designator, bool inTime) noexcept {
    switch (designator) {
    case 'Y':
        return inTime ? NoDesignator : Years;
    case 'M':
        return inTime ? Minutes : Months;
    case 'D':
        return inTime ? NoDesignator : Days;
    case 'H':
        return inTime ? Hours : NoDesignator;
    case 'S':
        return inTime ? Seconds : NoDesignator;
    default:
        return NoDesignator;
    }
}

// Takes a run of digits with at most one ".", which is not the first.
std::string_view takeNumber(std::string_view& text) noexcept {
    std::size_t size = 0;
    bool point = false;
    while (size < text.size() && (isDigit(text[size]) || (text[size] == '.' && !point && size > 0))) {
        point = point || text[size] == '.';
        ++size;
    }
    const std::string_view number = text.substr(0, size);
    text.remove_prefix(size);
    return number;
}

// The number, or none where it exceeds 32 bits with sign.
std::optional<std::uint64_t> wholeNumber(std::string_view digits) noexcept {
    constexpr std::uint64_t highest = std::numeric_limits<std::int32_t>::max();
    std::uint64_t value = 0;
    for (const char c : digits) {
        value = value * 10 + static_cast<std::uint64_t>(c - '0');
        if (value > highest) {
            return std::nullopt;
        }
    }
    return value;
}

std::uint64_t& fieldOf(IntervalParts& parts, Rank rank) noexcept {
    switch (rank) {
    case Years:
        return PartsAccess::years(parts);
    case Months:
        return PartsAccess::months(parts);
    case Days:
        return PartsAccess::days(parts);
    case Hours:
        return PartsAccess::hours(parts);
    case Minutes:
        return PartsAccess::minutes(parts);
    default:
        return PartsAccess::seconds(parts);
    }
}

} // namespace

Outcome<IntervalParts> readInterval(std::string_view given) {
    const IntervalUnreadable none = {given};
    IntervalParts parts;
    std::string_view text = trimmed(given);
    if (text.size() < shortestInterval) {
        return none;
    }
    if (text.front() == '-') {
        PartsAccess::negative(parts) = true;
        text.remove_prefix(1);
    }
    if (text.front() != 'P') {
        return none;
    }
    text.remove_prefix(1);

    bool inTime = false;
    int nextRank = Years;
    while (!text.empty()) {
        if (text.front() == 'T') {
            if (inTime) {
                return none;
            }
            inTime = true;
            nextRank = Hours;
            text.remove_prefix(1);
            continue;
        }
        if (!isDigit(text.front())) {
            return none;
        }
        const std::string_view digits = takeNumber(text);
        const bool fractional = digits.find('.') != std::string_view::npos;
        const std::optional<std::uint64_t> whole =
            fractional ? std::optional<std::uint64_t>() : wholeNumber(digits);
        const double value = fractional ? decimalValue(digits) : 0.0;
        if (fractional ? std::isinf(value) : !whole) {
            return Unexpected{};
        }
        const Rank rank = text.empty() ? NoDesignator : rankOf(text.front(), inTime);
        if (rank == NoDesignator || rank < nextRank) {
            return none;
        }
        if (!fractional) {
            fieldOf(parts, rank) = *whole;
        } else if (rank == Seconds) {
            const SplitSeconds split = splitSeconds(value);
            PartsAccess::seconds(parts) = split.seconds;
            PartsAccess::nanoseconds(parts) = split.nanoseconds;
        } else {
            return Unexpected{};
        }
        nextRank = rank + 1;
        text.remove_prefix(1);
    }
    return parts;
}

void writeInterval(TextBuffer& text, const IntervalParts& parts) {
    const bool hasSeconds = parts.seconds() > 0 || parts.nanoseconds() > 0;
    const bool hasTime = parts.hours() > 0 || parts.minutes() > 0 || hasSeconds;
    if (!hasTime && parts.years() <= 0 && parts.months() <= 0 && parts.days() <= 0) {
        return text.put("PT0S"); // without a sign
    }
    constexpr std::size_t longestNumber = 20;
    char* place = text.room(3 + 5 * (longestNumber + 1)); // "-P", "T", and all but the seconds
    const auto put = [&](std::int64_t number, char designator) {
        if (number > 0) {
            place = writeNumber(place, static_cast<std::uint64_t>(number));
            *place++ = designator;
        }
    };
    if (parts.negative()) {
        *place++ = '-';
    }
    *place++ = 'P';
    put(parts.years(), 'Y');
    put(parts.months(), 'M');
    put(parts.days(), 'D');
    if (hasTime) {
        *place++ = 'T';
        put(parts.hours(), 'H');
        put(parts.minutes(), 'M');
    }
    text.endAt(place);
    if (hasSeconds) {
        text.putSeconds(static_cast<std::uint64_t>(parts.seconds()),
                        static_cast<std::uint64_t>(parts.nanoseconds()));
        text.put('S');
    }
}

UString<0> intervalText(const IntervalParts& parts) {
    TextBuffer text;
    writeInterval(text, parts);
    return text.toString();
}

} // namespace kvt::ex::datetime::detail
