// One compiled program and many threads; the thread sanitizer watches.
#include "regex_support.h"

#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <thread>

namespace kvt::test {
namespace {

void onThreads(const std::function<void(int)>& work) {
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 4; ++thread) {
        threads.emplace_back([&work, thread] { work(thread); });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}

TEST(RegexThreads, OneRegexServesThemAll) {
    const ex::URegex<0> regex("(\\w+)@(\\w+)(?:\\.(\\w+))?");
    const ObsoleteRegexp regexp("f(x)");
    std::atomic<int> wrong{0};
    onThreads([&](int thread) {
        const std::string before(static_cast<std::size_t>(thread), ' ');
        const ex::UString<0> subject(ex::UStringView<0>(before + "me@home"));
        const std::string text = before + "f(x)";
        for (int round = 0; round < 300; ++round) {
            const auto at = static_cast<std::uint64_t>(thread);
            wrong += groupsOf(regex.search(subject)) != Spans{{at, 7}, {at, 2}, {at + 3, 4}, {none, 0}};
            wrong += indexedBy(regexp, text, 0) != Span{at, 4};
        }
    });
    EXPECT_EQ(wrong, 0);
}

// Other threads may have programs of their own, which are compiled later.
TEST(RegexThreads, AllOfThemSeeTheLocaleInWhichThePatternWasCompiled) {
    const ex::URegex<0> regex = compiledWithExclamationLetters("\\w+");
    std::atomic<int> wrong{0};
    for (int round = 0; round < 3; ++round) {
        onThreads([&](int) { wrong += !regex.match("a!"); });
    }
    EXPECT_EQ(wrong, 0);
}

TEST(RegexThreads, CopiesComeAndGoOnAllOfThem) {
    const ex::URegex<0> regex("a(b)?");
    const ObsoleteRegexp regexp("a{");
    std::atomic<int> wrong{0};
    onThreads([&](int) {
        ex::URegex<0> other;
        for (int round = 0; round < 300; ++round) {
            const ex::URegex<0> copy(regex);
            other = copy;
            const ObsoleteRegexp obsolete(regexp);
            wrong += !other.match("ab");
            wrong += indexedBy(obsolete, "xa{", 0) != Span{1, 2};
        }
    });
    EXPECT_EQ(wrong, 0);
    EXPECT_TRUE(regex.match("a"));
}

TEST(RegexThreads, PatternsAreCompiledSideBySide) {
    std::atomic<int> wrong{0};
    onThreads([&](int thread) {
        for (int round = 0; round < 100; ++round) {
            const ex::URegex<28> regex(units<28>("[[:alpha:]]+\\d{" + std::to_string(thread + 1) + "}"));
            wrong += !regex.match(units<28>("abc" + std::string(static_cast<std::size_t>(thread) + 1, '7')));
            wrong += errorOf([] { ObsoleteRegexp bad("[a"); }).code == -1;
        }
    });
    EXPECT_EQ(wrong, 0);
}

} // namespace
} // namespace kvt::test
