#include "translate/explanation.h"

#include "base/text.h"
#include "translate/block_worker.h"
#include "translate/header_names.h"
#include "translate/job_text.h"
#include "translate/plan.h"
#include "translate/row_reader.h"
#include "translate/source_blocks.h"

#include <cstddef>
#include <optional>
#include <string_view>

namespace host {

namespace {

constexpr std::size_t mostRows = 5; // besides the header

std::string_view withoutLineEnd(std::string_view row) {
    return row.substr(0, row.find_last_not_of("\r\n") + 1);
}

// The rows go through the steps one by one, so that each is shown beside what becomes of it.
class Explanation {
public:
    explicit Explanation(const Job& job) : plan_(asUtf8(job)) {}

    std::string of(const std::vector<std::string>& inputs) {
        SourceBlocks source(plan_, inputs, std::nullopt, nullptr);
        SourceBlock block;
        if (!source.next(block)) {
            return "The input is empty.\n";
        }
        plan_.names = namesOf(block, plan_);
        worker_.emplace(plan_, false);
        const std::string text = textOf(block);
        RowReader reader(plan_.in, text);
        const bool hasHeader = plan_.job.input.hasHeader;
        for (std::size_t row = 0; row < mostRows + (hasHeader ? 1 : 0) && reader.next(); ++row) {
            show(row + 1, reader.row(), hasHeader && row == 0);
        }
        return out_;
    }

private:
    // What is shown is UTF-8, whatever the output will be, and every failure is of interest.
    static Job asUtf8(Job job) {
        job.output.encoding = "UTF-8";
        job.onError = job.onError == "stop" ? "keep" : job.onError;
        job.mostErrors.clear();
        std::erase_if(job.steps,
                      [](const JobStep& step) { return step.name == "sort" || step.name == "unique"; });
        return job;
    }

    void show(std::size_t number, std::string_view row, bool isHeader) {
        SourceBlock block;
        block.bytes = std::string(row) + "\n";
        block.isDecoded = true;
        block.source = block.bytes;
        block.beginsFile = isHeader;
        block.isOfFirstFile = true;
        BlockResult result;
        worker_->process(block, result);
        std::string label = "row " + std::to_string(number);
        out_ += label + "  before  " + printable(row) + "\n";
        label.assign(label.size(), ' ');
        const std::string_view after = withoutLineEnd(isHeader ? result.header : result.output);
        const bool isLeftOut = !isHeader && result.counts.written == 0;
        out_ += label + "  after   " + (isLeftOut ? std::string("(left out)") : printable(after)) + "\n";
        for (const CellFailure& failure : result.failures) {
            out_ += label + "  failed  " + (failure.column.empty() ? "" : failure.column + ": ") +
                    failure.problem.text + "\n";
        }
    }

    Plan plan_;
    std::optional<BlockWorker> worker_;
    std::string out_;
};

} // namespace

std::string explanationOf(const Job& job, const std::vector<std::string>& inputs) {
    return jobText(job) + Explanation(job).of(inputs);
}

} // namespace host
