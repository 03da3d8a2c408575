// parse(): how much of the value a number takes, and what it may be; seconds with their fraction.

#include "pattern_rows.h"

#include <kvt/datetime/datetime.h>

#include <string>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::answerOf;
using kvt::test::expectParsed;
using kvt::test::failure;
using kvt::test::mismatch;
using kvt::test::success;
using kvt::test::ustring;

// ---- Numbers

TEST(ParseNumbers, TakeUpToTheirWidth) {
    expectParsed({
        {"2020-1-2", "%Y-%m-%d", success("20200102")},
        {"2020-01-02", "%Y-%m-%d", success("20200102")},
        {"2020-1-2 3:4:5", "%Y-%m-%d %H:%M:%S", success("20200102030405")},
        {"20201-01-02", "%Y-%m-%d", mismatch("%Y", "-%m-%d")},
        {"2020-001-02", "%Y-%m-%d", mismatch("%Y-", "%m-%d")}, // 00 is out of range
        {"2020-x-02", "%Y-%m-%d", mismatch("%Y-", "%m-%d")},
        {"2020--1-02", "%Y-%m-%d", mismatch("%Y-", "%m-%d")},
    });
}

TEST(ParseNumbers, TakeTheirWholeWidthBehindAnotherNumber) {
    expectParsed({
        {"20200102", "%Y%m%d", success("20200102")},
        {"2020012", "%Y%m%d", mismatch("%Y%m", "%d")},
        {"202001x2", "%Y%m%d", mismatch("%Y%m", "%d")},
        {"2020-1-2 3x", "%Y-%m-%d %H%M", mismatch("%Y-%m-%d %H", "%M")},
        {"2020-1-2 0304", "%Y-%m-%d %H%M", success("20200102030400")},
        {"03045", "%H%M%S", mismatch("%H%M", "%S")},
        {"030405", "%H%M%S", success("030405")},
        {"03:04:0506", "%T%d", failure(933082, {"%T%d"})},
        {"03:04:056", "%T%d", mismatch("%H:%M:%S", "%d")},
        {"2020Jan2", "%Y%b%d", success("20200102")},
        {"2020January2", "%Y%B%d", success("20200102")},
        {"1am", "%I%p", success("010000")},
        {"2020%1%2", "%Y%%%m%%%d", success("20200102")},
        {"2020x1x2", "%Y?%m?%d", success("20200102")},
        {"123:4:5", "%d%T", mismatch("%d", "%T")},
        {"+01:001", "%z%d", mismatch("%z", "%d")},
        {"51", "%s%d", mismatch("%s", "%d")},
    });
}

TEST(ParseNumbers, TheDayOfTheYearNeverTakesItsWholeWidth) {
    expectParsed({
        {"20201", "%Y%j", success("20200101")},
        {"202032", "%Y%j", success("20200201")},
        {"2020366", "%Y%j", success("20201231")},
        {"2020-1-03", "%Y-%j-%H", success("20200101030000")},
        {"2020-1303", "%Y-%j%H", mismatch("%Y-%j", "%H")}, // but it is a number
    });
}

TEST(ParseNumbers, HaveBounds) {
    const struct {
        const char* flag;
        const char* low;      // the lowest value
        const char* belowLow; // null where no text is below
        const char* high;
        const char* aboveHigh;
        bool lenientLiftsHigh;
    } rows[] = {
        {"%Y", "1000", "999", "9999", nullptr, false},
        {"%m", "1", "0", "12", "13", true},
        {"%N", "1", "0", "12", "13", true},
        {"%d", "1", "0", "31", "32", true},
        {"%e", "1", "0", "31", "32", true},
        {"%j", "1", "0", "366", "367", true},
        {"%H", "0", nullptr, "23", "24", true},
        {"%k", "0", nullptr, "23", "24", true},
        {"%I", "1", "0", "12", "13", false},
        {"%l", "1", "0", "12", "13", false},
        {"%M", "0", nullptr, "59", "60", true},
        {"%S", "0", nullptr, "59", "60", true},
    };
    for (const auto& row : rows) {
        const std::string flag = row.flag;
        for (const bool lenient : {false, true}) {
            const auto messageOf = [&](const char* value) {
                return answerOf(parse(ustring(value), ustring(flag), lenient)).message;
            };
            EXPECT_NE(messageOf(row.low), 933067u) << flag << " " << row.low;
            EXPECT_NE(messageOf(row.high), 933067u) << flag << " " << row.high;
            if (row.belowLow != nullptr) {
                EXPECT_EQ(messageOf(row.belowLow), 933067u) << flag << " " << row.belowLow;
            }
            if (row.aboveHigh != nullptr) {
                EXPECT_EQ(messageOf(row.aboveHigh) == 933067, !(lenient && row.lenientLiftsHigh))
                    << flag << " " << row.aboveHigh << (lenient ? " lenient" : "");
            }
        }
    }
}

TEST(ParseNumbers, SynonymsReadTheSame) {
    expectParsed({
        {"2020-1-02", "%Y-%N-%e", success("20200102")},
        {"2020-01-2", "%Y-%N-%e", success("20200102")},
        {"2020-1-2 7:05", "%Y-%m-%d %k:%M", success("20200102070500")},
        {"2020-1-2 7:05 pm", "%Y-%m-%d %l:%M %p", success("20200102190500")},
    });
}

TEST(ParseNumbers, TheLastOfTheSameFieldCounts) {
    expectParsed(
        {{"2020-01-02-03", "%Y-%m-%d-%e", success("20200103")}, {"3 4", "%H %I", success("040000")}});
}

// ---- Seconds and their fraction

TEST(ParseSeconds, TakeAFractionOfAnyLength) {
    expectParsed({
        {"12:30:05.25", "%H:%M:%S", success("123005.25")},
        {"12:30:5.250000", "%H:%M:%S", success("123005.25")},
        {"12:30:05.", "%H:%M:%S$", success("123005")},
        {"12:30:05.0", "%H:%M:%S$", success("123005")},
        {"12:30:05.123456789", "%H:%M:%S", success("123005.123456789")},
        {"12:30:05.1234567894", "%H:%M:%S", success("123005.123456789")},
        {"12:30:05.1234567896", "%H:%M:%S", success("123005.12345679")},
        {"12:30:05,25", "%H:%M:%S", success("123005")},
        {"12:30:05.25.5", "%H:%M:%S$", mismatch("%H:%M:%S", "$")},
        {"12:30:05.25x", "%H:%M:%Sx$", success("123005.25")},
    });
}

TEST(ParseSeconds, AFractionThatRoundsUpRunsOver) {
    expectParsed({
        {"12:30:59.9999999999", "%H:%M:%S", success("123100")},
        {"23:59:59.9999999999", "%H:%M:%S", success("000000")},
        {"2020-12-31 23:59:59.9999999999", "%Y-%m-%d %T", success("20210101000000")},
        {"9999-12-31 23:59:59.9999999999", "%Y-%m-%d %T", failure(933091, {"%Y-%m-%d %T"})},
        {"2020-366 23:59:59.9999999999", "%Y-%j %T", failure(933089, {"%Y-%j %T"})},
    });
}

TEST(ParseSeconds, RunOverWhenLenient) {
    expectParsed({
        {"12:30:60", "%H:%M:%S", mismatch("%H:%M:", "%S")},
        {"12:30:60", "%H:%M:%S", success("123100"), true},
        {"12:99:99.5", "%H:%M:%S", success("134039.5"), true},
        {"2020-01-02 99:00", "%Y-%m-%d %H:%M", success("20200106030000"), true},
    });
}

TEST(ParseTime, TStandsForHoursMinutesSeconds) {
    expectParsed({
        {"12:30:05.25", "%T", success("123005.25")},
        {"1:2:3", "%T$", success("010203")},
        {"2020-01-02T12:30:05", "%Y-%m-%dT%T", success("20200102123005")},
    });
}

TEST(ParseTime, AFailureWithinTIsThatOfT) {
    expectParsed({
        {"12:3x", "at %T$", mismatch("", "at %T$")},
        {"at 12:3x", "at %T$", mismatch("at ", "%T$")},
        {"at 12:30:61", "at %T$", mismatch("at ", "%T$")},
        {"at x", "at %T$", mismatch("at ", "%T$")},
    });
}

// Behind it, what has matched is told as it was read.
TEST(ParseTime, AFailureBehindTShowsItReplaced) {
    expectParsed({
        {"12:30:05x", "%T$", mismatch("%H:%M:%S", "$")},
        {"12:30:05 1:2", "%T %T", mismatch("%H:%M:%S ", "%T")},
        {"%T aT 12:30:05x", "%%T *T %T$", mismatch("%%T *T %H:%M:%S", "$")},
    });
}

} // namespace
