// Shortest text of floating-point numbers, by the library and by what one would use instead:
//
//     kvt_double, kvt_float   double_to_string and float_to_string
//     to_chars                std::to_chars without a precision, which gives shortest digits too
//     snprintf                snprintf with %.17g, which reads back but is not the shortest
//     ostringstream           a std::ostringstream of precision 17, used again
//
// A benchmark is called WAY/NUMBERS. Each iteration writes all numbers of a set; items per second are numbers.
#include <kvt/codec/float_text.h>

#include <benchmark/benchmark.h>

#include <bit>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <random>
#include <sstream>
#include <string>
#include <vector>

namespace {

constexpr std::size_t count = 4096;

using Numbers = std::vector<double>;

/// Any finite number: random bits.
Numbers randomNumbers() {
    std::mt19937_64 random(1);
    Numbers numbers;
    while (numbers.size() < count) {
        const auto number = std::bit_cast<double>(random());
        if (std::isfinite(number)) {
            numbers.push_back(number);
        }
    }
    return numbers;
}

/// Measurements: few digits, a point among them.
Numbers measuredNumbers() {
    std::mt19937_64 random(2);
    Numbers numbers;
    for (std::size_t i = 0; i < count; ++i) {
        numbers.push_back(static_cast<double>(random() % 10'000'000) / 1000);
    }
    return numbers;
}

/// Whole numbers of up to nine digits.
Numbers wholeNumbers() {
    std::mt19937_64 random(3);
    Numbers numbers;
    for (std::size_t i = 0; i < count; ++i) {
        numbers.push_back(static_cast<double>(random() % 1'000'000'000 >> random() % 30));
    }
    return numbers;
}

template <typename Write>
void writeAll(benchmark::State& state, const Numbers& numbers, Write write) {
    char buffer[kvt::ex::floatTextBuffer];
    for (auto _ : state) {
        for (const double number : numbers) {
            write(number, buffer);
            benchmark::DoNotOptimize(buffer);
        }
    }
    state.SetItemsProcessed(static_cast<std::int64_t>(state.iterations()) *
                            static_cast<std::int64_t>(numbers.size()));
}

void byKvtDouble(benchmark::State& state, const Numbers& numbers) {
    writeAll(state, numbers, [](double number, char* buffer) { kvt::ex::double_to_string(number, buffer); });
}

/// The nearest float, or where there is none, a finite one from the same bits.
float single(double number) {
    if (std::abs(number) > 1e-37 && std::abs(number) < 1e38) {
        return static_cast<float>(number);
    }
    return std::bit_cast<float>(static_cast<std::uint32_t>(std::bit_cast<std::uint64_t>(number)) &
                                0xBFFFFFFF);
}

void byKvtFloat(benchmark::State& state, const Numbers& numbers) {
    std::vector<float> singles;
    for (const double number : numbers) {
        singles.push_back(single(number));
    }
    char buffer[kvt::ex::floatTextBuffer];
    for (auto _ : state) {
        for (const float number : singles) {
            kvt::ex::float_to_string(number, buffer);
            benchmark::DoNotOptimize(buffer);
        }
    }
    state.SetItemsProcessed(static_cast<std::int64_t>(state.iterations()) *
                            static_cast<std::int64_t>(singles.size()));
}

void byToChars(benchmark::State& state, const Numbers& numbers) {
    writeAll(state, numbers, [](double number, char* buffer) {
        *std::to_chars(buffer, buffer + kvt::ex::floatTextBuffer, number).ptr = '\0';
    });
}

void bySnprintf(benchmark::State& state, const Numbers& numbers) {
    writeAll(state, numbers, [](double number, char* buffer) {
        std::snprintf(buffer, kvt::ex::floatTextBuffer, "%.17g", number);
    });
}

void byStream(benchmark::State& state, const Numbers& numbers) {
    std::ostringstream stream;
    stream.precision(17);
    writeAll(state, numbers, [&](double number, char*) {
        stream.seekp(0);
        stream << number;
    });
}

struct Way {
    const char* name;
    void (*run)(benchmark::State&, const Numbers&);
};
const Way ways[] = {
    {"kvt_double", &byKvtDouble}, {"kvt_float", &byKvtFloat},   {"to_chars", &byToChars},
    {"snprintf", &bySnprintf},    {"ostringstream", &byStream},
};

struct Set {
    const char* name;
    Numbers numbers;
};
const std::vector<Set> sets = {
    {"random", randomNumbers()}, {"measured", measuredNumbers()}, {"whole", wholeNumbers()}};

[[maybe_unused]] const bool registered = [] {
    for (const Set& set : sets) {
        for (const Way& way : ways) {
            benchmark::RegisterBenchmark(
                (std::string(way.name) + '/' + set.name).c_str(),
                [&way, &set](benchmark::State& state) { way.run(state, set.numbers); });
        }
    }
    return true;
}();

} // namespace
