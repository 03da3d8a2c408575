#include "answer.h"

#include <kvt/datetime/datetime.h>

#include <limits>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::outOfRange;
using kvt::test::success;

DateTimeParts parts(std::int64_t year, std::uint64_t month, std::uint64_t day, std::uint64_t hours = 0,
                    std::uint64_t minutes = 0, std::uint64_t seconds = 0, std::uint64_t nanoseconds = 0) {
    DateTimeParts made(year, month, day, hours, minutes, 0.0, "");
    made.setSeconds(seconds);
    made.setNanoseconds(nanoseconds);
    return made;
}

TEST(Create, GivesADatetimeWhateverTheType) {
    for (const int type : {0, 1, 2, 3, 4, 5, 9}) {
        DateTimeParts made = parts(2020, 1, 2, 3, 4, 5);
        made.setType(static_cast<TemporalType>(type));
        EXPECT_EQ(answerOf(create(made)), success("20200102030405"));
    }
    EXPECT_EQ(answerOf(create(DateTimeParts())), success("19700101000000"));
}

TEST(Create, WritesFractionAndOffset) {
    DateTimeParts made = parts(2020, 1, 2, 3, 4, 5, 500'000'000);
    EXPECT_EQ(answerOf(create(made)), success("20200102030405.5"));
    made.setOffset("+0100");
    EXPECT_EQ(answerOf(create(made)), success("20200102030405.5+01:00"));
    made.setOffset("-1075"); // its minutes are written anew
    EXPECT_EQ(answerOf(create(made)), success("20200102030405.5-11:15"));
    made.setOffset("-00:00");
    EXPECT_EQ(answerOf(create(made)), success("20200102030405.5+00:00"));
    made.setOffset("nothing");
    EXPECT_EQ(answerOf(create(made)), success("20200102030405.5"));
    EXPECT_EQ(answerOf(create(parts(9999, 12, 31, 23, 59, 59, 999'999'999))), success("99991231235959.999999999"));
    EXPECT_EQ(answerOf(create(parts(1000, 1, 1))), success("10000101000000"));
}

TEST(Create, FirstTurnsAwayWhatTwoDigitsDoNotHold) {
    const Answer year = outOfRange("999", "year", "1000", "9999");
    const std::uint64_t minusOne = std::numeric_limits<std::uint64_t>::max();
    const struct {
        int line;
        DateTimeParts parts;
        Answer answer;
    } rows[] = {
        {__LINE__, parts(999, 100, 100, 100, 100, 100), year},
        {__LINE__, parts(10000, 1, 1), outOfRange("10000", "year", "1000", "9999")},
        {__LINE__, parts(-5, 1, 1), outOfRange("-5", "year", "1000", "9999")},
        {__LINE__, parts((std::int64_t{1} << 32) + 2020, 1, 1), outOfRange("4294969316", "year", "1000", "9999")},
        {__LINE__, parts(2020, 0, 0), outOfRange("0", "month", "1", "12")},
        {__LINE__, parts(2020, 100, 100, 100), outOfRange("100", "month", "1", "12")},
        {__LINE__, parts(2020, (std::uint64_t{1} << 32) + 1, 1), outOfRange("4294967297", "month", "1", "12")},
        {__LINE__, parts(2020, 2, 0, 100), outOfRange("0", "day", "1", "29")},
        {__LINE__, parts(2021, 2, 100, 100), outOfRange("100", "day", "1", "28")},
        {__LINE__, parts(2021, 4, 100), outOfRange("100", "day", "1", "30")},
        {__LINE__, parts(2021, 12, 100), outOfRange("100", "day", "1", "31")},
        {__LINE__, parts(2020, 13, 1, 100), outOfRange("100", "hours", "0", "23")},
        {__LINE__, parts(2020, 13, 1, minusOne), outOfRange("-1", "hours", "0", "23")},
        {__LINE__, parts(2020, 13, 1, 24, 100, 100), outOfRange("100", "minutes", "0", "59")},
        {__LINE__, parts(2020, 13, 1, 24, 60, 100), outOfRange("100", "seconds", "0", "59.999999999")},
        {__LINE__, parts(2020, 13, 1, 24, 60, 100, 500'000'000), outOfRange("100.5", "seconds", "0", "59.999999999")},
        {__LINE__, parts(2020, 1, 1, 24, 60, 59, 1'000'000'000), outOfRange("60", "seconds", "0", "59.999999999")},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(answerOf(create(row.parts)), row.answer) << "line " << row.line;
    }
}

TEST(Create, ThenChecksTheTimeAndThenTheDate) {
    const struct {
        int line;
        DateTimeParts parts;
        Answer answer;
    } rows[] = {
        {__LINE__, parts(2020, 2, 30), outOfRange("30", "day", "1", "29")},
        {__LINE__, parts(2020, 13, 1), outOfRange("13", "month", "1", "12")},
        {__LINE__, parts(2020, 99, 99), outOfRange("99", "month", "1", "12")},
        {__LINE__, parts(2020, 13, 1, 24), outOfRange("24", "hours", "0", "23")},
        {__LINE__, parts(2020, 13, 1, 99, 99, 99), outOfRange("99", "hours", "0", "23")},
        {__LINE__, parts(2020, 13, 1, 23, 60, 60), outOfRange("60", "minutes", "0", "59")},
        {__LINE__, parts(2020, 13, 1, 23, 59, 60, 7), outOfRange("60", "seconds", "0", "59.999999999")},
        {__LINE__, parts(2020, 4, 31, 23, 59, 59, 999'999'999), outOfRange("31", "day", "1", "30")},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(answerOf(create(row.parts)), row.answer) << "line " << row.line;
    }
}

TEST(Create, IsTheInverseOfReading) {
    for (const char* value : {"20200229235959.123456789-03:30", "10000101000000", "99991231235959.5+99:59"}) {
        EXPECT_EQ(answerOf(create(std::get<1>(parseZQTDateTime(value, 9)))), success(value));
    }
}

TEST(IntervalCreate, WritesWhatIsAboveZero) {
    const struct {
        int line;
        IntervalParts parts;
        const char* text;
    } rows[] = {
        {__LINE__, IntervalParts(), "PT0S"},
        {__LINE__, {0, 0, 0, 0, 0, 0.0, true}, "PT0S"},
        {__LINE__, {0, 0, 1, 0, 0, 0.0, true}, "-P1D"},
        {__LINE__, {1, 0, 0, 0, 0, 1.5, false}, "P1YT1.5S"},
        {__LINE__, {0, 0, 0, 0, 90, 0.0, false}, "PT90M"},
        {__LINE__, {0, 90, 0, 0, 0, 0.0, false}, "P90M"},
        {__LINE__, {1, 2, 3, 4, 5, 6.000000007, false}, "P1Y2M3DT4H5M6.000000007S"},
        {__LINE__, {0, 0, 0, 1, 0, 0.0, false}, "PT1H"},
        {__LINE__, {0, 0, 0, 0, 0, 0.000000001, true}, "-PT0.000000001S"},
        {__LINE__, {0, 0, 0, 0, 0, 59.9999999999, false}, "PT60S"},
        {__LINE__, {0, 0, 0, 0, 0, 1e12, false}, "PT1000000000000S"},
        {__LINE__, {9223372036854775807U, 0, 0, 0, 0, 0.0, false}, "P9223372036854775807Y"},
        // Compared as signed numbers, this one is not above zero.
        {__LINE__, {9223372036854775808U, 0, 0, 9223372036854775808U, 0, 0.0, true}, "PT0S"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(answerOf(intervalCreate(row.parts)), success(row.text)) << "line " << row.line;
    }
}

} // namespace
