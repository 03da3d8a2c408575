// What becomes of one block: decoded, read row by row, taken through the steps, written and encoded. Each thread has a
// worker of its own; what it gives is the same whichever thread it was.
#pragma once

#include "translate/byte_decoder.h"
#include "translate/plan.h"
#include "translate/row_output.h"
#include "translate/source_blocks.h"
#include "translate/source_places.h"

#include <kvt/encoding/stream_transcoder.h>

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace host {

/// Counts of rows. The header is not one of them.
struct RowCounts {
    std::uint64_t read = 0;
    std::uint64_t written = 0;
    std::uint64_t rejected = 0; ///< left out since they failed
    std::uint64_t skipped = 0;  ///< left out since they were not wanted
    std::uint64_t cellsChanged = 0;

    RowCounts& operator+=(const RowCounts& other);
};

/// A row that waits for the others, to be sorted.
struct OrderedRow {
    std::string key;
    std::size_t end; ///< of the row in the output of the block
};

struct BlockResult {
    std::string header; ///< the names of the columns, as a row; for the first file only
    std::string_view
        output; ///< in the encoding of the output, or in UTF-8 where rows are ordered; of the block, or:
    std::string text; ///< the block decoded, where it had to be
    std::string room; ///< of rows that changed
    std::vector<OrderedRow> ordered;
    std::string rejected;                      ///< the rows as they stood in the input
    std::string rejectedHeader;                ///< and their header
    std::vector<CellFailure> failures;         ///< in the order of rows
    std::map<std::string, std::uint64_t> lost; ///< characters and bytes, in words
    RowCounts counts;
    std::uint64_t rows = 0; ///< all that the block has, header and other parts included
    bool isStopped = false; ///< the last failure ends the command; what is behind it was not looked at

    void clear();
};

class BlockWorker {
public:
    /// `plan` has names, and outlives the worker. Throws Failure.
    explicit BlockWorker(const Plan& plan, bool keepsRejected);

    /// The block has to stay for as long as the result is used. Throws Failure where a header is not that of the first
    /// file.
    void process(const SourceBlock& block, BlockResult& result);

    const Layout& layout() const { return layout_; }

private:
    void decode(const SourceBlock& block, BlockResult& result);
    void placeLosses(const SourceBlock& block);
    void translate(const SourceBlock& block, BlockResult& result);
    void takeHeader(const SourceBlock& block, BlockResult& result);
    void takeRow(bool needsLineEnd, BlockResult& result);
    void rejectRow(BlockResult& result);
    void failLostCells(BlockResult& result);
    void failUnwritableCells(BlockResult& result);
    void takeFailures(BlockResult& result);
    void reject(BlockResult& result);
    void addKey(BlockResult& result);
    bool encode(std::string_view text, std::string& out);
    void placeFailures(const SourceBlock& block, BlockResult& result);
    std::string asItStood(const SourceBlock& block, std::uint64_t begin, std::uint64_t end) const;

    const Plan& plan_;
    bool keepsRejected_;
    Layout layout_;
    std::vector<std::unique_ptr<Step>> steps_;
    std::vector<std::size_t> keySlots_;
    RowOutput rowOutput_;
    RowCells cells_;
    RowReader reader_;

    std::optional<ByteDecoder> byteDecoder_;
    std::optional<kvt::ex::StreamTranscoder> decoder_;
    kvt::ex::Encoding decodes_;
    std::optional<kvt::ex::StreamTranscoder> encoder_;
    std::string encoded_;
    std::string encodedHeader_;
    std::string_view text_;          ///< of the block, in UTF-8
    std::vector<PlacedLoss> losses_; ///< of decoding it
    std::size_t nextLoss_ = 0;
    bool checksWriting_ = false; ///< the block has characters that the output cannot have
    struct RejectedRow {
        const char* begin;
        const char* end;
        bool isHeader;
    };
    std::vector<RejectedRow> rejectedRows_;
    std::uint64_t row_ = 0;
};

} // namespace host
