// How a date function gets its values: one from the command line, or the lines of files, whose results leave as the
// lines come.
#pragma once

#include "date/outcome.h"

#include <kvt/string/ustring.h>

#include <functional>
#include <string>

namespace host {

class Diagnostics;
class ValueLines;

using ApplyToValue = std::function<DateOutcome(const kvt::ex::UString<0>&)>;

/// Writes what becomes of one value; gives an ExitStatus.
int runValue(const std::string& value, const ApplyToValue& apply, bool json, const std::string& outputPath,
             Diagnostics& diagnostics);

/// The same for each of the lines.
int runLines(const ApplyToValue& apply, bool json, ValueLines& lines, Diagnostics& diagnostics);

/// Prints one outcome that has no value to it, as of now().
int showOutcome(const DateOutcome& outcome, bool json, const std::string& outputPath,
                Diagnostics& diagnostics);

} // namespace host
