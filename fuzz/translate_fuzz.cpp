// Blocks of any bytes through steps of any kind: rows read are rows written, rejected and skipped; what was written is a
// table; and one block gives the same as several, cut at row borders.
//
// Input: a byte for the encoding, one for the policy, one that says how many steps there are, one for each of them; then
// the text.
#include <fuzzing.h>

#include <base/failure.h>
#include <translate/block_worker.h>
#include <translate/cell_text.h>
#include <translate/row_borders.h>
#include <translate/step_table.h>

#include <kvt/foundation/throwable.h>

#include <map>
#include <memory>
#include <string>

using namespace kvt::fuzz;

namespace {

const std::vector<host::JobStep>& steps() {
    static const std::vector<host::JobStep> all = {
        host::makeStep("date", {{"column", "1"}, {"format", "%d.%m.%Y|ISO|%y%m%d"}, {"pivot", "50"}}),
        host::makeStep("date", {{"column", "2"}, {"format", "%d. %B %Y|%b"}, {"months", "de"}}),
        host::makeStep("write-date", {{"column", "1"}, {"format", "%A, %d %B %Y"}}),
        host::makeStep("zone", {{"column", "1"}, {"zone", "+01:00"}}),
        host::makeStep("add", {{"column", "1"}, {"interval", "-P1M"}}),
        host::makeStep("number", {{"column", "2"}, {"language", "de"}}),
        host::makeStep("number", {{"column", "1"}, {"language", "fr"}}),
        host::makeStep("replace", {{"column", "2"}, {"regex", "(.)(x)"}, {"text", "$2$1"}}),
        host::makeStep("case", {{"column", "1"}, {"change", "upper"}}),
        host::makeStep("strip", {{"column", "2"}}),
        host::makeStep("normalize", {{"column", "1"}, {"form", "nfkd"}}),
        host::makeStep("split", {{"column", "2"}, {"separator", " "}, {"names", "x,y"}}),
        host::makeStep("join", {{"name", "z"}, {"columns", "1,1"}, {"separator", "-"}}),
        host::makeStep("where", {{"column", "1"}, {"regex", "[^a]"}}),
        host::makeStep("keep", {{"columns", "1,1"}}),
    };
    return all;
}

struct JobAtWork {
    explicit JobAtWork(const host::Job& job)
        : plan(withNames(job)), worker(plan, true), decoder(plan.to, kvt::ex::Encoding::Utf8),
          isInputCut(host::isCutUndecoded(plan.from.encoding, plan.in)),
          isOutputCut(host::isCutUndecoded(plan.to, plan.out)) {}

    static host::Plan withNames(const host::Job& job) {
        host::Plan plan(job);
        plan.names = {"1", "2"};
        return plan;
    }

    host::Plan plan;
    host::BlockWorker worker;
    kvt::ex::StreamTranscoder decoder; ///< of the output
    bool isInputCut;
    bool isOutputCut;
};

// Making a job takes a hundred times as long as a text takes to go through it: jobs are kept, and what a worker has done
// before makes no difference. Null for a job that cannot be, as without a column that it needs.
JobAtWork* jobOf(Input& input) {
    constexpr const char* policies[] = {"keep", "empty", "skip"};
    constexpr std::size_t mostKept = 2000;
    static std::map<std::string, std::unique_ptr<JobAtWork>> kept;
    std::string choices;
    const auto choose = [&](std::size_t count) {
        choices += static_cast<char>(input.byte() % count);
        return static_cast<std::size_t>(static_cast<unsigned char>(choices.back()));
    };
    host::Job job;
    job.input.encoding = encodings[choose(std::size(encodings))];
    job.output.encoding = encodings[choose(std::size(encodings))];
    job.onError = policies[choose(std::size(policies))];
    job.input.hasHeader = false;
    for (std::size_t count = choose(5); count > 0; --count) {
        job.steps.push_back(steps()[choose(steps().size())]);
    }
    if (kept.size() == mostKept) {
        kept.clear();
    }
    const auto [place, isNew] = kept.try_emplace(choices);
    if (isNew) {
        try {
            place->second = std::make_unique<JobAtWork>(job);
        } catch (const host::Failure&) {
        }
    }
    return place->second.get();
}

// Blocks begin where the text of the one before ended.
host::SourceBlock blockOf(const host::Plan& plan, std::string_view bytes, std::uint64_t offset) {
    host::SourceBlock block;
    block.bytes = bytes;
    block.offset = offset;
    block.encoding = plan.from.encoding;
    block.beginsFile = offset == 0;
    block.isMoreToCome = true;
    return block;
}

void requireTable(JobAtWork& job, std::string_view output, std::size_t rows) {
    const std::size_t columns = job.worker.layout().columns().size();
    std::string text;
    job.decoder.convert(output, text, {});
    job.decoder.finish(text, {});
    host::RowReader reader(job.plan.out, text);
    std::size_t found = 0;
    for (; reader.next(); ++found) {
        require(reader.fault() == host::RowFault::None, "what was written has no fault");
        requireEqual(reader.cellCount(), columns, "cells of what was written");
    }
    requireEqual(found, rows, "rows of what was written");
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    JobAtWork* const job = jobOf(input);
    if (job == nullptr) {
        return 0;
    }
    const host::Plan& plan = job->plan;
    const std::string_view text = input.rest();
    if (!job->isInputCut) {
        return 0;
    }

    const host::SourceBlock block = blockOf(plan, text, 0);
    host::BlockResult whole;
    job->worker.process(block, whole);
    requireEqual(whole.counts.read, whole.counts.written + whole.counts.rejected + whole.counts.skipped,
                 "rows read");
    for (const host::CellFailure& failure : whole.failures) {
        require(failure.offset <= text.size() && failure.row < whole.rows, "the place of a failure");
    }
    // An encoding of the output may lack a delimiter or have states, and then this is not a matter of rows.
    if (job->isOutputCut) {
        requireTable(*job, whole.output, whole.counts.written);
    }

    if (host::unitsOf(plan.from.encoding).width != 1) {
        return 0;
    }
    host::RowBorders borders(plan.in);
    borders.add(text.substr(0, text.size() / 2));
    const auto cut = static_cast<std::size_t>(borders.border());
    const host::SourceBlock firstBlock = blockOf(plan, text.substr(0, cut), 0);
    const host::SourceBlock secondBlock = blockOf(plan, text.substr(cut), cut);
    host::BlockResult first;
    host::BlockResult second;
    job->worker.process(firstBlock, first);
    job->worker.process(secondBlock, second);
    requireEqual(first.rows + second.rows, whole.rows, "rows of both pieces");
    requireEqual(first.rejected + second.rejected, whole.rejected, "rejected rows of both pieces");
    requireEqual(first.failures.size() + second.failures.size(), whole.failures.size(),
                 "failures of both pieces");
    if (job->isOutputCut) {
        requireEqual(std::string(first.output).append(second.output), std::string(whole.output),
                     "output of both pieces");
    }
    for (std::size_t index = 0; index < second.failures.size(); ++index) {
        requireEqual(second.failures[index].offset, whole.failures[first.failures.size() + index].offset,
                     "the place of a failure in the second piece");
    }
    return 0;
}
