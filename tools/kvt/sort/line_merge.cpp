#include "sort/line_merge.h"

#include <algorithm>
#include <cstring>
#include <utility>

namespace host {

namespace {

// A tournament among the runs. Each node of the tree remembers the run that lost there, so that after the winner has
// moved on to its next record, only the nodes between its leaf and the root are played again.
class Tournament {
public:
    Tournament(std::vector<RunReader>& runs, LineOrder order, const Workspace& workspace)
        : runs_(runs), order_(order), workspace_(workspace), losers_(runs.size()) {
        winner_ = play(1);
    }

    RunReader& winner() { return runs_[winner_]; }

    /// The winner has moved on.
    void replay() {
        for (std::size_t node = (winner_ + runs_.size()) / 2; node > 0; node /= 2) {
            if (comesFirst(losers_[node], winner_)) {
                std::swap(losers_[node], winner_);
            }
        }
    }

private:
    // Leaves are numbered from runs_.size() on, behind the inner nodes, which begin at 1.
    std::size_t play(std::size_t node) {
        if (node >= runs_.size()) {
            return node - runs_.size();
        }
        const std::size_t left = play(node * 2);
        const std::size_t right = play(node * 2 + 1);
        const bool leftWins = comesFirst(left, right);
        losers_[node] = leftWins ? right : left;
        return leftWins ? left : right;
    }

    bool comesFirst(std::size_t leftIndex, std::size_t rightIndex) const {
        const RunReader& left = runs_[leftIndex];
        const RunReader& right = runs_[rightIndex];
        if (left.atEnd() || right.atEnd()) {
            return right.atEnd() && (!left.atEnd() || leftIndex < rightIndex);
        }
        if (left.prefix() != right.prefix()) {
            return left.prefix() < right.prefix();
        }
        if (isOpen(order_ == LineOrder::Descending ? ~left.prefix() : left.prefix())) {
            const int order = compareFrom(left.record().key, right.record().key, 7, workspace_);
            if (order != 0) {
                return (order < 0) == (order_ == LineOrder::Ascending);
            }
        }
        return leftIndex < rightIndex;
    }

    std::vector<RunReader>& runs_;
    LineOrder order_;
    const Workspace& workspace_;
    std::vector<std::size_t> losers_; ///< indexes of runs
    std::size_t winner_;
};

// Passes records on when it is known how many there are of each.
class EqualDropper : public RecordSink {
public:
    EqualDropper(RecordSink& sink, const Workspace& workspace) : sink_(sink), workspace_(workspace) {}

    void take(const LineRecord& record) override {
        if (held_ && held_->key.size() == record.key.size() &&
            compareFrom(held_->key, record.key, 0, workspace_) == 0) {
            held_->count += record.count;
            return;
        }
        flush();
        held_ = record;
    }

    void flush() {
        if (held_) {
            sink_.take(*held_);
            held_.reset();
        }
    }

private:
    RecordSink& sink_;
    const Workspace& workspace_;
    std::optional<LineRecord> held_; ///< views of its run, which stays to the end
};

void playAll(std::vector<RunReader>& runs, const MergeRule& rule, const Workspace& workspace,
             RecordSink& sink) {
    Tournament tournament(runs, rule.order, workspace);
    while (!tournament.winner().atEnd()) {
        sink.take(tournament.winner().record());
        tournament.winner().next();
        tournament.replay();
    }
}

} // namespace

RunWriter::RunWriter(Workspace& workspace, std::uint64_t most, std::uint64_t window)
    : workspace_(workspace), window_(window), stretch_(workspace.allocate(std::max<std::uint64_t>(most, 1))) {
}

void RunWriter::take(const LineRecord& record) {
    char header[mostHeaderBytes];
    append({header, static_cast<std::size_t>(encodeHeader(header, record) - header)});
    forEachPiece(workspace_, record.key, [this](std::string_view piece) { append(piece); });
    forEachPiece(workspace_, record.payload.value_or(std::string_view()),
                 [this](std::string_view piece) { append(piece); });
}

void RunWriter::append(std::string_view bytes) {
    if (bytes.empty()) {
        return;
    }
    stretch_->reserve(size_ + bytes.size());
    std::memcpy(stretch_->data() + size_, bytes.data(), bytes.size());
    size_ += bytes.size();
    if (size_ - gone_ >= window_) {
        letGo();
    }
}

void RunWriter::letGo() {
    workspace_.letGo({stretch_->data() + gone_, size_ - gone_});
    gone_ = size_;
}

LineRun RunWriter::finish(int level) {
    letGo();
    return {std::move(stretch_), size_, level};
}

RunReader::RunReader(LineRun run, const MergeRule& rule, std::uint64_t window, const Workspace& workspace)
    : run_(std::move(run)), order_(rule.order), window_(window), workspace_(&workspace) {
    next();
}

void RunReader::next() {
    const char* data = run_.stretch->data();
    if (start_ - gone_ >= window_) {
        workspace_->letGo({data + gone_, start_ - gone_});
        gone_ = start_;
    }
    start_ = end_;
    if (end_ == run_.size) {
        atEnd_ = true;
        return;
    }
    end_ = static_cast<std::uint64_t>(decode(data + start_, record_) - data);
    const std::uint64_t prefix = prefixOf(record_.key);
    prefix_ = order_ == LineOrder::Descending ? ~prefix : prefix;
}

void mergeRuns(std::vector<LineRun> runs, const MergeRule& rule, const Workspace& workspace,
               RecordSink& sink) {
    constexpr std::uint64_t leastWindow = 64 * 1024;
    constexpr std::uint64_t mostWindow = 8 * 1024 * 1024;
    const std::uint64_t window = std::clamp(rule.memory / runs.size(), leastWindow, mostWindow);
    std::vector<RunReader> readers;
    readers.reserve(runs.size());
    for (LineRun& run : runs) {
        readers.emplace_back(std::move(run), rule, window, workspace);
    }
    if (rule.dropEqual) {
        EqualDropper dropper(sink, workspace);
        playAll(readers, rule, workspace, dropper);
        dropper.flush();
    } else {
        playAll(readers, rule, workspace, sink);
    }
}

} // namespace host
