#include "naive_calendar.h"

#include <kvt/datetime/detail/apply_offset.h>
#include <kvt/datetime/detail/arithmetic.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/record.h>

#include <gtest/gtest.h>

#include <random>
#include <string>

namespace {

using namespace kvt::ex::datetime;
using namespace kvt::ex::datetime::detail;

std::string rangeOf(const std::optional<DatePartRange>& range) {
    return !range ? "no failure"
                  : std::string(range->value.view()) + "," + std::string(range->part) + "," +
                        std::string(range->lowest) + "," + std::string(range->highest);
}

DateTimeFields timeOf(std::int64_t hours, std::int64_t minutes, std::int64_t seconds,
                      std::int64_t nanoseconds = 0) {
    return {1970, 1, 1, hours, minutes, seconds, nanoseconds};
}

DateTimeFields dateOf(std::int64_t year, std::uint64_t month, std::uint64_t day) {
    return {year, month, day, 0, 0, 0, 0};
}

TEST(TimeOutOfRange, HasBoundsAndLenientOnlyTheLowerOnes) {
    const struct {
        std::int64_t hours;
        std::int64_t minutes;
        std::int64_t seconds;
        const char* strict;
        const char* lenient;
    } rows[] = {
        {23, 59, 59, "no failure", "no failure"},
        {24, 60, 60, "24,hours,0,23", "no failure"},
        {23, 60, 60, "60,minutes,0,59", "no failure"},
        {23, 59, 60, "60,seconds,0,59.999999999", "no failure"},
        {-1, -1, -1, "-1,hours,0,23", "-1,hours,0,23"},
        {0, -7, -1, "-7,minutes,0,59", "-7,minutes,0,59"},
        {0, 0, -1, "-1,seconds,0,59.999999999", "-1,seconds,0,59.999999999"},
    };
    for (const auto& row : rows) {
        const DateTimeFields fields = timeOf(row.hours, row.minutes, row.seconds);
        EXPECT_EQ(rangeOf(timeOutOfRange(fields, false)), row.strict);
        EXPECT_EQ(rangeOf(timeOutOfRange(fields, true)), row.lenient);
    }
    EXPECT_EQ(nanosecondsOfDay(timeOf(1, 2, 3, 4)), 3723 * nanosPerSecond + 4);
    EXPECT_EQ(nanosecondsOfDay(timeOf(25, 61, 61, 2'000'000'000)),
              (25 * 3600 + 61 * 60 + 63) * nanosPerSecond);
}

TEST(DateOutOfRange, HasBoundsAndLenientOnlySomeOfThem) {
    const struct {
        std::int64_t year;
        std::uint64_t month;
        std::uint64_t day;
        const char* strict;
        const char* lenient;
    } rows[] = {
        {1000, 1, 1, "no failure", "no failure"},
        {9999, 12, 31, "no failure", "no failure"},
        {999, 0, 0, "999,year,1000,9999", "999,year,1000,9999"},
        {10000, 1, 1, "10000,year,1000,9999", "10000,year,1000,9999"},
        {-1, 1, 1, "-1,year,1000,9999", "-1,year,1000,9999"},
        {2020, 0, 0, "0,month,1,12", "0,month,1,12"},
        {2020, 13, 0, "13,month,1,12", "0,day,1,29"},
        {2020, 13, 99, "13,month,1,12", "no failure"},
        {2020, 2, 0, "0,day,1,29", "0,day,1,29"},
        {2020, 2, 30, "30,day,1,29", "no failure"},
        {2000, 2, 30, "30,day,1,29", "no failure"},
        {2100, 2, 29, "29,day,1,28", "no failure"},
        {2020, 4, 31, "31,day,1,30", "no failure"},
        {2020, 1, 32, "32,day,1,31", "no failure"},
    };
    for (const auto& row : rows) {
        const DateTimeFields fields = dateOf(row.year, row.month, row.day);
        EXPECT_EQ(rangeOf(dateOutOfRange(fields, false)), row.strict);
        EXPECT_EQ(rangeOf(dateOutOfRange(fields, true)), row.lenient);
    }
}

TEST(InstantFromParts, AndBackIsTheSame) {
    std::mt19937_64 random(62);
    for (int i = 0; i < 50'000; ++i) {
        kvt::test::NaiveDateTime at{1000 + static_cast<std::int64_t>(random() % 9000),
                                    1 + static_cast<int>(random() % 12), 1};
        at.day =
            1 + static_cast<int>(random() % static_cast<unsigned>(kvt::test::daysInMonth(at.year, at.month)));
        at.hours = static_cast<int>(random() % 24);
        at.minutes = static_cast<int>(random() % 60);
        at.seconds = static_cast<int>(random() % 60);
        at.nanoseconds = static_cast<int>(random() % 1'000'000'000);
        const auto u = [](int number) { return static_cast<std::uint64_t>(number); };
        const DateTimeParts parts =
            partsOf(i % 2 == 0 ? TemporalType::DatetimeWithOffset : TemporalType::Datetime,
                    {at.year, u(at.month), u(at.day), at.hours, at.minutes, at.seconds, at.nanoseconds},
                    i % 2 == 0 ? "-03:30" : "");
        const auto instant = instantFromParts(parts, i % 3 == 0);
        ASSERT_TRUE(static_cast<bool>(instant));
        const auto days = kvt::test::naiveDays(at.year, at.month, at.day);
        ASSERT_EQ(instant->count,
                  timeCountOfSeconds(days * 86'400 + at.hours * 3600 + at.minutes * 60 + at.seconds,
                                     at.nanoseconds));
        const DateTimeParts back = partsFromInstant(*instant);
        ASSERT_EQ(back.toDatetimeString(FormatType::Extended, true),
                  parts.toDatetimeString(FormatType::Extended, true));
        ASSERT_EQ(back.type(), i % 2 == 0 ? TemporalType::DatetimeWithOffset : TemporalType::Datetime);
        ASSERT_EQ(canonicalText(answerOf(TemporalType::Datetime, *instant)),
                  parts.toDatetimeString(FormatType::Compact, true));
    }
}

TEST(ApplyOffsetText, ReplacesOrConverts) {
    const std::optional<std::int32_t> none;
    const std::int64_t noon = 12 * 3600;
    const struct {
        int line;
        std::optional<std::int32_t> before;
        const char* text;
        SetZoneMode mode;
        std::int64_t seconds;
        std::optional<std::int32_t> after;
    } rows[] = {
        {__LINE__, none, "+02:00", SetZoneMode::Replace, noon, 120},
        {__LINE__, 0, "+02:00", SetZoneMode::Convert, noon + 7200, 120},
        {__LINE__, 60, "+02:00", SetZoneMode::Convert, noon + 3600, 120},
        {__LINE__, 60, "+02:00", SetZoneMode::Replace, noon, 120},
        {__LINE__, 60, "+02:00", SetZoneMode::Automatic, noon + 3600, 120},
        {__LINE__, none, "+02:00", SetZoneMode::Automatic, noon, 120},
        {__LINE__, 60, "-0330", SetZoneMode::Convert, noon - 3600 - 12600, -210},
        {__LINE__, 60, "utc", SetZoneMode::Convert, noon - 3600, 0},
        {__LINE__, 60, "uTC", SetZoneMode::Replace, noon, 0},
        {__LINE__, none, "UTC", SetZoneMode::Automatic, noon, 0},
        {__LINE__, 60, "", SetZoneMode::Replace, noon, none},
        {__LINE__, 60, "", SetZoneMode::Convert, noon - 3600, none}, // UTC by then
        {__LINE__, 60, "", SetZoneMode::Automatic, noon - 3600, none},
        {__LINE__, 60, "nothing", SetZoneMode::Replace, noon, none},
        {__LINE__, 60, "utcs", SetZoneMode::Convert, noon - 3600, none},
        {__LINE__, none, "+1", SetZoneMode::Automatic, noon, none},
        {__LINE__, none, "+02:00", SetZoneMode::Convert, noon + 7200, 120}, // as if it had been UTC
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        TemporalInstant instant{timeCountOfSeconds(noon, 0), row.before};
        applyOffsetText(instant, row.text, row.mode);
        EXPECT_EQ(instant.count, timeCountOfSeconds(row.seconds, 0));
        EXPECT_EQ(instant.offsetMinutes, row.after);
    }
}

TEST(AddInterval, ChecksTheYearItStartsFrom) {
    DateTimeFields fields = dateOf(702, 6, 15);
    EXPECT_EQ(rangeOf(addInterval(fields, IntervalParts())), "702,year,1000,9999");
    EXPECT_EQ(fields.year, 702);
}

TEST(OffsetOfMinutes, HasASignAndTwoPairs) {
    const struct {
        std::int32_t minutes;
        const char* text;
    } rows[] = {{0, "+00:00"},    {60, "+01:00"},   {-1, "-00:01"},
                {-210, "-03:30"}, {5999, "+99:59"}, {675, "+11:15"}};
    for (const auto& row : rows) {
        const std::optional<OffsetForm> offset = offsetOfMinutes(row.minutes);
        ASSERT_TRUE(offset.has_value());
        EXPECT_EQ(offset->view(), row.text);
        EXPECT_EQ(offset->minutes, row.minutes);
    }
    EXPECT_FALSE(offsetOfMinutes(6000).has_value());
    EXPECT_FALSE(offsetOfMinutes(-6000).has_value());
}

} // namespace
