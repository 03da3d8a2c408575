#include "translate/accounts.h"

#include "base/diagnostics.h"
#include "base/failure.h"
#include "base/text.h"
#include "translate/cell_text.h"

#include <kvt/datetime/message_numbers.h>

#include <nlohmann/json.hpp>

#include <algorithm>
#include <vector>

namespace host {

namespace {

namespace message_number = kvt::ex::datetime::message_number;

constexpr std::size_t mostKinds = 1000;

std::string shownValue(std::string_view value) {
    constexpr std::size_t mostBytes = 200;
    return "\"" + printable(value.substr(0, mostBytes)) + (value.size() > mostBytes ? "...\"" : "\"");
}

std::string aligned(std::uint64_t count) {
    std::string text = std::to_string(count);
    text.insert(0, text.size() < 8 ? 8 - text.size() : 0, ' ');
    return text;
}

// Rows that come out of the sorter, on their way into the output.
class OrderedOutput : public RecordSink {
public:
    OrderedOutput(Output* output, kvt::ex::Encoding to) : output_(output) {
        if (to.evaluate() != kvt::ex::Encoding::Utf8) {
            encoder_.emplace(kvt::ex::Encoding::Utf8, to);
        }
    }

    void take(const LineRecord& record) override {
        ++count_;
        rows_ += record.line();
        if (rows_.size() >= SourceBlocks::blockSize) {
            flush();
        }
    }

    void flush() {
        if (encoder_) {
            encoded_.clear();
            encoder_->convert(rows_, encoded_, {});
            encoder_->finish(encoded_, {});
            rows_.swap(encoded_);
        }
        if (output_ != nullptr) {
            output_->write(rows_);
        }
        rows_.clear();
    }

    std::uint64_t count() const { return count_; }

private:
    Output* output_;
    std::optional<kvt::ex::StreamTranscoder> encoder_;
    std::string rows_;
    std::string encoded_;
    std::uint64_t count_ = 0;
};

} // namespace

Accounts::Accounts(const Plan& plan, const Destinations& destinations) : plan_(plan), to_(destinations) {}

const char* Accounts::csvHeader() {
    return "file,row,column,offset,value,number,text\n";
}

bool Accounts::take(const SourceBlock& block, BlockResult& result) {
    if (block.beginsFile) {
        rowsOfFile_ = 0;
        places_.reset();
    }
    placeInFile(block, result);
    bool goesOn = true;
    for (auto failure = result.failures.begin(); goesOn && failure != result.failures.end(); ++failure) {
        goesOn = takeFailure(block, *failure);
    }
    for (const auto& [what, count] : result.lost) {
        lost_[what] += count;
    }
    counts_ += result.counts;
    rowsOfFile_ += result.rows;
    if (to_.report != nullptr && !reportLines_.empty()) {
        to_.report->write(reportLines_);
        reportLines_.clear();
    }
    isStopped_ = !goesOn || result.isStopped;
    if (to_.output != nullptr) {
        to_.output->write(result.header);
    }
    if (sorter_ != nullptr) {
        keepRows(result);
    } else if (to_.output != nullptr) {
        to_.output->write(result.output);
    }
    if (to_.rejected != nullptr) {
        if (!std::exchange(hasRejectedHeader_, true)) {
            to_.rejected->write(result.rejectedHeader);
        }
        to_.rejected->write(result.rejected);
    }
    return !isStopped_;
}

// Of a text that was decoded before it was cut, places are known only by decoding it once more, from the beginning.
void Accounts::placeInFile(const SourceBlock& block, BlockResult& result) {
    if (!block.isDecoded) {
        return;
    }
    if (!places_) {
        places_.emplace(block.encoding);
    }
    places_->add(block.source);
    std::vector<std::uint64_t*> offsets;
    for (CellFailure& failure : result.failures) {
        offsets.push_back(&failure.offset);
    }
    std::sort(offsets.begin(), offsets.end(),
              [](const auto* left, const auto* right) { return *left < *right; });
    for (std::uint64_t* offset : offsets) {
        *offset = block.markSize + places_->at(*offset);
    }
    places_->at(block.offset + block.bytes.size());
}

// False where this is the end.
bool Accounts::takeFailure(const SourceBlock& block, const CellFailure& failure) {
    if (failures_ == plan_.mostErrors) {
        stopReason_ = "more than " + counted(plan_.mostErrors, "failure", "failures");
        return false;
    }
    ++failures_;
    const std::string text =
        failure.problem.text +
        (failure.problem.number == 0 ? "" : " (" + std::to_string(failure.problem.number) + ")");
    if (plan_.onError == OnCellError::Stop) {
        stopReason_ = placeOf(block, failure) + ": " + shownValue(failure.value) + ": " + text;
    }
    KindKey key(failure.column, failure.problem.number);
    if (kinds_.size() >= mostKinds && kinds_.find(key) == kinds_.end()) {
        key = {};
    }
    Kind& kind = kinds_[key];
    if (++kind.count == 1) {
        kind.order = kinds_.size();
        kind.example = placeOf(block, failure) + ": " + shownValue(failure.value) + ": " + text;
    }
    if (to_.report != nullptr) {
        report(block, failure);
    }
    return plan_.onError != OnCellError::Stop;
}

std::string Accounts::placeOf(const SourceBlock& block, const CellFailure& failure) const {
    return block.name + ": row " + std::to_string(rowsOfFile_ + failure.row + 1) +
           (failure.column.empty() ? "" : ", column " + printable(failure.column)) + ", byte " +
           std::to_string(failure.offset);
}

void Accounts::report(const SourceBlock& block, const CellFailure& failure) {
    const std::uint64_t row = rowsOfFile_ + failure.row + 1;
    if (!to_.reportIsCsv) {
        nlohmann::ordered_json object;
        object["file"] = block.name;
        object["row"] = row;
        object["column"] = nullptr;
        if (!failure.column.empty()) {
            object["column"] = failure.column;
        }
        object["offset"] = failure.offset;
        object["value"] = failure.value;
        object["number"] = nullptr;
        if (failure.problem.number != 0) {
            object["number"] = failure.problem.number;
        }
        object["text"] = failure.problem.text;
        reportLines_ += object.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n";
        return;
    }
    if (!std::exchange(hasReportHeader_, true)) {
        reportLines_ += csvHeader();
    }
    const RowForm form;
    const std::string number = failure.problem.number == 0 ? "" : std::to_string(failure.problem.number);
    const std::string cells[] = {
        block.name, std::to_string(row), failure.column, std::to_string(failure.offset), failure.value,
        number,     failure.problem.text};
    for (const std::string& cell : cells) {
        appendCell(reportLines_, cell, form);
        reportLines_ += &cell == std::end(cells) - 1 ? '\n' : ',';
    }
}

void Accounts::keepRows(const BlockResult& result) {
    std::size_t begin = 0;
    for (const OrderedRow& row : result.ordered) {
        LineRecord record;
        record.key = row.key;
        record.payload = result.output.substr(begin, row.end - begin);
        record.place = plan_.isUnique ? place_++ : 0;
        sorter_->add(record);
        begin = row.end;
    }
}

void Accounts::finish() {
    if (sorter_ == nullptr) {
        return;
    }
    OrderedOutput rows(to_.output, plan_.to);
    if (plan_.isUnique) {
        sorter_->finishByPlace(rows);
    } else {
        sorter_->finish(rows);
    }
    rows.flush();
    counts_.skipped += counts_.written - rows.count();
    counts_.written = rows.count();
}

void Accounts::printSummary(Diagnostics& diagnostics) const {
    if (isStopped_) {
        diagnostics.fail(stopReason_);
    }
    diagnostics.say(counted(counts_.read, "row", "rows") + " read, " + std::to_string(counts_.written) +
                    " written, " + std::to_string(counts_.rejected) + " rejected, " +
                    std::to_string(counts_.skipped) + " skipped; " +
                    counted(counts_.cellsChanged, "cell", "cells") + " changed");
    printFailures(diagnostics);
    if (!lost_.empty()) {
        std::uint64_t total = 0;
        for (const auto& [what, count] : lost_) {
            total += count;
        }
        diagnostics.say(counted(total, "loss", "losses") + " between " +
                        std::string(plan_.from.encoding.getName()) + " and " +
                        std::string(plan_.to.getName()) + ":");
        for (const auto& [what, count] : lost_) {
            diagnostics.line(aligned(count) + "  " + what);
        }
    }
    if (counts_.read != counts_.written + counts_.rejected + counts_.skipped) {
        throw Failure("the counts of rows contradict each other; this is a fault of kvt");
    }
}

void Accounts::printFailures(Diagnostics& diagnostics) const {
    if (failures_ == 0 || (isStopped_ && failures_ == 1)) {
        return;
    }
    std::vector<std::pair<const KindKey*, const Kind*>> kinds;
    for (const auto& [key, kind] : kinds_) {
        kinds.emplace_back(&key, &kind);
    }
    std::sort(kinds.begin(), kinds.end(), [](const auto& left, const auto& right) {
        return left.second->count != right.second->count ? left.second->count > right.second->count
                                                         : left.second->order < right.second->order;
    });
    diagnostics.say(counted(failures_, "failure", "failures") + ":");
    std::uint64_t inGap = 0;
    std::uint64_t inOverlap = 0;
    for (const auto& [key, kind] : kinds) {
        diagnostics.line(aligned(kind->count) + "  such as " + kind->example);
        inGap += key->second == message_number::localTimeInGap ? kind->count : 0;
        inOverlap += key->second == message_number::localTimeAmbiguous ? kind->count : 0;
    }
    if (inGap + inOverlap != 0) {
        diagnostics.say(counted(inGap, "local time", "local times") + " on no clock, " +
                        std::to_string(inOverlap) + " on the clocks twice");
    }
}

} // namespace host
