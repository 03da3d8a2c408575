#include "answer.h"

#include <kvt/datetime/datetime.h>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::failure;
using kvt::test::outOfRange;
using kvt::test::repaired;
using kvt::test::success;

constexpr CastToTemporalType toDate = CastToTemporalType::Date;
constexpr CastToTemporalType toTime = CastToTemporalType::Time;
constexpr CastToTemporalType toDatetime = CastToTemporalType::Datetime;
constexpr CastToTemporalType toUnknown = CastToTemporalType::Unknown;
constexpr auto toNothing = static_cast<CastToTemporalType>(4);
constexpr auto toLargest = static_cast<CastToTemporalType>(0xFFFFFFFF);

struct Row {
    int line;
    const char* value;
    CastToTemporalType target;
    Answer answer;
};

void expectRows(const std::vector<Row>& rows) {
    for (const Row& row : rows) {
        EXPECT_EQ(answerOf(cast(row.value, row.target)), row.answer)
            << "line " << row.line << ": " << row.value;
    }
}

TEST(Cast, ADateGetsMidnight) {
    expectRows({
        {__LINE__, "20200102", toDate, success("20200102")},
        {__LINE__, "20200102", toTime, success("000000")},
        {__LINE__, "20200102", toDatetime, success("20200102000000")},
        {__LINE__, "\t20200102\v", toDate, success("20200102")},
        {__LINE__, "20200102", toUnknown, failure(933052, {"date", "unknown"})},
        {__LINE__, "20200102", toNothing, failure(933052, {"date"})},
        {__LINE__, "20200102", toLargest, failure(933052, {"date"})},
    });
}

TEST(Cast, ATimeStaysATimeOrFails) {
    expectRows({
        {__LINE__, "120000", toTime, success("120000")},
        {__LINE__, "120000.500", toTime, success("120000.5")},
        {__LINE__, "120000.000", toTime, success("120000")},
        {__LINE__, "120000.", toTime, success("120000")},
        {__LINE__, "120000.5-05", toTime, repaired("120000.5-05:00")},
        {__LINE__, "120000.5-05:00", toTime, success("120000.5-05:00")},
        {__LINE__, "120000-00:00", toTime, success("120000-00:00")}, // the text, not the minutes
        {__LINE__, "120000", toDate, failure(933052, {"time", "date", "datetime", "unknown"})},
        {__LINE__, "120000-05", toDate, failure(933052, {"time", "date", "datetime", "unknown"})},
        {__LINE__, "120000", toDatetime, failure(933052, {"time", "datetime", "unknown"})},
        {__LINE__, "120000-05:00", toDatetime, failure(933052, {"time", "datetime", "unknown"})},
        {__LINE__, "120000", toUnknown, failure(933052, {"time", "unknown"})},
        {__LINE__, "120000-05:00", toUnknown, failure(933052, {"time", "unknown"})},
        {__LINE__, "120000", toNothing, failure(933052, {"time"})},
        {__LINE__, "120000+01:00", toLargest, failure(933052, {"time"})},
    });
}

TEST(Cast, ADatetimeLosesWhatTheTargetHasNot) {
    expectRows({
        {__LINE__, "20200102120000", toDate, success("20200102")},
        {__LINE__, "20200102120000", toTime, success("120000")},
        {__LINE__, "20200102120000.50", toDatetime, success("20200102120000.5")},
        {__LINE__, "20200102120000.5+0100", toDatetime, repaired("20200102120000.5+01:00")},
        {__LINE__, "20200102120000.5+01", toTime, repaired("120000.5+01:00")},
        {__LINE__, "20200102120000.5+0100", toDate, success("20200102")},
        {__LINE__, "20200102120000+01:00", toDatetime, success("20200102120000+01:00")},
        {__LINE__, "20200102120000+01:00", toTime, success("120000+01:00")},
        {__LINE__, "20200102120000+1075", toDatetime, repaired("20200102120000+10:75")},
        {__LINE__, "20200102120000", toUnknown, failure(933052, {"datetime", "unknown"})},
        {__LINE__, "20200102120000+01:00", toUnknown, failure(933052, {"datetime", "unknown"})},
        {__LINE__, "20200102120000", toNothing, failure(933052, {"datetime"})},
        {__LINE__, "20200102120000+01:00", toLargest, failure(933052, {"datetime"})},
    });
}

TEST(Cast, AFractionThatRoundsUpCarries) {
    expectRows({
        {__LINE__, "20191231235959.9999999999", toDatetime, success("20200101000000")},
        {__LINE__, "20191231235959.9999999999", toDate, success("20200101")},
        {__LINE__, "20191231235959.9999999999+0000", toTime, repaired("000000+00:00")},
        {__LINE__, "235959.9999999999", toTime, success("000000")},
    });
}

// A text that is canonical already is taken over as it stands; all others are made of their numbers, as by parse().
TEST(Cast, OfAValueToItsOwnKindIsItsCanonicalText) {
    struct Body {
        const char* text;
        CastToTemporalType kind;
    };
    const Body bodies[] = {{"20200229", toDate}, {"235959", toTime}, {"99990102030405", toDatetime}};
    const char* const fractions[] = {
        "",           ".",           ".5",          ".500",           ".0",
        ".000000001", ".0000000001", ".9999999995", ".123456789",     ".1234567890",
        ".999999999", ".00000000",   ".1234567891", ".12345678949999"};
    const char* const offsets[] = {"", "+01:00", "+0100", "+01", "-00:00", "+10:75", "-1075", "+99:59"};
    int values = 0;
    for (const Body& body : bodies) {
        for (const std::string fraction : fractions) {
            for (const std::string offset : offsets) {
                for (const std::string space : {"", " ", "\t\n"}) {
                    const std::string value = space + body.text + fraction + offset + space;
                    const kvt::ex::UString<0> text(value.c_str());
                    const auto expected = parse(text, "ZQT", false);
                    if (std::get<0>(expected) == ReturnState::Success) {
                        ++values;
                        EXPECT_EQ(std::get<1>(cast(text, body.kind)), std::get<1>(expected)) << value;
                    }
                }
            }
        }
    }
    EXPECT_GT(values, 300);
}

TEST(Cast, RefusesWhatIsNoValueBeforeItLooksAtTheTarget) {
    for (const CastToTemporalType target : {toDate, toTime, toDatetime, toUnknown, toNothing}) {
        EXPECT_EQ(answerOf(cast("abc", target)), failure(933063, {"abc"}));
        EXPECT_EQ(answerOf(cast("", target)), failure(933063, {""}));
        EXPECT_EQ(answerOf(cast(" 2020-01-02 ", target)), failure(933063, {" 2020-01-02 "})); // as given
        EXPECT_EQ(answerOf(cast("20210229", target)), outOfRange("29", "day", "1", "28"));
        EXPECT_EQ(answerOf(cast("240000", target)), outOfRange("24", "hours", "0", "23"));
    }
}

} // namespace
