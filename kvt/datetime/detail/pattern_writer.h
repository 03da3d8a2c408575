// The engine behind the patterns of format(): writes an instant by a pattern.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/text.h>

#include <cstdint>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// How far a pattern was written.
enum class WrittenPattern : std::uint8_t {
    Whole,
    WrongFlag,         ///< up to a flag that is unknown, cut short, or not for the kind of value
    EpochBesideOffset, ///< whole, but with flags that exclude each other
};

/// Writes a wall clock of a kind by a pattern; what is not a flag is copied. The offset counts for kinds that
/// have one, and is below 100 hours, as that of every value.
WrittenPattern renderFields(TextBuffer& out, std::string_view format, TemporalType kind,
                            const DateTimeFields& fields, std::int32_t offsetMinutes);

} // namespace kvt::ex::datetime::detail
