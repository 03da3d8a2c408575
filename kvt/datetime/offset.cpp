// Writing the text of an offset.
#include <kvt/datetime/detail/offset.h>

namespace kvt::ex::datetime::detail {

namespace {

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

std::optional<OffsetForm> offsetOfText(std::string_view text) noexcept {
    OffsetForm form;
    return readOffset(text, form) ? std::optional(form) : std::nullopt;
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
