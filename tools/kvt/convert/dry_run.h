// `kvt convert --dry-run`: what each of several target encodings would lose, without writing anything.
#pragma once

#include "convert/convert_options.h"

#include <kvt/encoding/encoding.h>

#include <string>
#include <vector>

namespace host {

class Diagnostics;

/// The names in a list such as "windows-1252,UTF-8". A comma within ICU's options ("UTF-16,version=1") separates
/// nothing.
std::vector<std::string> splitEncodings(const std::string& list);

/// Reads the input once and prints the targets, best first. Gives Done when one of them loses nothing.
int dryRun(const ConvertOptions& options, kvt::ex::Encoding from,
           const std::vector<kvt::ex::Encoding>& targets, Diagnostics& diagnostics);

} // namespace host
