// ObsoleteRegexp: the old dialect, as its one search shows it.
#include "regex_support.h"

#include <gtest/gtest.h>

#include <optional>
#include <stdexcept>
#include <type_traits>

namespace kvt::test {
namespace {

static_assert(std::is_convertible_v<const char*, ObsoleteRegexp>);
static_assert(std::is_copy_assignable_v<ObsoleteRegexp> && std::is_nothrow_move_assignable_v<ObsoleteRegexp>);
static_assert(!std::is_default_constructible_v<ObsoleteRegexp>);
static_assert(std::is_base_of_v<ex::detail::PimplBase<ObsoleteRegexpImpl>, ObsoleteRegexp>);
static_assert(ObsoleteRegexp::npos == none);

struct Row {
    int line;
    std::string pattern;
    std::string text;
    std::uint64_t start;
    Span expected;
};

void expectRows(const std::vector<Row>& rows) {
    for (const Row& row : rows) {
        SCOPED_TRACE("line " + std::to_string(row.line) + ": " + row.pattern + " on " + row.text);
        EXPECT_EQ(indexedBy(ObsoleteRegexp(row.pattern.data(), row.pattern.size()), row.text, row.start),
                  row.expected);
        if (row.pattern.find('\0') == std::string::npos) {
            EXPECT_EQ(indexedBy(ObsoleteRegexp(row.pattern.c_str()), row.text, row.start), row.expected);
        }
    }
}

constexpr Span notFound{none, 0};

TEST(ObsoleteRegexp, BracesParenthesesAndBarsAreText) {
    expectRows({
        {__LINE__, "a(b)", "xa(b)", 0, {1, 4}},
        {__LINE__, "a(b)", "ab", 0, notFound},
        {__LINE__, "(", "a(", 0, {1, 1}},
        {__LINE__, ")", "a)", 0, {1, 1}},
        {__LINE__, "a|b", "xa|b", 0, {1, 3}},
        {__LINE__, "a|b", "a", 0, notFound},
        {__LINE__, "{2}", "a{2}", 0, {1, 3}},
        {__LINE__, "a{2}", "aa", 0, notFound},
        {__LINE__, "a{2}", "aa{2}", 0, {1, 4}},
        {__LINE__, "{", "{", 0, {0, 1}},
        {__LINE__, "}", "}", 0, {0, 1}},
        {__LINE__, "(?:a)", "(:a)", 0, {0, 4}}, // an optional parenthesis
        {__LINE__, "(?:a)", ":a)", 0, {0, 3}},
        {__LINE__, "((", "((", 0, {0, 2}},
        {__LINE__, "(*", "(((", 0, {0, 3}},
    });
}

TEST(ObsoleteRegexp, OnlyAFinalDollarIsAnAnchor) {
    expectRows({
        {__LINE__, "end$", "end end", 0, {4, 3}},
        {__LINE__, "end$", "end$", 0, notFound},
        {__LINE__, "$end", "x$end", 0, {1, 4}},
        {__LINE__, "$end", "end", 0, notFound},
        {__LINE__, "a$b", "a$b", 0, {0, 3}},
        {__LINE__, "a$$", "a$", 0, {0, 2}},
        {__LINE__, "a$$", "a$b", 0, notFound},
        {__LINE__, "$", "ab", 0, {2, 0}},
        {__LINE__, "|$", "a|", 0, {1, 1}},
    });
}

TEST(ObsoleteRegexp, ABackslashBeforeSuchACharacterChangesNothing) {
    expectRows({
        {__LINE__, "a\\$", "a$b", 0, {0, 2}},
        {__LINE__, "a\\$", "a", 0, notFound},
        {__LINE__, "\\$b", "a$b", 0, {1, 2}},
        {__LINE__, "\\(a\\)", "(a)", 0, {0, 3}},
        {__LINE__, "a\\|b", "a|b", 0, {0, 3}},
        {__LINE__, "a\\{2\\}", "a{2}", 0, {0, 4}},
        // The bar behind an escaped backslash counts as escaped and is left to be an alternative, or an anchor.
        {__LINE__, "\\\\|b", "b", 0, {0, 1}},
        {__LINE__, "\\\\|b", "a\\", 0, {1, 1}},
        {__LINE__, "\\\\$", "a\\", 0, {1, 1}},
        {__LINE__, "x\\\\{2}", "x\\{2}", 0, {0, 5}}, // a repetition that is not closed is text to the engine
        {__LINE__, "x\\\\{2}", "x\\\\", 0, notFound},
        {__LINE__, "x\\\\(a\\\\)", "x\\a\\", 0, {0, 4}},
    });
}

TEST(ObsoleteRegexp, TheRestIsPerls) {
    expectRows({
        {__LINE__, "a.c", "xabc", 0, {1, 3}},
        {__LINE__, "ab*c", "abbbc", 0, {0, 5}},
        {__LINE__, "ab+c", "ac", 0, notFound},
        {__LINE__, "ab?c", "ac", 0, {0, 2}},
        {__LINE__, "[^a]", "ab", 0, {1, 1}},
        {__LINE__, "[()]", "a)", 0, {1, 1}},
        {__LINE__, "^b", "a\nb", 0, {2, 1}},
        {__LINE__, "^b", "ab", 0, notFound},
        {__LINE__, "\\d+", "a12", 0, {1, 2}},
        {__LINE__, "\\bb", "a b", 0, {2, 1}},
        {__LINE__, "A", "a", 0, notFound},
        {__LINE__, "", "a", 0, {0, 0}},
        {__LINE__, "\u00e9", "caf\u00e9", 0, {3, 2}},
        {__LINE__, ".", "\u00e9", 0, {0, 1}},
        {__LINE__, std::string("a\0b", 3), std::string("xa\0b", 4), 0, {1, 3}},
    });
}

TEST(ObsoleteRegexp, PositionsCountFromTheTextAndNothingBeforeTheStartIsSeen) {
    expectRows({
        {__LINE__, "abc", "xxabc", 1, {2, 3}},
        {__LINE__, "abc", "xxabc", 2, {2, 3}},
        {__LINE__, "abc", "xxabc", 3, notFound},
        {__LINE__, "a", "aaa", 2, {2, 1}},
        {__LINE__, "^a", "ba", 1, {1, 1}},
        {__LINE__, "\\ba", "ba", 1, {1, 1}},
        // At the end there is nothing to be found, unless the search began before it.
        {__LINE__, "x*", "abc", 3, notFound},
        {__LINE__, "$", "abc", 3, notFound},
        {__LINE__, "$", "abc", 2, {3, 0}},
        {__LINE__, "x*", "abc", 4, notFound},
        {__LINE__, "x*", "abc", none, notFound},
        {__LINE__, "", "", 0, notFound},
    });
}

TEST(ObsoleteRegexp, TheLengthMayBeEitherTypeOfSixtyFourBits) {
    unsigned long long length = 7;
    EXPECT_EQ(ObsoleteRegexp("abc").index("xxabc", 5, &length, 1), 2u);
    EXPECT_EQ(length, 3u);
    EXPECT_EQ(ObsoleteRegexp("abc").index("xxabc", 5, &length, 3), ObsoleteRegexp::npos);
    EXPECT_EQ(length, 0u);
}

// g++ warns, when it optimises, of a variable that is read before it is set. Here that is an error in every build.
#pragma GCC diagnostic push
#pragma GCC diagnostic error "-Wuninitialized"
TEST(ObsoleteRegexp, TheLengthIsOnlyWritten) {
    unsigned long long length;
    EXPECT_EQ(ObsoleteRegexp("abc").index("xxabc", 5, &length, 1), 2u);
    EXPECT_EQ(length, 3u);
}
#pragma GCC diagnostic pop

TEST(ObsoleteRegexp, LengthsCutThePatternAndTheText) {
    const ObsoleteRegexp regexp("ab(", 2);
    std::uint64_t length = 0;
    EXPECT_EQ(regexp.index("xxab", 4, &length, 0), 2u);
    EXPECT_EQ(regexp.index("xxab", 3, &length, 0), none);
    EXPECT_EQ(length, 0u);
    EXPECT_EQ(indexedBy(ObsoleteRegexp("a$b", 2), "ba", 0), (Span{1, 1}));
    EXPECT_EQ(indexedBy(ObsoleteRegexp(nullptr, 0), "ba", 0), (Span{0, 0}));
    EXPECT_EQ(regexp.index(nullptr, 0, &length, 0), none);
}

TEST(ObsoleteRegexp, APatternThatCannotBeCompiledThrowsTheEnginesOwn) {
    for (const std::string pattern : {"[a", "*", "a**{", "\\", "\\\\(", "a\\\\)", "[[:no:]]", "a\\1"}) {
        const EngineError expected = errorOf([&] { boost::regex regex(perlByHand(pattern)); });
        EXPECT_NE(expected.code, -1) << pattern;
        EXPECT_EQ(errorOf([&] { ObsoleteRegexp regexp(pattern.c_str()); }), expected) << pattern;
    }
    EXPECT_THROW(ObsoleteRegexp("[a"), std::runtime_error);
}

TEST(ObsoleteRegexp, ASearchThatTakesTooLongThrowsTheEnginesOwnAndSetsNothing) {
    const std::string pattern = "a*a*a*a*a*a*a*a*a*a*a*a*a*a*a*c";
    const std::string text(60, 'a');
    const Found expected = searchedByEngine(boost::regex(pattern), text, 0);
    EXPECT_EQ(expected.error.code, boost::regex_constants::error_complexity);
    const ObsoleteRegexp regexp(pattern.c_str());
    std::uint64_t length = 77;
    EXPECT_EQ(errorOf([&] { regexp.index(text.data(), text.size(), &length, 0); }), expected.error);
    EXPECT_EQ(length, 77u);
    EXPECT_EQ(indexedBy(regexp, "xaac", 0), (Span{1, 3}));
}

TEST(ObsoleteRegexp, IsAValue) {
    std::optional<ObsoleteRegexp> first("a(b");
    ObsoleteRegexp copy(*first);
    ObsoleteRegexp other("x");
    other = copy;
    const ObsoleteRegexp moved(std::move(copy));
    copy = ObsoleteRegexp("y");
    first.reset();
    EXPECT_EQ(indexedBy(other, "xa(b", 0), (Span{1, 3}));
    EXPECT_EQ(indexedBy(moved, "xa(b", 0), (Span{1, 3}));
    EXPECT_EQ(indexedBy(copy, "xy", 0), (Span{1, 1}));
}

} // namespace
} // namespace kvt::test
