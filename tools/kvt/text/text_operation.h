// What `kvt text` can do to a line. Every operation is one of the library's strings, on the units that keep
// characters whole: UTF-8 where valid text in gives valid text out, UTF-32 where single units are what
// counts.
#pragma once

#include "text/line_reader.h"

#include <memory>
#include <string>
#include <string_view>

namespace host {

class TextOperation {
public:
    virtual ~TextOperation() = default;
    /// Appends what becomes of the line, its end included, as UTF-8.
    virtual void apply(const TextLine& line, std::string& out) const = 0;
    /// Whether the results are the text itself, which goes on in its own encoding, or statements about it.
    virtual bool givesText() const { return true; }
    /// Whether it asks lines for places.
    virtual bool asksForPlaces() const { return false; }
};

enum class CaseChange { Upper, Lower, Fold };
enum class CaseRule { Distinguish, Ignore };
enum class Side { Both, Front, Back };
/// How what is found out about lines is written: as text on a line, places with the name of their file or without it, or
/// as a JSON object on a line.
enum class Statements { Lines, LinesWithFile, Records };

/// All texts are UTF-8; these throw Failure for an empty one where something has to be found.
std::unique_ptr<TextOperation> changeCase(CaseChange change);
/// "LINE:COLUMN:BYTE" for each place, with "FILE:" before it if that is wanted.
std::unique_ptr<TextOperation> findText(const std::string& needle, CaseRule rule, Statements form);
std::unique_ptr<TextOperation> replaceText(const std::string& from, const std::string& to, CaseRule rule);
std::unique_ptr<TextOperation> splitText(const std::string& delimiter, CaseRule rule, bool skipEmpty);
std::unique_ptr<TextOperation> stripText(const std::string& set, Side side);
std::unique_ptr<TextOperation> hashText(CaseRule rule, Statements form);

/// Appends the form that texts share which differ in case only, by full Unicode case folding. Each character folds
/// for itself, so that a text may be folded in pieces.
void appendFolded(std::string_view text, std::string& out);

} // namespace host
