// docs/trust.md as data: its tables by the headings above them. The tests that make a figure compare it with the page
// through this, and trust_test compares the rest with the files in tests/trust.
#pragma once

#include <map>
#include <string>
#include <vector>

namespace kvt::test {

struct TrustTable {
    /// The heading that stands above it, without its marks.
    std::string heading;
    std::vector<std::string> columns;
    /// As many cells in each as there are columns, without blanks around them and without marks of code.
    std::vector<std::vector<std::string>> rows;
    /// The name between the backquotes of the line "Held by `NAME`" below it; empty without one.
    std::string heldBy;

    /// The row whose first cell is `key`, by the names of the columns; empty when there is no such row.
    std::map<std::string, std::string> row(const std::string& key) const;
};

/// All tables of a page in Markdown. Throws std::runtime_error when the file cannot be read, when a row has another
/// number of cells than its table has columns, and when two tables stand below one heading.
std::vector<TrustTable> readTrustPage(const std::string& path);

/// A file of tests/trust: the first line names the columns, tabulators part the cells. `heading` stays empty.
TrustTable readTrustFile(const std::string& path);

/// The name of the file for a table: its heading in small letters, with "_" for each blank, and ".tsv".
std::string trustFileName(const std::string& heading);

/// One row of docs/trust.md in the source tree `sourceFolder`; empty when there is no such table or row.
std::map<std::string, std::string> trustRow(const std::string& sourceFolder, const std::string& heading,
                                            const std::string& key);

} // namespace kvt::test
