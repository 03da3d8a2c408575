// How long the result of a case mapping is: UString<0> and UString<2> keep the length of their source where the mapping
// gives less, and how many calls and allocations that takes.
#include <string/case_mapping_members.h>
#include <string/intercepted_case_mapping.h>
#include <support/allocations.h>
#include <support/string_types.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace kvt::test {
namespace {

using namespace std::string_literals;
using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

struct LengthRow {
    const char* reason;
    Mapping mapping;
    const char* sourceUtf8;
    const char16_t* sourceUtf16;
    std::string utf8;
    std::u16string utf16;
    std::size_t utf8Calls;
    std::size_t utf16Calls;
};

const std::vector<LengthRow> lengthRows = {
    {"two bytes give two letters, one unit gives two", upper, "\u00DF", u"\u00DF", "SS", u"SS", 1, 2},
    {"three bytes give three letters, one unit gives three", upper, "\uFB03", u"\uFB03", "FFI", u"FFI", 1, 2},
    {"three letters of two bytes", upper, "\u0390", u"\u0390", "\u0399\u0308\u0301", u"\u0399\u0308\u0301", 2,
     2},
    {"the Kelvin sign shrinks in UTF-8", folded, "\u212A", u"\u212A", "k\0\0"s, u"k", 1, 1},
    {"also in lower case", lower, "\u212A", u"\u212A", "k\0\0"s, u"k", 1, 1},
    {"the Angstrom sign shrinks by one", lower, "\u212B", u"\u212B", "\u00E5\0"s, u"\u00E5", 1, 1},
    {"dotless i", upper, "\u0131", u"\u0131", "I\0"s, u"I", 1, 1},
    {"long s", upper, "\u017F", u"\u017F", "S\0"s, u"S", 1, 1},
    {"capital sharp s grows in one form and shrinks in the other", folded, "\u1E9E", u"\u1E9E", "ss\0"s,
     u"ss", 1, 2},
    {"dotted I folds to two characters", folded, "\u0130", u"\u0130", "i\u0307", u"i\u0307", 2, 2},
    {"only the sum of growth and loss shows", folded, "\u212A\u0130", u"\u212A\u0130", "ki\u0307\0"s,
     u"ki\u0307", 1, 2},
    {"a lasting loss stands at the end", lower, "\u212Ax\u00DF", u"\u212Ax\u00DF", "kx\u00DF\0\0"s,
     u"kx\u00DF", 1, 1},
    {"surrogate pairs", lower, "\U00010400", u"\U00010400", "\U00010428", u"\U00010428", 1, 1},
    {"final sigma", lower, "\u0391\u03A3 \u03A3\u0391", u"\u0391\u03A3 \u03A3\u0391",
     "\u03B1\u03C2 \u03C3\u03B1", u"\u03B1\u03C2 \u03C3\u03B1", 1, 1},
    {"folding knows no final sigma", folded, "\u0391\u03A3", u"\u0391\u03A3", "\u03B1\u03C3", u"\u03B1\u03C3",
     1, 1},
    {"full folding, without the Turkic rule", folded, "I\u0131", u"I\u0131", "i\u0131", u"i\u0131", 1, 1},
};

template <std::uint32_t N, typename Source>
void expectRow(const LengthRow& row, Source source, const Units<N>& expected, std::size_t calls) {
    for (const Member<N>& member : nineMembers<N>()) {
        if (member.mapping == row.mapping) {
            SCOPED_TRACE(std::string(row.reason) + ", UTF-" + (N == Encoding::Utf8 ? "8" : "16") + ", " +
                         member.form);
            UString<N> text{UStringView<N>(source)};
            InterceptedCaseMapping icu;
            member.run(text);
            EXPECT_EQ(shown(text), shown<N>(expected));
            EXPECT_EQ(icu.calls.size(), calls);
        }
    }
}

TEST(UStringCaseLength, AResultIsNeverShorterThanItsSource) {
    for (const LengthRow& row : lengthRows) {
        expectRow<Encoding::Utf8>(row, row.sourceUtf8, row.utf8, row.utf8Calls);
        expectRow<Encoding::Utf16LE>(row, row.sourceUtf16, row.utf16, row.utf16Calls);
    }
}

TEST(UStringCaseLength, TrailingZerosAreUnitsOfTheText) {
    const UString<0> kelvin = UString<0>("\u212A").getAsFoldedCase();
    EXPECT_EQ(kelvin.size(), 3U);
    EXPECT_NE(kelvin, UString<0>("k"));
    EXPECT_EQ(kelvin.find('\0'), 1U);
    EXPECT_NE(UString<0>("\u212A").compare("k", UString<0>::case_insensitive), 0);
    EXPECT_TRUE(UString<0>("\u212A").beginsWith("k", UString<0>::case_insensitive));
}

TEST(UStringCaseLength, ZerosInsideAreMappedOver) {
    EXPECT_EQ(shown(UString<0>(UStringView<0>("a\0b", 3)).getAsUpperCase()), "A{0}B");
    EXPECT_EQ(shown(UString<2>(UStringView<2>(u"a\0b", 3)).getAsUpperCase()), "A{0}B");
}

// Long enough for the tables, with a sigma, of which only ICU knows whether a word ends there.
template <std::uint32_t N>
void expectLongInPlace() {
    std::string text;
    for (int i = 0; i < 1000; ++i) {
        text += "Stra\u00dfe \u03a3\u0391\u03a3 \u0130I\u0149 ";
    }
    const UString<N> source = UString<N>(UString<0>(text.data(), text.size()));
    UString<N> upper = source;
    upper.toUpperCase();
    EXPECT_TRUE(upper == source.getAsUpperCase());
    EXPECT_TRUE(upper.beginsWith(UString<N>(UString<0>("STRASSE \u03a3\u0391\u03a3 \u0130I\u02bcN S"))));
    UString<N> lower = source;
    lower.toLowerCase();
    EXPECT_TRUE(lower == source.getAsLowerCase());
    EXPECT_TRUE(lower.beginsWith(UString<N>(UString<0>("stra\u00dfe \u03c3\u03b1\u03c2 i\u0307i\u0149 s"))));
    UString<N> folded = source;
    folded.toFoldedCase();
    EXPECT_TRUE(folded == source.getAsFoldedCase());
    EXPECT_TRUE(folded.beginsWith(UString<N>(UString<0>("strasse \u03c3\u03b1\u03c3 i\u0307i\u02bcn s"))));
}

TEST(UStringCaseLength, ALongTextIsMappedInPlaceAsInACopy) {
    expectLongInPlace<0>();
    expectLongInPlace<2>();
    expectLongInPlace<3>();
}

TEST(UStringCaseLength, AViewIsMappedToItsOwnEnd) {
    EXPECT_EQ(shown(UString<0>::getAsUpperCase(UStringView<0>("abcdef", 3))), "ABC");
    EXPECT_EQ(shown(UString<1>::getAsUpperCase(UStringView<1>("abcdef", 3))), "ABC");
    EXPECT_EQ(shown(UString<2>::getAsUpperCase(UStringView<2>(u"abcdef", 3))), "ABC");
    EXPECT_EQ(shown(UString<3>::getAsUpperCase(UStringView<3>(U"abcdef", 3))), "ABC");
    EXPECT_EQ(shown(UString<27>::getAsUpperCase(UStringView<27>("abcdef", 3))), "ABC");
    EXPECT_EQ(shown(UString<29>::getAsUpperCase(UStringView<29>("abcdef", 3))), "ABC");
}

// A mapping that is no longer than its source costs one call and one allocation.
TEST(UStringCaseLength, TheCommonCaseAllocatesOnce) {
    const UString<0> utf8(std::string(100, 'a').c_str());
    const UString<2> utf16(utf8);
    utf8.getAsUpperCase(); // opens the case map
    const std::size_t before = allocationCount();
    const auto upper8 = utf8.getAsUpperCase();
    const std::size_t between = allocationCount();
    const auto upper16 = utf16.getAsUpperCase();
    EXPECT_EQ(between - before, 1U);
    EXPECT_EQ(allocationCount() - between, 1U);
    EXPECT_EQ(upper8.size() + upper16.size(), 200U);
}

} // namespace
} // namespace kvt::test
