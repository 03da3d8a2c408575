#include "naive_calendar.h"

#include <kvt/datetime/detail/calendar.h>

#include <gtest/gtest.h>

namespace {

using namespace kvt::ex::datetime::detail;

TEST(Calendar, AgreesWithCountingDayByDay) {
    std::int64_t days = kvt::test::daysToYear(1000);
    for (std::int64_t year = 1000; year <= 9999; ++year) {
        for (int month = 1; month <= 12; ++month) {
            const int last = kvt::test::daysInMonth(year, month);
            ASSERT_EQ(lastDayOfMonth(year, static_cast<unsigned>(month)), static_cast<unsigned>(last)) << year << "-" << month;
            for (int day = 1; day <= last; ++day, ++days) {
                ASSERT_EQ(daysFromCivil(year, static_cast<unsigned>(month), static_cast<unsigned>(day)), days)
                    << year << "-" << month << "-" << day;
                const CivilDate date = civilFromDays(days);
                ASSERT_TRUE(date.year == year && date.month == static_cast<unsigned>(month) &&
                            date.day == static_cast<unsigned>(day))
                    << year << "-" << month << "-" << day;
            }
        }
    }
    EXPECT_EQ(days, 2'932'897); // 10000-01-01
}

TEST(Calendar, EpochIsDayZero) {
    EXPECT_EQ(daysFromCivil(1970, 1, 1), 0);
    EXPECT_EQ(daysFromCivil(1000, 1, 1) * 86'400, -30'610'224'000);
    EXPECT_EQ(daysFromCivil(10000, 1, 1) * 86'400, 253'402'300'800);
}

TEST(Calendar, HasNoBounds) {
    for (const std::int64_t year : {-5'000'000'000LL, -70'000LL, -32'769LL, -1LL, 0LL, 32'768LL, 70'000LL, 5'000'000'000LL}) {
        const std::int64_t days = daysFromCivil(year, 3, 1);
        const CivilDate date = civilFromDays(days);
        EXPECT_EQ(date.year, year);
        EXPECT_EQ(date.month, 3U);
        EXPECT_EQ(date.day, 1U);
        const bool leap = kvt::test::isLeapYear(year);
        EXPECT_EQ(civilFromDays(days - 1).day, leap ? 29U : 28U) << year;
        EXPECT_EQ(lastDayOfMonth(year, 2), leap ? 29U : 28U) << year;
    }
}

// March is the first month of the formula's year, and the months behind it begin after 153 days for five of them.
TEST(Calendar, MonthsBeyondTheYearRunThroughTheFormula) {
    for (std::int64_t year = 1999; year <= 2005; ++year) {
        const std::int64_t march = kvt::test::naiveDays(year, 3, 1);
        for (unsigned month = 3; month <= 99; ++month) {
            for (const unsigned day : {1U, 31U, 99U}) {
                EXPECT_EQ(daysFromCivil(year, month, day), march + (153 * (month - 3) + 2) / 5 + day - 1)
                    << year << "-" << month << "-" << day;
            }
        }
        EXPECT_EQ(daysFromCivil(year, 13, 1), kvt::test::naiveDays(year + 1, 1, 1));
        EXPECT_EQ(daysFromCivil(year, 14, 1), kvt::test::naiveDays(year + 1, 2, 1));
        // As if February had 30 days.
        EXPECT_EQ(daysFromCivil(year, 15, 1), kvt::test::naiveDays(year + 1, 2, 1) + 30);
    }
    EXPECT_EQ(daysFromCivil(2022, 15, 1), kvt::test::naiveDays(2023, 3, 3));
}

TEST(Calendar, AMonthThatIsNoneHas29Days) {
    for (const unsigned month : {0U, 13U, 99U}) {
        EXPECT_EQ(lastDayOfMonth(2021, month), 29U);
    }
    EXPECT_EQ(lastDayText(28), "28");
    EXPECT_EQ(lastDayText(29), "29");
    EXPECT_EQ(lastDayText(30), "30");
    EXPECT_EQ(lastDayText(31), "31");
}

} // namespace
