// The engine behind the patterns of format(): writes an instant by a pattern.
#pragma once

#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/pattern_failure.h>
#include <kvt/datetime/detail/text.h>

#include <cstdint>
#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// Writes a wall clock by a pattern all of whose flags are known; what is not a flag is copied. Fails by FormatFlag
/// where a flag asks for an offset that is not there, or for none, and by FormatStringBadCombo. The offset is below
/// 100 hours, as that of every value.
std::optional<PatternFailure> renderFields(TextBuffer& out, std::string_view format,
                                           const DateTimeFields& fields,
                                           std::optional<std::int32_t> offsetMinutes);

} // namespace kvt::ex::datetime::detail
