// `kvt convert --dry-run`: what each of several target encodings would lose, without writing anything.
#pragma once

#include "convert/convert_options.h"
#include "text/byte_order_mark.h"

#include <kvt/encoding/encoding.h>

#include <string>
#include <vector>

namespace host {

class Diagnostics;

/// Reads the input once and prints the targets, best first. Gives Done when one of them loses nothing.
int dryRun(const ConvertOptions& options, const TextEncoding& from,
           const std::vector<kvt::ex::Encoding>& targets, Diagnostics& diagnostics);

} // namespace host
