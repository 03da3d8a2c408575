// The text of a moment: its formats, and how long it stays.
#include "legacy_support.h"
#include <support/private_member.h>

namespace kvt::test {

struct TextOfTime {
    using Type = void (ObsoleteTime::*)(const char*, const char*&, unsigned long long&) const;
    friend Type memberOf(TextOfTime);
};
template struct Opens<TextOfTime, &ObsoleteTime::asString>;

namespace {

struct TextRow {
    int line;
    const char* format;
    const char* expected;
};

// Of 2020-02-01 13:02:03, a Saturday.
const TextRow textRows[] = {
    {__LINE__, "%Y-%m-%d %H:%M:%S", "2020-02-01 13:02:03"},
    {__LINE__, "%I %p", "01 PM"},
    {__LINE__, "%a %j", "Sat 032"},
    {__LINE__, "%T|%R", "13:02:03|13:02"},
    {__LINE__, "%f|%s", "000000|03.000000"},
    {__LINE__, "%S%F", "03"}, // no fraction, no point
    {__LINE__, "%H %z", "13"},
    {__LINE__, "%H %Z", "13"},
    {__LINE__, "%x %X", "02/01/20 13:02:03"},
    {__LINE__, "no directive", "no directive"},
    {__LINE__, "", ""},
};

TEST(ObsoleteTimeText, FollowsTheFormat) {
    const ObsoleteTime time(ObsoleteDate(1, 2, 2020), 13, 2, 3);
    for (const TextRow& row : textRows) {
        EXPECT_EQ(time.asString(row.format), row.expected) << "row " << row.line;
    }
}

TEST(ObsoleteTimeText, BelongsToTheObjectUntilItsNext) {
    const ObsoleteTime time(ObsoleteDate(1, 2, 2020), 13, 2, 3);
    const char* out = nullptr;
    unsigned long long length = 0;
    (time.*memberOf(TextOfTime()))("%H:%M", out, length);
    EXPECT_EQ(std::string(out, length), "13:02");
    EXPECT_EQ(out[length], '\0');
    const ObsoleteTime copy(time);
    EXPECT_EQ(copy.asString("%S"), "03");
    EXPECT_EQ((time + 1).hour(), 13U);
    EXPECT_EQ(std::string(out), "13:02");
}

} // namespace
} // namespace kvt::test
