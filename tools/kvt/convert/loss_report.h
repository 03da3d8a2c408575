// One loss at a time, as a line for a person or as JSON.
#pragma once

#include "text/place.h"

#include <kvt/encoding/stream_transcoder.h>

#include <optional>
#include <string>
#include <string_view>

namespace host {

/// `U+0141 LATIN CAPITAL LETTER L WITH STROKE "Ł" (C5 81)`, or `bad bytes FF`.
std::string describeLost(const kvt::ex::Loss& loss);

/// The bytes as failures show them: what can be printed in ASCII as it is, the others as `\xFF`.
std::string escapedBytes(std::string_view bytes);

/// `, written as "L"`; nothing where a substitution was written.
std::string describeWritten(const std::optional<std::u32string>& written);

/// A line: the place, what was lost, and why.
std::string describeLoss(const kvt::ex::Loss& loss, const Place& place, const std::string& from,
                         const std::string& to);

/// One JSON object and a line feed. "kind" is "bad-input" or "not-representable"; "codePoint" and "name" are null
/// for bad input. "replacement" is there where something else was written than a substitution.
std::string lossAsJson(const kvt::ex::Loss& loss, const Place& place, const std::string& from,
                       const std::string& to, const std::optional<std::u32string>& written = std::nullopt);

} // namespace host
