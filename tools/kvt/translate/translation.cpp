// Threads take blocks from the input in turn, and whoever has the next one in order hands it, and those that wait behind
// it, to the accounts. Only a few blocks are on their way at a time.

#include "translate/translation.h"

#include "base/diagnostics.h"
#include "base/failure.h"
#include "base/input.h"
#include "base/output.h"
#include "base/text.h"
#include "cli/exit_status.h"
#include "translate/accounts.h"
#include "translate/block_worker.h"
#include "translate/header_names.h"

#include <condition_variable>
#include <exception>
#include <filesystem>
#include <map>
#include <memory>
#include <mutex>
#include <system_error>
#include <thread>

namespace host {

namespace {

// A block and what became of it.
struct Work {
    std::uint64_t order = 0;
    SourceBlock block;
    BlockResult result;
    std::exception_ptr failure;
};

class Pipeline {
public:
    Pipeline(SourceBlocks& source, std::unique_ptr<Work> first, Accounts& accounts, Progress& progress)
        : source_(source), first_(std::move(first)), accounts_(accounts), progress_(progress) {}

    void run(const Plan& plan, bool keepsRejected, std::size_t threads) {
        std::vector<std::unique_ptr<BlockWorker>> workers;
        for (std::size_t index = 0; index < threads; ++index) {
            workers.push_back(std::make_unique<BlockWorker>(plan, keepsRejected));
        }
        mostAhead_ = threads == 1 ? 1 : 3 * threads;
        {
            std::vector<std::jthread> others;
            try {
                for (std::size_t index = 1; index < threads; ++index) {
                    others.emplace_back([this, &worker = *workers[index]] { work(worker); });
                }
            } catch (const std::system_error&) {
                // There may be no more threads. Those that there are do all of it then.
            }
            work(*workers.front());
        }
        if (failure_) {
            std::rethrow_exception(failure_);
        }
    }

private:
    void work(BlockWorker& worker) {
        while (std::unique_ptr<Work> work = begin()) {
            if (!work->failure) {
                try {
                    worker.process(work->block, work->result);
                } catch (...) {
                    work->failure = std::current_exception();
                }
            }
            end(std::move(work));
        }
    }

    // The next block; null where there is none. What goes wrong in reading comes behind all blocks before it.
    std::unique_ptr<Work> begin() {
        const std::lock_guard reading(reading_);
        std::unique_ptr<Work> work;
        {
            std::unique_lock lock(state_);
            isRoom_.wait(lock, [&] { return isOver_ || begun_ - ended_ < mostAhead_; });
            if (isOver_) {
                return nullptr;
            }
            work = first_ ? std::move(first_) : spare();
        }
        bool isBlock = true;
        if (begun_ != 0) { // the first was read before
            try {
                isBlock = source_.next(work->block);
            } catch (...) {
                work->failure = std::current_exception();
            }
        }
        const std::lock_guard lock(state_);
        isOver_ = isOver_ || !isBlock || work->failure;
        work->order = begun_;
        begun_ += isBlock ? 1 : 0;
        return isBlock ? std::move(work) : nullptr;
    }

    std::unique_ptr<Work> spare() {
        if (spares_.empty()) {
            return std::make_unique<Work>();
        }
        std::unique_ptr<Work> work = std::move(spares_.back());
        spares_.pop_back();
        return work;
    }

    void end(std::unique_ptr<Work> work) {
        std::unique_lock lock(state_);
        done_[work->order] = std::move(work);
        if (isCounting_) {
            return; // by another thread, which sees to this one, too
        }
        isCounting_ = true;
        while (!done_.empty() && done_.begin()->first == ended_) {
            std::unique_ptr<Work> next = std::move(done_.begin()->second);
            done_.erase(done_.begin());
            lock.unlock();
            const bool goesOn = count(*next);
            lock.lock();
            ++ended_;
            isOver_ = isOver_ || !goesOn;
            spares_.push_back(std::move(next));
            isRoom_.notify_all();
        }
        isCounting_ = false;
    }

    // In the order of the input, one at a time.
    bool count(Work& work) {
        if (isStopped_) {
            return false;
        }
        try {
            if (work.failure) {
                std::rethrow_exception(work.failure);
            }
            isStopped_ = !accounts_.take(work.block, work.result);
            progress_.advance(work.block.taken);
        } catch (...) {
            failure_ = std::current_exception();
            isStopped_ = true;
        }
        return !isStopped_;
    }

    SourceBlocks& source_;
    std::unique_ptr<Work> first_;
    Accounts& accounts_;
    Progress& progress_;

    std::mutex reading_; ///< of the input; taken before the other one
    std::mutex state_;
    std::condition_variable isRoom_;
    std::map<std::uint64_t, std::unique_ptr<Work>> done_;
    std::vector<std::unique_ptr<Work>> spares_;
    std::uint64_t begun_ = 0;
    std::uint64_t ended_ = 0;
    std::uint64_t mostAhead_ = 1;
    bool isOver_ = false;
    bool isCounting_ = false;
    // Of who counts.
    bool isStopped_ = false;
    std::exception_ptr failure_;
};

// A file of its own for each of what is written.
std::unique_ptr<Output> openBeside(const std::string& what, const std::string& path,
                                   const TranslationOptions& options, const std::string& other) {
    if (path.empty()) {
        return nullptr;
    }
    if (isStandardOutput(path)) {
        throw Failure(what + " goes to a file");
    }
    bool isTaken = (!isStandardOutput(options.output) && isSamePlace(options.output, path)) ||
                   (!other.empty() && isSamePlace(other, path));
    for (const std::string& input : options.inputs) {
        isTaken = isTaken || (input != "-" && isSamePlace(input, path));
    }
    if (isTaken && !std::filesystem::is_character_file(path)) {
        throw Failure(what + " needs a file of its own: " + printable(path));
    }
    return openOutput(path);
}

void checkPart(const Plan& plan, const TranslationOptions& options) {
    if (!options.part) {
        return;
    }
    if (plan.isOrdered()) {
        throw Failure("--part does not go together with 'sort' and 'unique', which need all rows");
    }
    if (!isCutUndecoded(plan.to, plan.out)) {
        throw Failure(
            "--part: a text in " + std::string(plan.to.getName()) +
            " cannot be begun in the middle, since what its bytes mean depends on those before them");
    }
}

} // namespace

int translate(const Job& job, const TranslationOptions& options, Diagnostics& diagnostics) {
    Plan plan(job);
    if (!options.reject.empty() && plan.onError != OnCellError::Skip) {
        throw Failure("--reject goes with --on-error skip only");
    }
    checkPart(plan, options);
    const std::unique_ptr<Output> output = options.isDryRun ? nullptr : openOutput(options.output);
    const std::unique_ptr<Output> report =
        options.isDryRun ? nullptr : openBeside("the report", options.report, options, {});
    const std::unique_ptr<Output> rejected =
        options.isDryRun ? nullptr : openBeside("what is rejected", options.reject, options, options.report);
    Accounts accounts(plan, {output.get(), report.get(), options.report.ends_with(".csv"), rejected.get()});
    {
        Workspace workspace(options.workspace);
        std::optional<LineSorter> sorter;
        if (plan.isOrdered()) {
            sorter.emplace(SortRule{LineOrder::Ascending, plan.isUnique, options.memory}, workspace);
            accounts.order(*sorter);
        }
        Progress progress(diagnostics, totalSize(options.inputs), options.progress, "");
        SourceBlocks source(plan, options.inputs, options.part, output.get());
        auto first = std::make_unique<Work>();
        if (source.next(first->block)) {
            plan.names = namesOf(first->block, plan);
            Pipeline(source, std::move(first), accounts, progress)
                .run(plan, rejected != nullptr, options.threads);
        }
        if (!accounts.isStopped()) {
            accounts.finish();
        }
    }
    if (report) {
        report->commit();
    }
    accounts.printSummary(diagnostics);
    if (accounts.isStopped()) {
        return NotDone;
    }
    if (output) {
        output->commit();
    }
    if (rejected) {
        rejected->commit();
    }
    return accounts.hasFailures() ? DoneWithLosses : Done;
}

void mergeReports(const std::vector<std::string>& reports, const std::string& output) {
    const std::unique_ptr<Output> merged = openOutput(output);
    const std::string_view header = Accounts::csvHeader();
    bool hasHeader = false;
    for (const std::string& path : reports) {
        Input input(path);
        std::string_view block =
            input.readWhile([&](std::string_view start) { return start.size() < header.size(); });
        if (block.starts_with(header) && std::exchange(hasHeader, true)) {
            block.remove_prefix(header.size());
        }
        merged->write(block);
        for (block = input.read(); !block.empty(); block = input.read()) {
            merged->write(block);
        }
    }
    merged->commit();
}

} // namespace host
