// One loss at a time, as a line for a person or as JSON.
#pragma once

#include "text/place.h"

#include <kvt/encoding/stream_transcoder.h>

#include <string>

namespace host {

/// `U+0141 LATIN CAPITAL LETTER L WITH STROKE "Ł" (C5 81)`, or `bad bytes FF`.
std::string describeLost(const kvt::ex::Loss& loss);

/// A line: the place, what was lost, and why.
std::string describeLoss(const kvt::ex::Loss& loss, const Place& place, const std::string& from,
                         const std::string& to);

/// One JSON object and a line feed. "kind" is "bad-input" or "not-representable"; "codePoint" and "name" are null
/// for bad input.
std::string lossAsJson(const kvt::ex::Loss& loss, const Place& place, const std::string& from,
                       const std::string& to);

} // namespace host
