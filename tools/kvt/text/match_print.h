// What `kvt match` prints of a line in which its pattern matched.
#pragma once

#include "text/line_pattern.h"
#include "text/line_reader.h"

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// What stands before what is printed of a line.
struct MatchLabels {
    bool file = false;
    bool line = false;
};

class Replacement;

class MatchPrinter {
public:
    virtual ~MatchPrinter() = default;
    /// Whether it is text, in the encoding of the file, or statements about it, in UTF-8.
    virtual bool givesText() const { return true; }
    /// Whether it asks lines for places.
    virtual bool asksForPlaces() const { return false; }
    /// Whether matches have to be found, or only lines with one.
    virtual bool needsPlaces() const { return true; }

    /// A line begins to be printed.
    virtual void begin(const TextLine& line, std::string& out) = 0;
    /// A match in it; whether the next one is wanted, too.
    virtual bool take(const TextLine&, const GroupPlaces&, std::string&) { return false; }
    virtual void end(const TextLine&, std::string&) {}
};

/// The line as it stands.
std::unique_ptr<MatchPrinter> printLines(const MatchLabels& labels);
/// The line with `text` in the place of each match.
std::unique_ptr<MatchPrinter> printReplaced(const MatchLabels& labels, Replacement text);
/// Each match that is not empty as a line, or what `text` makes of each match.
std::unique_ptr<MatchPrinter> printMatches(const MatchLabels& labels);
std::unique_ptr<MatchPrinter> printReplacements(const MatchLabels& labels, Replacement text);
/// The groups of each match as a row of values with tabs between them; a pattern without groups has one for all of it.
std::unique_ptr<MatchPrinter> printRows(const MatchLabels& labels);
/// "LINE:COLUMN:BYTE:GROUP:LENGTH:TEXT" for each group of the first match.
std::unique_ptr<MatchPrinter> printGroups(bool showFile);
/// Each match with its groups as a JSON object.
std::unique_ptr<MatchPrinter> printRecords(const MatchLabels& labels);

/// What takes the place of a match: text with "$1" and its like for groups.
class Replacement {
public:
    /// "$0" is the whole match, "${1}" is "$1", "$$" a dollar. Throws Failure for another "$", and for a group beyond
    /// `groupCount`.
    Replacement(std::string_view typed, std::size_t groupCount);

    void append(std::string_view line, const GroupPlaces& groups, std::string& out) const;

private:
    struct Piece {
        std::string text;  ///< stands before the group
        std::size_t group; ///< or `none`
    };
    static constexpr std::size_t none = static_cast<std::size_t>(-1);

    std::vector<Piece> pieces_;
};

} // namespace host
