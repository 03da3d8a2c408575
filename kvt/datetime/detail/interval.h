// The text of an interval: reading and writing.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/failure.h>

#include <optional>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// No value for a text that is no interval. A failure, Unexpected, for one whose shape is right so far and whose number
/// cannot be stored: a fraction of anything but seconds, or more than 2^31 - 1.
Outcome<std::optional<IntervalParts>> parseInterval(std::string_view text);

/// The fields as they are, without those that are not above zero as signed numbers; "PT0S" if none is left.
UString<0> intervalText(const IntervalParts& parts);

} // namespace kvt::ex::datetime::detail
