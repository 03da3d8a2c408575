#include "naive_calendar.h"

#include <kvt/datetime/detail/time_count.h>

#include <gtest/gtest.h>

#include <random>

namespace {

using namespace kvt::ex::datetime::detail;
using kvt::test::Int128;

Int128 valueOf(const TimeCount& count) {
    return static_cast<Int128>(count.days) * nanosPerDay + count.nanoseconds;
}

bool isCarried(const TimeCount& count) {
    return count.nanoseconds >= 0 && count.nanoseconds < nanosPerDay;
}

// Of both signs, and of all sizes up to `bits`.
std::int64_t numberOf(std::mt19937_64& random, unsigned bits) {
    return static_cast<std::int64_t>(random()) >> (64 - bits + random() % bits);
}

TEST(TimeCount, CarriesNanosecondsIntoDays) {
    std::mt19937_64 random(91);
    for (int i = 0; i < 100'000; ++i) {
        const std::int64_t days = numberOf(random, 50);
        const std::int64_t nanoseconds = i % 7 == 0 ? nanosPerDay * (i % 5 - 2) : numberOf(random, 63);
        const TimeCount count = timeCount(days, nanoseconds);
        ASSERT_TRUE(isCarried(count));
        ASSERT_TRUE(valueOf(count) == static_cast<Int128>(days) * nanosPerDay + nanoseconds);
    }
}

TEST(TimeCount, IsMadeOfAnyNumberOfSeconds) {
    std::mt19937_64 random(92);
    for (int i = 0; i < 100'000; ++i) {
        const std::int64_t seconds = numberOf(random, 64);
        const std::int64_t nanoseconds = numberOf(random, 59);
        const TimeCount count = timeCountOfSeconds(seconds, nanoseconds);
        ASSERT_TRUE(isCarried(count));
        ASSERT_TRUE(valueOf(count) == static_cast<Int128>(seconds) * nanosPerSecond + nanoseconds);
    }
}

TEST(TimeCount, IsComparedAndSubtractedAsOneNumber) {
    std::mt19937_64 random(93);
    for (int i = 0; i < 100'000; ++i) {
        const TimeCount left = timeCount(numberOf(random, 40), numberOf(random, 60));
        const TimeCount right =
            i % 3 == 0 ? timeCount(left.days, numberOf(random, 60)) : timeCount(numberOf(random, 40), 0);
        ASSERT_EQ(left < right, valueOf(left) < valueOf(right));
        ASSERT_EQ(left == right, valueOf(left) == valueOf(right));
        ASSERT_TRUE(isCarried(left - right));
        ASSERT_TRUE(valueOf(left - right) == valueOf(left) - valueOf(right));
        const auto minutes = static_cast<std::int32_t>(random() % 12'001) - 6'000;
        ASSERT_TRUE(valueOf(plusMinutes(left, minutes)) ==
                    valueOf(left) + static_cast<Int128>(minutes) * nanosPerMinute);
    }
}

// On both sides of what 64 bits hold.
TEST(TimeCount, BecomesTheNearestDouble) {
    std::mt19937_64 random(94);
    for (int i = 0; i < 100'000; ++i) {
        const std::int64_t days =
            i % 2 == 0 ? 105'990 + static_cast<std::int64_t>(random() % 20) : numberOf(random, 26);
        const TimeCount count = {i % 3 == 0 ? -days : days,
                                 static_cast<std::int64_t>(random() % std::uint64_t{nanosPerDay})};
        ASSERT_EQ(nanosecondsAsDouble(count), static_cast<double>(valueOf(count)));
    }
}

TEST(TimeCount, HasWholeSecondsTowardsMinusInfinity) {
    EXPECT_EQ(wholeSeconds(timeCountOfSeconds(-1, 0)), -1);
    EXPECT_EQ(wholeSeconds(timeCountOfSeconds(0, -1)), -1);
    EXPECT_EQ(wholeSeconds(timeCountOfSeconds(0, 999'999'999)), 0);
    EXPECT_EQ(wholeSeconds(timeCountOfSeconds(253'402'300'799, 5)), 253'402'300'799);
}

} // namespace
