// Offsets from UTC, as texts and in minutes, without any string; ZQTDateTimeUTCOffset is the public face.
#pragma once

#include <kvt/datetime/detail/text.h>

#include <algorithm>
#include <array>
#include <cstdint>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// An offset in minutes and as canonical text, such as +01:00.
struct OffsetForm {
    std::int32_t minutes = 0; ///< negative to the west of UTC
    std::array<char, 6> text = {};

    std::string_view view() const noexcept { return {text.data(), text.size()}; }
};

inline constexpr std::int32_t minutesPerHour = 60;

/// Reads +hh, +hhmm and +hh:mm into `form`; false for anything else and for the empty text. The minutes of the text may
/// be up to 99, and are not carried: "+1075" is "+10:75", of 675 minutes.
inline bool readOffset(std::string_view text, OffsetForm& form) noexcept {
    if (text.empty() || (text.front() != '+' && text.front() != '-')) {
        return false;
    }
    const std::string_view body = text.substr(1);
    const bool hasColon = body.size() == 5 && body[2] == ':';
    if (!hasColon && body.size() != 4 && body.size() != 2) {
        return false;
    }
    constexpr int highestPair = 9959; // of the four digits, taken as one number
    const int hours = digitPair(body.data());
    const char* const minuteDigits = body.size() == 2 ? "00" : body.data() + (hasColon ? 3 : 2);
    const int minutes = digitPair(minuteDigits);
    if (hours < 0 || minutes < 0 || hours * 100 + minutes > highestPair) {
        return false;
    }
    const int magnitude = hours * minutesPerHour + minutes;
    form.minutes = text.front() == '-' ? -magnitude : magnitude;
    if (hasColon) {
        std::copy_n(text.data(), form.text.size(), form.text.data());
    } else {
        form.text = {text.front(), body[0], body[1], ':', minuteDigits[0], minuteDigits[1]};
    }
    return true;
}

/// The same as a value of its own.
std::optional<OffsetForm> offsetOfText(std::string_view text) noexcept;

/// The offset of so many minutes, with the minutes of its text below 60. None from 100 hours on, for which there is
/// no text.
std::optional<OffsetForm> offsetOfMinutes(std::int32_t minutes) noexcept;

} // namespace kvt::ex::datetime::detail
