// Sorted runs of records on disk: writing one, reading one, and the merging of many.
//
// A run is read once, from its front to its end. Of each run, a window of some bytes is in memory, whatever its size.
#pragma once

#include "sort/line_chunk.h"
#include "sort/line_record.h"
#include "sort/workspace.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <vector>

namespace host {

struct LineRun {
    std::unique_ptr<Stretch> stretch;
    std::uint64_t size = 0;
    int level = 0; ///< how many merges its records have been through
};

/// Takes the records of a sorted whole, in order. Views are valid during the call.
class RecordSink {
public:
    virtual ~RecordSink() = default;
    virtual void take(const LineRecord& record) = 0;
};

class RunWriter : public RecordSink {
public:
    /// `most` is the most bytes that all records may have, `window` how many are in memory.
    RunWriter(Workspace& workspace, std::uint64_t most, std::uint64_t window);

    void take(const LineRecord& record) override;
    LineRun finish(int level);

private:
    void append(std::string_view bytes);
    void letGo();

    Workspace& workspace_;
    std::uint64_t window_;
    std::unique_ptr<Stretch> stretch_;
    std::uint64_t size_ = 0;
    std::uint64_t gone_ = 0; ///< up to here, the run is not in memory
};

struct MergeRule {
    LineOrder order = LineOrder::Ascending;
    bool dropEqual = false;   ///< of equal records, the first one passes and counts for all
    std::uint64_t memory = 0; ///< for the windows of all runs together
};

class RunReader {
public:
    RunReader(LineRun run, const MergeRule& rule, std::uint64_t window, const Workspace& workspace);

    /// Goes on to the next record. The texts of the one before stay where they are until the run ends.
    void next();
    const LineRecord& record() const { return record_; }
    /// Of the key, so that a smaller one comes first in the order.
    std::uint64_t prefix() const { return prefix_; }
    bool atEnd() const { return atEnd_; }

private:
    LineRun run_;
    LineOrder order_;
    std::uint64_t window_;
    const Workspace* workspace_;
    std::uint64_t start_ = 0; ///< of the record
    std::uint64_t end_ = 0;
    std::uint64_t gone_ = 0; ///< up to here, the run is not in memory
    LineRecord record_;
    std::uint64_t prefix_ = 0;
    bool atEnd_ = false;
};

/// Merges runs into one order; of equal records, those of an earlier run come first.
void mergeRuns(std::vector<LineRun> runs, const MergeRule& rule, const Workspace& workspace,
               RecordSink& sink);

} // namespace host
