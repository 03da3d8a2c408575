// LineSorter against std::stable_sort, with so little memory that a few hundred bytes become several levels of runs.
//
// Input: a byte of flags (1 descending, 2 only the first of equal lines, in the order of the input), a byte for the
// memory, then lines. Nearly all the time goes into segments of the workspace, one for each run, at some twenty calls
// to the system. So the workspace lies in a file system in memory, where there is one, since on a disk it takes a
// hundred times as long to give a segment back; and there are only so many lines that each number of levels comes
// about.
#include <fuzzing.h>

#include <sort/line_sorter.h>
#include <sort/workspace.h>

#include <algorithm>
#include <map>
#include <string>
#include <vector>

using namespace kvt::fuzz;

namespace {

class Collector : public host::RecordSink {
public:
    void take(const host::LineRecord& record) override {
        text.append(record.key).append(" ").append(std::to_string(record.count)).append("\n");
    }
    std::string text;
};

[[maybe_unused]] const bool inMemory = keepFilesInMemory();

std::vector<std::string> linesOf(std::string_view text, std::size_t most) {
    std::vector<std::string> lines;
    while (!text.empty() && lines.size() < most) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        lines.emplace_back(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return lines;
}

std::string expectedFor(std::vector<std::string> lines, bool descending, bool unique) {
    std::map<std::string, int> counts;
    std::string expected;
    if (unique) {
        std::vector<std::string> kept;
        for (const std::string& line : lines) {
            if (++counts[line] == 1) {
                kept.push_back(line);
            }
        }
        lines = kept;
    } else {
        std::stable_sort(lines.begin(), lines.end(), [&](const std::string& left, const std::string& right) {
            return descending ? right < left : left < right;
        });
    }
    for (const std::string& line : lines) {
        expected += line + " " + std::to_string(unique ? counts[line] : 1) + "\n";
    }
    return expected;
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    constexpr std::uint64_t memories[] = {64, 128, 256, 1024, 16384};
    Input input(data, size);
    const unsigned flags = input.byte();
    const bool descending = (flags & 1) != 0;
    const bool unique = (flags & 2) != 0;
    const std::uint64_t memory = input.pick(memories);
    // With the least memory each line is a run, and 32 of them are merged in three levels.
    const std::vector<std::string> lines = linesOf(input.rest(), memory / 2);

    host::Workspace workspace("");
    const host::LineOrder order = descending ? host::LineOrder::Descending : host::LineOrder::Ascending;
    host::LineSorter sorter({order, unique, memory}, workspace);
    std::uint64_t place = 0;
    for (const std::string& line : lines) {
        host::LineRecord record;
        record.key = line;
        record.place = unique ? place++ : 0;
        sorter.add(record);
    }
    Collector collector;
    if (unique) {
        sorter.finishByPlace(collector);
    } else {
        sorter.finish(collector);
    }
    requireEqual(collector.text, expectedFor(lines, descending, unique), "the lines in order");
    return 0;
}
