// What the columns of a table are called, by its first block.
#pragma once

#include "translate/plan.h"
#include "translate/source_blocks.h"

#include <string>
#include <vector>

namespace host {

/// The cells of the header, or the numbers of the columns where there is none. Throws Failure for a header that is no row.
std::vector<std::string> namesOf(const SourceBlock& block, const Plan& plan);

/// The text of a block in UTF-8; what cannot be decoded is replaced.
std::string textOf(const SourceBlock& block);

} // namespace host
