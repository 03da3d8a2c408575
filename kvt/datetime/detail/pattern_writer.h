// The engine behind the patterns of format(): writes an instant by a pattern.
#pragma once

#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/nano_count.h>

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace kvt::ex::datetime::detail {

/// The wall clock `count` by a pattern all of whose flags are known; what is no flag is copied. Fails by FormatFlag
/// where a flag asks for an offset that is not there, or for none, and by FormatStringBadCombo.
Outcome<std::string> renderFields(std::string_view format, const NanoCount& count,
                                  std::optional<std::int32_t> offsetMinutes);

} // namespace kvt::ex::datetime::detail
