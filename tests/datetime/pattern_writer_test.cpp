// What the pattern writer answers, by pattern and kind of value.
#include <kvt/datetime/detail/pattern_writer.h>

#include <gtest/gtest.h>

namespace {

using namespace kvt::ex::datetime;
using namespace kvt::ex::datetime::detail;

struct Row {
    const char* format;
    TemporalType kind;
    std::int32_t offset;
    const char* text;
};

void expectWritten(const Row& row, WrittenPattern expected) {
    SCOPED_TRACE(row.format);
    TextBuffer text;
    EXPECT_EQ(renderFields(text, row.format, row.kind, DateTimeFields(), row.offset), expected);
    EXPECT_EQ(text.view(), row.text);
}

TEST(RenderFields, StopsAtAFlagThatIsWrong) {
    const Row rows[] = {
        {"%s", TemporalType::Datetime, 0, ""},
        {"%Y %s", TemporalType::Datetime, 0, "1970 "},
        {"%Es", TemporalType::DatetimeWithOffset, 0, ""},
        {"%z", TemporalType::Date, 0, ""},
        {"%Ez", TemporalType::Time, 0, ""},
        {"%H%Y", TemporalType::TimeWithOffset, 0, "00"},
        {"a%Qb", TemporalType::Datetime, 0, "a"},
        {"a%$", TemporalType::Datetime, 0, "a"},
        {"%E", TemporalType::Datetime, 0, ""},
        {"%E%Y", TemporalType::Datetime, 0, ""},
        {"%%%", TemporalType::Datetime, 0, "%"},
    };
    for (const Row& row : rows) {
        expectWritten(row, WrittenPattern::WrongFlag);
    }
}

TEST(RenderFields, FindsSecondsSince1970BesideAnOffset) {
    const Row rows[] = {
        {"%s%z", TemporalType::DatetimeWithOffset, 60, "-3600+01:00"},
        {"%Ez, %s", TemporalType::DatetimeWithOffset, 0, "Z, 0"},
        {"%z %Y %s", TemporalType::DatetimeWithOffset, 60, "+01:00 1970 -3600"},
    };
    for (const Row& row : rows) {
        expectWritten(row, WrittenPattern::EpochBesideOffset);
    }
}

TEST(RenderFields, WritesEitherAlone) {
    const Row rows[] = {
        {"%s", TemporalType::DatetimeWithOffset, 60, "-3600"},
        {"%Es", TemporalType::Datetime, 0, "0"},
        {"%z", TemporalType::DatetimeWithOffset, 60, "+01:00"},
        {"%Ez", TemporalType::TimeWithOffset, 0, "Z"},
        {"%%z", TemporalType::Date, 0, "%z"},
        {"%T$*?", TemporalType::Time, 0, "00:00:00$*?"},
    };
    for (const Row& row : rows) {
        expectWritten(row, WrittenPattern::Whole);
    }
}

} // namespace
