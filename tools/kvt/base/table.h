// Rows of text with their columns lined up.
#pragma once

#include <string>
#include <vector>

namespace host {

enum class Align { Left, Right };

/// Each row as a line, columns two blanks apart. The last column is not padded. Widths are counted in code points.
std::string formatTable(const std::vector<Align>& columns, const std::vector<std::vector<std::string>>& rows);

} // namespace host
