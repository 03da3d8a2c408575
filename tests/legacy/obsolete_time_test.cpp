// ObsoleteTime: how it is built, asked, moved and compared.
#include "legacy_support.h"
#include "machine_clock.h"

#include <climits>
#include <cstring>
#include <type_traits>
#include <utility>

namespace kvt::test {
namespace {

// The comparisons are for objects that are not const, and there are no others.
static_assert(
    std::is_same_v<decltype(&ObsoleteTime::operator<), bool (ObsoleteTime::*)(const ObsoleteTime&)>);
static_assert(
    std::is_same_v<decltype(&ObsoleteTime::operator>), bool (ObsoleteTime::*)(const ObsoleteTime&)>);
static_assert(
    std::is_same_v<decltype(&ObsoleteTime::operator+), ObsoleteTime (ObsoleteTime::*)(unsigned long) const>);
static_assert(
    std::is_same_v<decltype(&ObsoleteTime::operator-), ObsoleteTime (ObsoleteTime::*)(unsigned long) const>);

template <typename T>
concept HasEqual = requires {
    &T::operator==;
};
template <typename T>
concept HasOrEqual = requires {
    &T::operator<=;
}
|| requires {
    &T::operator>=;
};
template <typename T>
concept HasTextWithoutFormat = requires(const T& value) {
    value.asString();
};
template <typename T>
concept HasDate = requires(const T& value) {
    value.year();
}
|| requires(const T& value) {
    value.month();
}
|| requires(const T& value) {
    value.day();
};

static_assert(HasEqual<ObsoleteDate> && !HasEqual<ObsoleteTime>);
static_assert(HasOrEqual<ObsoleteDate> && !HasOrEqual<ObsoleteTime>);
static_assert(HasTextWithoutFormat<ObsoleteDate> && !HasTextWithoutFormat<ObsoleteTime>);
static_assert(HasDate<ObsoleteDate> && !HasDate<ObsoleteTime>);
static_assert(sizeof(ObsoleteTime) == sizeof(void*), "an object is one pointer");

std::string shown(const ObsoleteTime& time) {
    return time.asString("%Y-%m-%d %H:%M:%S");
}

TEST(ObsoleteTimeOfDay, IsWhatItWasBuiltFrom) {
    const ObsoleteTime time(ObsoleteDate(1, 2, 2020), 1, 2, 3);
    EXPECT_EQ(time.hour(), 1U);
    EXPECT_EQ(time.minute(), 2U);
    EXPECT_EQ(time.second(), 3U);
    EXPECT_TRUE(time.isValid());
}

struct TimeOfDayRow {
    int line;
    unsigned int hours, minutes, seconds;
    const char* expected; // from 2020-02-28 on
};

const TimeOfDayRow timeOfDayRows[] = {
    {__LINE__, 0, 0, 0, "2020-02-28 00:00:00"},         {__LINE__, 23, 59, 59, "2020-02-28 23:59:59"},
    {__LINE__, 24, 0, 0, "2020-02-29 00:00:00"},        {__LINE__, 25, 0, 0, "2020-02-29 01:00:00"},
    {__LINE__, 0, 90, 0, "2020-02-28 01:30:00"},        {__LINE__, 0, 0, 86400, "2020-02-29 00:00:00"},
    {__LINE__, 48, 60, 61, "2020-03-01 01:01:01"},      {__LINE__, 1000000, 0, 0, "2134-03-28 16:00:00"},
    {__LINE__, 0, UINT_MAX, 0, "10186-05-19 04:15:00"}, // outside the calendar: only its time of day is asked
    {__LINE__, 0, 0, UINT_MAX, "2156-04-05 06:28:15"},
};

TEST(ObsoleteTimeOfDay, IsAddedToTheDateUnchecked) {
    for (const TimeOfDayRow& row : timeOfDayRows) {
        const ObsoleteTime time(ObsoleteDate(28, 2, 2020), row.hours, row.minutes, row.seconds);
        if (std::strlen(row.expected) == std::strlen("2020-02-28 00:00:00")) {
            EXPECT_EQ(shown(time), row.expected) << "row " << row.line;
        } else {
            EXPECT_EQ(failureOf([&] { shown(time); }), badYear) << "row " << row.line;
        }
        const std::uint64_t total =
            std::uint64_t{row.hours} * 3600 + std::uint64_t{row.minutes} * 60 + row.seconds;
        EXPECT_EQ(time.hour(), total / 3600 % 24) << "row " << row.line;
        EXPECT_EQ(time.minute(), total / 60 % 60) << "row " << row.line;
        EXPECT_EQ(time.second(), total % 60) << "row " << row.line;
    }
}

TEST(ObsoleteTimeOfDate, ChecksTheDateAgain) {
    ObsoleteDate before(1, 1, 1400);
    --before;
    EXPECT_EQ(failureOf([&] { ObsoleteTime(before, 0, 0, 0); }), badYear);
    // Not even a time of day that would lead back into the calendar helps.
    EXPECT_EQ(failureOf([&] { ObsoleteTime(before, 24, 0, 0); }), badYear);
    for (const unsigned int number : {notADate, positiveInfinity, negativeInfinity}) {
        EXPECT_EQ(failureOf([&] { ObsoleteTime(dateNumbered(number), 0, 0, 0); }), badYear) << number;
    }
}

TEST(ObsoleteTimeOfTm, TakesDateAndTimeOfDay) {
    std::tm time = calendarTime(2020, 2, 28, 25, 61, 61);
    EXPECT_EQ(shown(ObsoleteTime(&time)), "2020-02-29 02:02:01");
    time = calendarTime(2020, 2, 28, 7, 8, 9);
    time.tm_isdst = 1;
    time.tm_yday = -4;
    EXPECT_EQ(shown(ObsoleteTime(&time)), "2020-02-28 07:08:09");
}

TEST(ObsoleteTimeOfTm, OneNegativeFieldMakesThemAllNegative) {
    std::tm time = calendarTime(2020, 2, 28, -1, 0, 0);
    EXPECT_EQ(shown(ObsoleteTime(&time)), "2020-02-27 23:00:00");
    time = calendarTime(2020, 2, 28, 1, -30, 0);
    EXPECT_EQ(shown(ObsoleteTime(&time)), "2020-02-27 22:30:00");
}

TEST(ObsoleteTimeOfTm, ChecksTheDate) {
    const std::pair<std::tm, std::string> rows[] = {
        {calendarTime(2020, 4, 31), badDayOfMonth},
        {calendarTime(2020, 4, 32), badDay},
        {calendarTime(2020, 13, 1), badMonth},
        {calendarTime(1399, 1, 1), badYear},
    };
    for (const auto& [bad, expected] : rows) {
        std::tm given = bad;
        EXPECT_EQ(failureOf([&] { const ObsoleteTime time(&given); }), expected);
    }
}

struct MoveRow {
    int line;
    unsigned long seconds;
    const char* sum;        // from 2020-02-28 12:00:00
    const char* difference; // from the same
};

const MoveRow moveRows[] = {
    {__LINE__, 0, "2020-02-28 12:00:00", "2020-02-28 12:00:00"},
    {__LINE__, 1, "2020-02-28 12:00:01", "2020-02-28 11:59:59"},
    {__LINE__, 86400, "2020-02-29 12:00:00", "2020-02-27 12:00:00"},
    {__LINE__, 2147483647, "2088-03-17 15:14:07", "1952-02-10 08:45:53"},
    // From here on the number is a negative one.
    {__LINE__, 2147483648, "1952-02-10 08:45:52", "2088-03-17 15:14:08"},
    {__LINE__, 4294967295, "2020-02-28 11:59:59", "2020-02-28 12:00:01"},
    // And here it begins again.
    {__LINE__, 4294967296, "2020-02-28 12:00:00", "2020-02-28 12:00:00"},
    {__LINE__, (1UL << 40) + 1, "2020-02-28 12:00:01", "2020-02-28 11:59:59"},
};

TEST(ObsoleteTimeArithmetic, MovesBySecondsReadAsSigned) {
    const ObsoleteTime time(ObsoleteDate(28, 2, 2020), 12, 0, 0);
    for (const MoveRow& row : moveRows) {
        EXPECT_EQ(shown(time + row.seconds), row.sum) << "row " << row.line;
        EXPECT_EQ(shown(time - row.seconds), row.difference) << "row " << row.line;
    }
    EXPECT_EQ(shown(time), "2020-02-28 12:00:00");
}

TEST(ObsoleteTimeArithmetic, MayLeaveTheCalendarAndComeBack) {
    const ObsoleteTime time = ObsoleteTime(ObsoleteDate(1, 1, 1400), 0, 0, 0) - 1;
    EXPECT_TRUE(time.isValid());
    EXPECT_EQ(time.hour(), 23U);
    EXPECT_EQ(time.minute(), 59U);
    EXPECT_EQ(time.second(), 59U);
    EXPECT_EQ(failureOf([&] { shown(time); }), badYear);
    std::tm filled{};
    EXPECT_EQ(failureOf([&] { time.extract(&filled); }), badYear);
    EXPECT_EQ(shown(time + 1), "1400-01-01 00:00:00");
}

// Under the sanitizers this is also about sums that no signed count could hold.
TEST(ObsoleteTimeArithmetic, WrapsWhereTheCountEnds) {
    const ObsoleteTime start(ObsoleteDate(1, 1, 2000), 0, 0, 0);
    ObsoleteTime time = start;
    bool hasWrapped = false;
    for (int step = 0; step < 9000; ++step) {
        const ObsoleteTime next = time + 2147483647UL;
        hasWrapped |= time > next;
        time = next;
    }
    EXPECT_TRUE(hasWrapped);
    for (int step = 0; step < 9000; ++step) {
        time = time - 2147483647UL;
    }
    EXPECT_EQ(shown(time), "2000-01-01 00:00:00");
}

TEST(ObsoleteTimeComparison, IsByTheCounts) {
    ObsoleteTime time(ObsoleteDate(28, 2, 2020), 12, 0, 0);
    ObsoleteTime same(ObsoleteDate(27, 2, 2020), 36, 0, 0);
    ObsoleteTime later = time + 1;
    EXPECT_FALSE(time < time);
    EXPECT_FALSE(time > time);
    EXPECT_FALSE(time < same);
    EXPECT_FALSE(time > same);
    EXPECT_TRUE(time < later);
    EXPECT_FALSE(time > later);
    EXPECT_TRUE(later > time);
    EXPECT_FALSE(later < time);
    // A moment before the first day has a negative count.
    ObsoleteTime longAgo = time;
    for (int step = 0; step < 150; ++step) {
        longAgo = longAgo - 2147483647UL;
    }
    EXPECT_TRUE(longAgo < time);
}

TEST(ObsoleteTimeCopies, AreIndependent) {
    ObsoleteTime first(ObsoleteDate(28, 2, 2020), 12, 0, 0);
    const ObsoleteTime copy(first);
    ObsoleteTime assigned(ObsoleteDate(1, 1, 1900), 0, 0, 0);
    assigned = first;
    first = first + 5;
    EXPECT_EQ(shown(copy), "2020-02-28 12:00:00");
    EXPECT_EQ(shown(assigned), "2020-02-28 12:00:00");
    EXPECT_EQ(shown(first), "2020-02-28 12:00:05");
    const ObsoleteTime& itself = first;
    first = itself;
    EXPECT_EQ(shown(first), "2020-02-28 12:00:05");
}

TEST(ObsoleteTimeExtract, FillsAllFields) {
    std::tm filled;
    std::memset(&filled, 0x5A, sizeof filled);
    ObsoleteTime(ObsoleteDate(1, 3, 2020), 1, 2, 3).extract(&filled); // a Sunday
    EXPECT_EQ(filled.tm_year, 120);
    EXPECT_EQ(filled.tm_mon, 2);
    EXPECT_EQ(filled.tm_mday, 1);
    EXPECT_EQ(filled.tm_hour, 1);
    EXPECT_EQ(filled.tm_min, 2);
    EXPECT_EQ(filled.tm_sec, 3);
    EXPECT_EQ(filled.tm_wday, 0);
    EXPECT_EQ(filled.tm_yday, 60);
    EXPECT_EQ(filled.tm_isdst, -1);
}

} // namespace
} // namespace kvt::test
