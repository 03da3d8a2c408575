// Tables that nobody here wrote: all delimited text of the npm packages vega-datasets and csv-spectrum, which
// real_tables.sh fetches. Each is read and written back with the same cells; what csv-spectrum says that its files hold
// is what they hold; and each column of dates goes to ISO and back.
#include "host_test.h"

#include <reference/row_reference.h>

#include <nlohmann/json.hpp>

#include <sstream>

namespace kvt::test {

namespace {

namespace fs = std::filesystem;

std::string contentsOf(const fs::path& path) {
    std::ifstream in(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(in), {}};
}

std::vector<fs::path> tables() {
    std::vector<fs::path> found;
    for (const auto& entry : fs::recursive_directory_iterator(KVT_TABLES)) {
        const std::string extension = entry.path().extension().string();
        if (extension == ".csv" || extension == ".tsv") {
            found.push_back(entry.path());
        }
    }
    std::sort(found.begin(), found.end());
    return found;
}

std::string delimiterOf(const fs::path& path) {
    return path.extension() == ".tsv" ? "tab" : "comma";
}

// The text of all cells, row by row, by the reader that goes byte by byte.
std::vector<std::vector<std::string>> cellsOf(const std::string& text, char delimiter) {
    std::vector<std::vector<std::string>> rows;
    for (const ReferenceRow& row : referenceRows(text, delimiter, '"')) {
        rows.emplace_back();
        for (const auto& cell : row.cells) {
            rows.back().push_back(cell.text);
        }
    }
    return rows;
}

class RealTables : public HostTest {};

TEST_F(RealTables, AreThere) {
    EXPECT_GE(tables().size(), 30U);
}

TEST_F(RealTables, ComeBackAsTheyStood) {
    for (const fs::path& table : tables()) {
        const auto result =
            kvt({"translate", "--delimiter", delimiterOf(table), table.string(), "-o", path("out")});
        ASSERT_EQ(result.status, 0) << table << result.err;
        ASSERT_EQ(read("out"), contentsOf(table)) << table;
    }
}

TEST_F(RealTables, HaveTheSameCellsWhenAllAreQuoted) {
    for (const fs::path& table : tables()) {
        const auto result = kvt({"translate", "--delimiter", delimiterOf(table), "--out-delimiter", ";",
                                 "--quote-all", table.string(), "-o", path("out")});
        ASSERT_EQ(result.status, 0) << table << result.err;
        ASSERT_EQ(cellsOf(read("out"), ';'),
                  cellsOf(contentsOf(table), delimiterOf(table) == "tab" ? '\t' : ','))
            << table;
    }
}

TEST_F(RealTables, HoldWhatTheyAreSaidToHold) {
    std::size_t compared = 0;
    for (const fs::path& table : tables()) {
        const fs::path said = table.parent_path().parent_path() / "json" / (table.stem().string() + ".json");
        if (!fs::exists(said)) {
            continue;
        }
        const auto records = nlohmann::json::parse(contentsOf(said));
        if (!records.is_array()) {
            continue; // location_coordinates.json describes another telephone number than its table has
        }
        const auto rows = cellsOf(kvt({"translate", "--line-ends", "lf", table.string()}).out, ',');
        ASSERT_EQ(rows.size(), records.size() + 1) << table;
        for (std::size_t row = 0; row < records.size(); ++row) {
            for (std::size_t column = 0; column < rows[0].size(); ++column) {
                ASSERT_EQ(rows[row + 1][column], records[row].at(rows[0][column]).get<std::string>())
                    << table << " row " << row;
            }
        }
        ++compared;
    }
    EXPECT_GE(compared, 10U);
}

// The dates that infer finds, by their column and first format.
std::vector<std::pair<std::string, std::string>> dateColumns(const std::string& job) {
    std::vector<std::pair<std::string, std::string>> found;
    std::istringstream lines(job);
    std::string column;
    bool isDate = false;
    for (std::string line; std::getline(lines, line);) {
        if (line.starts_with("do = ")) {
            isDate = line == "do = \"date\"";
        } else if (isDate && line.starts_with("column = ")) {
            column = line.substr(10, line.size() - 11);
        } else if (isDate && line.starts_with("format = \"")) {
            found.emplace_back(column, line.substr(10, line.size() - 11));
        }
    }
    return found;
}

TEST_F(RealTables, HaveDatesThatGoToIsoAndBack) {
    std::size_t columns = 0;
    for (const fs::path& table : tables()) {
        const std::string delimiter = delimiterOf(table);
        const auto inferred = kvt({"infer", table.string()});
        ASSERT_EQ(inferred.status, 0) << table << inferred.err;
        for (const auto& dated : dateColumns(inferred.out)) {
            const std::string& column = dated.first;
            const std::string& format = dated.second;
            const std::string pivot = format.find("%y") == std::string::npos ? "" : "50";
            const auto steps = [&](const std::vector<std::string>& formats) {
                std::vector<std::string> arguments = {"translate", "--delimiter", delimiter, "--on-error",
                                                      "keep"};
                if (!pivot.empty()) {
                    arguments.insert(arguments.end(), {"--pivot", pivot});
                }
                arguments.insert(arguments.end(), formats.begin(), formats.end());
                arguments.insert(arguments.end(), {table.string(), "-o", path("out")});
                EXPECT_LE(kvt(arguments).status, 1) << table << " " << column;
                return read("out");
            };
            const std::string straight = steps({"--date", column + "=" + format});
            const std::string byIso = steps({"--date", column + "=" + format, "--write-date", column + "=ISO",
                                             "--date", column + "=ISO"});
            ASSERT_NE(straight, contentsOf(table)) << table << " " << column << " " << format;
            ASSERT_EQ(byIso, straight) << table << " " << column;
            ++columns;
        }
    }
    EXPECT_GE(columns, 5U);
}

} // namespace

} // namespace kvt::test
