// Offsets from UTC, as texts and in minutes, without any string; ZQTDateTimeUTCOffset is the public face.
#pragma once

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

/// Reads +hh, +hhmm and +hh:mm; nothing else, and not the empty text. The minutes of the text may be up to 99, and are
/// not carried: "+1075" is "+10:75", of 675 minutes.
std::optional<OffsetForm> readOffset(std::string_view text) noexcept;

/// The offset of so many minutes, with the minutes of its text below 60. None from 100 hours on, for which there is
/// no text.
std::optional<OffsetForm> offsetOfMinutes(std::int32_t minutes) noexcept;

} // namespace kvt::ex::datetime::detail
