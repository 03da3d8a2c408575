// One table of what the benchmarks with limits measured, and a picture of it.
//
//     report RESULTS [--against EARLIER] [--svg FILE]
//
// RESULTS is what they wrote with --results=FILE: work, other way, kind of bound, limit, ratio, and the nanoseconds of
// both. With EARLIER, such a file of another run, each row shows how its ratio has changed. The exit status is 1 where
// a row misses its limit.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <fstream>
#include <iostream>
#include <map>
#include <optional>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

namespace {

// As `kvt::bench::Bound`.
enum Bound { shown, atMost, atLeast };

struct Row {
    std::string work;
    std::string beside;
    int bound = shown;
    double limit = 0;
    double ratio = 0;
    double nanoseconds = 0;
    double besideNanoseconds = 0;

    bool isWithin() const { return bound == shown || (bound == atMost ? ratio <= limit : ratio >= limit); }
    /// How many times as fast as the other way the work is.
    double speed() const { return bound == atLeast ? ratio : 1 / ratio; }
};

std::optional<std::vector<Row>> rowsOf(const std::string& file) {
    std::ifstream stream(file);
    if (!stream) {
        std::cerr << "report: cannot read " << file << '\n';
        return std::nullopt;
    }
    std::vector<Row> rows;
    for (std::string line; std::getline(stream, line);) {
        std::istringstream parts(line);
        Row row;
        std::getline(parts, row.work, '\t');
        std::getline(parts, row.beside, '\t');
        if (parts >> row.bound >> row.limit >> row.ratio >> row.nanoseconds >> row.besideNanoseconds) {
            rows.push_back(row);
        }
    }
    return rows;
}

/// The other way without the name of the work, which it often begins with.
std::string shortName(const Row& row) {
    const std::string prefix = row.work + ": ";
    return row.beside.compare(0, prefix.size(), prefix) == 0 ? row.beside.substr(prefix.size()) : row.beside;
}

void printTable(const std::vector<Row>& rows, const std::vector<Row>& earlier) {
    std::map<std::pair<std::string, std::string>, double> before;
    for (const Row& row : earlier) {
        before[{row.work, row.beside}] = row.speed();
    }
    std::printf("| work | beside | nanoseconds | times as fast | limit | |%s\n",
                earlier.empty() ? "" : " before |");
    std::printf("|---|---|---:|---:|---:|---|%s\n", earlier.empty() ? "" : "---:|");
    for (const Row& row : rows) {
        const double limit = row.bound == atMost ? 1 / row.limit : row.limit;
        std::printf("| %s | %s | %.0f | %.2f |", row.work.c_str(), shortName(row).c_str(), row.nanoseconds,
                    row.speed());
        row.bound == shown ? std::printf(" | |")
                           : std::printf(" %.2f | %s |", limit, row.isWithin() ? "" : "MISSED");
        if (!earlier.empty()) {
            const auto found = before.find({row.work, row.beside});
            found == before.end()
                ? std::printf(" new |")
                : std::printf(" %.2f (%+.0f %%) |", found->second, (row.speed() / found->second - 1) * 100);
        }
        std::printf("\n");
    }
}

std::string escaped(const std::string& text) {
    std::string xml;
    for (const char c : text) {
        switch (c) {
        case '<':
            xml += "&lt;";
            break;
        case '>':
            xml += "&gt;";
            break;
        case '&':
            xml += "&amp;";
            break;
        default:
            xml += c;
        }
    }
    return xml;
}

// Bars of how many times as fast the library is, on a logarithmic scale; a line stands where both are alike.
void writePicture(const std::vector<Row>& rows, const std::string& file) {
    constexpr double labelWidth = 520;
    constexpr double barWidth = 380;
    constexpr double rowHeight = 18;
    constexpr double slowest = 0.1;
    constexpr double fastest = 100;
    const auto place = [&](double speed) {
        const double part =
            std::log(std::clamp(speed, slowest, fastest) / slowest) / std::log(fastest / slowest);
        return labelWidth + barWidth * part;
    };
    const double height = rowHeight * static_cast<double>(rows.size() + 2);
    std::ofstream svg(file);
    svg << "<svg xmlns=\"http://www.w3.org/2000/svg\" width=\"" << labelWidth + barWidth + 60
        << "\" height=\"" << height << "\" font-family=\"sans-serif\" font-size=\"11\">\n"
        << "<rect width=\"100%\" height=\"100%\" fill=\"white\"/>\n";
    for (const double speed : {0.1, 0.5, 1.0, 2.0, 5.0, 10.0, 20.0, 50.0, 100.0}) {
        svg << "<line x1=\"" << place(speed) << "\" x2=\"" << place(speed) << "\" y1=\"" << rowHeight
            << "\" y2=\"" << height << "\" stroke=\"" << (speed == 1.0 ? "#444" : "#ddd") << "\"/>\n"
            << "<text x=\"" << place(speed) << "\" y=\"12\" text-anchor=\"middle\">" << speed << "</text>\n";
    }
    double top = rowHeight * 1.5;
    for (const Row& row : rows) {
        const double from = place(std::min(row.speed(), 1.0));
        svg << "<text x=\"" << labelWidth - 8 << "\" y=\"" << top + 11 << "\" text-anchor=\"end\">"
            << escaped(row.work + " | " + shortName(row)) << "</text>\n"
            << "<rect x=\"" << from << "\" y=\"" << top + 2 << "\" height=\"" << rowHeight - 6
            << "\" width=\"" << place(std::max(row.speed(), 1.0)) - from << "\" fill=\""
            << (row.isWithin() ? "#4a90c2" : "#c2564a") << "\"/>\n";
        top += rowHeight;
    }
    svg << "</svg>\n";
}

} // namespace

int main(int argc, char** argv) {
    const std::vector<std::string> given(argv + 1, argv + argc);
    const auto valueOf = [&](const std::string& option) {
        const auto found = std::find(given.begin(), given.end(), option);
        return found == given.end() || found + 1 == given.end() ? std::string() : *(found + 1);
    };
    if (given.empty()) {
        std::cerr << "usage: report RESULTS [--against EARLIER] [--svg FILE]\n";
        return 2;
    }
    const std::string earlierFile = valueOf("--against");
    const auto rows = rowsOf(given.front());
    const auto earlier =
        earlierFile.empty() ? std::optional<std::vector<Row>>(std::in_place) : rowsOf(earlierFile);
    if (!rows || !earlier) {
        return 2;
    }
    printTable(*rows, *earlier);
    if (const std::string picture = valueOf("--svg"); !picture.empty()) {
        writePicture(*rows, picture);
    }
    return std::all_of(rows->begin(), rows->end(), [](const Row& row) { return row.isWithin(); }) ? 0 : 1;
}
