#include "answer.h"

#include <kvt/datetime/datetime_parts.h>

#include <cmath>
#include <limits>
#include <random>

namespace {

using namespace kvt::ex::datetime;
using kvt::ex::UString;

TEST(DateTimeEnumerations, HaveTheValuesThatAHostStores) {
    EXPECT_EQ(static_cast<int>(TemporalType::Date), 0);
    EXPECT_EQ(static_cast<int>(TemporalType::Time), 1);
    EXPECT_EQ(static_cast<int>(TemporalType::TimeWithOffset), 2);
    EXPECT_EQ(static_cast<int>(TemporalType::Datetime), 3);
    EXPECT_EQ(static_cast<int>(TemporalType::DatetimeWithOffset), 4);
    EXPECT_EQ(static_cast<int>(TemporalType::Unsupported), 5);
    EXPECT_EQ(static_cast<int>(CastToTemporalType::Date), 0);
    EXPECT_EQ(static_cast<int>(CastToTemporalType::Time), 1);
    EXPECT_EQ(static_cast<int>(CastToTemporalType::Datetime), 2);
    EXPECT_EQ(static_cast<int>(CastToTemporalType::Unknown), 3);
    EXPECT_EQ(static_cast<int>(FormatType::Compact), 0);
    EXPECT_EQ(static_cast<int>(FormatType::Extended), 1);
    EXPECT_EQ(static_cast<int>(ReturnState::Error), 0);
    EXPECT_EQ(static_cast<int>(ReturnState::Failure), 1);
    EXPECT_EQ(static_cast<int>(ReturnState::Repaired), 2);
    EXPECT_EQ(static_cast<int>(ReturnState::Success), 3);
    EXPECT_EQ(static_cast<int>(UnitType::Years), 0);
    EXPECT_EQ(static_cast<int>(UnitType::Months), 1);
    EXPECT_EQ(static_cast<int>(UnitType::Weeks), 2);
    EXPECT_EQ(static_cast<int>(UnitType::Days), 3);
    EXPECT_EQ(static_cast<int>(UnitType::Hours), 4);
    EXPECT_EQ(static_cast<int>(UnitType::Minutes), 5);
    EXPECT_EQ(static_cast<int>(UnitType::Seconds), 6);
    EXPECT_EQ(static_cast<int>(ZoneMode::LocalWithOffset), 0);
    EXPECT_EQ(static_cast<int>(ZoneMode::Utc), 1);
    EXPECT_EQ(static_cast<int>(ZoneMode::LocalWithoutOffset), 2);
    EXPECT_EQ(static_cast<int>(UTCOffsetType::OffsetText), 0);
    EXPECT_EQ(static_cast<int>(UTCOffsetType::OffsetInMinutes), 1);
    EXPECT_EQ(static_cast<int>(UTCOffsetType::OffsetInSeconds), 2);
    EXPECT_EQ(static_cast<int>(SetZoneMode::Automatic), 0);
    EXPECT_EQ(static_cast<int>(SetZoneMode::Replace), 1);
    EXPECT_EQ(static_cast<int>(SetZoneMode::Convert), 2);
}

TEST(DateTimeParts, DefaultIsTheEpochOfNoKnownKind) {
    const DateTimeParts parts;
    EXPECT_EQ(parts.year(), 1970);
    EXPECT_EQ(parts.month(), 1);
    EXPECT_EQ(parts.day(), 1);
    EXPECT_EQ(parts.hours(), 0);
    EXPECT_EQ(parts.minutes(), 0);
    EXPECT_EQ(parts.seconds(), 0);
    EXPECT_EQ(parts.nanoseconds(), 0);
    EXPECT_EQ(parts.offset(), "");
    EXPECT_EQ(parts.type(), TemporalType::Unsupported);
    EXPECT_TRUE(parts.hasDate());
    EXPECT_TRUE(parts.hasTime());
    EXPECT_FALSE(parts.hasOffset());
}

TEST(DateTimeParts, ConstructorSplitsSecondsAndRepairsTheOffset) {
    const DateTimeParts parts(2020, 1, 2, 3, 4, 5.25, "+0100");
    EXPECT_EQ(parts.year(), 2020);
    EXPECT_EQ(parts.month(), 1);
    EXPECT_EQ(parts.day(), 2);
    EXPECT_EQ(parts.hours(), 3);
    EXPECT_EQ(parts.minutes(), 4);
    EXPECT_EQ(parts.seconds(), 5);
    EXPECT_EQ(parts.nanoseconds(), 250'000'000);
    EXPECT_EQ(parts.offset(), "+01:00");
    EXPECT_EQ(parts.type(), TemporalType::DatetimeWithOffset);
}

TEST(DateTimeParts, ConstructorDropsWhatIsNoOffset) {
    const DateTimeParts parts(2020, 1, 2, 3, 4, 5.25, "bad");
    EXPECT_EQ(parts.offset(), "");
    EXPECT_EQ(parts.type(), TemporalType::Datetime);
    EXPECT_EQ(DateTimeParts(2020, 1, 2, 3, 4, 5.25, "").type(), TemporalType::Datetime);
}

TEST(DateTimeParts, KindDecidesAboutDateAndTimeButNotAboutTheOffset) {
    const struct {
        TemporalType type;
        bool date;
        bool time;
    } rows[] = {
        {TemporalType::Date, true, false},        {TemporalType::Time, false, true},
        {TemporalType::TimeWithOffset, false, true}, {TemporalType::Datetime, true, true},
        {TemporalType::DatetimeWithOffset, true, true}, {TemporalType::Unsupported, true, true},
        {static_cast<TemporalType>(77), true, true},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(static_cast<int>(row.type));
        DateTimeParts parts;
        parts.setType(row.type);
        EXPECT_EQ(parts.hasDate(), row.date);
        EXPECT_EQ(parts.hasTime(), row.time);
        EXPECT_FALSE(parts.hasOffset());
        parts.setOffset("-05");
        EXPECT_TRUE(parts.hasOffset());
        EXPECT_EQ(parts.offset(), "-05:00");
        EXPECT_EQ(parts.type(), row.type);
        parts.setOffset("x");
        EXPECT_FALSE(parts.hasOffset());
        EXPECT_EQ(parts.type(), row.type);
    }
}

TEST(DateTimeParts, SettersStoreWithoutChecks) {
    DateTimeParts parts;
    parts.setYear(-123456789012);
    parts.setMonth(99);
    parts.setDay(0);
    parts.setHours(std::numeric_limits<std::uint64_t>::max());
    parts.setMinutes(61);
    parts.setSeconds(5'000'000'000);
    parts.setNanoseconds(2'000'000'000);
    EXPECT_EQ(parts.year(), static_cast<int>(-123456789012)); // the low 32 bits
    EXPECT_EQ(parts.month(), 99);
    EXPECT_EQ(parts.day(), 0);
    EXPECT_EQ(parts.hours(), -1);
    EXPECT_EQ(parts.minutes(), 61);
    EXPECT_EQ(parts.seconds(), 5'000'000'000);
    EXPECT_EQ(parts.nanoseconds(), 2'000'000'000);
    parts.setMonth((std::uint64_t{7} << 32) + 5);
    parts.setDay((std::uint64_t{7} << 32) + 6);
    EXPECT_EQ(parts.month(), 5);
    EXPECT_EQ(parts.day(), 6);
}

TEST(DateTimeParts, SecondsAreSplitWithoutACarry) {
    const double infinity = std::numeric_limits<double>::infinity();
    const struct {
        int line;
        double seconds;
        std::int64_t whole;
        std::int64_t nanoseconds;
    } rows[] = {
        {__LINE__, 0.0, 0, 0},
        {__LINE__, -0.0, 0, 0},
        {__LINE__, -1.0, 0, 0},
        {__LINE__, -1e300, 0, 0},
        {__LINE__, std::nan(""), 0, 0},
        {__LINE__, 1.5, 1, 500'000'000},
        {__LINE__, 59.999999999, 59, 999'999'999},
        {__LINE__, 59.9999999999, 59, 1'000'000'000},
        {__LINE__, 0.0000000004, 0, 0},
        {__LINE__, 0.0000000006, 0, 1},
        {__LINE__, 4294967296.25, 4294967296, 250'000'000},
        {__LINE__, 9223372036854774784.0, 9223372036854774784, 0},
        {__LINE__, 18446744073709549568.0, -2048, 0}, // the largest double that the field holds, read as signed
        {__LINE__, 18446744073709551616.0, std::numeric_limits<std::int64_t>::max(), 0},
        {__LINE__, infinity, std::numeric_limits<std::int64_t>::max(), 0},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        const DateTimeParts parts(2020, 1, 1, 0, 0, row.seconds, "");
        EXPECT_EQ(parts.seconds(), row.whole);
        EXPECT_EQ(parts.nanoseconds(), row.nanoseconds);
        const IntervalParts interval(0, 0, 0, 0, 0, row.seconds, false);
        EXPECT_EQ(interval.seconds(), row.whole);
        EXPECT_EQ(interval.nanoseconds(), row.nanoseconds);
    }
}

TEST(DateTimeParts, SecondsTextHasTwoDigitsAndTheFraction) {
    const struct {
        std::uint64_t seconds;
        std::uint64_t nanoseconds;
        const char* text;
    } rows[] = {
        {0, 0, "00"},
        {5, 250'000'000, "05.25"},
        {9, 500'000'000, "09.5"},
        {10, 0, "10"},
        {59, 999'999'999, "59.999999999"},
        {0, 1, "00.000000001"},
        {100, 0, "100"},
        {5, 1'000'000'000, "06"},
        {9, 1'000'000'000, "010"},
        {12, 2'500'000'000, "14.5"},
        {1'048'575, 999'999'999, "1048575.999999999"},
        {1'000'000'000'000, 123'456'789, "1000000000000.123413086"}, // a double has no more of it
        {18'446'744'073'709'551'615U, 0, "18446744073709551616"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        DateTimeParts parts;
        parts.setSeconds(row.seconds);
        parts.setNanoseconds(row.nanoseconds);
        EXPECT_EQ(parts.secondsFractionalToString(), row.text);
    }
}

TEST(DateTimeParts, RendersItsDateAndTime) {
    const DateTimeParts parts(2020, 1, 2, 3, 4, 5.25, "+0100");
    EXPECT_EQ(parts.toDateString(FormatType::Compact), "20200102");
    EXPECT_EQ(parts.toDateString(FormatType::Extended), "2020-01-02");
    EXPECT_EQ(parts.toTimeString(FormatType::Compact, false), "030405.25");
    EXPECT_EQ(parts.toTimeString(FormatType::Extended, false), "03:04:05.25");
    EXPECT_EQ(parts.toTimeString(FormatType::Compact, true), "030405.25+01:00");
    EXPECT_EQ(parts.toTimeString(FormatType::Extended, true), "03:04:05.25+01:00");
    EXPECT_EQ(parts.toDatetimeString(FormatType::Compact, false), "20200102030405.25");
    EXPECT_EQ(parts.toDatetimeString(FormatType::Extended, false), "2020-01-02T03:04:05.25");
    EXPECT_EQ(parts.toDatetimeString(FormatType::Compact, true), "20200102030405.25+01:00");
    EXPECT_EQ(parts.toDatetimeString(FormatType::Extended, true), "2020-01-02T03:04:05.25+01:00");
}

TEST(DateTimeParts, ATimeHasNoDateTextAndNoT) {
    for (const TemporalType type : {TemporalType::Time, TemporalType::TimeWithOffset}) {
        DateTimeParts parts(2020, 1, 2, 3, 4, 5.0, "-0030");
        parts.setType(type);
        EXPECT_EQ(parts.toDateString(FormatType::Compact), "");
        EXPECT_EQ(parts.toDateString(FormatType::Extended), "");
        EXPECT_EQ(parts.toDatetimeString(FormatType::Compact, false), "030405");
        EXPECT_EQ(parts.toDatetimeString(FormatType::Extended, false), "03:04:05");
        EXPECT_EQ(parts.toDatetimeString(FormatType::Extended, true), "03:04:05-00:30");
    }
}

TEST(DateTimeParts, ADateStillHasATimeText) {
    DateTimeParts parts(2020, 1, 2, 3, 4, 5.0, "");
    parts.setType(TemporalType::Date);
    EXPECT_EQ(parts.toTimeString(FormatType::Compact, true), "030405");
    EXPECT_EQ(parts.toDatetimeString(FormatType::Compact, true), "20200102030405");
}

TEST(DateTimeParts, PadsToTheWidthAndNoFurther) {
    DateTimeParts parts;
    parts.setYear(7);
    parts.setMonth(123);
    parts.setHours(456);
    EXPECT_EQ(parts.toDateString(FormatType::Extended), "0007-123-01");
    EXPECT_EQ(parts.toTimeString(FormatType::Extended, false), "456:00:00");
    parts.setYear(123456);
    EXPECT_EQ(parts.toDateString(FormatType::Compact), "12345612301");
}

TEST(DateTimeParts, LongestTextOfAllFits) {
    constexpr std::uint64_t largest = std::numeric_limits<std::uint64_t>::max();
    DateTimeParts parts(std::numeric_limits<std::int64_t>::min(), largest, largest, largest, largest, 0.0, "-99:59");
    parts.setSeconds(largest);
    parts.setNanoseconds(largest);
    const std::string number = "18446744073709551615";
    EXPECT_EQ(parts.toDatetimeString(FormatType::Extended, true),
              kvt::test::ustring("-9223372036854775808-" + number + "-" + number + "T" + number + ":" + number +
                                 ":18446744092156297216-99:59"));
}

TEST(SecondsFractionalToString, HasNoZerosAtTheEnd) {
    const struct {
        double seconds;
        const char* text;
    } rows[] = {
        {59.5, "59.5"},
        {0.0, "0"},
        {-0.0, "-0"},
        {59.999999999, "59.999999999"},
        {59.9999999999, "60"},
        {100.0, "100"},
        {1e-9, "0.000000001"},
        {4e-10, "0"},
        {-1.25, "-1.25"},
        {1e22, "10000000000000000000000"},
        {std::numeric_limits<double>::infinity(), "inf"},
        {-std::numeric_limits<double>::infinity(), "-inf"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(secondsFractionalToString(row.seconds), row.text);
    }
    EXPECT_EQ(secondsFractionalToString(std::numeric_limits<double>::max()).size(), 309U);
    EXPECT_EQ(secondsFractionalToString(-std::numeric_limits<double>::max()).size(), 310U);
}

// The digits of the fields must be those of the sum as a double, which is how the text is defined.
TEST(SecondsFractionalToString, FieldsAndDoubleGiveTheSameDigits) {
    std::mt19937_64 random(20200102);
    for (int i = 0; i < 300'000; ++i) {
        DateTimeParts parts;
        const std::uint64_t seconds = random() % (i % 2 == 0 ? 100 : 2'000'000);
        const std::uint64_t nanoseconds = i % 3 == 0 ? 999'999'999 - random() % 1000 : random() % 1'000'000'000;
        parts.setSeconds(seconds);
        parts.setNanoseconds(nanoseconds);
        const double sum = static_cast<double>(seconds) + static_cast<double>(nanoseconds) / 1e9;
        const UString<0> expected = UString<0>(seconds < 10 ? "0" : "") + secondsFractionalToString(sum);
        ASSERT_EQ(parts.secondsFractionalToString(), expected) << seconds << " " << nanoseconds;
    }
}

TEST(IntervalParts, DefaultIsZero) {
    const IntervalParts parts;
    EXPECT_EQ(parts.years(), 0);
    EXPECT_EQ(parts.months(), 0);
    EXPECT_EQ(parts.days(), 0);
    EXPECT_EQ(parts.hours(), 0);
    EXPECT_EQ(parts.minutes(), 0);
    EXPECT_EQ(parts.seconds(), 0);
    EXPECT_EQ(parts.nanoseconds(), 0);
    EXPECT_FALSE(parts.negative());
}

TEST(IntervalParts, KeepsWhatItIsGiven) {
    const IntervalParts parts(1, 20, 300, 4000, 50000, 6.5, true);
    EXPECT_EQ(parts.years(), 1);
    EXPECT_EQ(parts.months(), 20);
    EXPECT_EQ(parts.days(), 300);
    EXPECT_EQ(parts.hours(), 4000);
    EXPECT_EQ(parts.minutes(), 50000);
    EXPECT_EQ(parts.seconds(), 6);
    EXPECT_EQ(parts.nanoseconds(), 500'000'000);
    EXPECT_TRUE(parts.negative());
}

} // namespace
