// Works held to limits beside other ways of doing them.
//
// All ways are measured in turn, a short while each, and that many times over, so that what the machine does meanwhile
// falls on all of them alike. A way is called several times in a row, as users call it, and once before that. What counts is
// the processor's time, in which waiting for a processor has no part, or the clock's where ways take several threads. A row
// is the median of the ratios of its two ways within a round. A row that misses its limit is marked, and the exit status is
// then 1.
//
//     --benchmark_filter=REGEX   only the rows whose work it finds
//     --quick                    a fifth of the rounds
//     --results=FILE             adds the rows to a file, one in a line with tabs between its parts; see report.cpp
#pragma once

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdio>
#include <functional>
#include <map>
#include <regex>
#include <string>
#include <time.h>
#include <vector>

namespace kvt::bench {

/// One way to do some work: calls it so many times.
using Way = std::function<void(int)>;

template <typename Function>
Way way(Function function) {
    return [function](int calls) {
        for (int i = 0; i < calls; ++i) {
            auto result = function();
            benchmark::DoNotOptimize(&result);
        }
    };
}

/// What a row is held to.
enum class Bound {
    shown,   ///< nothing
    atMost,  ///< the time of the work over the time of the other way
    atLeast, ///< how many times as fast as the other way the work is
};

struct Row {
    std::string work;
    std::string beside;
    Bound bound = Bound::shown;
    double limit = 0;
};

/// Which time is measured: that of the processor for the calling thread, or that of the clock.
enum class Clock { ofThread = CLOCK_THREAD_CPUTIME_ID, ofWall = CLOCK_MONOTONIC };

class Limits {
public:
    /// Each way is called `calls` times in each of the rounds.
    Limits(int rounds, int calls, Clock clock = Clock::ofThread)
        : rounds_(rounds), calls_(calls), clock_(clock) {}

    /// A way that does `parts` times as much as counts is taken to be so many times as fast.
    void add(const std::string& name, Way measured, double parts = 1) {
        ways_[name] = {std::move(measured), parts};
    }
    void hold(Row row) { rows_.push_back(std::move(row)); }

    /// Measures the rows that the arguments ask for, prints them, and returns the exit status.
    int run(int count, char** arguments) {
        const std::vector<std::string> given(arguments + 1, arguments + count);
        const std::regex filter(valueOf(given, "--benchmark_filter=", ".*"));
        const std::string file = valueOf(given, "--results=", "");
        results_ = file.empty() ? nullptr : std::fopen(file.c_str(), "a");
        if (std::find(given.begin(), given.end(), "--quick") != given.end()) {
            rounds_ = std::max(rounds_ / 5, 5);
        }
        rows_.erase(std::remove_if(rows_.begin(), rows_.end(),
                                   [&](const Row& row) { return !std::regex_search(row.work, filter); }),
                    rows_.end());
        measure();
        bool areAllWithin = true;
        for (const Row& row : rows_) {
            areAllWithin = isWithinLimit(row) && areAllWithin;
        }
        if (results_ != nullptr) {
            std::fclose(results_);
        }
        return areAllWithin ? 0 : 1;
    }

private:
    void measure() {
        for (int round = 0; round < rounds_; ++round) {
            for (const auto& [name, measured] : ways_) {
                if (isUsed(name)) {
                    times_[name].push_back(nanosecondsOf(measured));
                }
            }
        }
    }

    bool isUsed(const std::string& name) const {
        return std::any_of(rows_.begin(), rows_.end(),
                           [&](const Row& row) { return row.work == name || row.beside == name; });
    }

    struct Measured {
        Way way;
        double parts = 1;
    };

    double now() const {
        timespec time{};
        clock_gettime(static_cast<clockid_t>(clock_), &time);
        return static_cast<double>(time.tv_sec) * 1e9 + static_cast<double>(time.tv_nsec);
    }

    double nanosecondsOf(const Measured& measured) const {
        measured.way(1); // so that no way pays for the caches and the heap that the way before it left behind
        const double begin = now();
        measured.way(calls_);
        return (now() - begin) / calls_ / measured.parts;
    }

    static double median(std::vector<double> numbers) {
        const auto middle = numbers.begin() + static_cast<std::ptrdiff_t>(numbers.size() / 2);
        std::nth_element(numbers.begin(), middle, numbers.end());
        return *middle;
    }

    bool isWithinLimit(const Row& row) const {
        const std::vector<double>& work = times_.at(row.work);
        const std::vector<double>& beside = times_.at(row.beside);
        std::vector<double> ratios;
        for (std::size_t round = 0; round < work.size(); ++round) {
            ratios.push_back(row.bound == Bound::atLeast ? beside[round] / work[round]
                                                         : work[round] / beside[round]);
        }
        const double ratio = median(ratios);
        const bool isWithin = row.bound == Bound::shown ||
                              (row.bound == Bound::atMost ? ratio <= row.limit : ratio >= row.limit);
        std::printf("%-36s %9.0f ns   beside %-44s %9.0f ns   %s %5.2f", row.work.c_str(), median(work),
                    row.beside.c_str(), median(beside),
                    row.bound == Bound::atLeast ? "times as fast" : "ratio", ratio);
        if (row.bound != Bound::shown) {
            std::printf("   %s %5.2f%s", row.bound == Bound::atMost ? "at most" : "at least", row.limit,
                        isWithin ? "" : "   MISSED");
        }
        std::printf("\n");
        if (results_ != nullptr) {
            std::fprintf(results_, "%s\t%s\t%d\t%g\t%g\t%g\t%g\n", row.work.c_str(), row.beside.c_str(),
                         static_cast<int>(row.bound), row.limit, ratio, median(work), median(beside));
        }
        return isWithin;
    }

    // What stands behind an option.
    static std::string valueOf(const std::vector<std::string>& given, const std::string& option,
                               const std::string& otherwise) {
        for (const std::string& argument : given) {
            if (argument.compare(0, option.size(), option) == 0) {
                return argument.substr(option.size());
            }
        }
        return otherwise;
    }

    int rounds_;
    int calls_;
    Clock clock_;
    std::map<std::string, Measured> ways_;
    std::vector<Row> rows_;
    std::map<std::string, std::vector<double>> times_;
    std::FILE* results_ = nullptr;
};

} // namespace kvt::bench
