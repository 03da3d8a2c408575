#include "naive_calendar.h"

#include <kvt/datetime/detail/nano_count.h>

#include <gtest/gtest.h>

#include <random>

namespace {

using namespace kvt::ex::datetime::detail;
using kvt::test::Int128;

Int128 valueOf(const NanoCount& count) {
    const NanoCount unit = NanoCount(1) << 62;
    const auto high = static_cast<std::int64_t>(NanoCount(count / unit));
    const auto low = static_cast<std::int64_t>(NanoCount(count % unit));
    return static_cast<Int128>(high) * (static_cast<Int128>(1) << 62) + low;
}

struct Number {
    Int128 value;
    NanoCount count;
};

// Up to about 100 bits, of both signs, and now and then a small one.
Number number(std::mt19937_64& random) {
    const auto high = static_cast<std::int64_t>(random()) >> (random() % 60);
    const auto low = static_cast<std::int64_t>(random() >> 28);
    Number made;
    made.value = static_cast<Int128>(high) * (static_cast<Int128>(1) << 36) + low;
    made.count = NanoCount(high) * (std::int64_t{1} << 36) + low;
    return made;
}

TEST(NanoCount, HasTheArithmeticOf128Bits) {
    std::mt19937_64 random(128);
    for (int i = 0; i < 100'000; ++i) {
        const Number a = number(random);
        const Number b = number(random);
        ASSERT_TRUE(valueOf(a.count) == a.value);
        ASSERT_TRUE(valueOf(NanoCount(a.count + b.count)) == a.value + b.value);
        ASSERT_TRUE(valueOf(NanoCount(a.count - b.count)) == a.value - b.value);
        ASSERT_TRUE(valueOf(NanoCount(-a.count)) == -a.value);
        ASSERT_TRUE(valueOf(NanoCount(a.count * 1000)) == a.value * 1000);
        ASSERT_TRUE(valueOf(NanoCount(a.count / 7919)) == a.value / 7919);
        ASSERT_EQ(a.count < b.count, a.value < b.value);
        ASSERT_EQ(a.count == b.count, a.value == b.value);
        ASSERT_EQ(toDouble(a.count), static_cast<double>(a.value));
    }
}

TEST(NanoCount, ZeroHasOneForm) {
    const NanoCount one(1);
    EXPECT_EQ(one - one, NanoCount(0));
    EXPECT_EQ(NanoCount(-one + one), NanoCount(0));
    EXPECT_FALSE(NanoCount(-one + one) < NanoCount(0));
    EXPECT_EQ(toDouble(one - one), 0.0);
}

} // namespace
