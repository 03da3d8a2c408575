// What two threads do at once, beside one alone, and what a mebibyte costs in texts of 1 KiB to 256 MiB.
//
// Two threads with as much to do each should take the time of one. A loop over numbers that touches no memory shows what
// the machine gives: its row is the one to look at where others miss their limits.
#include "limits.h"
#include "texts.h"

#include <kvt/kvt.h>

#include <algorithm>
#include <cstdint>
#include <string>
#include <thread>

namespace {

using namespace kvt::ex;
using kvt::bench::Bound;
using kvt::bench::Clock;
using kvt::bench::Limits;
using kvt::bench::way;
using kvt::bench::Way;

constexpr std::size_t kibibyte = 1 << 10;
constexpr std::size_t mebibyte = 1 << 20;

UString<0> string(const std::string& text) {
    return UString<0>(UStringView<0>(text));
}

// ---- Two threads

Way onTwoThreads(const Way& work) {
    return [work](int calls) {
        std::thread other([&] { work(calls); });
        work(calls);
        other.join();
    };
}

// 1.8 times the work of one is 2 / 1.8 of its time.
void holdThreads(Limits& limits, const std::string& name, const Way& work, Bound bound = Bound::atMost) {
    limits.add(name + ", one thread", work);
    limits.add(name + ", two threads", onTwoThreads(work));
    limits.hold({name + ", two threads", name + ", one thread", bound, 2 / 1.8});
}

/// The function so many times in a call.
template <typename Function>
Way repeated(int times, Function function) {
    const Way work = way(function);
    return [work, times](int calls) { work(calls * times); };
}

/// The steps that a number takes to become 1, halved when it is even, and else three times as much and one.
int stepsOf(std::uint64_t number) {
    int steps = 0;
    for (; number != 1; ++steps) {
        number = number % 2 == 0 ? number / 2 : number * 3 + 1;
    }
    return steps;
}

void holdThreads(Limits& limits) {
    const UString<0> text = string(kvt::bench::shuffled(kvt::bench::latin.sentence, 64 * kibibyte));
    holdThreads(limits, "a loop over numbers",
                repeated(20'000,
                         [] {
                             std::uint64_t number = 27;
                             benchmark::DoNotOptimize(number);
                             return stepsOf(number);
                         }),
                Bound::shown);
    holdThreads(limits, "UTF-8 to UTF-16", repeated(200, [text] { return UString<2>(text); }));
    holdThreads(limits, "fold", repeated(200, [text] { return text.getAsFoldedCase(); }));
    holdThreads(limits, "text to date",
                repeated(20'000, [value = string("2020-01-02"), pattern = string("%Y-%m-%d")] {
                    return datetime::parse(value, pattern, false);
                }));
    holdThreads(limits, "search with one URegex",
                repeated(20'000, [regex = URegex<0>(string("(\\w+)@(\\w+)")),
                                  subject = string("mail for someone@somewhere")] {
                    return regex.search(subject).groupCount();
                }));
    holdThreads(limits, "getName",
                repeated(500'000, [encoding = Encoding("macintosh")] { return encoding.getName(); }));
    holdThreads(limits, "Encoding of a known name",
                repeated(50'000, [name = string("macintosh")] { return Encoding(name); }));
}

// ---- Sizes

/// As much text as is in a mebibyte, in texts of `size` bytes, or the share of a mebibyte in a larger one.
void addSize(Limits& limits, const std::string& name, std::size_t size, const Way& work) {
    const auto times = static_cast<int>(std::max<std::size_t>(mebibyte / size, 1));
    limits.add(
        name, [work, times](int calls) { work(calls * times); },
        std::max(1.0, static_cast<double>(size) / mebibyte));
}

// Memory that is new to the process costs as much again as what is written to it, in large texts only; so what they are
// beside is large, too.
template <typename Function>
void holdSizes(Limits& limits, const std::string& name, Function function, Bound bound = Bound::atMost) {
    const auto nameOf = [&](const char* size) {
        return "a MiB in texts of " + std::string(size) + ": " + name;
    };
    const auto add = [&](const char* size, std::size_t bytes) {
        const UString<0> text = string(kvt::bench::shuffled(kvt::bench::latin.sentence, bytes));
        addSize(limits, nameOf(size), bytes, way([text, function] { return function(text); }));
    };
    add("1 KiB", kibibyte);
    add("1 MiB", mebibyte);
    add("16 MiB", 16 * mebibyte);
    add("256 MiB", 256 * mebibyte);
    limits.hold({nameOf("1 KiB"), nameOf("1 MiB"), bound, 2});
    limits.hold({nameOf("16 MiB"), nameOf("1 MiB")});
    limits.hold({nameOf("256 MiB"), nameOf("16 MiB"), bound, 1.5});
}

void holdSizes(Limits& limits) {
    // What the system takes for the memory of a result, whoever makes it.
    holdSizes(
        limits, "copy", [](const UString<0>& text) { return std::string(text.rawData(), text.size()); },
        Bound::shown);
    holdSizes(limits, "UTF-8 to UTF-16", [](const UString<0>& text) { return UString<2>(text); });
    holdSizes(limits, "fold", [](const UString<0>& text) { return text.getAsFoldedCase(); });
    holdSizes(limits, "hash", [](const UString<0>& text) { return text.hash(); });
    holdSizes(limits, "find",
              [needle = string("animal kingdom")](const UString<0>& text) { return text.find(needle); });
}

} // namespace

int main(int argc, char** argv) {
    Limits threads(31, 1, Clock::ofWall);
    holdThreads(threads);
    Limits sizes(7, 1);
    holdSizes(sizes);
    const bool areThreadsWithin = threads.run(argc, argv) == 0;
    return sizes.run(argc, argv) == 0 && areThreadsWithin ? 0 : 1;
}
