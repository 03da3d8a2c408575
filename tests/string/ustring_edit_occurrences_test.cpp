// Editing where something occurs: all occurrences of a text, its first and its last, single units, and units at the
// ends.
#include <string/editing_support.h>

namespace {

using namespace kvt::test;
using kvt::ex::detail::case_insensitive_t;

TYPED_TEST_SUITE(UStringEdit, StringTypes, StringTypeNames);

TYPED_TEST(UStringEdit, ReplacesEachOccurrenceFromTheLeft) {
    const struct {
        const char *text, *from, *to, *expected;
    } rows[] = {
        {"aaaa", "aa", "a", "aa"},
        {"a", "a", "aa", "aa"},
        {"aaa", "a", "aa", "aaaaaa"},
        {"aaa", "aa", "b", "ba"},
        {"abcabc", "b", "", "acac"},
        {"abcabc", "abc", "", ""},
        {"abcabc", "x", "y", "abcabc"},
        {"", "a", "b", ""},
        {"", "", "b", ""},
        {"", "", "", ""},
        {"ab", "abc", "x", "ab"},
        {"aXbXc", "X", "--", "a--b--c"},
        {"xax", "x", "x", "xax"},
        {"aab", "ab", "b", "ab"},
        {"abab", "ab", "aba", "abaaba"},
        {"AaAa", "a", "b", "AbAb"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.text) + ": " + row.from + " by " + row.to);
        auto string = this->make(row.text);
        EXPECT_EQ(&string.replaceAll(this->make(row.from), this->make(row.to)), &string);
        this->expectText(string, row.expected);
        string = this->make(row.text);
        string.replaceAll(this->make(row.from), this->make(row.to), TestFixture::String::case_sensitive);
        this->expectText(string, row.expected);
    }
}

TYPED_TEST(UStringEdit, ReplacesTheFirstOrTheLastOccurrence) {
    const auto check = [this](auto tag) {
        const struct {
            const char *text, *from, *to, *first, *last;
        } rows[] = {
            {"abcb", "b", "X", "aXcb", "abcX"},
            {"abcb", "bcb", "", "a", "a"},
            {"aaa", "aa", "b", "ba", "ab"},
            {"ab", "", "X", "Xab", "abX"},
            {"", "", "X", "X", "X"},
            {"abc", "abc", "abcd", "abcd", "abcd"},
        };
        for (const auto& row : rows) {
            SCOPED_TRACE(std::string(row.text) + ": " + row.from + " by " + row.to);
            auto string = this->make(row.text);
            EXPECT_EQ(&string.replaceFirst(this->make(row.from), this->make(row.to), tag), &string);
            this->expectText(string, row.first);
            string = this->make(row.text);
            EXPECT_EQ(&string.replaceLast(this->make(row.from), this->make(row.to), tag), &string);
            this->expectText(string, row.last);
        }
    };
    check(TestFixture::String::case_sensitive);
    if constexpr (TestFixture::number != Encoding::Unknown) {
        check(case_insensitive_t());
    }
    auto string = this->make("abcb");
    string.replaceFirst(this->make("b"), this->make("1")).replaceLast(this->make("b"), this->make("2"));
    this->expectText(string, "a1c2");
}

TYPED_TEST(UStringEdit, ThrowsWhereTheFirstOrTheLastOfNoneIsReplaced) {
    const auto check = [this](auto tag) {
        for (const char* const text : {"abc", ""}) {
            auto string = this->make(text);
            EXPECT_EQ(thrownBy([&] { string.replaceFirst(this->make("x"), this->make("y"), tag); }),
                      outOfRange);
            EXPECT_EQ(thrownBy([&] { string.replaceLast(this->make("x"), this->make("y"), tag); }),
                      outOfRange);
            EXPECT_EQ(thrownBy([&] { string.replaceFirst(this->make("abcd"), {}, tag); }), outOfRange);
            string.replaceAll(this->make("x"), this->make("y"), tag);
            this->expectText(string, text);
        }
    };
    check(TestFixture::String::case_sensitive);
    if constexpr (TestFixture::number != Encoding::Unknown) {
        check(case_insensitive_t());
    }
    auto string = this->make("abc");
    EXPECT_EQ(thrownBy([&] { string.replaceFirst(this->make("B"), this->make("y")); }), outOfRange);
    EXPECT_EQ(thrownBy([&] { string.replaceLast(this->make("B"), this->make("y")); }), outOfRange);
}

TYPED_TEST(UStringEdit, ReplacesUnits) {
    auto string = this->make("abcabc");
    EXPECT_EQ(&string.replaceAll(TestFixture::unit('b'), TestFixture::unit('X')), &string);
    this->expectText(string, "aXcaXc");
    string.replaceAll(TestFixture::unit('y'), TestFixture::unit('z'));
    this->expectText(string, "aXcaXc");
    EXPECT_EQ(&string.replaceAll(this->set("ac"), TestFixture::unit('c')), &string);
    this->expectText(string, "cXccXc");
    string.replaceAll(this->set(""), TestFixture::unit('z'));
    this->expectText(string, "cXccXc");
    string.replaceAll(this->set("cX"), TestFixture::highest);
    this->expectText(string, typename TestFixture::Units(6, TestFixture::highest));
    string.replaceAll(TestFixture::highest, TestFixture::unit('\0'));
    this->expectText(string, typename TestFixture::Units(6, 0));
    auto empty = this->make("");
    empty.replaceAll(TestFixture::unit('\0'), TestFixture::unit('x'))
        .replaceAll(this->set("\0"), TestFixture::unit('x'));
    this->expectText(empty, "");
}

TYPED_TEST(UStringEdit, RemovesUnits) {
    const struct {
        const char *text, *expected;
    } rows[] = {{"abcabc", "acac"}, {"bbb", ""}, {"", ""},   {"xyz", "xyz"},
                {"baab", "aa"},     {"ab", "a"}, {"ba", "a"}};
    for (const auto& row : rows) {
        SCOPED_TRACE(row.text);
        auto string = this->make(row.text);
        EXPECT_EQ(&string.removeAll(TestFixture::unit('b')), &string);
        this->expectText(string, row.expected);
    }
}

TYPED_TEST(UStringEdit, StripsTheFrontAndRstripsTheBackOnly) {
    const struct {
        const char *text, *set, *stripped, *rstripped;
    } rows[] = {
        {"  a  ", " ", "a  ", "  a"},
        {"xyaxy", "xy", "axy", "xya"},
        {"   ", " ", "", ""},
        {"", " ", "", ""},
        {"", "", "", ""},
        {" a ", "", " a ", " a "},
        {"abc", " ", "abc", "abc"},
        {"a b", " ", "a b", "a b"},
        {"\t a\t", "\t ", "a\t", "\t a"},
        {"aXa", "a", "Xa", "aX"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.text) + " by " + row.set);
        auto string = this->make(row.text);
        const auto* const memory = string.rawData();
        EXPECT_EQ(&string.strip(this->set(row.set)), &string);
        EXPECT_EQ(string.rawData(), memory) << "in place";
        this->expectText(string, row.stripped);
        string = this->make(row.text);
        EXPECT_EQ(&string.rstrip(this->set(row.set)), &string);
        this->expectText(string, row.rstripped);
    }
}

TYPED_TEST(UStringEdit, TellsWideUnitsWithEqualLowBytesApart) {
    if constexpr (!TestFixture::narrow) {
        auto string = this->make({0x0120, 0x20, 0x0120});
        string.strip(this->set(" ")).rstrip(this->set(" "));
        this->expectText(string, {0x0120, 0x20, 0x0120});
        string.replaceAll(this->set(" "), TestFixture::unit('x'));
        this->expectText(string, {0x0120, 'x', 0x0120});
        string.removeAll(0x20);
        this->expectText(string, {0x0120, 'x', 0x0120});
        string.strip(this->set({0x0120}));
        this->expectText(string, {'x', 0x0120});
    }
}

} // namespace
