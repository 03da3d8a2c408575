// A case of matching, as the bodies of cases on regular expressions have it, and the way in which it is tried.
#pragma once

#include "suite.h"

#include <boost/regex.hpp>

#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace conformance {

/// Where a group begins and ends; -1 twice for one that took no part.
using Place = std::pair<std::ptrdiff_t, std::ptrdiff_t>;
/// The places of the first match and its groups; none without a match.
using Places = std::vector<Place>;

/// What kvt finds, or nothing where it cannot compile the pattern or gives up.
std::optional<Places> foundByKvt(const std::string& pattern, const std::string& text);
/// What Boost.Regex finds without kvt, by the syntax that kvt promises.
std::optional<Places> foundByBoost(const std::string& pattern, const std::string& text);

std::string shown(const std::optional<Places>& places);

} // namespace conformance
