// An offset from UTC, as a value may carry it: up to two digits of hours and two of minutes, of no particular zone.
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/foundation/optional.h>
#include <kvt/string/ustring.h>

#include <cstdint>
#include <utility>

namespace kvt::ex::datetime {

class KVT_EXPORT ZQTDateTimeUTCOffset {
public:
    /// Reads the forms +hh, +hhmm and +hh:mm, with either sign; the canonical one is +hh:mm. The empty text is an
    /// offset too: zero minutes, with an empty text. What is none of these gives no value.
    ///
    /// There is one bound, on the four digits taken as a number: at most 9959. So "+10:75" is an offset, of 675
    /// minutes, and "+99:60" is not. Offsets are not held against any zone.
    static kvt::future::optional<ZQTDateTimeUTCOffset> repairOffset(const UString<0>& text);

    /// Negative to the west of UTC.
    std::int32_t offsetMinutes() const noexcept { return offsetMinutes_; }
    /// The canonical text.
    const UString<0>& text() const noexcept { return text_; }

private:
    ZQTDateTimeUTCOffset(std::int32_t offsetMinutes, UString<0> text) noexcept
        : offsetMinutes_(offsetMinutes), text_(std::move(text)) {}

    std::int32_t offsetMinutes_ = 0;
    UString<0> text_;
};

} // namespace kvt::ex::datetime
