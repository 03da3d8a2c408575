// The engine behind the patterns of parse(): reads a value by a pattern, on bytes.
#pragma once

#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/pattern_fields.h>

#include <string_view>

namespace kvt::ex::datetime::detail {

/// Reads `value`, as far as the format asks for it. `wantsOffset` says that the result is to have an offset; it needs
/// a time then. Fails by ParseMismatch, ParseUnknownFlag, ParseEpochTimeRange, FormatStringBadCombo and
/// ParseValidation.
Outcome<PatternReading> readFields(std::string_view value, std::string_view format, bool wantsOffset,
                                   bool lenient);

} // namespace kvt::ex::datetime::detail
