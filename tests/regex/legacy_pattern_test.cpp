// The old dialect in Perl syntax: by example, and all short patterns against a translation by hand.
#include "regex_support.h"

#include <kvt/regex/detail/legacy_pattern.h>

#include <gtest/gtest.h>

namespace kvt::test {
namespace {

using ex::detail::perlPattern;

TEST(LegacyPattern, EscapesWhatIsTextInTheOldDialect) {
    struct Row {
        int line;
        std::string legacy;
        std::string perl;
    };
    const Row rows[] = {
        {__LINE__, "", ""},
        {__LINE__, "a(b)", R"(a\(b\))"},
        {__LINE__, "a|b", R"(a\|b)"},
        {__LINE__, "{2}", R"(\{2\})"},
        {__LINE__, "end$", "end$"},
        {__LINE__, "$end", R"(\$end)"},
        {__LINE__, "a$b", R"(a\$b)"},
        {__LINE__, "$", "$"},
        {__LINE__, "$$", R"(\$$)"},
        {__LINE__, R"(a\$)", R"(a\$)"},
        {__LINE__, R"(\$b)", R"(\$b)"},
        {__LINE__, R"(\(a\))", R"(\(a\))"},
        {__LINE__, R"(\\()", R"(\\()"},
        {__LINE__, R"(\()", R"(\()"},
        {__LINE__, R"(\(()", R"(\(\()"},
        {__LINE__, "((", R"(\(\()"},
        {__LINE__, "|", R"(\|)"},
        {__LINE__, R"(a.*+?[b]^\d)", R"(a.*+?[b]^\d)"},
        {__LINE__, "[$]", R"([\$])"},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(perlPattern(row.legacy), row.perl) << "line " << row.line << ": " << row.legacy;
    }
}

TEST(LegacyPattern, AllShortPatternsAreTranslatedAsByHand) {
    std::size_t count = 0;
    forEachShortText("{}()|$\\a", 6, [&](const std::string& pattern) {
        ASSERT_EQ(perlPattern(pattern), perlByHand(pattern)) << pattern;
        ++count;
    });
    EXPECT_EQ(count, 299593u);
}

TEST(LegacyPattern, LongPatternsTakeNoLongerForEachByte) {
    // Inserting in place would move the rest of the text for each of them: for ten million, that is hours.
    const std::string perl = perlPattern(std::string(10'000'000, '('));
    EXPECT_EQ(perl.size(), 20'000'000u);
    EXPECT_EQ(perl.substr(perl.size() - 4), R"(\(\()");
}

} // namespace
} // namespace kvt::test
