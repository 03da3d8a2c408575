// URegex and URegexMatch: what is promised, one by one.
#include "regex_support.h"

#include <gtest/gtest.h>

#include <optional>
#include <stdexcept>
#include <type_traits>

namespace kvt::test {
namespace {

using ex::URegex;
using ex::URegexMatch;
using ex::UString;
using ex::UStringView;

// What programs rely on at compile time.
static_assert(std::is_nothrow_move_constructible_v<URegex<0>> &&
              std::is_nothrow_move_assignable_v<URegex<0>>);
static_assert(std::is_copy_constructible_v<URegex<28>> && std::is_copy_assignable_v<URegex<28>>);
static_assert(std::is_convertible_v<URegex<1>, bool> && std::is_convertible_v<UString<1>, URegex<1>>);
static_assert(sizeof(URegex<0>) == sizeof(void*));
static_assert(!std::is_default_constructible_v<URegexMatch<0>>, "only a regex makes a match");
static_assert(std::is_copy_assignable_v<URegexMatch<0>> &&
              std::is_nothrow_move_constructible_v<URegexMatch<0>>);
static_assert(!std::is_convertible_v<URegexMatch<0>, bool> && std::is_constructible_v<bool, URegexMatch<0>>);
static_assert(std::is_same_v<decltype(std::declval<URegexMatch<1>>().group(0)), const Span&>);

struct Row {
    int line;
    std::string pattern;
    std::string subject;
    std::optional<std::uint64_t> start; ///< of a search; none: the whole subject is matched
    Spans groups;
};

template <std::uint32_t N>
void check(const Row& row) {
    SCOPED_TRACE("line " + std::to_string(row.line) + ": " + row.pattern + " on " + row.subject +
                 " as N = " + std::to_string(N));
    const URegex<N> regex(units<N>(row.pattern));
    EXPECT_TRUE(regex);
    const URegexMatch<N> match =
        row.start ? regex.search(units<N>(row.subject), *row.start) : regex.match(units<N>(row.subject));
    EXPECT_EQ(groupsOf(match), row.groups);
    EXPECT_EQ(match.groupCount(), row.groups.size());
    EXPECT_EQ(match.matched(), !row.groups.empty());
    EXPECT_EQ(static_cast<bool>(match), !row.groups.empty());
    EXPECT_EQ(match.subject(), units<N>(row.subject));
    for (std::uint64_t i = 0; i < row.groups.size(); ++i) {
        const auto& [position, length] = row.groups[i];
        EXPECT_EQ(match.group(i), row.groups[i]);
        EXPECT_EQ(match.text(i).toStdString(), length == 0 ? "" : row.subject.substr(position, length)) << i;
    }
}

TEST(URegex, GroupsArePositionsAndLengthsInBytes) {
    const std::string zero("a\0b", 3);
    const Row rows[] = {
        // A whole match.
        {__LINE__, "a(b)?c", "ac", {}, {{0, 2}, {none, 0}}},
        {__LINE__, "a(b)?c", "abc", {}, {{0, 3}, {1, 1}}},
        {__LINE__, "a(b)?c", "xac", {}, {}},
        {__LINE__, "a(b)?c", "acx", {}, {}},
        {__LINE__, "a|ab", "ab", {}, {{0, 2}}}, // the first alternative would end too early
        {__LINE__, "", "", {}, {{0, 0}}},
        {__LINE__, "", "a", {}, {}},
        {__LINE__, "a*", "", {}, {{0, 0}}},
        {__LINE__, "(a)|(b)", "b", {}, {{0, 1}, {none, 0}, {0, 1}}},
        {__LINE__, "(?:a)(b(c))", "abc", {}, {{0, 3}, {1, 2}, {2, 1}}},
        {__LINE__, "(x*)", "", {}, {{0, 0}, {0, 0}}}, // took part, with nothing
        // A search, from the beginning and from further on.
        {__LINE__, "a(b)?c", "xxac", 0, {{2, 2}, {none, 0}}},
        {__LINE__, "a(b)?c", "xxac", 1, {{2, 2}, {0, 0}}},
        {__LINE__, "a(b)?c", "xxac", 2, {{2, 2}, {1, 0}}},
        {__LINE__, "a(b)?c", "xxac", 3, {}},
        {__LINE__, "a(b)?c", "xxac", 4, {}},
        {__LINE__, "(a)|(b)", "xxab", 3, {{3, 1}, {2, 0}, {3, 1}}},
        {__LINE__, "a", "aaa", 1, {{1, 1}}},
        {__LINE__, "a|ab", "ab", 0, {{0, 1}}}, // the first alternative is preferred
        {__LINE__, "a+", "baab", 0, {{1, 2}}},
        {__LINE__, "a+?", "baab", 0, {{1, 1}}},
        // The end of the subject is a place for nothing.
        {__LINE__, "", "abc", 3, {{3, 0}}},
        {__LINE__, "x*", "abc", 3, {{3, 0}}},
        {__LINE__, "(x)?", "abc", 3, {{3, 0}, {2, 0}}},
        {__LINE__, "$", "abc", 0, {{3, 0}}},
        {__LINE__, "c", "abc", 3, {}},
        {__LINE__, "x*", "", 0, {{0, 0}}},
        // What is before the start cannot be seen.
        {__LINE__, "^a", "ba", 0, {}},
        {__LINE__, "^a", "ba", 1, {{1, 1}}},
        {__LINE__, "\\Aa", "ba", 1, {{1, 1}}},
        {__LINE__, "\\ba", "ba", 0, {}},
        {__LINE__, "\\ba", "ba", 1, {{1, 1}}},
        {__LINE__, "\\Ba", "ba", 1, {}},
        {__LINE__, "(?<=b)a", "ba", 0, {{1, 1}}},
        {__LINE__, "(?<=b)a", "ba", 1, {}},
        {__LINE__, "(?<!b)a", "ba", 1, {{1, 1}}},
        // Perl's syntax without options: case counts, blanks are text, a point takes all, lines have their own ends.
        {__LINE__, "A", "a", 0, {}},
        {__LINE__, "a b", "ab", 0, {}},
        {__LINE__, "(?i)A", "a", 0, {{0, 1}}},
        {__LINE__, "a.b", "a\nb", {}, {{0, 3}}},
        {__LINE__, "^b$", "a\nb\nc", 0, {{2, 1}}},
        {__LINE__, "(a)\\1", "aa", {}, {{0, 2}, {0, 1}}},
        {__LINE__, "\\d{2}", "a12", 0, {{1, 2}}},
        {__LINE__, "\\(a\\)", "(a)", {}, {{0, 3}}},
        {__LINE__, "(?<year>\\d+)", "a12", 0, {{1, 2}, {1, 2}}},
        // Bytes, whatever they mean.
        {__LINE__, "\u00e9", "caf\u00e9s", 0, {{3, 2}}},
        {__LINE__, "s", "caf\u00e9s", 0, {{5, 1}}},
        {__LINE__, "f.s", "caf\u00e9s", 0, {}},
        {__LINE__, "f..s", "caf\u00e9s", 0, {{2, 4}}},
        {__LINE__, "[\u00e9]", "caf\u00e9s", 0, {{3, 1}}},
        {__LINE__, "(\u20ac)+", "\u20ac\u20ac", {}, {{0, 6}, {3, 3}}},
        {__LINE__, "\\w+", "caf\u00e9", 0, {{0, 3}}},
        {__LINE__, "\xff+", "a\xff\xff", 0, {{1, 2}}},
        {__LINE__, "\\xff", "\xff", {}, {{0, 1}}},
        {__LINE__, "a.b", zero, {}, {{0, 3}}},
        {__LINE__, zero, "x" + zero, 0, {{1, 3}}},
    };
    for (const Row& row : rows) {
        check<0>(row);
        check<1>(row);
        check<28>(row);
    }
}

TEST(URegex, ASearchBeginsAtTheBeginningUnlessTold) {
    EXPECT_EQ(groupsOf(URegex<0>("a").search("ba")), (Spans{{1, 1}}));
}

TEST(URegex, AllMatchesAreFoundWithAViewOfTheWholeText) {
    struct Subject {
        int line;
        const char* pattern;
        const char* subject;
        std::vector<Spans> matches;
    };
    const Subject rows[] = {
        {__LINE__, "a", "banana", {{{1, 1}}, {{3, 1}}, {{5, 1}}}},
        {__LINE__, "^a", "aaa", {{{0, 1}}}},
        {__LINE__, "(?<=a)a", "aaa", {{{1, 1}}, {{2, 1}}}},
        {__LINE__, "\\ba", "aa a", {{{0, 1}}, {{3, 1}}}},
        {__LINE__, "b*", "abb", {{{0, 0}}, {{1, 2}}, {{3, 0}}}},
        {__LINE__, "|b", "b", {{{0, 0}}, {{0, 1}}, {{1, 0}}}},
        {__LINE__, "(a)|b", "ba", {{{0, 1}, {none, 0}}, {{1, 1}, {1, 1}}}},
        {__LINE__, "(?=a\\K)", "a", {{{1, std::uint64_t(0) - 1}}}},
        {__LINE__, "x", "", {}},
    };
    for (const Subject& row : rows) {
        EXPECT_EQ(allFoundBy(URegex<0>(row.pattern), row.subject).matches, row.matches) << "row " << row.line;
    }
    int calls = 0;
    URegex<0>("a").searchAll("aaa", [&](const URegexMatch<0>& match) {
        EXPECT_EQ(match.subject(), UString<0>("aaa"));
        return ++calls < 2;
    });
    EXPECT_EQ(calls, 2);
    URegex<0>().searchAll("a", [](const URegexMatch<0>&) -> bool { throw std::logic_error("no match"); });
    EXPECT_THROW(URegex<0>("a").searchAll("a", [](const URegexMatch<0>&) -> bool { throw 1; }), int);
}

TEST(URegex, WithoutAPatternItIsFalseAndMatchesNothing) {
    const URegex<0> regex;
    EXPECT_FALSE(regex);
    for (const char* subject : {"", "a"}) {
        EXPECT_EQ(regex.match(subject).groupCount(), 0u);
        EXPECT_EQ(regex.search(subject).groupCount(), 0u);
        EXPECT_EQ(regex.search(subject, UString<0>(subject).size()).groupCount(), 0u);
        EXPECT_EQ(regex.search(subject).subject(), UString<0>(subject));
    }
}

TEST(URegex, TheEmptyPatternIsAPattern) {
    EXPECT_TRUE(URegex<0>(""));
    EXPECT_FALSE(URegex<0>());
}

TEST(URegex, AMovedFromOneIsTrue) {
    URegex<0> compiled("a");
    URegex<0> empty;
    const URegex<0> first(std::move(compiled));
    const URegex<0> second(std::move(empty));
    EXPECT_TRUE(compiled);
    EXPECT_TRUE(empty);
    EXPECT_TRUE(first);
    EXPECT_FALSE(second);
    EXPECT_TRUE(first.match("a"));
}

// A regex in each of its three states.
enum class State { MovedFrom, Empty, Compiled };

URegex<0> inState(State state, const char* pattern) {
    if (state == State::MovedFrom) {
        URegex<0> regex;
        const URegex<0> taken(std::move(regex));
        return regex;
    }
    return state == State::Empty ? URegex<0>() : URegex<0>(pattern);
}

// One that is compiled matches `text` and not `otherText`.
void expectState(const URegex<0>& regex, State state, const char* text, const char* otherText) {
    EXPECT_EQ(static_cast<bool>(regex), state != State::Empty);
    if (state == State::MovedFrom) {
        // Without an implementation there is nothing to match with.
        return;
    }
    EXPECT_EQ(regex.match(text).matched(), state == State::Compiled);
    EXPECT_FALSE(regex.match(otherText));
}

constexpr State states[] = {State::MovedFrom, State::Empty, State::Compiled};

TEST(URegex, ACopyIsAsItsSourceAndLeavesItAsItWas) {
    for (const State source : states) {
        const URegex<0> from = inState(source, "a");
        const URegex<0> copy(from);
        expectState(copy, source, "a", "b");
        expectState(from, source, "a", "b");
        for (const State target : states) {
            SCOPED_TRACE(static_cast<int>(source) * 10 + static_cast<int>(target));
            URegex<0> to = inState(target, "b");
            const URegex<0> sharesWithTarget(to);
            EXPECT_EQ(&(to = from), &to);
            expectState(to, source, "a", "b");
            expectState(from, source, "a", "b");
            expectState(sharesWithTarget, target, "b", "a");
        }
    }
}

TEST(URegex, AMoveLeavesItsSourceMovedFrom) {
    for (const State source : states) {
        for (const State target : states) {
            SCOPED_TRACE(static_cast<int>(source) * 10 + static_cast<int>(target));
            URegex<0> from = inState(source, "a");
            URegex<0> to = inState(target, "b");
            EXPECT_EQ(&(to = std::move(from)), &to);
            expectState(to, source, "a", "b");
            expectState(from, State::MovedFrom, "a", "b");
            from = URegex<0>("c");
            EXPECT_TRUE(from.match("c"));
        }
    }
}

TEST(URegex, AssigningItToItselfChangesNothing) {
    for (const State state : states) {
        URegex<0> regex = inState(state, "a");
        URegex<0>& same = regex;
        regex = same;
        expectState(regex, state, "a", "b");
        regex = std::move(same);
        expectState(regex, state, "a", "b");
    }
}

TEST(URegexMatch, OutlivesTheSubjectAndTheRegex) {
    std::optional<URegex<0>> regex("(b)c");
    std::optional<UString<0>> subject("abc, a text that is too long to be kept in place");
    const URegexMatch<0> match = regex->search(*subject);
    subject->replace(0, 3, "xyz");
    subject.reset();
    regex.reset();
    EXPECT_EQ(match.text(0), UString<0>("bc"));
    EXPECT_EQ(match.text(1), UString<0>("b"));
    EXPECT_TRUE(match.subject().beginsWith("abc, "));
}

TEST(URegexMatch, IsAValue) {
    const URegex<0> regex("a(b)?");
    const URegexMatch<0> first = regex.search("xa");
    URegexMatch<0> copy = first;
    EXPECT_EQ(groupsOf(copy), groupsOf(first));
    copy = regex.search("ab");
    EXPECT_EQ(groupsOf(copy), (Spans{{0, 2}, {1, 1}}));
    EXPECT_EQ(groupsOf(first), (Spans{{1, 1}, {none, 0}}));
    const URegexMatch<0> moved = std::move(copy);
    EXPECT_EQ(moved.text(1), UString<0>("b"));
    ASSERT_EQ(moved.groups().size(), 2U);
    EXPECT_EQ(moved.groups()[1], moved.group(1));
}

TEST(URegexFailure, APatternThatCannotBeCompiledThrowsTheEnginesOwn) {
    struct Bad {
        int line;
        std::string pattern;
        boost::regex_constants::error_type code;
    };
    const Bad rows[] = {
        {__LINE__, "a(b", boost::regex_constants::error_paren},
        {__LINE__, "a)", boost::regex_constants::error_paren},
        {__LINE__, "[a", boost::regex_constants::error_brack},
        {__LINE__, "[[:nothing:]]", boost::regex_constants::error_ctype},
        {__LINE__, "a{2,1}", boost::regex_constants::error_badbrace},
        {__LINE__, "*a", boost::regex_constants::error_badrepeat},
        {__LINE__, "a\\", boost::regex_constants::error_escape},
        {__LINE__, "\\1", boost::regex_constants::error_backref},
        {__LINE__, "(?<=a*)", boost::regex_constants::error_bad_pattern},
        {__LINE__, "(?z)", boost::regex_constants::error_perl_extension},
    };
    for (const Bad& row : rows) {
        SCOPED_TRACE("line " + std::to_string(row.line) + ": " + row.pattern);
        const EngineError expected = errorOf([&] { boost::regex regex(row.pattern); });
        EXPECT_EQ(expected.code, row.code);
        EXPECT_EQ(errorOf([&] { URegex<0> regex(units<0>(row.pattern)); }), expected);
        EXPECT_EQ(errorOf([&] { URegex<1> regex(units<1>(row.pattern)); }), expected);
        EXPECT_EQ(errorOf([&] { URegex<28> regex(units<28>(row.pattern)); }), expected);
        EXPECT_THROW(URegex<0>(units<0>(row.pattern)), std::runtime_error);
    }
}

TEST(URegexFailure, ASubjectThatTakesTooLongThrowsTheEnginesOwn) {
    struct Hard {
        int line;
        std::string pattern;
        std::string subject;
        boost::regex_constants::error_type code;
    };
    const Hard rows[] = {
        {__LINE__, "(?:a|b|aab|[ab])*(?:[ab]|aa)*c", std::string(30, 'a') + "b",
         boost::regex_constants::error_complexity},
        {__LINE__, "(?:(.)|.)*c", std::string(200000, 'a'), boost::regex_constants::error_stack},
    };
    for (const Hard& row : rows) {
        SCOPED_TRACE("line " + std::to_string(row.line));
        const Found expected = searchedByEngine(boost::regex(row.pattern), row.subject, 0);
        EXPECT_EQ(expected.error.code, row.code) << expected;
        const URegex<0> regex(units<0>(row.pattern));
        EXPECT_EQ(searchedBy(regex, row.subject, 0), expected);
        EXPECT_EQ(matchedBy(regex, row.subject), matchedByEngine(boost::regex(row.pattern), row.subject));
        EXPECT_NE(matchedBy(regex, row.subject).error.code, -1);
        // It is as good as before.
        EXPECT_TRUE(regex);
        EXPECT_TRUE(regex.match("aac"));
    }
}

TEST(URegex, ClassesFollowTheGlobalLocaleInWhichThePatternWasCompiled) {
    const URegex<0> before("\\w+");
    const URegex<0> during = compiledWithExclamationLetters("\\w+");
    EXPECT_FALSE(before.match("a!"));
    EXPECT_TRUE(during.match("a!"));
    EXPECT_FALSE(URegex<0>("\\w+").match("a!"));
}

// What a search of many lines builds on.
TEST(URegex, PlacesWithoutAMatchArePassedOver) {
    const std::string text = "no date\n12 \n2020-01-31 and 2020-02-01\nend";
    const URegex<0> date("\\d{4}-\\d\\d-\\d\\d");
    EXPECT_EQ(date.passOver(text), text.find("2020"));
    EXPECT_EQ(date.passOver(text, text.find("2020") + 1), text.find("2020-02"));
    EXPECT_EQ(date.passOver(text, text.find("020-02")), text.size());
    EXPECT_EQ(date.passOver(text, text.size()), text.size());
    EXPECT_EQ(date.passOver("", 0), 0U);
    // Of a run, up to its last byte.
    EXPECT_EQ(URegex<0>("\\d+-").passOver(text), text.find("0-"));
    EXPECT_EQ(URegex<1>("(?:ERROR|WARN): ").passOver("no ERROR, a WARN: x"), 12U);
    EXPECT_EQ(URegex<28>("^Z\\d").passOver("aZ Z1"), 3U) << "where a line begins is not known";
    // Nothing is known of these, or too little to be worth looking for.
    for (const char* pattern : {"", "x*", "[a-z]", "(?<=a)Z1", "(Z1)*", ".*Z1", "\\AZ1", "(Z)\\1"}) {
        EXPECT_EQ(URegex<0>(pattern).passOver(text, 3), 3U) << pattern;
    }
    EXPECT_EQ(URegex<0>().passOver(text, 3), text.size());

    EXPECT_TRUE(date.matchesIn(text));
    EXPECT_FALSE(date.matchesIn("no date"));
    EXPECT_TRUE(URegex<0>("^$").matchesIn(""));
    EXPECT_TRUE(URegex<0>("").matchesIn(UStringView<0>()));
    EXPECT_FALSE(URegex<0>().matchesIn(""));
}

} // namespace
} // namespace kvt::test
