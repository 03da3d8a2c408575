// Reading and writing the text of an offset.
#include <kvt/datetime/detail/offset.h>

#include <kvt/datetime/detail/text.h>

namespace kvt::ex::datetime::detail {

namespace {

constexpr int highestPair = 9959; // of the four digits, taken as one number
constexpr int minutesPerHour = 60;

// The number of two digits, or a negative one where they are none.
constexpr int pairAt(const char* digits) noexcept {
    return isDigit(digits[0]) && isDigit(digits[1]) ? (digits[0] - '0') * 10 + (digits[1] - '0') : -1;
}

constexpr char digitOf(int number) noexcept {
    return static_cast<char>('0' + number);
}

constexpr OffsetForm formOf(bool isNegative, int hours, int minutes) noexcept {
    const std::int32_t magnitude = hours * minutesPerHour + minutes;
    return {isNegative ? -magnitude : magnitude,
            {isNegative ? '-' : '+', digitOf(hours / 10), digitOf(hours % 10), ':', digitOf(minutes / 10),
             digitOf(minutes % 10)}};
}

} // namespace

std::optional<OffsetForm> readOffset(std::string_view text) noexcept {
    if (text.empty() || (text.front() != '+' && text.front() != '-')) {
        return std::nullopt;
    }
    const std::string_view body = text.substr(1);
    const bool hasColon = body.size() == 5 && body[2] == ':';
    if (!hasColon && body.size() != 4 && body.size() != 2) {
        return std::nullopt;
    }
    const int hours = pairAt(body.data());
    const int minutes = body.size() == 2 ? 0 : pairAt(body.data() + (hasColon ? 3 : 2));
    if (hours < 0 || minutes < 0 || hours * 100 + minutes > highestPair) {
        return std::nullopt;
    }
    return formOf(text.front() == '-', hours, minutes);
}

std::optional<OffsetForm> offsetOfMinutes(std::int32_t minutes) noexcept {
    constexpr std::int32_t end = 100 * minutesPerHour;
    if (minutes <= -end || minutes >= end) {
        return std::nullopt;
    }
    const std::int32_t magnitude = minutes < 0 ? -minutes : minutes;
    return formOf(minutes < 0, magnitude / minutesPerHour, magnitude % minutesPerHour);
}

} // namespace kvt::ex::datetime::detail
