// What became of the input, added up block by block in its order: rows, failures, losses. Writes the output, the report
// of failures and the rejected rows, decides when it is enough, and says at the end what there was.
#pragma once

#include "base/output.h"
#include "sort/line_sorter.h"
#include "sort/workspace.h"
#include "translate/block_worker.h"
#include "translate/plan.h"
#include "translate/source_blocks.h"

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <utility>

namespace host {

class Diagnostics;

/// Where things go; null for what is not wanted.
struct Destinations {
    Output* output = nullptr;
    Output* report = nullptr;
    bool reportIsCsv = false;
    Output* rejected = nullptr;
};

class Accounts {
public:
    Accounts(const Plan& plan, const Destinations& destinations);

    /// Rows wait in `sorter` from now on, and are written by finish().
    void order(LineSorter& sorter) { sorter_ = &sorter; }

    /// The next block. False where the command ends here.
    bool take(const SourceBlock& block, BlockResult& result);
    /// All blocks were taken.
    void finish();

    /// Says on standard error what there was. Throws Failure where the counts of rows contradict each other.
    void printSummary(Diagnostics& diagnostics) const;

    bool isStopped() const { return isStopped_; }
    /// Whether something failed or was lost.
    bool hasFailures() const { return failures_ != 0 || !lost_.empty(); }

    static const char* csvHeader();

private:
    struct Kind {
        std::uint64_t count = 0;
        std::uint64_t order = 0;
        std::string example;
    };
    using KindKey = std::pair<std::string, std::uint32_t>; ///< column and number

    void placeInFile(const SourceBlock& block, BlockResult& result);
    bool takeFailure(const SourceBlock& block, const CellFailure& failure);
    std::string placeOf(const SourceBlock& block, const CellFailure& failure) const;
    void report(const SourceBlock& block, const CellFailure& failure);
    void keepRows(const BlockResult& result);
    void printFailures(Diagnostics& diagnostics) const;

    const Plan& plan_;
    Destinations to_;
    LineSorter* sorter_ = nullptr;
    std::uint64_t place_ = 0; ///< of the next row in the order of the input
    std::string reportLines_;
    bool hasReportHeader_ = false;
    bool hasRejectedHeader_ = false;

    RowCounts counts_;
    std::uint64_t rowsOfFile_ = 0; ///< before the block
    std::optional<SourcePlaces> places_;
    std::uint64_t failures_ = 0;
    std::map<KindKey, Kind> kinds_;
    std::map<std::string, std::uint64_t> lost_;
    std::string stopReason_;
    bool isStopped_ = false;
};

} // namespace host
