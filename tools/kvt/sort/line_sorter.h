// Sorts more records than memory holds.
//
// Records fill a chunk; a full chunk is sorted and written to the workspace as a run. As soon as there are as many
// runs of one level as can be read together, they are merged into one of the next, so that there are never many.
// What fits memory never sees the disk. A record that is larger than a chunk is a run of its own.
#pragma once

#include "sort/line_chunk.h"
#include "sort/line_merge.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace host {

struct SortRule {
    LineOrder order = LineOrder::Ascending;
    bool dropEqual = false;   ///< of records with equal keys, the first one added stays and counts for all
    std::uint64_t memory = 0; ///< bytes
};

class LineSorter {
public:
    LineSorter(const SortRule& rule, Workspace& workspace);

    void add(const LineRecord& record);
    /// Gives all records to `sink` in order, and ends the use of the sorter.
    void finish(RecordSink& sink);
    /// The same for a sorter that drops what is equal, in the order of the records' places. They come with the
    /// payload, where there is one, as their key.
    void finishByPlace(RecordSink& sink);

private:
    std::uint64_t fanIn() const;
    std::uint64_t window() const;
    void spill();
    void closeRuns();
    void addRun(LineRun run);
    void mergeLast(std::size_t count, int level);

    SortRule rule_;
    Workspace& workspace_;
    std::optional<LineChunk> chunk_;
    std::vector<LineRun> runs_; ///< in the order of their records in the input
};

} // namespace host
