// What a pattern takes from a value, field by field, and how the fields make an instant. The pattern reader fills
// them; here is which of them go together, what stands for those that are not given, and which message comes when
// they do not make up a value.
#pragma once

#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/nano_count.h>

#include <cstdint>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// What a pattern has read, with everything that it did not ask for filled in.
struct PatternReading {
    NanoCount count;                ///< of the wall clock, or of UTC where seconds since 1970 were read
    std::int32_t offsetMinutes = 0; ///< as `%z` or `%Ez` read it
};

/// The fields as they were read; none where the pattern has not asked for it.
struct PatternFields {
    std::optional<std::int64_t> year;
    std::optional<std::int64_t> month;
    std::optional<std::int64_t> day;
    std::optional<std::int64_t> ordinal;
    std::optional<std::int64_t> hours;
    std::optional<std::int64_t> minutes;
    bool hasSeconds = false;
    std::int64_t seconds = 0;     ///< within the minute; with an epoch flag, since 1970
    std::int64_t nanoseconds = 0; ///< to be added; up to 1,000,000,000, and negative where the seconds are
    char meridiem = '\0';         ///< 'a' or 'p'
    std::string_view epochFlag;   ///< "%s" or "%Es" when one was read
    bool hasOffset = false;
    std::int32_t offsetMinutes = 0;
};

/// The instant of the fields; a result that is to have an offset needs a time. Fails by FormatStringBadCombo and
/// ParseValidation.
Outcome<PatternReading> instantOfFields(PatternFields fields, bool wantsOffset, bool lenient);

} // namespace kvt::ex::datetime::detail
