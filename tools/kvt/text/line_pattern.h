// A pattern that lines are held against, in one of the two dialects of the library.
#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// Where a group stands in a line, in bytes of UTF-8.
struct GroupPlace {
    std::size_t position;
    std::size_t length;
};

/// The whole match, and then the groups of the pattern; those without a place took no part.
using GroupPlaces = std::vector<std::optional<GroupPlace>>;

class LinePattern {
public:
    virtual ~LinePattern() = default;
    /// Whether the pattern matches anywhere in the line; if it does, `groups`, unless null, becomes the places of the
    /// first match. Throws std::runtime_error when that takes too long.
    virtual bool find(std::string_view line, GroupPlaces* groups) = 0;
};

enum class Dialect { Perl, Legacy };

/// Throws Failure for a pattern that cannot be compiled, and kvt::ex::UStringBadEncodingException for one that is not
/// UTF-8.
std::unique_ptr<LinePattern> compilePattern(const std::string& pattern, Dialect dialect);

} // namespace host
