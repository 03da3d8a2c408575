// Who shares and who owns, seen by the blocks that are allocated.
#include "regex_support.h"

#include <support/allocations.h>

#include <gtest/gtest.h>

#include <functional>
#include <optional>

namespace kvt::test {
namespace {

using ex::URegex;
using ex::UString;
using kvt::test::livingBlocks;

const UString<0> pattern("(a|b)+[c-e]{2,3}(?=f)");

// The engine keeps some blocks for the next time, so each test runs what it counts once before.
class RegexMemory : public ::testing::Test {
protected:
    RegexMemory() {
        runOnce();
        before_ = livingBlocks();
    }
    ~RegexMemory() override { EXPECT_EQ(livingBlocks(), before_) << "something was not released"; }

    static void runOnce() {
        const URegex<0> regex(pattern);
        regex.search("abccf");
        regex.match("abccf");
        errorOf([] { URegex<0> bad("(a"); });
        errorOf([] { ObsoleteRegexp bad("[a"); });
    }

    static std::ptrdiff_t blocksOf(const std::function<void()>& operation) {
        const std::ptrdiff_t before = livingBlocks();
        operation();
        return livingBlocks() - before;
    }

private:
    std::ptrdiff_t before_ = 0;
};

TEST_F(RegexMemory, ACopyAddsOneBlockAndSharesTheProgram) {
    const URegex<0> regex(pattern);
    std::optional<URegex<0>> copy;
    EXPECT_EQ(blocksOf([&] { copy.emplace(regex); }), 1);
    EXPECT_EQ(blocksOf([&] { copy.reset(); }), -1);
    EXPECT_TRUE(regex.search("abccf"));
}

TEST_F(RegexMemory, AnAssignmentToAnImplementationAddsNone) {
    const URegex<0> regex(pattern);
    URegex<0> empty;
    EXPECT_EQ(blocksOf([&] { empty = regex; }), 0);
    URegex<0> other(pattern);
    EXPECT_LT(blocksOf([&] { other = regex; }), 0); // its own program goes
    const URegex<0> taken(std::move(other));
    EXPECT_EQ(blocksOf([&] { other = regex; }), 1); // a moved-from one gets an implementation of its own
    EXPECT_TRUE(other.search("abccf"));
}

TEST_F(RegexMemory, AMoveAddsNoneAndReleasesTheTargetsOwn) {
    URegex<0> first(pattern);
    URegex<0> second;
    EXPECT_EQ(blocksOf([&] {
                  URegex<0> moved(std::move(first));
                  first = std::move(moved);
              }),
              0);
    EXPECT_EQ(blocksOf([&] { second = std::move(first); }), -1);
    URegex<0> third;
    EXPECT_EQ(blocksOf([&] { third = std::move(first); }), -1);
    EXPECT_EQ(blocksOf([&] { third = std::move(first); }), 0);
    EXPECT_TRUE(second.search("abccf"));
}

TEST_F(RegexMemory, ACopyOfAnObsoleteRegexpSharesTheProgram) {
    const ObsoleteRegexp regexp("a(b)c.*");
    std::optional<ObsoleteRegexp> copy;
    EXPECT_EQ(blocksOf([&] { copy.emplace(regexp); }), 1);
    EXPECT_EQ(blocksOf([&] { copy.reset(); }), -1);
}

TEST_F(RegexMemory, AFailedConstructionLeavesNothing) {
    for (const char* bad : {"(a", "[a", "a(b[c)", "(((((a*)*)*", "(?<name"}) {
        EXPECT_EQ(blocksOf([&] { EXPECT_NE(errorOf([&] { URegex<0> regex(bad); }).code, -1) << bad; }), 0)
            << bad;
    }
    EXPECT_EQ(blocksOf([] { EXPECT_NE(errorOf([] { ObsoleteRegexp regexp("({[a"); }).code, -1); }), 0);
}

TEST_F(RegexMemory, AnAssignmentThatFailsForLackOfMemoryChangesNothing) {
    const URegex<0> regex(pattern);
    URegex<0> target("x");
    const URegex<0> taken(std::move(target));
    const std::size_t failures =
        kvt::test::failEachAllocation([&] { target = regex; },
                                      [&](std::size_t) {
                                          EXPECT_TRUE(target); // moved-from as before
                                      });
    EXPECT_EQ(failures, 1u);
    EXPECT_TRUE(target.search("abccf"));
}

TEST_F(RegexMemory, CompilingAndSearchingReleaseAllWhenMemoryRunsOut) {
    const UString<0> subject("xx abccf, and more text than is kept in place");
    EXPECT_GT(kvt::test::failEachAllocation([&] { URegex<0> regex(pattern); }, [](std::size_t) {}), 3u);
    EXPECT_GT(kvt::test::failEachAllocation([&] { ObsoleteRegexp regexp("a(b)"); }, [](std::size_t) {}), 3u);
    const URegex<0> regex(pattern);
    EXPECT_GT(kvt::test::failEachAllocation([&] { regex.search(subject); }, [](std::size_t) {}), 1u);
    EXPECT_TRUE(regex.search(subject));
}

} // namespace
} // namespace kvt::test
