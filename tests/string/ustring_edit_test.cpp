// Editing: the rows, and the rules that look odd and are relied on. Against every small text they are held by
// ustring_edit_property_test.cpp, and what a failure leaves behind by ustring_failure_guarantee_test.cpp.
#include <string/operations_support.h>
#include <support/failure_record.h>

#include <stdexcept>

namespace {

using namespace kvt::test;
using kvt::ex::detail::case_insensitive_t;

/// The class and text of a standard exception.
template <typename Action>
std::string thrownBy(Action action) {
    try {
        action();
    } catch (const std::out_of_range& failure) {
        return std::string("out_of_range: ") + failure.what();
    } catch (const std::length_error& failure) {
        return std::string("length_error: ") + failure.what();
    }
    return "nothing";
}
const std::string outOfRange = "out_of_range: invalid string position";

template <typename Number>
class UStringEdit : public StringTest<Number> {};
TYPED_TEST_SUITE(UStringEdit, StringTypes, StringTypeNames);

TYPED_TEST(UStringEdit, AppendsPrependsAndInserts) {
    auto string = this->make("");
    EXPECT_EQ(&string.append(this->make("cd")), &string);
    this->expectText(string, "cd");
    EXPECT_EQ(&string.prepend(this->make("a")), &string);
    this->expectText(string, "acd");
    EXPECT_EQ(&string.insert(1, TestFixture::unit('b')), &string);
    this->expectText(string, "abcd");
    EXPECT_EQ(&string.insert(4, this->make("fg")), &string) << "at the size";
    this->expectText(string, "abcdfg");
    EXPECT_EQ(&string.insert(4, this->make("e")), &string);
    this->expectText(string, "abcdefg");
    EXPECT_EQ(&(string += this->make("hi")), &string);
    this->expectText(string, "abcdefghi");
    string.push_back(TestFixture::unit('j'));
    this->expectText(string, "abcdefghij");
    string.insert(string.size(), TestFixture::unit('k')).insert(0, TestFixture::unit('_'));
    this->expectText(string, "_abcdefghijk");
    string.append({})
        .prepend({})
        .insert(3, typename TestFixture::View())
        .insert(string.size(), this->make(""));
    this->expectText(string, "_abcdefghijk");
}

TYPED_TEST(UStringEdit, ErasesUpToTheEnd) {
    const struct {
        std::uint64_t pos, count;
        const char* expected;
    } rows[] = {
        {0, 0, "abcdef"},  {0, 1, "bcdef"},     {2, 2, "abef"},     {5, 1, "abcde"},
        {5, 10, "abcde"},  {2, npos, "ab"},     {0, npos, ""},      {6, 0, "abcdef"},
        {6, 10, "abcdef"}, {6, npos, "abcdef"}, {1, npos - 1, "a"}, {0, 6, ""},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::to_string(row.pos) + ' ' + std::to_string(row.count));
        auto string = this->make("abcdef");
        EXPECT_EQ(&string.erase(row.pos, row.count), &string);
        this->expectText(string, row.expected);
        if (row.count == npos) {
            auto rest = this->make("abcdef");
            rest.erase(row.pos);
            this->expectText(rest, row.expected);
        }
    }
}

TYPED_TEST(UStringEdit, ReplacesUpToTheEnd) {
    const struct {
        std::uint64_t pos, count;
        const char *with, *expected;
    } rows[] = {
        {0, 0, "X", "Xabcdef"}, {0, 1, "X", "Xbcdef"},   {2, 2, "XYZ", "abXYZef"}, {2, 2, "XY", "abXYef"},
        {2, 3, "", "abf"},      {4, npos, "X", "abcdX"}, {6, 0, "X", "abcdefX"},   {6, npos, "X", "abcdefX"},
        {0, npos, "", ""},      {0, 6, "abc", "abc"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::to_string(row.pos) + ' ' + std::to_string(row.count) + ' ' + row.with);
        auto string = this->make("abcdef");
        EXPECT_EQ(&string.replace(row.pos, row.count, this->make(row.with)), &string);
        this->expectText(string, row.expected);
    }
}

TYPED_TEST(UStringEdit, RefusesPositionsBeyondTheEnd) {
    auto string = this->make("abc");
    const auto x = TestFixture::unit('x');
    for (const std::uint64_t pos : {std::uint64_t{4}, std::uint64_t{5}, npos - 1, npos}) {
        SCOPED_TRACE(pos);
        EXPECT_EQ(thrownBy([&] { string.insert(pos, this->make("x")); }), outOfRange);
        EXPECT_EQ(thrownBy([&] { string.insert(pos, typename TestFixture::View()); }), outOfRange);
        EXPECT_EQ(thrownBy([&] { string.insert(pos, x); }), outOfRange);
        EXPECT_EQ(thrownBy([&] { string.erase(pos, 0); }), outOfRange);
        EXPECT_EQ(thrownBy([&] { string.erase(pos); }), outOfRange);
        EXPECT_EQ(thrownBy([&] { string.replace(pos, 0, {}); }), outOfRange);
        EXPECT_EQ(thrownBy([&] { string.replace(pos, npos, this->make("x")); }), outOfRange);
    }
    this->expectText(string, "abc");
    auto empty = this->make("");
    EXPECT_EQ(thrownBy([&] { empty.erase(0, 1); }), "nothing");
    EXPECT_EQ(thrownBy([&] { empty.erase(1, 0); }), outOfRange);
}

TYPED_TEST(UStringEdit, ResizesByCuttingAndFilling) {
    auto string = this->make("abc");
    string.resize(5, TestFixture::unit('x'));
    this->expectText(string, "abcxx");
    string.resize(5, TestFixture::unit('y'));
    this->expectText(string, "abcxx");
    string.resize(2, TestFixture::unit('y'));
    this->expectText(string, "ab");
    string.resize(4);
    this->expectText(string, TestFixture::units({"ab\0\0", 4}));
    string.resize(0);
    this->expectText(string, "");
    string.resize(100, TestFixture::highest);
    this->expectText(string, typename TestFixture::Units(100, TestFixture::highest));
}

TYPED_TEST(UStringEdit, KeepsItsMemoryWhenItIsEmptied) {
    const auto longText = typename TestFixture::Units(200, TestFixture::unit('m'));
    for (const bool byResize : {false, true}) {
        auto string = this->make(longText);
        const auto* const memory = string.rawData();
        if (byResize) {
            string.resize(0, TestFixture::unit('x'));
        } else {
            string.clear();
        }
        this->expectText(string, "");
        for (int i = 0; i < 200; ++i) {
            string.push_back(TestFixture::unit('n'));
        }
        EXPECT_EQ(string.rawData(), memory);
        EXPECT_EQ(string.size(), 200u);
    }
}

TYPED_TEST(UStringEdit, ViewsAPartWithoutACopy) {
    const auto string = this->make("abcdef");
    const struct {
        std::uint64_t pos, count;
        std::size_t start;
        const char* expected;
    } rows[] = {
        {0, npos, 0, "abcdef"}, {0, 0, 0, ""},  {2, 3, 2, "cde"},    {2, npos, 2, "cdef"},  {4, 10, 4, "ef"},
        {6, 1, 6, ""},          {11, 1, 6, ""}, {npos, npos, 6, ""}, {5, npos - 1, 5, "f"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::to_string(row.pos) + ' ' + std::to_string(row.count));
        const auto view = string.substr(row.pos, row.count);
        EXPECT_EQ(view.data(), string.begin() + row.start);
        EXPECT_EQ(show(this->textOf(view)), show(this->units(row.expected)));
    }
    EXPECT_EQ(string.substr(2).size(), 4u);
    EXPECT_TRUE(this->make("").substr(5, 1).isEmpty());
}

TYPED_TEST(UStringEdit, AddsTwoStringsIntoANewOne) {
    const auto left = this->make("ab");
    const auto right = this->make("cd");
    this->expectText(left + right, "abcd");
    this->expectText(right + left, "cdab");
    this->expectText(left + left, "abab");
    this->expectText(left + this->make(""), "ab");
    this->expectText(this->make("") + right, "cd");
    this->expectText(this->make("") + this->make(""), "");
    const auto longText = typename TestFixture::Units(100, TestFixture::unit('z'));
    this->expectText(left + this->make(longText), this->units("ab") + longText);
    this->expectText(left, "ab");
    this->expectText(right, "cd");
}

TEST(UStringEditAny, KeepsTheLeftEncodingAndTakesBytesAsTheyAre) {
    const UString<30> wide("x\0", 2, Encoding::Utf16LE);
    const UString<30> narrow("\xC3\xA9", 2, Encoding::Utf8);
    const UString<30> sum = wide + narrow;
    EXPECT_EQ(sum.toStdString(), std::string("x\0\xC3\xA9", 4));
    EXPECT_EQ(sum.encoding().id(), Encoding(Encoding::Utf16LE).id());
    EXPECT_EQ((narrow + wide).encoding().id(), Encoding(Encoding::Utf8).id());
    UString<30> edited = wide;
    edited += narrow;
    edited.insert(0, narrow).prepend("p").replace(0, 1, "q").append(narrow).replaceAll("q", "r").replaceFirst(
        "r", "s");
    edited.push_back('t');
    edited.resize(3);
    EXPECT_EQ(edited.toStdString(), "s\xC3\xA9");
    EXPECT_EQ(edited.encoding().id(), Encoding(Encoding::Utf16LE).id());
    edited.clear();
    EXPECT_EQ(edited.encoding().id(), Encoding(Encoding::Utf16LE).id());
}

TYPED_TEST(UStringEdit, TakesViewsOfItsOwnText) {
    // Short text lies inside the object, long text elsewhere; the room that is left decides whether the text moves.
    for (const std::size_t repeat : {1u, 40u}) {
        for (const bool roomy : {false, true}) {
            typename TestFixture::Units text;
            for (std::size_t i = 0; i < repeat; ++i) {
                text += this->units("abcd");
            }
            const auto fresh = [&] {
                auto string = this->make(text);
                if (roomy) {
                    string.resize(text.size() * 5);
                    string.resize(text.size());
                }
                return string;
            };
            const std::size_t size = text.size();
            for (const std::size_t from : {std::size_t{0}, std::size_t{1}, size / 2, size}) {
                for (const std::size_t count : {std::size_t{0}, std::size_t{2}, size}) {
                    const auto part = text.substr(from, count);
                    SCOPED_TRACE(show(part) + " of " + show(text) + (roomy ? " with room" : ""));
                    auto string = fresh();
                    string.append(string.substr(from, count));
                    this->expectText(string, text + part);
                    string = fresh();
                    string.prepend(string.substr(from, count));
                    this->expectText(string, part + text);
                    for (const std::size_t at : {std::size_t{0}, std::size_t{1}, size / 2, size}) {
                        string = fresh();
                        string.insert(at, string.substr(from, count));
                        this->expectText(string, text.substr(0, at) + part + text.substr(at));
                        for (const std::size_t gone : {std::size_t{0}, std::size_t{1}, size / 2, size}) {
                            string = fresh();
                            string.replace(at, gone, string.substr(from, count));
                            this->expectText(string, text.substr(0, at) + part +
                                                         text.substr(std::min(at + gone, size)));
                        }
                    }
                }
            }
            auto string = fresh();
            string += string;
            this->expectText(string, text + text);
        }
    }
}

TYPED_TEST(UStringEdit, InsertsAUnitOfItsOwn) {
    auto string = this->make("abcd");
    string.resize(4);
    string.insert(0, string[3]);
    string.push_back(string[1]);
    this->expectText(string, "dabcda");
}

TYPED_TEST(UStringEdit, ReplacesAllWithViewsOfItsOwnText) {
    const auto check = [this](auto tag) {
        auto string = this->make("abcabcabc");
        string.replaceAll(string.substr(1, 1), string.substr(0, 3), tag);
        this->expectText(string, "aabccaabccaabcc");
        string = this->make("abcabcabc");
        string.replaceAll(string.substr(0, 3), string.substr(8, 1), tag);
        this->expectText(string, "ccc");
        string = this->make("abcabcabc");
        string.replaceAll(string.substr(0, 1), string.substr(2, 1), tag);
        this->expectText(string, "cbccbccbc");
        string = this->make("abc");
        string.replaceAll(string, string, tag);
        this->expectText(string, "abc");
        string.replaceFirst(string.substr(1), string, tag);
        this->expectText(string, "aabc");
        string.replaceLast(string.substr(0, 1), string.substr(2), tag);
        this->expectText(string, "abcbc");
    };
    check(TestFixture::String::case_sensitive);
    if constexpr (TestFixture::number != Encoding::Unknown) {
        check(case_insensitive_t());
    }
}

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

// ---- Without regard to case

template <typename Number>
class UStringEditWithoutCase : public StringTest<Number> {
public:
    static constexpr case_insensitive_t tag{};
};
using FoldingTypes = testing::Types<StringType<0>, StringType<1>, StringType<2>, StringType<3>,
                                    StringType<27>, StringType<29>>;
TYPED_TEST_SUITE(UStringEditWithoutCase, FoldingTypes, StringTypeNames);

TYPED_TEST(UStringEditWithoutCase, ReplacesBothCasesAndPutsInWhatItIsGiven) {
    const struct {
        const char *text, *from, *to, *all, *first, *last;
    } rows[] = {
        {"aBAb", "b", "X", "aXAX", "aXAb", "aBAX"},
        {"aBAb", "ab", "Xy", "XyXy", "XyAb", "aBXy"},
        {"AaAa", "a", "aA", "aAaAaAaA", "aAaAa", "AaAaA"},
        {"AaA", "aa", "A", "AA", "AA", "AA"},
        {"ab", "B", "bb", "abb", "abb", "abb"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.text) + ": " + row.from + " by " + row.to);
        auto string = this->make(row.text);
        EXPECT_EQ(&string.replaceAll(this->make(row.from), this->make(row.to), this->tag), &string);
        this->expectText(string, row.all);
        string = this->make(row.text);
        EXPECT_EQ(&string.replaceFirst(this->make(row.from), this->make(row.to), this->tag), &string);
        this->expectText(string, row.first);
        string = this->make(row.text);
        EXPECT_EQ(&string.replaceLast(this->make(row.from), this->make(row.to), this->tag), &string);
        this->expectText(string, row.last);
    }
}

TYPED_TEST(UStringEditWithoutCase, ReturnsAtOnceWhenEmpty) {
    auto empty = this->make("");
    empty.replaceAll(this->make("a"), this->make("b"), this->tag);
    empty.replaceAll({}, this->make("b"), this->tag);
    this->expectText(empty, "");
}

TEST(UStringEditFolded, ReplacesAtTheFoldedPositionWithTheLengthPassed) {
    const case_insensitive_t tag;
    // U+0149 is stored in two bytes and folds to three, so that what is found lies one place further on.
    UString<0> grown("\u0149abc");
    grown.replaceFirst("A", "_", tag);
    EXPECT_EQ(grown.toStdString(), "\u0149a_c");
    // The three bytes of the Kelvin sign fold to one.
    UString<0> shrunk("\u212Axyz");
    shrunk.replaceFirst("X", "_", tag);
    EXPECT_EQ(shrunk.toStdString(), "\xE2_\xAAxyz");
    // "ss" is found in the folded sharp s at 0, and two units go where one was meant.
    UString<2> sharp("\u00DFab");
    sharp.replaceFirst(u"SS", u"!", tag);
    EXPECT_EQ(sharp.getAsUtf8().toStdString(), "!b");
    sharp = UString<2>("a\u00DF");
    sharp.replaceLast(u"S", u"!", tag);
    EXPECT_EQ(sharp.getAsUtf8().toStdString(), "a\u00DF!")
        << "folded position 2 is the end of the stored text";
    // A needle that folds to more units than it was passed with takes as many as it was passed with.
    UString<2> plain("xssy");
    plain.replaceAll(u"\u00DF", u"!", tag);
    EXPECT_EQ(plain.getAsUtf8().toStdString(), "x!sy");
}

TEST(UStringEditFolded, ThrowsWhereTheFoldedPositionIsBeyondTheStoredText) {
    const case_insensitive_t tag;
    UString<2> string("\u00DF\u00DF\u00DFx");
    const std::u16string before(string.begin(), string.end());
    EXPECT_EQ(thrownBy([&] { string.replaceFirst(u"X", u"y", tag); }), outOfRange);
    EXPECT_EQ(thrownBy([&] { string.replaceLast(u"X", u"y", tag); }), outOfRange);
    EXPECT_EQ(thrownBy([&] { string.replaceAll(u"X", u"y", tag); }), outOfRange);
    EXPECT_EQ(std::u16string(string.begin(), string.end()), before);
    // Also when replacements went before it.
    UString<2> later("a\u00DF\u00DF\u00DFx");
    EXPECT_EQ(thrownBy([&] { later.replaceAll(u"a", u"b", tag).replaceAll(u"x", u"y", tag); }), outOfRange);
    EXPECT_EQ(std::u16string(later.begin(), later.end()), u"b\u00DF\u00DF\u00DFx");
    UString<2> both("xa\u00DF\u00DF\u00DFx");
    const std::u16string bothBefore(both.begin(), both.end());
    EXPECT_EQ(thrownBy([&] { both.replaceAll(u"X", u"y", tag); }), outOfRange);
    EXPECT_EQ(std::u16string(both.begin(), both.end()), bothBefore) << "the first one is not replaced either";
}

TEST(UStringEditFolded, SearchesAgainInWhatWasChanged) {
    // Each round folds the text as it then is: the zeros that the first round saw at the end are gone in the second.
    UString<0> string("\u212A\u212A");
    string.replaceAll("k", "", case_insensitive_t());
    // The same by hand, with the bytes as they stand after each round.
    const UString<0> expected = [] {
        UString<0> text("\u212A\u212A");
        for (std::uint64_t pos = 0; pos < text.size();) {
            const std::uint64_t found = text.getAsFoldedCase().find("k", pos);
            if (found == npos) {
                break;
            }
            text.erase(found, 1);
            pos = found;
        }
        return text;
    }();
    EXPECT_EQ(string.toStdString(), expected.toStdString());
    EXPECT_NE(string.toStdString(), "\u212A\u212A");
}

TEST(UStringEditBinary, KnowsNoCaseAndDoesNotFail) {
    const case_insensitive_t tag;
    UString<28> string("AaAa");
    string.replaceAll("a", "x", tag);
    EXPECT_EQ(string.toStdString(), "AxAx");
    string.replaceFirst("A", "y", tag).replaceLast("x", "z", tag);
    EXPECT_EQ(string.toStdString(), "yxAz");
    EXPECT_EQ(thrownBy([&] { string.replaceFirst("a", "b", tag); }), outOfRange);
    EXPECT_EQ(thrownBy([&] { string.replaceLast("a", "b", tag); }), outOfRange);
    string.replaceAll("a", "b", tag);
    string.replaceAll("A", "B", UString<28>::case_insensitive);
    EXPECT_EQ(string.toStdString(), "yxBz");
}

TEST(UStringEditAny, FailsWithoutRegardToCaseUnlessThereIsNothingToSearch) {
    const case_insensitive_t tag;
    const FailureRecord refused = invalidEncodingFailure("unknown");
    UString<30> string("abc", 3, Encoding::Utf8);
    EXPECT_EQ(failureOf([&] { string.replaceAll("a", "b", tag); }), refused);
    EXPECT_EQ(failureOf([&] { string.replaceAll({}, {}, tag); }), refused);
    EXPECT_EQ(failureOf([&] { string.replaceFirst("a", "b", tag); }), refused);
    EXPECT_EQ(failureOf([&] { string.replaceLast("a", "b", tag); }), refused);
    EXPECT_EQ(string.toStdString(), "abc");
    UString<30> empty(Encoding::Utf8);
    EXPECT_EQ(failureOf([&] { empty.replaceAll("a", "b", tag); }), noFailure());
    EXPECT_EQ(failureOf([&] { empty.replaceAll({}, {}, tag); }), noFailure());
    EXPECT_EQ(failureOf([&] { empty.replaceFirst({}, {}, tag); }), refused);
    EXPECT_EQ(failureOf([&] { empty.replaceLast({}, {}, tag); }), refused);
    EXPECT_EQ(empty.encoding().id(), Encoding(Encoding::Utf8).id());
}

TEST(UStringEditFolded, LeavesTheStringWhenFoldingFails) {
    const case_insensitive_t tag;
    UString<29> string("abc");
    const UStringView<29> bad = "x\xE9";
    const FailureRecord expected = failureOf([&] { UString<29>::getAsFoldedCase(bad); });
    EXPECT_EQ(failureOf([&] { string.replaceAll(bad, "y", tag); }), expected);
    EXPECT_EQ(failureOf([&] { string.replaceFirst(bad, "y", tag); }), expected);
    EXPECT_EQ(failureOf([&] { string.replaceLast(bad, "y", tag); }), expected);
    EXPECT_EQ(string.toStdString(), "abc");
    // What is put in makes the text unfit for the second round.
    EXPECT_NE(failureOf([&] { string.replaceAll("a", bad, tag); }), noFailure());
    EXPECT_EQ(string.toStdString(), "abc");
}

TEST(UStringEditPositions, MayCutCharacters) {
    UString<0> bytes("\u00E9x");
    bytes.erase(1, 1);
    EXPECT_EQ(bytes.toStdString(), "\xC3x");
    bytes.insert(1, "\xA9");
    EXPECT_EQ(bytes.toStdString(), "\u00E9x");
    UString<2> pair("\U0001F600");
    pair.insert(1, u"x");
    EXPECT_EQ(std::u16string(pair.begin(), pair.end()), (std::u16string{0xD83D, u'x', 0xDE00}));
}

} // namespace
