// What the pattern writer itself refuses. format() knows all of it beforehand, by the kind of the value.
#include <kvt/datetime/detail/pattern_writer.h>

#include <gtest/gtest.h>

namespace {

using namespace kvt::ex::datetime::detail;
using Minutes = std::optional<std::int32_t>;

TEST(RenderFields, RefusesAFlagThatHasNotTheOffsetItWants) {
    const struct {
        const char* format;
        Minutes offset;
        FormatFlag flag;
    } rows[] = {
        {"%s", {}, FormatFlag::EpochWithoutOffset}, {"%Y %s", {}, FormatFlag::EpochWithoutOffset},
        {"%Es", 0, FormatFlag::EpochWithOffset},    {"%z", {}, FormatFlag::OffsetMissing},
        {"%Ez", {}, FormatFlag::OffsetMissing},     {"%z %s", {}, FormatFlag::OffsetMissing},
        {"%Es %z", {}, FormatFlag::OffsetMissing},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.format);
        PatternText text;
        const std::optional<Failure> failure = renderFields(text, row.format, nanosOf(0, 0), row.offset);
        ASSERT_TRUE(failure.has_value());
        const auto* flag = std::get_if<FormatFlag>(&*failure);
        ASSERT_NE(flag, nullptr);
        EXPECT_EQ(*flag, row.flag);
    }
}

TEST(RenderFields, RefusesSecondsSince1970BesideAnOffset) {
    for (const char* format : {"%s%z", "%Ez, %s", "%z %Y %s %z"}) {
        SCOPED_TRACE(format);
        PatternText text;
        const std::optional<Failure> failure = renderFields(text, format, nanosOf(0, 0), 60);
        ASSERT_TRUE(failure.has_value());
        const auto* flags = std::get_if<FormatStringBadCombo>(&*failure);
        ASSERT_NE(flags, nullptr);
        EXPECT_EQ(flags->first, "%s");
        EXPECT_EQ(flags->second, "%z");
    }
}

TEST(RenderFields, WritesEitherAlone) {
    const struct {
        const char* format;
        Minutes offset;
        const char* text;
    } rows[] = {
        {"%s", 60, "-3600"}, {"%Es", {}, "0"}, {"%z", 60, "+01:00"}, {"%Ez", 0, "Z"}, {"%%z", {}, "%z"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.format);
        PatternText text;
        EXPECT_FALSE(renderFields(text, row.format, nanosOf(0, 0), row.offset).has_value());
        EXPECT_EQ(text.view(), row.text);
    }
}

} // namespace
