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
        const char* flag;
    } rows[] = {
        {"%s", {}, "%s"},  {"%Y %s", {}, "%s"}, {"%Es", 0, "%Es"},    {"%z", {}, "%z"},
        {"%Ez", {}, "%z"}, {"%z %s", {}, "%z"}, {"%Es %z", {}, "%z"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.format);
        TextBuffer text;
        const std::optional<PatternFailure> failure =
            renderFields(text, row.format, DateTimeFields(), row.offset);
        ASSERT_TRUE(failure.has_value());
        const auto* flag = std::get_if<FormatFlag>(&*failure);
        ASSERT_NE(flag, nullptr);
        EXPECT_EQ(flag->flag, row.flag);
    }
}

TEST(RenderFields, RefusesSecondsSince1970BesideAnOffset) {
    for (const char* format : {"%s%z", "%Ez, %s", "%z %Y %s %z"}) {
        SCOPED_TRACE(format);
        TextBuffer text;
        const std::optional<PatternFailure> failure = renderFields(text, format, DateTimeFields(), 60);
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
        TextBuffer text;
        EXPECT_FALSE(renderFields(text, row.format, DateTimeFields(), row.offset).has_value());
        EXPECT_EQ(text.view(), row.text);
    }
}

} // namespace
