// The text of an interval: reading and writing.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/text.h>

#include <string_view>

namespace kvt::ex::datetime::detail {

/// Reads an interval. Any other text fails by IntervalUnreadable. A text of the right shape whose number cannot be
/// stored fails by Unexpected: a fraction of anything but seconds, or more than 2^31 - 1.
Outcome<IntervalParts> readInterval(std::string_view text);

/// Writes the fields as they are, without those that are not above zero as signed numbers; "PT0S" if none is left.
void writeInterval(TextBuffer& text, const IntervalParts& parts);

/// The same as a text of its own.
UString<0> intervalText(const IntervalParts& parts);

} // namespace kvt::ex::datetime::detail
