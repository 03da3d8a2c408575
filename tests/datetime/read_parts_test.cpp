// parseZQTDateTime: values into fields, with rounding.

#include "answer.h"
#include "naive_calendar.h"

#include <kvt/datetime/datetime.h>

#include <random>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::NaiveDateTime;
using kvt::test::ustring;

// All fields in one line: 2020-1-2 3:4:5 6 +01:00 type.
std::string fieldsOf(const DateTimeParts& parts) {
    char text[128];
    std::snprintf(text, sizeof text, "%d-%d-%d %d:%d:%d %d ", parts.year(), parts.month(), parts.day(),
                  static_cast<int>(parts.hours()), static_cast<int>(parts.minutes()),
                  static_cast<int>(parts.seconds()), static_cast<int>(parts.nanoseconds()));
    return text + parts.offset().toStdString() + " " + std::to_string(static_cast<int>(parts.type()));
}

const char* const defaultFields = "1970-1-1 0:0:0 0  5";

void expectFields(const char* value, std::int16_t precision, const std::string& fields) {
    const PartsResult result = parseZQTDateTime(value, precision);
    EXPECT_EQ(std::get<0>(result), ReturnState::Success) << value << " at " << precision;
    EXPECT_EQ(fieldsOf(std::get<1>(result)), fields) << value << " at " << precision;
    EXPECT_FALSE(std::get<2>(result).has_value()) << value << " at " << precision;
}

void expectFailure(const char* value, std::int16_t precision, const Answer& expected) {
    const PartsResult result = parseZQTDateTime(value, precision);
    EXPECT_EQ(kvt::test::answerWithoutValue(result), expected) << value << " at " << precision;
    EXPECT_EQ(fieldsOf(std::get<1>(result)), defaultFields) << value << " at " << precision;
}

TEST(ParseZQTDateTime, ReadsEachKind) {
    expectFields("20200102", 9, "2020-1-2 0:0:0 0  0");
    expectFields("030405", 9, "1970-1-1 3:4:5 0  1");
    expectFields("030405.25", 9, "1970-1-1 3:4:5 250000000  1");
    expectFields("030405-05", 9, "1970-1-1 3:4:5 0 -05:00 2");
    expectFields("20200102030405.000000001", 9, "2020-1-2 3:4:5 1  3");
    expectFields(" 20200102030405+1075\n", 9, "2020-1-2 3:4:5 0 +10:75 4");
    expectFields("10000101000000", 9, "1000-1-1 0:0:0 0  3");
    expectFields("99991231235959.999999999", 9, "9999-12-31 23:59:59 999999999  3");
}

TEST(ParseZQTDateTime, FractionIsReadAsADouble) {
    expectFields("000000.1234567894", 9, "1970-1-1 0:0:0 123456789  1");
    expectFields("000000.1234567896", 9, "1970-1-1 0:0:0 123456790  1");
    expectFields("000000.9999999999", 9, "1970-1-1 0:0:0 1000000000  1"); // not carried
    expectFields("000000.00000000049", 9, "1970-1-1 0:0:0 0  1");
    expectFields("000000.00000000051", 9, "1970-1-1 0:0:0 1  1");
    expectFields("000000.12300000000000000000000000000000000000000000000", 9, "1970-1-1 0:0:0 123000000  1");
    expectFields("000000.12345678940000000000000000000000000000000000001", 9, "1970-1-1 0:0:0 123456789  1");
    expectFields(("000000.5" + std::string(5000, '0') + "1").c_str(), 9, "1970-1-1 0:0:0 500000000  1");
}

TEST(ParseZQTDateTime, RefusesOtherPrecisions) {
    for (const int precision : {-32768, -2, 10, 11, 32767}) {
        expectFailure("20200102", static_cast<std::int16_t>(precision), kvt::test::genericFailure());
        expectFailure("abc", static_cast<std::int16_t>(precision), kvt::test::genericFailure());
    }
}

TEST(ParseZQTDateTime, RefusesWhatIsNoValue) {
    for (const char* value :
         {"", "  ", "abc", "2020-01-02", "2020 0101", "20200101+01:00", "20200101.5", "20200101.", "+12", "1200", "12000",
          "1200000", "2020010112000", "202001011200000", "120000+1", "120000.5.5", "120000.a", "12a000", "120000+01:00x",
          "-120000", "120000Z"}) {
        expectFailure(value, 9, kvt::test::failure(933063, {value}));
    }
}

TEST(ParseZQTDateTime, NamesTheFirstPartThatIsOutOfRange) {
    const struct {
        const char* value;
        Answer failure;
    } rows[] = {
        {"20210229", kvt::test::outOfRange("29", "day", "1", "28")},
        {"20200230", kvt::test::outOfRange("30", "day", "1", "29")},
        {"19000229", kvt::test::outOfRange("29", "day", "1", "28")},
        {"20200431", kvt::test::outOfRange("31", "day", "1", "30")},
        {"20200132", kvt::test::outOfRange("32", "day", "1", "31")},
        {"20200100", kvt::test::outOfRange("0", "day", "1", "31")},
        {"20200001", kvt::test::outOfRange("0", "month", "1", "12")},
        {"20201301", kvt::test::outOfRange("13", "month", "1", "12")},
        {"20201300", kvt::test::outOfRange("13", "month", "1", "12")},
        {"00000101", kvt::test::outOfRange("0", "year", "1000", "9999")},
        {"09991301", kvt::test::outOfRange("999", "year", "1000", "9999")},
        {"240000", kvt::test::outOfRange("24", "hours", "0", "23")},
        {"236000", kvt::test::outOfRange("60", "minutes", "0", "59")},
        {"235960", kvt::test::outOfRange("60", "seconds", "0", "59.999999999")},
        {"235999.5", kvt::test::outOfRange("99", "seconds", "0", "59.999999999")},
        {"246060", kvt::test::outOfRange("24", "hours", "0", "23")},
        {"236060", kvt::test::outOfRange("60", "minutes", "0", "59")},
        {"00001301240000", kvt::test::outOfRange("24", "hours", "0", "23")}, // the time comes first
        {"20201301235960+01:00", kvt::test::outOfRange("60", "seconds", "0", "59.999999999")},
    };
    for (const auto& row : rows) {
        expectFailure(row.value, 9, row.failure);
        expectFailure(row.value, -1, row.failure);
    }
}

TEST(ParseZQTDateTime, RoundsToTheMinuteAndLeavesTheSeconds) {
    expectFields("20200102030429.9", -1, "2020-1-2 3:4:29 900000000  3");
    expectFields("20200102030430", -1, "2020-1-2 3:5:30 0  3");
    expectFields("20200102030459.9", -1, "2020-1-2 3:5:59 900000000  3");
    expectFields("20201231235930+0100", -1, "2021-1-1 0:0:30 0 +01:00 4");
    expectFields("20200102", -1, "2020-1-2 0:0:0 0  0");
}

TEST(ParseZQTDateTime, RoundsToTheSecond) {
    expectFields("20200102030405.499999999", 0, "2020-1-2 3:4:5 0  3");
    expectFields("20200102030405.5", 0, "2020-1-2 3:4:6 0  3");
    expectFields("20200102030459.5", 0, "2020-1-2 3:5:0 0  3");
    expectFields("20200228235959.5", 0, "2020-2-29 0:0:0 0  3");
    expectFields("20200102030405", 0, "2020-1-2 3:4:5 0  3");
}

TEST(ParseZQTDateTime, RoundsToDecimals) {
    expectFields("20200102030405.125", 2, "2020-1-2 3:4:5 130000000  3");
    expectFields("20200102030405.124999999", 2, "2020-1-2 3:4:5 120000000  3");
    expectFields("20200102030405.123456789", 8, "2020-1-2 3:4:5 123456790  3");
    expectFields("20200102030405.95", 1, "2020-1-2 3:4:6 0  3");
    expectFields("99991231235959.999999999", 8, "10000-1-1 0:0:0 0  3"); // no bound behind the rounding
}

TEST(ParseZQTDateTime, CarryingMakesADatetimeOfATime) {
    expectFields("120059.5", 0, "1970-1-1 12:1:0 0  3");
    expectFields("120059.4", 0, "1970-1-1 12:0:59 0  1");
    expectFields("235959.9999+10:75", 3, "1970-1-2 0:0:0 0 +11:15 4"); // and writes the offset anew
    expectFields("235959.9994+10:75", 3, "1970-1-1 23:59:59 999000000 +10:75 2");
}

TEST(ParseZQTDateTime, ADatePassesAtAnyPrecision) {
    for (std::int16_t precision = -1; precision <= 9; ++precision) {
        expectFields("20200102", precision, "2020-1-2 0:0:0 0  0");
    }
}

// Rounds half up at a decimal by text: the digits behind it are looked at, and the carry goes through a count.
kvt::test::Int128 naivelyRounded(const NaiveDateTime& at, int precision) {
    const kvt::test::Int128 nanoseconds = kvt::test::naiveNanoseconds(at);
    char digits[16];
    std::snprintf(digits, sizeof digits, "%09d", at.nanoseconds);
    std::string kept(digits, static_cast<std::size_t>(precision));
    kept.resize(9, '0');
    kvt::test::Int128 rounded = nanoseconds - at.nanoseconds + std::stoi(kept);
    if (precision < 9 && digits[precision] >= '5') {
        int unit = 1;
        for (int i = precision; i < 9; ++i) {
            unit *= 10;
        }
        rounded += unit;
    }
    return rounded;
}

TEST(ParseZQTDateTime, AgreesWithRoundingByText) {
    std::mt19937_64 random(6);
    for (int i = 0; i < 100'000; ++i) {
        NaiveDateTime at{1000 + static_cast<std::int64_t>(random() % 9000), 1 + static_cast<int>(random() % 12), 1};
        at.day = 1 + static_cast<int>(random() % static_cast<unsigned>(kvt::test::daysInMonth(at.year, at.month)));
        at.hours = static_cast<int>(random() % 24);
        at.minutes = random() % 3 == 0 ? 59 : static_cast<int>(random() % 60);
        at.seconds = random() % 3 == 0 ? 59 : static_cast<int>(random() % 60);
        at.nanoseconds = static_cast<int>(random() % 1'000'000'000);
        if (random() % 2 == 0) { // near and at the halves
            int unit = 1;
            for (auto power = random() % 9; power > 0; --power) {
                unit *= 10;
            }
            at.nanoseconds = at.nanoseconds / unit * unit + unit / 2 - static_cast<int>(random() % 2);
            at.nanoseconds = std::max(at.nanoseconds, 0);
        }
        const int precision = static_cast<int>(random() % 10);
        const NaiveDateTime expected = kvt::test::naiveDateTime(naivelyRounded(at, precision));
        const std::string value = kvt::test::naiveText(at);
        const PartsResult result = parseZQTDateTime(ustring(value), static_cast<std::int16_t>(precision));
        ASSERT_EQ(std::get<0>(result), ReturnState::Success) << value;
        ASSERT_EQ(std::get<1>(result).toDatetimeString(FormatType::Compact, true), ustring(kvt::test::naiveText(expected)))
            << value << " at " << precision;
    }
}

} // namespace
