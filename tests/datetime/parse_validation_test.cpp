// What parse() finds wrong in the fields of a pattern taken together, in which order, and what `lenient` makes of them.

#include "pattern_rows.h"

namespace {

using namespace kvt::ex::datetime;
using kvt::test::answerOf;
using kvt::test::expectParsed;
using kvt::test::failure;
using kvt::test::PatternRow;
using kvt::test::success;
using kvt::test::ustring;

// A row that fails with the format as the parameter.
PatternRow invalid(const char* value, const char* format, std::uint32_t message, bool lenient = false) {
    return {value, format, failure(message, {format}), lenient};
}

TEST(ParseValidation, AnOrdinalNeedsAYear) {
    expectParsed({
        invalid("032", "%j", 933081),
        invalid("032 12", "%j %H", 933081),
        invalid("1-2 032", "%m-%d %j", 933081),
        {"2020-032", "%Y-%j", success("20200201")},
        {"032 2020", "%j %Y", success("20200201")},
    });
}

TEST(ParseValidation, ADateIsWhole) {
    expectParsed({
        invalid("2020", "%Y", 933082),
        invalid("2020-01", "%Y-%m", 933082),
        invalid("2020-01", "%Y-%d", 933082),
        invalid("01", "%m", 933082),
        invalid("01", "%d", 933082),
        invalid("01-02", "%m-%d", 933082),
        invalid("01-02 12:00", "%m-%d %H:%M", 933082),
        invalid("02/xyz/2020", "%d/%b/%Y", 933082),
    });
}

TEST(ParseValidation, AnOrdinalOutweighsMonthAndDay) {
    expectParsed({
        {"2020-032 12", "%Y-%j %m", success("20200201")},
        {"2020-12-31 032", "%Y-%m-%d %j", success("20200201")},
        {"2020-02-31 032", "%Y-%m-%d %j", success("20200201")},
    });
}

TEST(ParseValidation, ATimeHasNoGaps) {
    expectParsed({
        {"12", "%H", success("120000")},
        {"12:30", "%H:%M", success("123000")},
        {"12:30:05", "%H:%M:%S", success("123005")},
        invalid("1230", "%H%S", 933086),
        invalid("30", "%M", 933086),
        invalid("30", "%S", 933086),
        invalid("30:05", "%M:%S", 933086),
        invalid("2020-01-02 30", "%Y-%m-%d %M", 933086),
    });
}

TEST(ParseValidation, AnOffsetNeedsATime) {
    expectParsed({
        invalid("Z", "%z", 933085), invalid("2020-01-02Z", "%Y-%m-%d%z", 933085),
        invalid("2020-032Z", "%Y-%j%z", 933085),
        invalid("30Z", "%M%z", 933086), // minutes without hours are told first
    });
}

TEST(ParseValidation, SomethingHasToBeGiven) {
    expectParsed({
        invalid("am", "%p", 933087),
        invalid("xyz", "%b", 933087),
        invalid("%", "%%", 933087),
        invalid("abc%", "*%%", 933087),
    });
}

TEST(ParseValidation, AMeridiemNeedsHoursFromOneToTwelve) {
    expectParsed({
        invalid("13 pm", "%H %p", 933088),
        invalid("0 am", "%H %p", 933088),
        invalid("2020-01-02 am", "%Y-%m-%d %p", 933088),
        invalid("5 am", "%s %p", 933088), // also beside seconds since 1970
        invalid("25 am", "%k %p", 933088, true),
        {"12 pm", "%H %p", success("120000")},
    });
}

TEST(ParseValidation, AnOrdinalLiesInItsYear) {
    expectParsed({
        {"2020-366", "%Y-%j", success("20201231")},
        invalid("2021-366", "%Y-%j", 933089),
        {"2021-366", "%Y-%j", success("20220101"), true},
        {"2021-999", "%Y-%j", success("20230926"), true},
    });
}

TEST(ParseValidation, ADateIsOneOfTheCalendar) {
    expectParsed({
        {"2020-02-29", "%Y-%m-%d", success("20200229")},
        {"2000-02-29", "%Y-%m-%d", success("20000229")},
        invalid("2021-02-29", "%Y-%m-%d", 933090),
        invalid("1900-02-29", "%Y-%m-%d", 933090),
        invalid("2020-02-30", "%Y-%m-%d", 933090),
        invalid("2020-04-31", "%Y-%m-%d", 933090),
    });
}

TEST(ParseValidation, LenientDatesRunOver) {
    expectParsed({
        {"2020-02-30", "%Y-%m-%d", success("20200301"), true},
        {"2021-02-31", "%Y-%m-%d", success("20210303"), true},
        {"2020-12-32", "%Y-%m-%d", success("20210101"), true},
        {"2020-01-99", "%Y-%m-%d", success("20200408"), true},
        {"2020-13-01", "%Y-%m-%d", success("20210101"), true},
        {"2020-14-29", "%Y-%m-%d", success("20210301"), true},
        {"2019-14-29", "%Y-%m-%d", success("20200229"), true},
        // Carried into the year first, so that no month drifts.
        {"2019-15-01", "%Y-%m-%d", success("20200301"), true},
        {"2020-15-01", "%Y-%m-%d", success("20210301"), true},
        {"2020-24-01", "%Y-%m-%d", success("20211201"), true},
        {"2020-25-01", "%Y-%m-%d", success("20220101"), true},
        {"2020-99-01", "%Y-%m-%d", success("20280301"), true},
        {"2020-01-02 25:61:62", "%Y-%m-%d %T", success("20200103020202"), true},
    });
}

TEST(ParseValidation, TheResultHasAYearOfFourDigits) {
    expectParsed({
        {"9999-12-31", "%Y-%m-%d", success("99991231")},
        invalid("9999-12-32", "%Y-%m-%d", 933091, true),
        invalid("9999-13-01", "%Y-%m-%d", 933091, true),
        invalid("9999-366", "%Y-%j", 933091, true),
        invalid("9999-12-31 24", "%Y-%m-%d %H", 933091, true),
        invalid("9999-366", "%Y-%j", 933089),
        {"1000-01-01", "%Y-%m-%d", success("10000101")},
    });
}

TEST(ParseValidation, ChecksComeInTheirOrder) {
    expectParsed({
        invalid("032 30", "%j %M", 933081),                    // before the time
        invalid("01 30", "%m %M", 933082),                     // the date before the time
        invalid("01Z", "%m%z", 933082),                        // the date before the offset
        invalid("30 amZ", "%S %p%z", 933086),                  // the time before the meridiem
        invalid("amZ", "%p%z", 933085),                        // the offset before nothing at all
        invalid("2021-02-29 13 am", "%Y-%m-%d %H %p", 933088), // the meridiem before the date
        invalid("2021-366 13 am", "%Y-%j %H %p", 933088),
    });
}

TEST(ParseValidation, AMismatchIsToldFirst) {
    expectParsed({
        {"032x", "%j$", kvt::test::mismatch("%j", "$")},
        {"2021-02-29x", "%Y-%m-%d$", kvt::test::mismatch("%Y-%m-%d", "$")},
    });
}

TEST(ParseValidation, NamesTheTrimmedFormat) {
    EXPECT_EQ(answerOf(parse(ustring(" 2020 "), ustring(" %Y\t"), false)), failure(933082, {"%Y"}));
}

} // namespace
