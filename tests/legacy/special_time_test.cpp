// What is special: moments that arithmetic in whole seconds from a checked date does not reach, and the texts that a
// copy takes along.
#include "legacy_support.h"
#include <support/private_member.h>

#include <kvt/legacy/detail/calendar.h>

#include <cstring>
#include <memory>

namespace kvt::test {

struct ImplOfDate {
    using Type = std::unique_ptr<ex::detail::ObsoleteDateImpl> ObsoleteDate::*;
    friend Type memberOf(ImplOfDate);
};
struct ImplOfTime {
    using Type = std::unique_ptr<ex::detail::ObsoleteTimeImpl> ObsoleteTime::*;
    friend Type memberOf(ImplOfTime);
};
template struct Opens<ImplOfDate, &ObsoleteDate::impl_>;
template struct Opens<ImplOfTime, &ObsoleteTime::impl_>;

namespace {

using boost::date_time::special_values;

ex::detail::ObsoleteDateImpl& implOf(ObsoleteDate& date) {
    return *(date.*memberOf(ImplOfDate()));
}

ex::detail::ObsoleteTimeImpl& implOf(ObsoleteTime& time) {
    return *(time.*memberOf(ImplOfTime()));
}

ObsoleteTime specialTime(special_values value) {
    ObsoleteTime time(ObsoleteDate(1, 1, 2000), 0, 0, 0);
    implOf(time).time = boost::posix_time::ptime(value);
    return time;
}

std::string bytesOf(const std::tm& time) {
    return {reinterpret_cast<const char*>(&time), sizeof time};
}

struct SpecialRow {
    int line;
    special_values value;
    const char* text;
    const char* extractFailure;
};

const SpecialRow specialRows[] = {
    {__LINE__, boost::date_time::not_a_date_time, "not-a-date-time",
     "out_of_range: tm unable to handle not-a-date-time value"},
    {__LINE__, boost::date_time::neg_infin, "-infinity",
     "out_of_range: tm unable to handle -infinity date value"},
    {__LINE__, boost::date_time::pos_infin, "+infinity",
     "out_of_range: tm unable to handle +infinity date value"},
};

TEST(ObsoleteTimeSpecial, OnlyNotADateTimeIsInvalid) {
    for (const SpecialRow& row : specialRows) {
        EXPECT_EQ(specialTime(row.value).isValid(), row.value != boost::date_time::not_a_date_time)
            << "row " << row.line;
    }
}

TEST(ObsoleteTimeSpecial, HasItsNameWhateverTheFormat) {
    for (const SpecialRow& row : specialRows) {
        for (const char* format : {"%Y-%m-%d %H:%M:%S", "%f", "", "text"}) {
            EXPECT_EQ(specialTime(row.value).asString(format), row.text) << "row " << row.line << format;
        }
    }
}

TEST(ObsoleteTimeSpecial, IsNotExtractedAndLeavesTheFieldsAlone) {
    for (const SpecialRow& row : specialRows) {
        std::tm filled;
        std::memset(&filled, 0x5A, sizeof filled);
        const std::string before = bytesOf(filled);
        EXPECT_EQ(failureOf([&] { specialTime(row.value).extract(&filled); }), row.extractFailure)
            << "row " << row.line;
        EXPECT_EQ(bytesOf(filled), before) << "row " << row.line;
    }
}

TEST(ObsoleteTimeSpecial, StaysUnderArithmetic) {
    for (const SpecialRow& row : specialRows) {
        for (const unsigned long seconds : {0UL, 1UL, 2147483647UL, 2147483648UL, 4294967295UL}) {
            EXPECT_EQ((specialTime(row.value) + seconds).asString(""), row.text) << "row " << row.line;
            EXPECT_EQ((specialTime(row.value) - seconds).asString(""), row.text) << "row " << row.line;
        }
    }
}

TEST(ObsoleteTimeSpecial, StandsInTheOrderOfTheCounts) {
    using namespace boost::date_time;
    ObsoleteTime ascending[] = {specialTime(neg_infin), ObsoleteTime(ObsoleteDate(1, 1, 2000), 0, 0, 0),
                                specialTime(not_a_date_time), specialTime(pos_infin)};
    for (std::size_t left = 0; left < 4; ++left) {
        for (std::size_t right = 0; right < 4; ++right) {
            EXPECT_EQ(ascending[left] < ascending[right], left < right) << left << ' ' << right;
            EXPECT_EQ(ascending[left] > ascending[right], left > right) << left << ' ' << right;
        }
    }
}

TEST(ObsoleteDateImpl, HoldsTheNumbersThatAreGiven) {
    const auto number = [](special_values value) { return boost::gregorian::date(value).day_number(); };
    EXPECT_EQ(number(boost::date_time::not_a_date_time), notADate);
    EXPECT_EQ(number(boost::date_time::pos_infin), positiveInfinity);
    EXPECT_EQ(number(boost::date_time::neg_infin), negativeInfinity);
    ObsoleteDate date = dateNumbered(123456789);
    EXPECT_EQ(implOf(date).date.day_number(), 123456789U);
}

TEST(ObsoleteDateImpl, TextIsThatOfTheLastAsString) {
    ObsoleteDate date(1, 2, 2020);
    EXPECT_EQ(implOf(date).text, "");
    EXPECT_EQ(date.asString("%Y"), implOf(date).text);
    EXPECT_EQ(date.asString(), implOf(date).text);
    ObsoleteDate copy(date);
    EXPECT_EQ(implOf(copy).text, "02/01/20");
    ObsoleteDate assigned(1, 1, 2000);
    assigned = date;
    EXPECT_EQ(implOf(assigned).text, "02/01/20");
    ObsoleteDate before = date++;
    EXPECT_EQ(implOf(before).text, "02/01/20");
    EXPECT_EQ(implOf(date).text, "02/01/20");
    ObsoleteDate sum = date + 1;
    EXPECT_EQ(implOf(sum).text, "");
}

TEST(ObsoleteTimeImpl, TextIsThatOfTheLastAsString) {
    ObsoleteTime time(ObsoleteDate(1, 2, 2020), 13, 2, 3);
    EXPECT_EQ(implOf(time).text, "");
    EXPECT_EQ(time.asString("%H"), implOf(time).text);
    ObsoleteTime copy(time);
    EXPECT_EQ(implOf(copy).text, "13");
    ObsoleteTime assigned(ObsoleteDate(1, 1, 2000), 0, 0, 0);
    assigned = time;
    EXPECT_EQ(implOf(assigned).text, "13");
    const ObsoleteTime& itself = assigned;
    assigned = itself;
    EXPECT_EQ(implOf(assigned).text, "13");
    ObsoleteTime sum = time + 1;
    EXPECT_EQ(implOf(sum).text, "");
    ObsoleteTime difference = time - 1;
    EXPECT_EQ(implOf(difference).text, "");
}

} // namespace
} // namespace kvt::test
