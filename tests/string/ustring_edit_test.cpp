// Editing at positions: the rows, and the rules that look odd and are relied on. Occurrences and units are in
// ustring_edit_occurrences_test.cpp, the same without regard to case in ustring_edit_case_test.cpp. Against every small
// text they are held by ustring_edit_property_test.cpp, and what a failure leaves behind by
// ustring_failure_guarantee_test.cpp.
#include <string/editing_support.h>

#include <algorithm>

namespace {

using namespace kvt::test;
using kvt::ex::detail::case_insensitive_t;

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
        EXPECT_EQ(shown(this->textOf(view)), shown(this->units(row.expected)));
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
                    SCOPED_TRACE(shown(part) + " of " + shown(text) + (roomy ? " with room" : ""));
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
