// The present day and moment, by the machine's clock and zone.
#include "legacy_support.h"
#include "machine_clock.h"

#include <optional>

namespace kvt::test {
namespace {

const std::string noLocalTime = "runtime_error: could not convert calendar time to local time";
const char* const allOfIt = "%Y-%m-%d %H:%M:%S";

TEST(ObsoleteNow, IsTheLocalDateAndTime) {
    const LocalTime clock(calendarTime(2024, 2, 29, 23, 59, 58));
    EXPECT_EQ(ObsoleteDate().asString("%Y-%m-%d"), "2024-02-29");
    EXPECT_EQ(ObsoleteTime().asString(allOfIt), "2024-02-29 23:59:58");
    EXPECT_EQ(ObsoleteTime().asString("%f"), "000000");
}

TEST(ObsoleteNow, ATimeOfDayAloneIsOneOfToday) {
    const LocalTime clock(calendarTime(2024, 2, 29, 23, 59, 58));
    EXPECT_EQ(ObsoleteTime(1, 2, 3).asString(allOfIt), "2024-02-29 01:02:03");
    EXPECT_EQ(ObsoleteTime(25, 0, 0).asString(allOfIt), "2024-03-01 01:00:00");
}

TEST(ObsoleteNow, ALeapSecondIsTheNextMinute) {
    const LocalTime clock(calendarTime(2016, 12, 31, 23, 59, 60));
    EXPECT_EQ(ObsoleteTime().asString(allOfIt), "2017-01-01 00:00:00");
    EXPECT_EQ(ObsoleteDate().asString("%Y-%m-%d"), "2016-12-31");
}

TEST(ObsoleteNow, FailsWhereThereIsNoLocalTime) {
    const LocalTime clock(std::nullopt);
    EXPECT_EQ(failureOf([] { ObsoleteDate(); }), noLocalTime);
    EXPECT_EQ(failureOf([] { ObsoleteTime(); }), noLocalTime);
    EXPECT_EQ(failureOf([] { ObsoleteTime(1, 2, 3); }), noLocalTime);
}

TEST(ObsoleteNow, FailsAsADateWhereTheClockIsOutsideTheCalendar) {
    const LocalTime clock(calendarTime(10001, 1, 1));
    EXPECT_EQ(failureOf([] { ObsoleteDate(); }), badYear);
    EXPECT_EQ(failureOf([] { ObsoleteTime(); }), badYear);
}

// By the real clock: between a moment before and a moment after.
TEST(ObsoleteNow, IsNowByTheClockOfTheMachine) {
    const auto moment = [] {
        const std::time_t seconds = std::time(nullptr);
        std::tm local = *std::localtime(&seconds);
        return ObsoleteTime(&local);
    };
    ObsoleteTime before = moment();
    ObsoleteTime now;
    ObsoleteTime after = moment();
    EXPECT_FALSE(now < before);
    EXPECT_FALSE(now > after);
}

} // namespace
} // namespace kvt::test
