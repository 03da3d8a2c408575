// A pattern that lines are held against, in one of three dialects.
//
// The two of the library, Perl's and the legacy one, work on bytes of UTF-8 and may stop within a character. That of
// ICU works on whole characters.
#pragma once

#include <cstddef>
#include <functional>
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

/// Gets the groups of one match; false when no more are wanted.
using TakeMatch = std::function<bool(const GroupPlaces&)>;

class LinePattern {
public:
    virtual ~LinePattern() = default;
    // The two functions throw std::runtime_error when a line takes too long. Lines are valid UTF-8.

    /// Whether the pattern matches anywhere in the line.
    virtual bool find(std::string_view line) = 0;
    /// Calls `take` with the matches in the line from left to right, none within the one before; the legacy dialect has
    /// but one. Behind an empty match, the next one is longer or stands farther on.
    virtual void findAll(std::string_view line, const TakeMatch& take) = 0;

    /// The place up to which no line ends that has a match, of lines in a row with their ends. Never throws.
    virtual std::size_t passOver(std::string_view) const { return 0; }

    /// Of the pattern, without the whole match.
    virtual std::size_t groupCount() const { return 0; }
};

enum class Dialect { Perl, Legacy, Unicode };
enum class LetterCase { Distinguish, Ignore };

/// Letters in either case are the same in all dialects but the legacy one. Throws Failure for a pattern that cannot be
/// compiled or is not UTF-8.
std::unique_ptr<LinePattern> compilePattern(const std::string& pattern, Dialect dialect,
                                            LetterCase letterCase);

/// The same for ICU's dialect alone. The pattern is valid UTF-8. Throws Failure.
std::unique_ptr<LinePattern> compileUnicodePattern(const std::string& pattern, LetterCase letterCase);

} // namespace host
