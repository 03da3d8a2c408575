// Comparison, hash and search: the rows, and the rules that look odd and are relied on. Against every small text they
// are held by ustring_search_property_test.cpp.
#include <support/failure_record.h>
#include <support/string_types.h>

#include <functional>
#include <unordered_set>

namespace {

using namespace kvt::test;
using kvt::ex::detail::case_insensitive_t;
using kvt::ex::detail::case_sensitive_t;

int sign(int value) {
    return (value > 0) - (value < 0);
}

template <typename Number>
class UStringCompare : public StringTest<Number> {};
TYPED_TEST_SUITE(UStringCompare, StringTypes, StringTypeNames);

TYPED_TEST(UStringCompare, OrdersByUnitsAsUnsignedNumbers) {
    const auto high = typename TestFixture::Units(1, TestFixture::highest);
    const auto zero = typename TestFixture::Units(1, 0);
    const auto text = [](const char* ascii) { return TestFixture::units(ascii); };
    const struct {
        typename TestFixture::Units left, right;
        int expected;
    } rows[] = {
        {text(""), text(""), 0},
        {text(""), text("a"), -1},
        {text(""), zero, -1},
        {text("a"), text("a"), 0},
        {text("a"), text("b"), -1},
        {text("B"), text("a"), -1},
        {text("ab"), text("abc"), -1},
        {text("b"), text("abc"), 1},
        {text("a"), text("a") + zero, -1},
        {text("a"), high, -1},
        {text("\x7F"), text("\x80"), -1},
        {text("a\x7F"), text("a") + high, -1},
        {zero, high, -1},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(shown(row.left) + " and " + shown(row.right));
        const auto left = this->make(row.left);
        const auto right = this->make(row.right);
        EXPECT_EQ(sign(left.compare(right)), row.expected);
        EXPECT_EQ(sign(right.compare(left)), -row.expected);
        EXPECT_EQ(sign(left.compare(right, TestFixture::String::case_sensitive)), row.expected);
        EXPECT_EQ(left == right, row.expected == 0);
        EXPECT_EQ(left != right, row.expected != 0);
        EXPECT_EQ(left < right, row.expected < 0);
        EXPECT_EQ(left > right, row.expected > 0);
        EXPECT_EQ(left <= right, row.expected <= 0);
        EXPECT_EQ(left >= right, row.expected >= 0);
        EXPECT_EQ(right<left, row.expected> 0);
    }
}

TYPED_TEST(UStringCompare, GivesOneWhereOnlyLengthsDiffer) {
    EXPECT_EQ(this->make("abc").compare(this->make("ab")), 1);
    EXPECT_EQ(this->make("ab").compare(this->make("abcdef")), -1);
    EXPECT_EQ(this->make("abc").compare(typename TestFixture::View()), 1);
    EXPECT_EQ(this->make("").compare(typename TestFixture::View()), 0);
}

TYPED_TEST(UStringCompare, GivesOneAtTheFirstDifferenceOfWideUnits) {
    if constexpr (!TestFixture::narrow) {
        EXPECT_EQ(this->make("aXz").compare(this->make("aca")), -1);
        EXPECT_EQ(this->make("acz").compare(this->make("aXa")), 1);
        // The low byte of the lesser unit is the greater one.
        EXPECT_EQ(this->make({0x01FF}).compare(this->make({0x0200})), -1);
        EXPECT_EQ(this->make({0x0200}).compare(this->make({0x01FF})), 1);
    } else {
        EXPECT_LT(this->make("aXz").compare(this->make("aca")), 0);
        EXPECT_GT(this->make("acz").compare(this->make("aXa")), 0);
    }
}

TYPED_TEST(UStringCompare, FindsADifferenceAtEachPlaceOfALongText) {
    for (const std::size_t length : {31u, 32u, 33u, 63u, 64u, 65u, 127u, 128u, 129u, 200u}) {
        const auto text = typename TestFixture::Units(length, TestFixture::unit('m'));
        const auto string = this->make(text);
        EXPECT_EQ(string.compare(this->make(text)), 0) << length;
        for (std::size_t at = 0; at < length; ++at) {
            auto other = text;
            other[at] = TestFixture::highest;
            EXPECT_LT(string.compare(this->make(other)), 0) << length << " at " << at;
            other[at] = TestFixture::unit('a');
            EXPECT_GT(string.compare(this->make(other)), 0) << length << " at " << at;
        }
    }
}

TEST(UStringCompareUtf16, PutsSurrogatesBelowTheEndOfTheFirstPlane) {
    const UString<2> supplementary(UStringView<2>(u"\U00010000"));
    for (const char16_t unit : {u'\uE000', u'\uFFFD', u'\uFFFF'}) {
        const UString<2> single(UStringView<2>(&unit, 1));
        EXPECT_LT(supplementary, single);
        EXPECT_EQ(supplementary.compare(single), -1);
        EXPECT_GT(supplementary.getAsUtf32(), single.getAsUtf32())
            << "by code point it is the other way round";
    }
}

TEST(UStringCompareAny, TakesNoAccountOfTheEncoding) {
    const UString<30> left("text", 4, Encoding::Utf8);
    const UString<30> right("text", 4, Encoding::Windows1252);
    EXPECT_TRUE(left == right);
    EXPECT_FALSE(left < right);
    EXPECT_EQ(left.compare(right), 0);
    EXPECT_EQ(left.hash(), right.hash());
}

template <typename Number>
class UStringHash : public StringTest<Number> {};
TYPED_TEST_SUITE(UStringHash, StringTypes, StringTypeNames);

TYPED_TEST(UStringHash, IsFnv1aOverTheBytesOfTheUnits) {
    EXPECT_EQ(this->make("").hash(), 0xcbf29ce484222325u);
    // Of the wide types the bytes are written out: 61 00, 61 00 00 00 and so on.
    using namespace std::string_literals;
    const auto bytes = [](const std::string& ascii) {
        std::string result;
        for (const char c : ascii) {
            result += c + std::string(sizeof(typename TestFixture::Unit) - 1, '\0');
        }
        return result;
    };
    EXPECT_EQ(this->make("a").hash(), UString<28>(UStringView<28>(bytes("a"))).hash());
    EXPECT_EQ(this->make("foobar").hash(), UString<28>(UStringView<28>(bytes("foobar"))).hash());
    if (TestFixture::narrow) {
        EXPECT_EQ(this->make("a").hash(), 0xaf63dc4c8601ec8cu);
        EXPECT_EQ(this->make("foobar").hash(), 0x85944171f73967e8u);
        EXPECT_EQ(this->make("\xFF").hash(), (0xcbf29ce484222325u ^ 0xFFu) * 0x100000001b3u);
    } else {
        EXPECT_NE(this->make("a").hash(), 0xaf63dc4c8601ec8cu);
    }
}

TYPED_TEST(UStringHash, ServesStandardContainers) {
    using Tested = typename TestFixture::String;
    EXPECT_EQ(std::hash<Tested>()(this->make("foobar")), this->make("foobar").hash());
    std::unordered_set<Tested> set;
    set.insert(this->make("a"));
    set.insert(this->make("a"));
    set.insert(this->make("b"));
    EXPECT_EQ(set.size(), 2u);
}

TEST(UStringHashWide, MixesTheLowByteFirst) {
    // 61 00, written out by hand.
    std::uint64_t expected = (0xcbf29ce484222325u ^ 0x61u) * 0x100000001b3u;
    expected = (expected ^ 0x00u) * 0x100000001b3u;
    EXPECT_EQ(UString<2>(UStringView<2>(u"a")).hash(), expected);
    expected = (0xcbf29ce484222325u ^ 0x34u) * 0x100000001b3u;
    expected = (expected ^ 0x12u) * 0x100000001b3u;
    EXPECT_EQ(UString<2>(UStringView<2>(u"\u1234")).hash(), expected);
}

template <typename Number>
class UStringSearch : public StringTest<Number> {};
TYPED_TEST_SUITE(UStringSearch, StringTypes, StringTypeNames);

TYPED_TEST(UStringSearch, BeginsEndsAndContains) {
    const struct {
        const char *text, *needle;
        bool begins, ends, contains;
    } rows[] = {
        {"", "", true, true, true},           {"abc", "", true, true, true},
        {"", "a", false, false, false},       {"abc", "abc", true, true, true},
        {"abc", "abcd", false, false, false}, {"abc", "ab", true, false, true},
        {"abc", "bc", false, true, true},     {"abc", "b", false, false, true},
        {"abc", "ac", false, false, false},   {"abc", "A", false, false, false},
        {"aXa", "a", true, true, true},       {"abc", "xabc", false, false, false},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.text) + " and " + row.needle);
        const auto string = this->make(row.text);
        const auto needle = this->make(row.needle);
        EXPECT_EQ(string.beginsWith(needle), row.begins);
        EXPECT_EQ(string.endsWith(needle), row.ends);
        EXPECT_EQ(string.contains(needle), row.contains);
        EXPECT_EQ(string.beginsWith(needle, TestFixture::String::case_sensitive), row.begins);
        EXPECT_EQ(string.endsWith(needle, TestFixture::String::case_sensitive), row.ends);
        EXPECT_EQ(string.contains(needle, TestFixture::String::case_sensitive), row.contains);
    }
}

TYPED_TEST(UStringSearch, FindsTheFirstAtOrAfterThePosition) {
    const struct {
        const char *text, *needle;
        std::uint64_t pos, expected;
    } rows[] = {
        {"abcabc", "abc", 0, 0},    {"abcabc", "abc", 1, 3},     {"abcabc", "abc", 3, 3},
        {"abcabc", "abc", 4, npos}, {"abcabc", "c", 5, 5},       {"abcabc", "c", 6, npos},
        {"abcabc", "c", 7, npos},   {"abcabc", "c", npos, npos}, {"aaab", "aab", 0, 1},
        {"ab", "abc", 0, npos},     {"abc", "bcd", 0, npos},     {"", "a", 0, npos},
        {"abc", "", 0, 0},          {"abc", "", 2, 2},           {"abc", "", 3, 3},
        {"abc", "", 4, npos},       {"abc", "", npos, npos},     {"", "", 0, 0},
        {"", "", 1, npos},          {"abc", "B", 0, npos},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.text) + " and " + row.needle + " from " + std::to_string(row.pos));
        const auto string = this->make(row.text);
        const auto needle = this->make(row.needle);
        EXPECT_EQ(string.find(needle, row.pos), row.expected);
        EXPECT_EQ(string.find(needle, row.pos, TestFixture::String::case_sensitive), row.expected);
        if (row.pos == 0) {
            EXPECT_EQ(string.find(needle), row.expected);
        }
        if (needle.size() == 1) {
            EXPECT_EQ(string.find(needle[0], row.pos), row.expected);
        }
    }
    EXPECT_EQ(this->make("abc").find(typename TestFixture::View(), 3), 3u) << "a view without an address";
    EXPECT_EQ(this->make("").find(typename TestFixture::View()), 0u);
}

TYPED_TEST(UStringSearch, FindsTheLastAtOrBeforeThePosition) {
    const struct {
        const char *text, *needle;
        std::uint64_t pos, expected;
    } rows[] = {
        {"abcabc", "abc", npos, 3}, {"abcabc", "abc", 3, 3},
        {"abcabc", "abc", 2, 0},    {"abcabc", "abc", 0, 0},
        {"abcabc", "bc", 0, npos},  {"abcabc", "c", 5, 5},
        {"abcabc", "c", 6, 5},      {"abcabc", "c", 4, 2},
        {"abcabc", "c", 1, npos},   {"aaab", "aa", npos, 1},
        {"ab", "abc", npos, npos},  {"", "a", npos, npos},
        {"", "a", 0, npos},         {"abc", "", npos, 3},
        {"abc", "", 4, 3},          {"abc", "", 3, 3},
        {"abc", "", 1, 1},          {"abc", "", 0, 0},
        {"", "", npos, 0},          {"", "", 0, 0},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.text) + " and " + row.needle + " from " + std::to_string(row.pos));
        const auto string = this->make(row.text);
        const auto needle = this->make(row.needle);
        EXPECT_EQ(string.rfind(needle, row.pos), row.expected);
        EXPECT_EQ(string.rfind(needle, row.pos, TestFixture::String::case_sensitive), row.expected);
        if (row.pos == npos) {
            EXPECT_EQ(string.rfind(needle), row.expected);
        }
        if (needle.size() == 1) {
            EXPECT_EQ(string.rfind(needle[0], row.pos), row.expected);
        }
    }
    EXPECT_EQ(this->make("abc").rfind(typename TestFixture::View()), 3u) << "a view without an address";
    EXPECT_EQ(this->make("").rfind(typename TestFixture::View()), 0u);
}

TYPED_TEST(UStringSearch, FindsASingleUnit) {
    const auto string = this->make("abcabc");
    const auto b = TestFixture::unit('b');
    EXPECT_EQ(string.find(b), 1u);
    EXPECT_EQ(string.rfind(b), 4u);
    EXPECT_EQ(string.find(TestFixture::unit('x')), npos);
    EXPECT_EQ(string.rfind(TestFixture::unit('x')), npos);
    EXPECT_EQ(string.find(TestFixture::unit('\0')), npos) << "the zero behind the text is none of its units";
    EXPECT_EQ(string.rfind(TestFixture::unit('\0')), npos);
}

TYPED_TEST(UStringSearch, FindsUnitsOfASetAndLooksAtThePositionItself) {
    const auto string = this->make("abcdefgh");
    const struct {
        const char* set;
        std::uint64_t pos, first, last;
    } rows[] = {
        {"f", 5, 5, 5},      {"f", 4, 5, npos},      {"f", 6, npos, 5},      {"fb", 0, 1, npos},
        {"fb", 2, 5, 1},     {"fb", 7, npos, 5},     {"fb", 8, npos, 5},     {"fb", npos, npos, 5},
        {"", 0, npos, npos}, {"", npos, npos, npos}, {"xyz", 0, npos, npos}, {"hgfedcba", 3, 3, 3},
        {"a", 0, 0, 0},      {"h", 7, 7, 7},         {"ffff", 0, 5, npos},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(std::string(row.set) + " from " + std::to_string(row.pos));
        EXPECT_EQ(string.findFirstOf(this->set(row.set), row.pos), row.first);
        EXPECT_EQ(string.findLastOf(this->set(row.set), row.pos), row.last);
    }
    EXPECT_EQ(string.findFirstOf(this->set("fb")), 1u);
    EXPECT_EQ(string.findLastOf(this->set("fb")), 5u);
    EXPECT_EQ(this->make("").findFirstOf(this->set("f")), npos);
    EXPECT_EQ(this->make("").findLastOf(this->set("f")), npos);
    EXPECT_EQ(this->make("").findLastOf(this->set("f"), 0), npos);
}

TYPED_TEST(UStringSearch, TellsWideUnitsWithEqualLowBytesApart) {
    if constexpr (!TestFixture::narrow) {
        const auto string = this->make({0x0161, 0x0261, 0x0061});
        EXPECT_EQ(string.findFirstOf(this->set("a")), 2u);
        EXPECT_EQ(string.findLastOf(this->set({0x0161})), 0u);
        EXPECT_EQ(string.findFirstOf(this->set({0x0361})), npos);
        EXPECT_EQ(string.find(typename TestFixture::Unit{0x0261}), 1u);
        EXPECT_EQ(string.rfind(typename TestFixture::Unit{0x0361}), npos);
    } else {
        const auto string = this->make("\x61\xE1\x7F\xFF");
        EXPECT_EQ(string.findFirstOf(this->set("\xFF")), 3u);
        EXPECT_EQ(string.findLastOf(this->set("\xE1")), 1u);
        EXPECT_EQ(string.find(TestFixture::unit('\xE1')), 1u);
        EXPECT_EQ(string.rfind(TestFixture::unit('\xFF')), 3u);
    }
}

TYPED_TEST(UStringSearch, FindsStringsOfAnArrayForward) {
    const auto string = this->make("abcdefgh");
    EXPECT_EQ(string.findFirstOf(this->array({"gh", "cd"})), 2u)
        << "the earliest place, not the first string";
    EXPECT_EQ(string.findFirstOf(this->array({"gh", "cd"}), 2), 2u);
    EXPECT_EQ(string.findFirstOf(this->array({"gh", "cd"}), 3), 6u);
    EXPECT_EQ(string.findFirstOf(this->array({"gh", "cd"}), 7), npos);
    EXPECT_EQ(string.findFirstOf(this->array({"ghi", "x"})), npos) << "a needle does not match in part";
    EXPECT_EQ(string.findFirstOf(this->array({})), npos);
    for (const std::uint64_t pos : {0u, 3u, 7u}) {
        EXPECT_EQ(string.findFirstOf(this->array({"x", ""}), pos), pos);
    }
    EXPECT_EQ(string.findFirstOf(this->array({""}), 8), npos);
    EXPECT_EQ(string.findFirstOf(this->array({""}), npos), npos);
    EXPECT_EQ(this->make("").findFirstOf(this->array({""})), npos);
}

TYPED_TEST(UStringSearch, FindsStringsOfAnArrayBackwardFromBelowThePosition) {
    const auto string = this->make("abcdefgh");
    EXPECT_EQ(string.findLastOf(this->array({"f"}), 5), npos);
    EXPECT_EQ(string.findLastOf(this->array({"f"}), 6), 5u);
    EXPECT_EQ(string.findLastOf(this->set("f"), 5), 5u) << "a set of units does look at the position";
    EXPECT_EQ(this->make("abcd").findLastOf(this->array({"cd"}), 3), 2u) << "it may run on past the position";
    EXPECT_EQ(string.findLastOf(this->array({"cd", "gh"})), 6u);
    EXPECT_EQ(string.findLastOf(this->array({"gh", "cd"}), 6), 2u);
    EXPECT_EQ(string.findLastOf(this->array({"a"}), 0), npos);
    EXPECT_EQ(string.findLastOf(this->array({"a"}), 1), 0u);
    EXPECT_EQ(string.findLastOf(this->array({}), 5), npos);
    EXPECT_EQ(string.findLastOf(this->array({""}), 5), 4u);
    EXPECT_EQ(string.findLastOf(this->array({""}), 0), npos);
    EXPECT_EQ(string.findLastOf(this->array({""})), 7u);
    EXPECT_EQ(this->make("").findLastOf(this->array({""})), npos);
}

TYPED_TEST(UStringSearch, CaseTagsSelectTheForms) {
    using Tested = typename TestFixture::String;
    EXPECT_TRUE((std::is_same_v<decltype(Tested::case_sensitive), const case_sensitive_t>));
    EXPECT_TRUE((std::is_same_v<
                 decltype(Tested::case_insensitive),
                 const std::conditional_t<TestFixture::number == 28, case_sensitive_t, case_insensitive_t>>));
    EXPECT_EQ(+Tested::npos, 18446744073709551615u);
}

// ---- Without regard to case

TEST(UStringSearchBinary, TakesItsOwnCaseInsensitiveTagAsCaseSensitive) {
    const UString<28> string("ABCabc");
    EXPECT_EQ(string.find("abc", 0, UString<28>::case_insensitive), 3u);
    EXPECT_EQ(string.rfind("ABC", npos, UString<28>::case_insensitive), 0u);
    EXPECT_FALSE(string.beginsWith("abc", UString<28>::case_insensitive));
    EXPECT_FALSE(string.endsWith("ABC", UString<28>::case_insensitive));
    EXPECT_FALSE(string.contains("aBC", UString<28>::case_insensitive));
    EXPECT_LT(string.compare("abcabc", UString<28>::case_insensitive), 0);
}

template <std::uint32_t N>
std::vector<FailureRecord> failuresWithoutCase(const UString<N>& string, UStringView<N> needle) {
    const case_insensitive_t tag;
    return {
        failureOf([&] { static_cast<void>(string.compare(needle, tag)); }),
        failureOf([&] { static_cast<void>(string.beginsWith(needle, tag)); }),
        failureOf([&] { static_cast<void>(string.endsWith(needle, tag)); }),
        failureOf([&] { static_cast<void>(string.contains(needle, tag)); }),
        failureOf([&] { static_cast<void>(string.find(needle, 0, tag)); }),
        failureOf([&] { static_cast<void>(string.rfind(needle, npos, tag)); }),
    };
}

TEST(UStringSearchBinary, FailsWithATrueCaseInsensitiveTag) {
    const std::vector expected(6, notImplementedFailure("getAsFoldedCase"));
    EXPECT_EQ(failuresWithoutCase<28>(UString<28>("abc"), "b"), expected);
    EXPECT_EQ(failuresWithoutCase<28>(UString<28>(), ""), expected);
}

TEST(UStringSearchAny, FailsWithoutRegardToCase) {
    const std::vector expected(6, invalidEncodingFailure("unknown"));
    EXPECT_EQ(failuresWithoutCase<30>(UString<30>("abc"), "b"), expected);
    EXPECT_EQ(failuresWithoutCase<30>(UString<30>(Encoding::Utf8), ""), expected);
    EXPECT_EQ(failuresWithoutCase<30>(UString<30>(Encoding::Utf16LE), {}), expected);
}

template <typename Number>
class UStringSearchWithoutCase : public StringTest<Number> {
public:
    static constexpr case_insensitive_t tag{};
};
TYPED_TEST_SUITE(UStringSearchWithoutCase, FoldingStringTypes, StringTypeNames);

TYPED_TEST(UStringSearchWithoutCase, TakesLettersOfBothCasesForTheSame) {
    const auto string = this->make("xABCabcX");
    const auto needle = this->make("aBc");
    EXPECT_EQ(string.find(needle, 0, this->tag), 1u);
    EXPECT_EQ(string.find(needle, 2, this->tag), 4u);
    EXPECT_EQ(string.find(needle, 5, this->tag), npos);
    EXPECT_EQ(string.find(needle, npos, this->tag), npos);
    EXPECT_EQ(string.rfind(needle, npos, this->tag), 4u);
    EXPECT_EQ(string.rfind(needle, 3, this->tag), 1u);
    EXPECT_EQ(string.rfind(needle, 0, this->tag), npos);
    EXPECT_TRUE(string.contains(needle, this->tag));
    EXPECT_FALSE(string.contains(this->make("cb"), this->tag));
    EXPECT_TRUE(string.beginsWith(this->make("XaB"), this->tag));
    EXPECT_FALSE(string.beginsWith(needle, this->tag));
    EXPECT_TRUE(string.endsWith(this->make("Cx"), this->tag));
    EXPECT_FALSE(string.endsWith(needle, this->tag));
    EXPECT_EQ(this->make("ABC").compare(this->make("abc"), this->tag), 0);
    EXPECT_LT(this->make("B").compare(this->make("a")), 0);
    EXPECT_GT(this->make("B").compare(this->make("a"), this->tag), 0);
    EXPECT_EQ(this->make("AB").compare(this->make("abC"), this->tag), -1);
    // "[" stands between the capitals and the small letters: both sides are folded down, not up.
    EXPECT_GT(this->make("A").compare(this->make("["), this->tag), 0);
    this->expectText(string, "xABCabcX");
}

TYPED_TEST(UStringSearchWithoutCase, HasTheSameRulesForEmptyText) {
    const auto string = this->make("ABC");
    const auto empty = this->make("");
    EXPECT_EQ(string.find(empty, 3, this->tag), 3u);
    EXPECT_EQ(string.find(empty, 4, this->tag), npos);
    EXPECT_EQ(string.rfind(empty, npos, this->tag), 3u);
    EXPECT_TRUE(string.contains(empty, this->tag));
    EXPECT_TRUE(empty.contains(empty, this->tag));
    EXPECT_TRUE(empty.beginsWith(empty, this->tag));
    EXPECT_TRUE(empty.endsWith(empty, this->tag));
    EXPECT_FALSE(empty.beginsWith(string, this->tag));
    EXPECT_EQ(empty.compare(empty, this->tag), 0);
    EXPECT_EQ(empty.compare(string, this->tag), -1);
    EXPECT_EQ(empty.find(typename TestFixture::View(), 0, this->tag), 0u);
}

TYPED_TEST(UStringSearchWithoutCase, CountsPositionsInTheFoldedText) {
    if constexpr (TestFixture::number != Encoding::UsAscii) {
        // U+0149 folds to two characters.
        const auto string = this->converted("\u0149A");
        const auto folded = string.getAsFoldedCase();
        ASSERT_GT(folded.size(), string.size());
        const auto a = this->make("a");
        EXPECT_EQ(string.find(a, 0, this->tag), folded.size() - 1);
        EXPECT_EQ(string.rfind(a, npos, this->tag), folded.size() - 1);
        EXPECT_EQ(string.find(a, string.size(), this->tag), folded.size() - 1)
            << "beyond the stored text there is folded text";
        EXPECT_EQ(string.find(a, folded.size(), this->tag), npos);
        EXPECT_EQ(string.find(this->make("N"), 0, this->tag), folded.size() - 2);
    }
}

TEST(UStringSearchFolded, HasThesePositions) {
    const case_insensitive_t tag;
    EXPECT_EQ(UString<0>("\u0149A").find("a", 0, tag), 3u);
    EXPECT_EQ(UString<2>("\u0149A").find(u"a", 0, tag), 2u);
    EXPECT_EQ(UString<3>("\u0149A").find(U"a", 0, tag), 2u);
    EXPECT_EQ(UString<27>("\u0149A").find("a", 0, tag), 3u);
    EXPECT_EQ(UString<29>("\u0149A").find("a", 0, tag), 8u);
    EXPECT_EQ(UString<2>("\u00DFX").find(u"x", 0, tag), 2u) << "sharp s folds to two units";
    EXPECT_EQ(UString<2>("\u00DF").rfind(u"S", npos, tag), 1u);
    EXPECT_EQ(UString<0>("STRASSE").compare("stra\u00DFe", tag), 0);
    EXPECT_EQ(UString<2>("STRASSE").compare(u"stra\u00DFe", tag), 0);
    EXPECT_EQ(UString<3>("STRASSE").compare(U"stra\u00DFe", tag), 0);
    EXPECT_EQ(UString<27>("STRASSE").compare("stra\u00DFe", tag), 0);
}

TEST(UStringSearchFolded, KeepsTheLengthOfUtf8ByZeros) {
    const case_insensitive_t tag;
    const UString<0> kelvin("\u212A");
    EXPECT_EQ(kelvin.compare("k", tag), 1);
    EXPECT_EQ(UString<0>("k").compare("\u212A", tag), -1);
    EXPECT_EQ(kelvin.compare("\u212A", tag), 0);
    EXPECT_TRUE(kelvin.beginsWith("k", tag));
    EXPECT_FALSE(kelvin.endsWith("k", tag));
    EXPECT_FALSE(UString<0>("k").beginsWith("\u212A", tag)) << "the needle has its zeros too";
    EXPECT_TRUE(kelvin.endsWith({"\0\0", 2}, tag));
    const UString<0> inside("x\u212Aa");
    EXPECT_EQ(inside.find("a", 0, tag), 2u) << "stored at 4";
    EXPECT_EQ(inside.find({"\0", 1}, 0, tag), 3u) << "the zeros stand at the end";
    EXPECT_EQ(inside.rfind("a", npos, tag), 2u);
    // Where the way goes through UTF-16, the sign is one unit as the letter is.
    EXPECT_EQ(UString<2>("\u212A").compare(u"k", tag), 0);
    EXPECT_EQ(UString<3>("\u212A").compare(U"k", tag), 0);
    EXPECT_EQ(UString<27>("\u212A").compare("k", tag), 0);
    EXPECT_EQ(UString<29>("\u212A").compare("k", tag), 0);
}

TEST(UStringSearchFolded, LeavesBytesBeyondAsciiAloneInAscii) {
    const case_insensitive_t tag;
    const UString<1> string(UStringView<1>("\xC0Z"));
    EXPECT_EQ(string.find("z", 0, tag), 1u);
    EXPECT_EQ(string.find("\xE0", 0, tag), npos);
    EXPECT_EQ(string.find("\xC0", 0, tag), 0u);
    EXPECT_EQ(string.compare("\xC0z", tag), 0);
    EXPECT_NE(string.compare("\xE0z", tag), 0);
    EXPECT_NE(UString<1>(UStringView<1>("[")).compare("{", tag), 0);
    EXPECT_NE(UString<1>(UStringView<1>("@")).compare("`", tag), 0);
}

TEST(UStringSearchFolded, PassesOnTheFailuresOfFoldingTheNeedleFirst) {
    const auto failsAs = [](const auto& string, auto needle, auto failing) {
        using String = std::decay_t<decltype(string)>;
        const FailureRecord expected = failureOf([&] { String::getAsFoldedCase(failing); });
        EXPECT_NE(expected, noFailure());
        EXPECT_EQ(failuresWithoutCase(string, needle), std::vector(6, expected));
    };
    const UStringView<29> bad29 = "x\xE9";
    failsAs(UString<29>("abc"), bad29, bad29);
    failsAs(UString<29>(bad29), UStringView<29>("abc"), bad29);
    failsAs(UString<29>(bad29), UStringView<29>("y\xE8"), UStringView<29>("y\xE8"));
    const UStringView<27> bad27 = "x\xFF";
    failsAs(UString<27>("abc"), bad27, bad27);
    failsAs(UString<27>(bad27), UStringView<27>("abc"), bad27);
    const UStringView<3> bad3 = U"x\xFFFFFFF";
    failsAs(UString<3>("abc"), bad3, bad3);
    failsAs(UString<3>(bad3), UStringView<3>(U"abc"), bad3);
    EXPECT_EQ(failuresWithoutCase<29>(UString<29>("abc"), bad29)[0],
              badEncodingFailure("x\xE9", "zqt-wwjd", "x\uFFFD", "\uFFFD"));
}

TEST(UStringSearchPositions, AreCodeUnits) {
    EXPECT_EQ(UString<0>("\u00E9").size(), 2u);
    EXPECT_EQ(UString<0>("\u00E9").find('\xA9'), 1u);
    EXPECT_EQ(UString<0>("\u00E9x").find("\xA9x"), 1u) << "in the middle of a character";
    EXPECT_EQ(UString<2>("\U0001F600x").find(u'x'), 2u);
    EXPECT_EQ(UString<2>("\U0001F600x").find(char16_t{0xDE00}), 1u);
    EXPECT_EQ(UString<3>("\U0001F600x").find(U'x'), 1u);
    const UString<30> wide("x\0y\0", 4, Encoding::Utf16LE);
    EXPECT_EQ(wide.find('y'), 2u) << "bytes, whatever the encoding";
    EXPECT_EQ(wide.find({"\0y", 2}), 1u);
}

} // namespace
