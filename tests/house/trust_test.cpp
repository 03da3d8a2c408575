// docs/trust.md and what made its figures agree: no figure is in the page that nothing holds.

#include <support/trust_page.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <set>
#include <string>
#include <vector>

namespace house {
namespace {

using kvt::test::readTrustFile;
using kvt::test::readTrustPage;
using kvt::test::trustFileName;
using kvt::test::TrustTable;
namespace fs = std::filesystem;

const std::string root = KVT_SOURCE_DIR;

// A line for each row, of the columns that `wanted` names.
std::vector<std::string> linesOf(const TrustTable& table, const std::vector<std::string>& wanted) {
    std::vector<std::string> lines;
    for (const std::vector<std::string>& row : table.rows) {
        std::string line;
        for (const std::string& column : wanted) {
            const auto at = std::find(table.columns.begin(), table.columns.end(), column);
            line += column + ": " +
                    (at == table.columns.end() ? std::string("no such column")
                                               : row[static_cast<std::size_t>(at - table.columns.begin())]) +
                    "; ";
        }
        lines.push_back(line);
    }
    return lines;
}

// Whether a test's source or the list of tests in a folder has a test or a suite of this name.
bool isNamedInTests(const std::string& name) {
    const std::string suite = name.substr(0, name.find('.'));
    if (suite.empty()) {
        return false;
    }
    for (const char* folder : {"/tests", "/fuzz"}) {
        for (const fs::directory_entry& entry : fs::recursive_directory_iterator(root + folder)) {
            const bool isList = entry.path().filename() == "CMakeLists.txt";
            if (!entry.is_regular_file() || !(isList || entry.path().extension() == ".cpp")) {
                continue;
            }
            std::ifstream file(entry.path());
            const std::string text{std::istreambuf_iterator<char>(file), {}};
            const auto opens = [&](const std::string& test) { return text.find(test) != std::string::npos; };
            if (opens("TEST(" + suite + ",") || opens("TEST_F(" + suite + ",") ||
                opens("TEST_P(" + suite + ",") || opens("add_test(NAME " + suite + ".") ||
                opens("add_test(NAME " + suite + " ")) {
                return true;
            }
        }
    }
    return false;
}

TEST(TrustPage, TablesAreThoseOfTheFilesInTestsTrust) {
    std::set<std::string> files;
    for (const fs::directory_entry& entry : fs::directory_iterator(root + "/tests/trust")) {
        if (entry.path().extension() == ".tsv") {
            files.insert(entry.path().filename().string());
        }
    }
    for (const TrustTable& table : readTrustPage(root + "/docs/trust.md")) {
        const std::string name = trustFileName(table.heading);
        if (files.erase(name) == 1) {
            const TrustTable made = readTrustFile(root + "/tests/trust/" + name);
            EXPECT_EQ(linesOf(table, made.columns), linesOf(made, made.columns)) << table.heading;
        } else {
            EXPECT_TRUE(isNamedInTests(table.heldBy))
                << "nothing holds the table below " << table.heading << ": neither is there a file " << name
                << " in tests/trust nor a line \"Held by `NAME OF A TEST`\" below the table";
        }
    }
    EXPECT_EQ(files, std::set<std::string>()) << "the page has no such table";
}

TEST(TrustPage, LinesThatNoTestCanRunStandInTheSources) {
    const TrustTable left = readTrustFile(root + "/tests/trust/lines_that_no_test_can_run.tsv");
    ASSERT_EQ(left.columns, (std::vector<std::string>{"file", "from the line", "lines", "why"}));
    for (const std::vector<std::string>& row : left.rows) {
        std::ifstream file(root + "/" + row[0]);
        const std::string text{std::istreambuf_iterator<char>(file), {}};
        EXPECT_NE(text.find(row[1] + "\n"), std::string::npos) << row[0] << ": " << row[1];
    }
}

} // namespace
} // namespace house
