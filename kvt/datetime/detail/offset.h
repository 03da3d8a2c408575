// The reader of offset texts, on bytes and without any string; ZQTDateTimeUTCOffset is its public face.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// An offset in minutes and as canonical text, such as +01:00.
struct OffsetForm {
    std::int32_t minutes;
    std::array<char, 6> text;

    std::string_view view() const noexcept { return {text.data(), text.size()}; }
};

/// Reads +hh, +hhmm and +hh:mm; nothing else, and not the empty text.
std::optional<OffsetForm> readOffset(std::string_view text) noexcept;

} // namespace kvt::ex::datetime::detail
