// The lines that people write with strings: that they compile, for all eight types, and what they give. The file is
// also compiled alone by every compiler that is there, as C++17 and as C++20 (see CMakeLists.txt).

#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <set>
#include <sstream>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

namespace {

using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringArray;
using kvt::ex::UStringView;
using Utf8 = UString<Encoding::Utf8>;
using Ascii = UString<Encoding::UsAscii>;
using Utf16 = UString<Encoding::Utf16LE>;
using Any = UString<Encoding::Unknown>;

template <std::uint32_t... Ns>
struct Numbers {};
using AllTypes = Numbers<0, 1, 2, 3, 27, 28, 29, 30>;

/// Literals in the units of a string: `narrow`, u"..." or U"...".
template <typename Unit>
constexpr const Unit* chosen(const char* narrow, const char16_t* utf16, const char32_t* utf32) {
    if constexpr (std::is_same_v<Unit, char16_t>) {
        return utf16;
    } else if constexpr (std::is_same_v<Unit, char32_t>) {
        return utf32;
    } else {
        return narrow;
    }
}
#define UNITS(text) chosen<Unit>(text, u##text, U##text)
#define UNIT(character) static_cast<Unit>(character)
#define VIEW(text) UStringView<N>(UNITS(text))

template <std::uint32_t N>
UString<N> ofUnits(UStringView<N> view) {
    UString<N> string;
    string.append(view);
    return string;
}

template <std::uint32_t N>
UStringArray<N> arrayOf(std::initializer_list<UStringView<N>> views) {
    UStringArray<N> array;
    for (const auto view : views) {
        array.push_back(ofUnits(view));
    }
    return array;
}

template <typename Left, typename Right>
void expectLess(const Left& left, const Right& right) {
    EXPECT_TRUE(left < right && left <= right && left != right);
    EXPECT_TRUE(right > left && right >= left && right != left);
    EXPECT_FALSE(left == right || right == left || left > right || left >= right || right < left ||
                 right <= left);
}

template <typename Left, typename Right>
void expectSame(const Left& left, const Right& right) {
    EXPECT_TRUE(left == right && right == left && left <= right && right <= left && left >= right &&
                right >= left);
    EXPECT_FALSE(left != right || right != left || left < right || right < left || left > right ||
                 right > left);
}

template <std::uint32_t N>
void comparesWithText() {
    using Unit = typename UString<N>::value_type;
    const UString<N> b("b");
    const UStringView<N> view = b;
    const std::basic_string<Unit> standard(UNITS("b"));
    const std::basic_string_view<Unit> standardView(standard);
    const auto compare = [](const auto& left, const auto& same, const auto& larger) {
        expectSame(left, same);
        expectLess(left, larger);
    };
    compare(b, "b", "ba");
    compare(b, u8"b", u8"c");
    compare(b, UNITS("b"), UNITS("c"));
    compare(b, view, UStringView<N>(UNITS("c")));
    compare(b, standard, standard + UNITS("a"));
    compare(b, standardView, std::basic_string_view<Unit>(UNITS("c")));
    compare(view, UNITS("b"), UNITS("c"));
    compare(view, standard, standard + UNITS("a"));
    compare(view, standardView, std::basic_string_view<Unit>(UNITS("c")));
    compare(view, view, UStringView<N>(UNITS("c")));
    compare(b, b, UString<N>("c"));
    char buffer[] = "b";
    expectSame(b, buffer);
    EXPECT_TRUE(b.substr(0, 1) == UNITS("b"));
}

template <std::uint32_t N>
void addsText() {
    using Unit = typename UString<N>::value_type;
    const UString<N> s("b");
    const std::basic_string<Unit> standard(UNITS("x"));
    EXPECT_EQ(s + "x", "bx");
    EXPECT_EQ("x" + s, "xb");
    EXPECT_EQ(u8"x" + s, "xb");
    EXPECT_EQ(s + UNITS("x") + s, "bxb");
    EXPECT_EQ(UNITS("x") + s, "xb");
    EXPECT_EQ(s + UNIT('x'), "bx");
    EXPECT_EQ(UNIT('x') + s, "xb");
    EXPECT_EQ(s + standard, "bx");
    EXPECT_EQ(standard + s, "xb");
    EXPECT_EQ(s + std::basic_string_view<Unit>(standard), "bx");
    EXPECT_EQ(s + s.substr(0), "bb");
    EXPECT_EQ(s.substr(0) + s, "bb");
    if constexpr (N != Encoding::Unknown) {
        EXPECT_EQ(s.substr(0) + UNITS("x") + "y", "bxy");
        EXPECT_EQ(UNITS("x") + s.substr(0), "xb");
        EXPECT_EQ(s.substr(0) + UNIT('x'), "bx");
        EXPECT_EQ(UNIT('x') + s.substr(0), "xb");
        EXPECT_EQ(s.substr(0) + s.substr(0), "bb");
        EXPECT_EQ(standard + s.substr(0) + standard, "xbx");
    }
    UString<N> sum = "a";
    sum += "b";
    sum += UNITS("c");
    sum += UNIT('d');
    sum += standard;
    sum += s;
    sum += s.substr(0);
    sum += sum;
    EXPECT_EQ(sum, "abcdxbbabcdxbb");
    sum = "new";
    EXPECT_EQ(sum, "new");
    sum = UNITS("newer");
    EXPECT_EQ(sum, "newer");
}

template <std::uint32_t N>
void searches() {
    using Unit = typename UString<N>::value_type;
    const UString<N> s = ofUnits(VIEW("one, two; three"));
    EXPECT_TRUE(s.contains(UNITS("two")) && s.contains(UNIT(';')) && !s.contains(UNIT('!')));
    EXPECT_TRUE(s.beginsWith(UNITS("one")) && s.beginsWith(UNIT('o')) && !s.beginsWith(UNIT('n')));
    EXPECT_TRUE(s.endsWith(UNITS("three")) && s.endsWith(UNIT('e')) && !s.endsWith(UNIT('o')));
    EXPECT_FALSE(UString<N>().beginsWith(UNIT('a')) || UString<N>().endsWith(UNIT('a')));
    EXPECT_EQ(s.findFirstOf({UNIT(','), UNIT(';')}), 3U);
    EXPECT_EQ(s.findLastOf({UNIT(','), UNIT(';')}), 8U);
    EXPECT_EQ(s.findFirstOf({UNIT(',')}), 3U);
    EXPECT_EQ(s.findFirstOf({0}), s.npos);
    EXPECT_EQ(s.findFirstOf({UNITS("three"), UNITS("two")}), 5U);
    EXPECT_EQ(s.findFirstOf({UNITS("three"), UNITS("two")}, 6), 10U);
    EXPECT_EQ(s.findLastOf({UNITS("three"), UNITS("two")}), 10U);
    EXPECT_EQ(s.findLastOf({UNITS("three"), UNITS("two")}, 10), 5U);
    EXPECT_EQ(s.findFirstOf({UNITS("two")}), 5U);
    if constexpr (sizeof(Unit) == 1) {
        EXPECT_EQ(s.findFirstOf({"three", "two"}), 5U);
        EXPECT_EQ(s.split({", ", "; "}).size(), 3U);
    } else if constexpr (sizeof(Unit) == 2) {
        EXPECT_EQ(s.findFirstOf({u"three", u"two"}), 5U);
        EXPECT_EQ(s.split({u", ", u"; "}).size(), 3U);
    }
    EXPECT_EQ(s.split({UNITS(", "), UNITS("; ")}),
              (arrayOf<N>({UNITS("one"), UNITS(" two"), UNITS(" three")})));
    EXPECT_EQ(s.split({UNITS(", ")}), s.split(UNITS(", ")));
    EXPECT_EQ(s.split({UNIT(','), UNIT(';')}), (arrayOf<N>({UNITS("one"), UNITS(" two"), UNITS(" three")})));
    EXPECT_EQ(s.split({UNIT(',')}), s.split(UNIT(',')));
    EXPECT_EQ(s.split({UNIT(' '), UNIT(',')}, s.SkipEmptyParts, 1)[0], UNITS("one"));
    EXPECT_EQ(s.split({UNITS(","), UNITS(" ")}, s.SkipEmptyParts).size(), 3U);
    EXPECT_EQ((UStringArray<N>{UNITS("a"), "b", s}.join("")), "ab" + s);
}

/// What is in braces gives what the same array gives, at every position.
template <std::uint32_t N>
void searchesForWhatIsInBracesLikeForAnArray() {
    using Unit = typename UString<N>::value_type;
    const UString<N> s("abcdabcd");
    const std::initializer_list<UStringView<N>> lists[] = {
        {},
        {UNITS("")},
        {UNITS("cd")},
        {UNITS("cd"), UNITS("bcd")},
        {UNITS("x"), UNITS("da")},
        {UNITS("d"), UNITS("")},
        {UNITS("abcdabcdx")},
    };
    const std::initializer_list<Unit> sets[] = {
        {}, {UNIT('a')}, {UNIT('d'), UNIT('b')}, {UNIT('x'), UNIT('c')}, {UNIT('x')}};
    for (const auto& set : sets) {
        for (std::uint64_t pos = 0; pos < 11; ++pos) {
            const std::uint64_t at = pos < 10 ? pos : s.npos;
            EXPECT_EQ(s.findFirstOf(set, at), s.findFirstOf(kvt::ex::vector<Unit>(set), at)) << at;
            EXPECT_EQ(s.findLastOf(set, at), s.findLastOf(kvt::ex::vector<Unit>(set), at)) << at;
            EXPECT_EQ(UString<N>().findLastOf(set, at), s.npos);
        }
    }
    for (const auto& list : lists) {
        for (std::uint64_t pos = 0; pos < 11; ++pos) {
            const std::uint64_t at = pos < 10 ? pos : s.npos;
            EXPECT_EQ(s.findFirstOf(list, at), s.findFirstOf(arrayOf(list), at)) << at;
            EXPECT_EQ(s.findLastOf(list, at), s.findLastOf(arrayOf(list), at)) << at;
            EXPECT_EQ(UString<N>().findLastOf(list, at), s.npos);
        }
    }
}

template <std::uint32_t N>
void strips() {
    using Unit = typename UString<N>::value_type;
    UString<N> s = ofUnits(VIEW("  x\t "));
    EXPECT_EQ(s.strip({UNIT(' ')}), VIEW("x\t "));
    EXPECT_EQ(s.rstrip({UNIT(' '), UNIT('\t')}), "x");
    EXPECT_EQ(s.replaceAll({UNIT('x'), UNIT('y')}, UNIT('z')), "z");
}

template <std::uint32_t N>
void goesIntoTheStandardLibrary() {
    using Unit = typename UString<N>::value_type;
    const UString<N> s("text");
    std::vector<UString<N>> list = {"c", "a", s};
    std::sort(list.begin(), list.end());
    EXPECT_EQ(list.front(), "a");
    EXPECT_NE(std::find(list.begin(), list.end(), "c"), list.end());
    std::map<UString<N>, int> tree = {{"one", 1}};
    ++tree["one"];
    EXPECT_EQ(tree.at("one"), 2);
    std::set<UString<N>, std::less<>> transparent = {"one"};
    EXPECT_EQ(transparent.count(UNITS("one")) + transparent.count(UStringView<N>(UNITS("two"))), 1U);
    std::unordered_map<UString<N>, UString<N>> table;
    table["key"] = s;
    EXPECT_EQ(table.begin()->second, s);
    const auto [key, value] = *table.begin();
    EXPECT_EQ(key + value, "keytext");
    std::basic_string<Unit> units;
    for (const Unit unit : s) {
        units += unit;
    }
    EXPECT_EQ(units, std::basic_string<Unit>(s));
    const std::basic_string_view<Unit> view = s;
    EXPECT_EQ(UStringView<N>(view), s);
    std::ostringstream out;
    out << s;
    if constexpr (N != Encoding::Unknown) {
        out << s.substr(1) << UString<N>(units);
        EXPECT_EQ(out.str(), "textexttext");
    }
    const UString<N> conditional = s.isEmpty() ? s : "x";
    EXPECT_EQ(conditional, "x");
#ifdef __cpp_impl_three_way_comparison
    struct Pair {
        UString<N> first;
        int second;
        auto operator<=>(const Pair&) const = default;
    };
    EXPECT_TRUE((Pair{"a", 2} < Pair{"b", 1}) && (Pair{"a", 2} == Pair{"a", 2}));
    EXPECT_TRUE((s <=> UString<N>("texts")) < 0);
#endif
}

template <std::uint32_t... Ns>
void forAll(Numbers<Ns...>) {
    (comparesWithText<Ns>(), ...);
    (addsText<Ns>(), ...);
    (searches<Ns>(), ...);
    (searchesForWhatIsInBracesLikeForAnArray<Ns>(), ...);
    (strips<Ns>(), ...);
    (goesIntoTheStandardLibrary<Ns>(), ...);
}

TEST(NaturalLines, GiveTheSameOnAllEightTypes) {
    forAll(AllTypes{});
}

template <std::uint32_t N, std::uint32_t M>
void comparesAsConverted(const UString<N>& left, const UString<M>& right) {
    const UString<N> converted(right);
    EXPECT_EQ((left == right), (left == converted));
    EXPECT_EQ((left != right), (left != converted));
    EXPECT_EQ((left < right), (left < converted));
    EXPECT_EQ((left > right), (left > converted));
    EXPECT_EQ((left <= right), (left <= converted));
    EXPECT_EQ((left >= right), (left >= converted));
}

template <std::uint32_t N, std::uint32_t M>
void comparesWithString() {
    const UString<N> left("b");
    for (const char* const text : {"a", "b", "c"}) {
        const UString<M> right(text);
        if constexpr (N == M || M != Encoding::Binary) {
            comparesAsConverted(left, right);
        } else {
            EXPECT_THROW(comparesAsConverted(left, right), kvt::ex::UStringBinaryTranscodingException);
            EXPECT_THROW(EXPECT_TRUE(left == right), kvt::ex::UStringBinaryTranscodingException);
        }
    }
}

template <std::uint32_t N, std::uint32_t... Ms>
void comparesWithAll(Numbers<Ms...>) {
    (comparesWithString<N, Ms>(), ...);
}

template <std::uint32_t... Ns>
void allPairs(Numbers<Ns...> all) {
    (comparesWithAll<Ns>(all), ...);
}

TEST(NaturalLines, StringsOfTwoEncodingsAreComparedInThatOfTheLeft) {
    allPairs(AllTypes{});
    EXPECT_TRUE(Utf8("\xC3\xA9") == Utf16(u"\u00e9"));
    EXPECT_FALSE(Utf8("\xC3\xA9") == Any("\xE8", 1, Encoding::Windows1252));
    EXPECT_THROW(EXPECT_TRUE(Ascii("e") == Utf16(u"\u00e9")), kvt::ex::UStringTranscodingException);
}

TEST(NaturalLines, AnyStringOnTheLeftComparesUnitsAndOnTheRightIsConverted) {
    const Any sent("\xE9", 1, Encoding::Windows1252);
    EXPECT_FALSE(sent == Utf8("\xC3\xA9"));
    EXPECT_TRUE(Utf8("\xC3\xA9") == sent);
    EXPECT_TRUE(sent == "\xE9");
    EXPECT_TRUE("\xE9" == sent);
}

TEST(NaturalLines, SumKeepsTheEncodingOfAnAnyStringOnEitherSide) {
    const Any sent("\xE9", 1, Encoding::Windows1252);
    EXPECT_EQ((sent + "x").encoding(), Encoding::Windows1252);
    EXPECT_EQ(("x" + sent).encoding(), Encoding::Windows1252);
    EXPECT_EQ(("x" + sent).getAsUtf8(), "x\xC3\xA9");
    EXPECT_EQ(('x' + sent + std::string("y")).encoding(), Encoding::Windows1252);
}

TEST(NaturalLines, LiteralIsUtf8BesideAStringAndUnitsBesideAView) {
    const UString<29> escaped("\xC3\xA9");
    EXPECT_TRUE(escaped == "\xC3\xA9" && "\xC3\xA9" == escaped);
    EXPECT_TRUE(escaped.substr(0) == "<u00e9>");
    EXPECT_EQ("," + escaped, "," + UString<29>("\xC3\xA9"));
    EXPECT_TRUE(Utf16("\xC3\xA9") == "\xC3\xA9");
    EXPECT_THROW(EXPECT_TRUE(Ascii("e") == "\xC3\xA9"), kvt::ex::UStringTranscodingException);
}

TEST(NaturalLines, OrderIsThatOfUnsignedUnits) {
    expectLess(Utf8("a"), "\xC3\xA9");
    expectLess("a", Utf8("\xC3\xA9"));
    expectLess(Utf16(u"\xD800"), u"\uFFFD");
    expectLess(Utf8("a"), std::string_view("a\0", 2));
}

} // namespace
