// A block is taken through the steps on the assumption that all of it can be decoded and encoded. Where that turns out
// to be wrong, it is done again with a look at each cell.

#include "translate/block_worker.h"

#include "base/failure.h"
#include "base/text.h"
#include "base/text_units.h"
#include "convert/loss_report.h"
#include "text/text_offsets.h"
#include "translate/utf8_check.h"

#include <algorithm>

namespace host {

namespace {

using kvt::ex::Encoding;
using kvt::ex::Loss;

constexpr std::string_view replacement = "\xEF\xBF\xBD";

// A row that never ends need not be shown as a whole.
std::string shownRow(std::string_view row) {
    constexpr std::size_t most = 1000;
    std::size_t length = std::min(row.size(), most);
    while (length < row.size() && length > 0 && isContinuation(row[length])) {
        --length;
    }
    return std::string(row.substr(0, length));
}

std::string encoded(std::string_view text, Encoding to) {
    std::string out;
    kvt::ex::StreamTranscoder encoder(Encoding::Utf8, to);
    encoder.convert(text, out, {});
    encoder.finish(out, {});
    return out;
}

} // namespace

RowCounts& RowCounts::operator+=(const RowCounts& other) {
    read += other.read;
    written += other.written;
    rejected += other.rejected;
    skipped += other.skipped;
    cellsChanged += other.cellsChanged;
    return *this;
}

void BlockResult::clear() {
    header.clear();
    output = {};
    ordered.clear();
    rejected.clear();
    rejectedHeader.clear();
    failures.clear();
    lost.clear();
    counts = {};
    rows = 0;
    isStopped = false;
}

BlockWorker::BlockWorker(const Plan& plan, bool keepsRejected)
    : plan_(plan), keepsRejected_(keepsRejected), layout_(plan.names), steps_(plan.start(layout_)),
      rowOutput_(plan, layout_), cells_(plan.in, plan.onError, layout_.slotCount()), reader_(plan.in, {}),
      decodes_(plan.from.encoding) {
    for (const std::string& column : plan.sortColumns) {
        keySlots_.push_back(layout_.at(column).slot);
    }
    if (plan.to.evaluate() != Encoding::Utf8) {
        encoder_.emplace(Encoding::Utf8, plan.to);
    }
}

void BlockWorker::process(const SourceBlock& block, BlockResult& result) {
    result.clear();
    decode(block, result);
    if (block.isOutside) {
        reader_.restart(text_);
        while (reader_.next()) {
            ++result.rows;
        }
        return;
    }
    placeLosses(block);
    checksWriting_ = false;
    translate(block, result);
    if (encoder_) {
        const bool isWhole = encode(result.header, encodedHeader_) && encode(result.output, encoded_);
        if (!isWhole) {
            checksWriting_ = true;
            result.clear();
            translate(block, result);
            encode(result.header, encodedHeader_);
            encode(result.output, encoded_);
        }
        result.header.swap(encodedHeader_);
        if (!plan_.isOrdered()) {
            result.room.swap(encoded_);
            result.output = result.room;
        }
    }
    placeFailures(block, result);
}

void BlockWorker::decode(const SourceBlock& block, BlockResult& result) {
    losses_ = block.losses;
    if (!decoder_ || decodes_ != block.encoding) {
        decodes_ = block.encoding;
        decoder_.emplace(decodes_, Encoding::Utf8);
        byteDecoder_ = ByteDecoder::of(decodes_);
    }
    if (block.isDecoded) {
        text_ = block.bytes;
        return;
    }
    if (byteDecoder_) {
        if (const auto text = byteDecoder_->decode(block.bytes, result.text)) {
            text_ = *text;
            return;
        }
    }
    if (decodes_.evaluate() == Encoding::Utf8 && isUtf8(block.bytes)) {
        text_ = block.bytes;
        return;
    }
    result.text.clear();
    const auto onLoss = [&](const Loss& loss) { losses_.push_back({loss, 0}); };
    decoder_->convert(block.bytes, result.text, onLoss);
    decoder_->finish(result.text, onLoss);
    text_ = result.text;
}

// Each loss left a U+FFFD, but not each of those is one.
void BlockWorker::placeLosses(const SourceBlock& block) {
    if (losses_.empty() || block.isDecoded) {
        return;
    }
    TextOffsets offsets(block.encoding);
    offsets.add(block.bytes);
    offsets.add({});
    auto loss = losses_.begin();
    for (std::size_t at = text_.find(replacement); at != std::string_view::npos && loss != losses_.end();
         at = text_.find(replacement, at + replacement.size())) {
        offsets.passTo(at);
        if (offsets.offsetOf(0) == loss->loss.offset) {
            loss->place = at;
            ++loss;
        }
    }
    losses_.erase(loss, losses_.end());
}

void BlockWorker::translate(const SourceBlock& block, BlockResult& result) {
    rejectedRows_.clear();
    nextLoss_ = 0;
    row_ = 0;
    rowOutput_.begin(result.room, text_);
    reader_.restart(text_);
    for (; !result.isStopped && reader_.next(); ++row_) {
        if (row_ == 0 && block.beginsFile && plan_.job.input.hasHeader) {
            takeHeader(block, result);
        } else {
            takeRow(block.isMoreToCome || plan_.isOrdered(), result);
        }
    }
    result.rows = row_;
    result.output = rowOutput_.end();
}

void BlockWorker::takeHeader(const SourceBlock& block, BlockResult& result) {
    if (keepsRejected_) {
        rejectedRows_.push_back(
            {reader_.row().data(), reader_.lineEnd().data() + reader_.lineEnd().size(), true});
    }
    cells_.begin(reader_);
    if (reader_.fault() != RowFault::None || reader_.cellCount() != plan_.names.size()) {
        throw Failure(block.name + ": the header is not that of the first file");
    }
    for (std::size_t slot = 0; slot < plan_.names.size(); ++slot) {
        if (cells_.text(slot) != plan_.names[slot]) {
            throw Failure(block.name + ": column " + std::to_string(slot + 1) + " is called '" +
                          printable(cells_.text(slot)) + "', and '" + printable(plan_.names[slot]) +
                          "' in the first file");
        }
    }
    failLostCells(result);
    for (const Layout::Column& column : layout_.columns()) {
        cells_.set(column.slot, column.name);
    }
    if (checksWriting_) {
        failUnwritableCells(result);
    }
    takeFailures(result);
    result.isStopped = plan_.onError == OnCellError::Stop && !result.failures.empty();
    if (block.isOfFirstFile) {
        rowOutput_.writeEachCell(cells_, reader_, block.isMoreToCome || plan_.isOrdered());
        result.header = rowOutput_.end();
        rowOutput_.begin(result.room, text_);
    }
}

void BlockWorker::takeRow(bool needsLineEnd, BlockResult& result) {
    ++result.counts.read;
    cells_.begin(reader_);
    if (reader_.fault() != RowFault::None || reader_.cellCount() != plan_.names.size()) {
        rejectRow(result);
        return;
    }
    if (nextLoss_ != losses_.size()) {
        failLostCells(result);
    }
    for (const auto& step : steps_) {
        if (!step->apply(cells_)) {
            // Who is not wanted need not be good.
            ++result.counts.skipped;
            return;
        }
    }
    const bool leavesOutFailed = plan_.onError == OnCellError::Stop || plan_.onError == OnCellError::Skip;
    // What is not written need not be writable.
    if (checksWriting_ && (cells_.failures().empty() || !leavesOutFailed)) {
        failUnwritableCells(result);
    }
    if (!cells_.failures().empty()) {
        takeFailures(result);
        if (leavesOutFailed) {
            reject(result);
            return;
        }
    }
    ++result.counts.written;
    result.counts.cellsChanged += cells_.changedCount();
    if (plan_.isOrdered()) {
        addKey(result);
    }
    if (cells_.failures().empty()) {
        rowOutput_.write(cells_, reader_, needsLineEnd);
    } else {
        rowOutput_.writeEachCell(cells_, reader_, needsLineEnd);
    }
    if (plan_.isOrdered()) {
        result.ordered.back().end = rowOutput_.size();
    }
}

// A row that is none of the table.
void BlockWorker::rejectRow(BlockResult& result) {
    Problem problem;
    const char* place = reader_.row().data();
    if (reader_.fault() != RowFault::None) {
        problem = makeProblem(reader_.fault() == RowFault::QuoteNeverEnds    ? problem_number::quoteNeverEnds
                              : reader_.fault() == RowFault::TextBehindQuote ? problem_number::textBehindQuote
                                                                             : problem_number::nul);
        place = reader_.faultPlace();
    } else {
        problem = makeProblem(problem_number::cellCount, {counted(reader_.cellCount(), "cell", "cells"),
                                                          counted(plan_.names.size(), "column", "columns")});
    }
    result.failures.push_back({row_, place, 0, "", shownRow(reader_.row()), std::move(problem)});
    reject(result);
}

// The cells of this row that have something that could not be decoded.
void BlockWorker::failLostCells(BlockResult& result) {
    const auto placeOf = [&](const char* place) { return static_cast<std::uint64_t>(place - text_.data()); };
    while (nextLoss_ != losses_.size() && losses_[nextLoss_].place < placeOf(reader_.row().data())) {
        ++nextLoss_;
    }
    for (std::size_t slot = 0; slot < reader_.cellCount(); ++slot) {
        for (; nextLoss_ != losses_.size() && losses_[nextLoss_].place < placeOf(reader_.ends()[slot]);
             ++nextLoss_) {
            const Loss& loss = losses_[nextLoss_].loss;
            ++result.lost[describeLost(loss)];
            if (!cells_.hasFailed(slot)) {
                cells_.fail(slot, plan_.names[slot],
                            makeProblem(problem_number::badBytes,
                                        {escapedBytes(loss.bytes), std::string(decodes_.getName())}));
            }
        }
    }
}

void BlockWorker::failUnwritableCells(BlockResult& result) {
    std::string written;
    for (const Layout::Column& column : layout_.columns()) {
        const std::string_view text = cells_.text(column.slot);
        if (std::all_of(text.begin(), text.end(), isAscii)) {
            continue;
        }
        std::string lost;
        const auto onLoss = [&](const Loss& loss) {
            ++result.lost[describeLost(loss)];
            lost = lost.empty() ? printable(std::u32string_view(&loss.codePoint, 1)) : lost;
        };
        written.clear();
        encoder_->convert(text, written, onLoss);
        encoder_->finish(written, onLoss);
        if (!lost.empty() && !cells_.hasFailed(column.slot)) {
            cells_.fail(column.slot, column.name,
                        makeProblem(problem_number::notRepresentable,
                                    {lost, "UTF-8", std::string(plan_.to.getName())}));
        }
    }
}

void BlockWorker::takeFailures(BlockResult& result) {
    for (const CellFailure& failure : cells_.failures()) {
        result.failures.push_back(failure);
        result.failures.back().row = row_;
    }
}

void BlockWorker::reject(BlockResult& result) {
    ++result.counts.rejected;
    result.isStopped = plan_.onError == OnCellError::Stop;
    if (keepsRejected_) {
        rejectedRows_.push_back(
            {reader_.row().data(), reader_.lineEnd().data() + reader_.lineEnd().size(), false});
    }
}

void BlockWorker::addKey(BlockResult& result) {
    OrderedRow& row = result.ordered.emplace_back();
    for (const std::size_t slot : keySlots_) {
        row.key += cells_.text(slot);
        row.key += '\0'; // less than whatever a cell has
    }
}

// Whether nothing was lost.
bool BlockWorker::encode(std::string_view text, std::string& out) {
    bool isWhole = true;
    const auto onLoss = [&](const Loss&) { isWhole = false; };
    out.clear();
    encoder_->convert(text, out, onLoss);
    encoder_->finish(out, onLoss);
    return isWhole;
}

// From places in the text to bytes of the file, and from rejected rows to what they were there.
void BlockWorker::placeFailures(const SourceBlock& block, BlockResult& result) {
    if (result.failures.empty() && rejectedRows_.empty()) {
        return;
    }
    struct Sought {
        const char* place;
        std::uint64_t* found;
    };
    std::vector<Sought> all;
    std::vector<std::pair<std::uint64_t, std::uint64_t>> rows(rejectedRows_.size());
    for (CellFailure& failure : result.failures) {
        all.push_back({failure.place, &failure.offset});
    }
    for (std::size_t index = 0; index < rows.size(); ++index) {
        all.push_back({rejectedRows_[index].begin, &rows[index].first});
        all.push_back({rejectedRows_[index].end, &rows[index].second});
    }
    std::stable_sort(all.begin(), all.end(),
                     [](const Sought& left, const Sought& right) { return left.place < right.place; });
    const bool isSame = block.isDecoded || (block.encoding.evaluate() == Encoding::Utf8 && losses_.empty());
    SourcePlaces places(block.encoding);
    if (!isSame) {
        places.add(block.bytes);
    }
    for (const Sought& sought : all) {
        const auto at = static_cast<std::uint64_t>(sought.place - text_.data());
        *sought.found = isSame ? at : places.at(at);
    }
    for (CellFailure& failure : result.failures) {
        failure.offset += block.offset;
    }
    for (std::size_t index = 0; index < rows.size(); ++index) {
        std::string& to = rejectedRows_[index].isHeader ? result.rejectedHeader : result.rejected;
        to += asItStood(block, rows[index].first, rows[index].second);
        const char last = rejectedRows_[index].end[-1];
        if (block.isMoreToCome && last != '\n' && last != '\r') {
            to += encoded("\n", block.encoding);
        }
    }
}

std::string BlockWorker::asItStood(const SourceBlock& block, std::uint64_t begin, std::uint64_t end) const {
    const std::string_view text =
        std::string_view(block.bytes)
            .substr(static_cast<std::size_t>(begin), static_cast<std::size_t>(end - begin));
    if (!block.isDecoded) {
        return std::string(text);
    }
    return encoded(text, block.encoding);
}

} // namespace host
