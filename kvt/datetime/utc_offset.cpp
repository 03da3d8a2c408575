#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/utc_offset.h>

#include <optional>
#include <string_view>

namespace kvt::ex::datetime {

namespace detail {

std::optional<OffsetForm> readOffset(std::string_view text) noexcept {
    constexpr std::uint64_t highest = 9959; // hhmm as one number
    if (text.empty() || (text.front() != '+' && text.front() != '-')) {
        return std::nullopt;
    }
    const std::string_view body = text.substr(1);
    std::string_view minutes = "00";
    if (body.size() == 4) {
        minutes = body.substr(2);
    } else if (body.size() == 5 && body[2] == ':') {
        minutes = body.substr(3);
    } else if (body.size() != 2) {
        return std::nullopt;
    }
    const std::string_view hours = body.substr(0, 2);
    if (!allDigits(hours) || !allDigits(minutes)) {
        return std::nullopt;
    }
    const std::uint64_t hourNumber = digitsValue(hours);
    const std::uint64_t minuteNumber = digitsValue(minutes);
    if (hourNumber * 100 + minuteNumber > highest) {
        return std::nullopt;
    }
    const auto magnitude = static_cast<std::int32_t>(hourNumber * 60 + minuteNumber);
    return OffsetForm{text.front() == '-' ? -magnitude : magnitude,
                      {text.front(), hours[0], hours[1], ':', minutes[0], minutes[1]}};
}

} // namespace detail

kvt::future::optional<ZQTDateTimeUTCOffset> ZQTDateTimeUTCOffset::repairOffset(const UString<0>& text) {
    if (text.isEmpty()) {
        return ZQTDateTimeUTCOffset(0, UString<0>());
    }
    const std::optional<detail::OffsetForm> form = detail::readOffset(detail::viewOf(text));
    if (!form) {
        return std::nullopt;
    }
    return ZQTDateTimeUTCOffset(form->minutes, UString<0>(UStringView<0>(form->view())));
}

} // namespace kvt::ex::datetime
