// Works held to limits beside other ways of doing them.
//
// All ways are measured in turn, a short while each, and that many times over, so that what the machine does meanwhile
// falls on all of them alike. A row is the median of the ratios of its two ways within a round. A row that misses its
// limit is marked, and the exit status is then 1.
#pragma once

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <functional>
#include <map>
#include <regex>
#include <string>
#include <string_view>
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

class Limits {
public:
    /// Each way is called `calls` times in each of the rounds.
    Limits(int rounds, int calls) : rounds_(rounds), calls_(calls) {}

    void add(const std::string& name, Way measured) { ways_[name] = std::move(measured); }
    void hold(Row row) { rows_.push_back(std::move(row)); }

    /// Measures the rows that --benchmark_filter names, prints them, and returns the exit status.
    int run(int count, char** arguments) {
        const std::regex filter = filterOf(count, arguments);
        rows_.erase(std::remove_if(rows_.begin(), rows_.end(),
                                   [&](const Row& row) { return !std::regex_search(row.work, filter); }),
                    rows_.end());
        measure();
        bool areAllWithin = true;
        for (const Row& row : rows_) {
            areAllWithin = isWithinLimit(row) && areAllWithin;
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

    double nanosecondsOf(const Way& measured) const {
        const auto begin = std::chrono::steady_clock::now();
        measured(calls_);
        const std::chrono::duration<double, std::nano> taken = std::chrono::steady_clock::now() - begin;
        return taken.count() / calls_;
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
        return isWithin;
    }

    static std::regex filterOf(int count, char** arguments) {
        constexpr std::string_view option = "--benchmark_filter=";
        for (int i = 1; i < count; ++i) {
            const std::string_view argument = arguments[i];
            if (argument.substr(0, option.size()) == option) {
                return std::regex(std::string(argument.substr(option.size())));
            }
        }
        return std::regex(".*");
    }

    int rounds_;
    int calls_;
    std::map<std::string, Way> ways_;
    std::vector<Row> rows_;
    std::map<std::string, std::vector<double>> times_;
};

} // namespace kvt::bench
