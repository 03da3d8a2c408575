// What only ICU knows and the library does not pass on: names of characters, the list of converters and their
// aliases, its version.
#pragma once

#include <string>
#include <vector>

namespace host {

/// "LATIN CAPITAL LETTER L WITH STROKE"; for characters without a name their kind, as "<control-0007>".
std::string characterName(char32_t character);

/// Whether a terminal shows it as something of its own: not a control, a surrogate, a formatting mark or a line end.
bool isPrintable(char32_t character);

/// Whether `name` is one of "UTF-16" or "UTF-32" that say nothing about the order of bytes.
bool leavesByteOrderOpen(const std::string& name);

/// ICU's own names of all its converters.
std::vector<std::string> converterNames();

/// All names of the converter that ICU opens under `name`.
std::vector<std::string> aliasesOf(const std::string& name);

/// "72.1".
std::string icuVersion();

} // namespace host
