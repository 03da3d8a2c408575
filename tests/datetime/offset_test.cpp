#include "answer.h"

#include <kvt/datetime/utc_offset.h>

#include <string>

namespace {

using kvt::ex::datetime::ZQTDateTimeUTCOffset;
using kvt::test::ustring;

TEST(RepairOffset, TakesThreeForms) {
    const struct {
        const char* text;
        const char* canonical;
        int minutes;
    } rows[] = {
        {"", "", 0},
        {"+01", "+01:00", 60},
        {"-05", "-05:00", -300},
        {"+99", "+99:00", 5940},
        {"+00", "+00:00", 0},
        {"-00", "-00:00", 0},
        {"+0100", "+01:00", 60},
        {"-0330", "-03:30", -210},
        {"+9959", "+99:59", 5999},
        {"+1075", "+10:75", 675},
        {"-9899", "-98:99", -5979},
        {"+01:00", "+01:00", 60},
        {"-00:30", "-00:30", -30},
        {"+99:59", "+99:59", 5999},
        {"+10:75", "+10:75", 675},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        const auto offset = ZQTDateTimeUTCOffset::repairOffset(row.text);
        ASSERT_TRUE(offset.has_value());
        EXPECT_EQ(offset->text(), row.canonical);
        EXPECT_EQ(offset->offsetMinutes(), row.minutes);
    }
}

TEST(RepairOffset, RefusesAllElse) {
    for (const char* text :
         {"+",       "-",         "+1",     "0100",   "01:00",  "Z",      "utc",     "local",
          "+100",    "+1:00",     "+01:0",  "+:100",  "+010:0", "+9960",  "+99:60",  "+9999",
          "+99:99",  "+0a",       "+a0",    "+01a0",  "+010a",  "+01:a0", "+01:0a",  "+a1:00",
          "+0::0",   "+01::0",    "+01-00", "+01.00", "++1",    "+-1",    "+01:000", "+001:00",
          "+010000", "+01:00:00", " +01",   "+01 ",   "+01:00 "}) {
        EXPECT_FALSE(ZQTDateTimeUTCOffset::repairOffset(text).has_value()) << text;
    }
    EXPECT_FALSE(ZQTDateTimeUTCOffset::repairOffset(ustring(std::string("+0\0", 3))).has_value());
}

TEST(RepairOffset, HasOneBoundOnFourDigitsAsANumber) {
    for (int number = 0; number <= 9999; ++number) {
        char digits[12];
        std::snprintf(digits, sizeof digits, "%04d", number);
        const std::string hours(digits, 2);
        const std::string minutes(digits + 2, 2);
        for (const std::string sign : {"+", "-"}) {
            for (const std::string& text : {sign + digits, sign + hours + ":" + minutes}) {
                const auto offset = ZQTDateTimeUTCOffset::repairOffset(ustring(text));
                ASSERT_EQ(offset.has_value(), number <= 9959) << text;
                if (offset) {
                    const int magnitude = number / 100 * 60 + number % 100;
                    ASSERT_EQ(offset->offsetMinutes(), sign == "-" ? -magnitude : magnitude) << text;
                    ASSERT_EQ(offset->text(), ustring(sign + hours + ":" + minutes)) << text;
                }
            }
        }
    }
}

} // namespace
