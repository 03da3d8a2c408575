// Writing the text of an offset.
#include <kvt/datetime/detail/offset.h>

namespace kvt::ex::datetime::detail {

std::optional<OffsetForm> offsetOfText(std::string_view text) noexcept {
    OffsetForm form;
    return readOffset(text, form) ? std::optional(form) : std::nullopt;
}

std::optional<OffsetForm> offsetOfMinutes(std::int32_t minutes) noexcept {
    constexpr std::int32_t end = 100 * minutesPerHour;
    if (minutes <= -end || minutes >= end) {
        return std::nullopt;
    }
    const bool isNegative = minutes < 0;
    const auto magnitude = static_cast<unsigned>(isNegative ? -minutes : minutes);
    OffsetForm form{minutes, {isNegative ? '-' : '+', '0', '0', ':', '0', '0'}};
    writePair(form.text.data() + 1, magnitude / minutesPerHour);
    writePair(form.text.data() + 4, magnitude % minutesPerHour);
    return form;
}

} // namespace kvt::ex::datetime::detail
