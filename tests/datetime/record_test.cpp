// The reader of canonical values: how a text is split, what `lenient` lets through, and how a record is written.

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/record.h>

#include <gtest/gtest.h>

#include <string>

namespace {

using namespace kvt::ex::datetime;
using namespace kvt::ex::datetime::detail;
using kvt::ex::UString;

// A record or a failure in one line.
std::string lineOf(const Outcome<CanonicalRecord>& outcome) {
    if (!outcome) {
        const auto* range = std::get_if<DatePartRange>(&outcome.failure());
        return range == nullptr ? "another failure"
                                : std::string(range->value.view()) + "," + std::string(range->part) + "," +
                                      std::string(range->lowest) + "," + std::string(range->highest);
    }
    const auto text = [](std::string_view view) { return "|" + std::string(view); };
    return std::to_string(static_cast<int>(outcome->type)) + text(outcome->dateText()) +
           text(outcome->timeText()) + text(outcome->fractionText) + text(outcome->offsetText()) +
           (outcome->offsetRepaired ? "|repaired" : "");
}

std::string textAs(TemporalType kind, const CanonicalRecord& record) {
    ValueAnswer answer = answerOf(record);
    answer.kind = kind;
    return canonicalText(answer).toStdString();
}

TEST(ParseCanonical, SplitsByTheNumberOfDigits) {
    const struct {
        const char* text;
        const char* line;
    } rows[] = {
        {"20200229", "0|20200229|||"},
        {"  20200101\t", "0|20200101|||"},
        {"120000", "1||120000||"},
        {"120000-05", "2||120000||-05:00|repaired"},
        {"120000-05:00", "2||120000||-05:00"},
        {"120000.500", "1||120000|5|"},
        {"120000.000", "1||120000||"},
        {"120000.", "1||120000||"},
        {"20200101000000.5+01:00", "4|20200101|000000|5|+01:00"},
        {"20200101000000", "3|20200101|000000||"},
        {"20200101000000.0102030+0100", "4|20200101|000000|010203|+01:00|repaired"},
        {"20210229", "29,day,1,28"},
        {"240000", "24,hours,0,23"},
        {"00000101", "0,year,1000,9999"},
        {"20200101250000", "25,hours,0,23"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(lineOf(parseCanonical(row.text, false)), row.line) << row.text;
    }
}

TEST(ParseCanonical, OtherShapesAreUnsupported) {
    for (const char* text : {"",
                             " ",
                             "2020 0101",
                             "20200101+01:00",
                             "20200101.5",
                             "20200101.",
                             "20200101.0",
                             "+12",
                             "2020-01-01",
                             "abc",
                             "12345",
                             "1234567",
                             "123456789",
                             "1234567890123",
                             "123456789012345",
                             "1234567+01:00",
                             "12000a",
                             "120000.5a",
                             "120000+",
                             "120000+1",
                             "120000+9960",
                             "120000.5.5",
                             "."}) {
        for (const bool lenient : {false, true}) {
            const auto record = parseCanonical(text, lenient);
            ASSERT_TRUE(static_cast<bool>(record)) << text;
            EXPECT_EQ(record->type, TemporalType::Unsupported) << text;
            EXPECT_TRUE(record->dateText().empty()) << text;
            EXPECT_TRUE(record->timeText().empty()) << text;
            EXPECT_TRUE(record->offsetText().empty()) << text;
            EXPECT_EQ(record->lenient, lenient) << text;
        }
    }
}

TEST(ParseCanonical, LenientLiftsTheUpperBoundsOnly) {
    const struct {
        const char* text;
        const char* line;
    } rows[] = {
        {"20200231", "0|20200231|||"},
        {"20209999", "0|20209999|||"},
        {"240000", "1||240000||"},
        {"999999.5", "1||999999|5|"},
        {"20201399256161+01", "4|20201399|256161||+01:00|repaired"},
        {"20200001", "0,month,1,12"},
        {"20200100", "0,day,1,31"},
        {"20201500", "0,day,1,29"},
        {"09990101", "999,year,1000,9999"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(lineOf(parseCanonical(row.text, true)), row.line) << row.text;
    }
}

TEST(RecordText, CarriesWhatLenientLetThrough) {
    const struct {
        const char* text;
        const char* date;
        const char* time;
        const char* datetime;
        const char* canonical;
    } rows[] = {
        {"20200231", "20200302", "000000", "20200302000000", "20200302"},
        {"20201301", "20210101", "000000", "20210101000000", "20210101"},
        {"20201401", "20210201", "000000", "20210201000000", "20210201"},
        {"20221501", "20230303", "000000", "20230303000000", "20230303"}, // months drift from here on
        {"20231501", "20240302", "000000", "20240302000000", "20240302"},
        {"20209999", "20280623", "000000", "20280623000000", "20280623"},
        {"99991301", "100000101", "000000", "100000101000000", "100000101"},
        {"240000", "19700102", "000000", "19700102000000", "000000"},
        {"250000+01", "19700102+01:00", "010000+01:00", "19700102010000+01:00", "010000+01:00"},
        {"20200101250000", "20200102", "010000", "20200102010000", "20200102010000"},
        {"20191231235960.5-0030", "20200101-00:30", "000000.5-00:30", "20200101000000.5-00:30",
         "20200101000000.5-00:30"},
        {"20200101006099", "20200101", "010139", "20200101010139", "20200101010139"},
        {"20200101000000+1075", "20200101+10:75", "000000+10:75", "20200101000000+10:75",
         "20200101000000+10:75"},
        {"20200229120000.25", "20200229", "120000.25", "20200229120000.25", "20200229120000.25"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        const auto record = parseCanonical(row.text, true);
        ASSERT_TRUE(static_cast<bool>(record));
        EXPECT_EQ(textAs(TemporalType::Date, *record), row.date);
        EXPECT_EQ(textAs(TemporalType::Time, *record), row.time);
        EXPECT_EQ(textAs(TemporalType::Datetime, *record), row.datetime);
        EXPECT_EQ(canonicalText(answerOf(*record)), row.canonical);
    }
}

TEST(RecordText, CarriesAFractionThatWasRoundedUp) {
    const auto record = parseCanonical("99991231235959.9999999995", false);
    ASSERT_TRUE(static_cast<bool>(record));
    EXPECT_EQ(record->fields.nanoseconds, nanosPerSecond);
    EXPECT_EQ(canonicalText(answerOf(*record)), "100000101000000");
}

TEST(RecordText, OfNoKnownKindIsEmpty) {
    EXPECT_EQ(canonicalText(answerOf(CanonicalRecord())), "");
    EXPECT_EQ(canonicalText(ValueAnswer()), "");
}

TEST(ParseCanonical, GivesTheNumbersAsTheyAreWrittenAndTheirCountCarried) {
    const auto record = parseCanonical("20201399256161.25+01", true);
    ASSERT_TRUE(static_cast<bool>(record));
    EXPECT_EQ(partsOf(record->type, record->fields, record->offsetText())
                  .toDatetimeString(FormatType::Extended, true),
              "2020-13-99T25:61:61.25+01:00");
    EXPECT_EQ(countOf(record->fields),
              timeCount(daysFromCivil(2021, 1, 99), 93'721 * nanosPerSecond + 250'000'000));
    EXPECT_EQ(record->offset.minutes, 60);
}

TEST(ReadValue, FailsForAWrongShape) {
    const auto none = readValue(" 2020-01-01");
    ASSERT_FALSE(static_cast<bool>(none));
    EXPECT_EQ(std::get<ValueUnsupported>(none.failure()).value, " 2020-01-01");
    const auto value = readValue("20200101");
    ASSERT_TRUE(static_cast<bool>(value));
    EXPECT_EQ(value->type, TemporalType::Date);
}

TEST(InstantWithOffset, HasTheWallClockAndTheOffsetBesideIt) {
    const auto with = parseCanonical("19700101120000+02:00", false);
    ASSERT_TRUE(static_cast<bool>(with));
    EXPECT_EQ(instantWithOffset(*with).count, timeCountOfSeconds(12 * 3600, 0));
    EXPECT_EQ(instantWithOffset(*with).offsetMinutes, 120);
    EXPECT_EQ(utcCount(instantWithOffset(*with)), timeCountOfSeconds(10 * 3600, 0));
    const auto without = parseCanonical("19700101120000", false);
    ASSERT_TRUE(static_cast<bool>(without));
    EXPECT_FALSE(instantWithOffset(*without).offsetMinutes.has_value());
    EXPECT_EQ(utcCount(instantWithOffset(*without)), countOf(with->fields));
}

TEST(KindWord, IsTheWordOfMessages) {
    EXPECT_EQ(kindWord(TemporalType::Date), "date");
    EXPECT_EQ(kindWord(TemporalType::Time), "time");
    EXPECT_EQ(kindWord(TemporalType::TimeWithOffset), "time with UTC offset");
    EXPECT_EQ(kindWord(TemporalType::Datetime), "datetime");
    EXPECT_EQ(kindWord(TemporalType::DatetimeWithOffset), "datetime with UTC offset");
    EXPECT_EQ(kindWord(TemporalType::Unsupported), "unsupported");
    EXPECT_EQ(kindWord(static_cast<TemporalType>(6)), "unsupported");
    EXPECT_EQ(kindWord(static_cast<TemporalType>(0xFFFFFFFF)), "unsupported");
}

} // namespace
