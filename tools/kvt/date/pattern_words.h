// The language of formats in words, from the library's one table: what the help lists, and what is wrong with a format.
#pragma once

#include <string>
#include <string_view>

namespace host {

/// The flags that parse() knows and what each reads, as lines for its help; the same for format().
std::string readPatternHelp();
std::string writtenPatternHelp();

/// The flags alone, with blanks between them.
std::string readFlags();
std::string writtenFlags();

/// What is wrong with a format for whatever value, in words; empty where nothing is. Where a flag is unknown, the words
/// list those that there are.
std::string wrongInReadFormat(const std::string& format);
std::string wrongInWrittenFormat(const std::string& format);

/// Without what the library strips from values and formats.
std::string withoutBlanks(std::string_view text);

} // namespace host
