#include "sort/line_sorter.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <utility>

namespace host {

namespace {

// The share of memory that is for records; the rest is for the windows of what is written.
std::uint64_t chunkShare(std::uint64_t memory) {
    return memory / 8 * 7;
}

// Turns records so that their places are their keys. Seven bytes, as many as a prefix holds, count all lines that
// there can be.
class PlaceSink : public RecordSink {
public:
    explicit PlaceSink(LineSorter& next) : next_(next) {}

    void take(const LineRecord& record) override {
        std::array<char, 7> place;
        for (std::size_t index = 0; index < place.size(); ++index) {
            place[index] = static_cast<char>(record.place >> (48 - 8 * index));
        }
        LineRecord turned = record;
        turned.key = {place.data(), place.size()};
        turned.payload = record.line();
        next_.add(turned);
    }

private:
    LineSorter& next_;
};

// Turns them back.
class LineSink : public RecordSink {
public:
    explicit LineSink(RecordSink& sink) : sink_(sink) {}

    void take(const LineRecord& record) override {
        LineRecord line = record;
        line.key = record.line();
        line.payload.reset();
        sink_.take(line);
    }

private:
    RecordSink& sink_;
};

} // namespace

LineSorter::LineSorter(const SortRule& rule, Workspace& workspace) : rule_(rule), workspace_(workspace) {
    chunk_.emplace(chunkShare(rule.memory), rule.order, workspace);
}

// Each run that is read has a window, and the pages around the place that is read.
std::uint64_t LineSorter::fanIn() const {
    constexpr std::uint64_t memoryOfRun = 256 * 1024;
    return std::clamp<std::uint64_t>(rule_.memory / memoryOfRun, 4, 256);
}

std::uint64_t LineSorter::window() const {
    return std::clamp<std::uint64_t>(rule_.memory / 16, 64 * 1024, 4 * 1024 * 1024);
}

void LineSorter::add(const LineRecord& record) {
    if (chunk_->add(record)) {
        return;
    }
    spill();
    if (chunk_->add(record)) {
        return;
    }
    RunWriter writer(workspace_, encodedSize(record), window());
    writer.take(record);
    addRun(writer.finish(0));
}

void LineSorter::spill() {
    if (chunk_->empty()) {
        return;
    }
    chunk_->sort();
    if (rule_.dropEqual) {
        chunk_->dropEqual();
    }
    // Equal records that become one are never shorter than it, whatever their count.
    RunWriter writer(workspace_, chunk_->size(), window());
    chunk_->forEach([&](const LineRecord& record) { writer.take(record); });
    chunk_->clear();
    addRun(writer.finish(0));
}

void LineSorter::addRun(LineRun run) {
    runs_.push_back(std::move(run));
    for (;;) {
        const int level = runs_.back().level;
        const auto isMergedMore = [&](const LineRun& other) { return other.level > level; };
        const auto first = std::find_if(runs_.rbegin(), runs_.rend(), isMergedMore).base();
        const auto count = static_cast<std::size_t>(runs_.end() - first);
        if (count < fanIn()) {
            return;
        }
        mergeLast(count, level + 1);
    }
}

void LineSorter::mergeLast(std::size_t count, int level) {
    const auto first = runs_.end() - static_cast<std::ptrdiff_t>(count);
    std::vector<LineRun> merged(std::make_move_iterator(first), std::make_move_iterator(runs_.end()));
    runs_.erase(first, runs_.end());
    std::uint64_t size = 0;
    for (const LineRun& run : merged) {
        size += run.size;
    }
    if (chunk_) {
        chunk_->giveBack();
    }
    RunWriter writer(workspace_, size, window());
    mergeRuns(std::move(merged), {rule_.order, rule_.dropEqual, rule_.memory / 2}, workspace_, writer);
    runs_.push_back(writer.finish(level));
}

// What is left in memory becomes a run as well, and no more runs stay than can be read together.
void LineSorter::closeRuns() {
    spill();
    chunk_.reset();
    while (runs_.size() > fanIn()) {
        const std::size_t tooMany = runs_.size() - fanIn() + 1;
        mergeLast(std::clamp<std::size_t>(tooMany, 2, fanIn()), runs_.back().level + 1);
    }
}

void LineSorter::finish(RecordSink& sink) {
    if (runs_.empty()) {
        chunk_->sort();
        if (rule_.dropEqual) {
            chunk_->dropEqual();
        }
        chunk_->forEach([&](const LineRecord& record) { sink.take(record); });
        return;
    }
    closeRuns();
    mergeRuns(std::move(runs_), {rule_.order, rule_.dropEqual, rule_.memory / 2}, workspace_, sink);
}

void LineSorter::finishByPlace(RecordSink& sink) {
    if (runs_.empty()) {
        chunk_->sort();
        if (rule_.dropEqual) {
            chunk_->dropEqual();
        }
        chunk_->sortByPlace();
        chunk_->forEach([&](const LineRecord& record) {
            LineRecord line = record;
            line.key = record.line();
            line.payload.reset();
            sink.take(line);
        });
        return;
    }
    // The last merge and the chunk of what comes out of it are in memory together.
    closeRuns();
    LineSorter byPlace({LineOrder::Ascending, false, rule_.memory / 2}, workspace_);
    PlaceSink turned(byPlace);
    mergeRuns(std::move(runs_), {rule_.order, true, rule_.memory / 4}, workspace_, turned);
    LineSink back(sink);
    byPlace.finish(back);
}

} // namespace host
