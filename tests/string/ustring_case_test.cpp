// Upper case, lower case and case folding of each string type: what is asked of ICU, what becomes of its answers, and
// what a failure says. How single characters map is checked against Unicode's own data in ustring_case_data_test.cpp.
#include <string/intercepted_case_mapping.h>
#include <string/one_failing_allocation.h>
#include <string/string_types.h>
#include <support/failure_record.h>

#include <kvt/foundation/throwable.h>

#include <gtest/gtest.h>
#include <unicode/uloc.h>

#include <array>
#include <cstdlib>
#include <functional>
#include <iostream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

namespace kvt::test {
namespace {

using namespace std::string_literals;
using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

enum Mapping { upper, lower, folded };

constexpr std::array utf8Functions = {"ucasemap_utf8ToUpper", "ucasemap_utf8ToLower",
                                      "ucasemap_utf8FoldCase"};
constexpr std::array utf16Functions = {"u_strToUpper", "u_strToLower", "u_strFoldCase"};
constexpr std::array utf8Prefixes = {"UString<Encoding::Utf8>::toUpperCase() failed on ",
                                     "UString<Encoding::Utf8>::toLowerCase() failed on ",
                                     "UString<Encoding::Utf8>::toFoldedCase() failed on "};
constexpr std::array utf16Prefixes = {"UString<Encoding::Utf16>::toUpperCase() failed on ",
                                      "UString<Encoding::Utf16>::toLowerCase() failed on ",
                                      "UString<Encoding::Utf16>::toFoldedCase() failed on "};

/// One of the nine members. `run` leaves the mapped text in the string that it is given.
template <std::uint32_t N>
struct Member {
    Mapping mapping;
    const char* name;
    const char* form;
    bool inPlace;
    std::function<void(UString<N>&)> run;
};

template <std::uint32_t N>
std::vector<Member<N>> nineMembers() {
    using S = UString<N>;
    using V = UStringView<N>;
    return {
        {upper, "toUpperCase", "in place", true, [](S& s) { s.toUpperCase(); }},
        {lower, "toLowerCase", "in place", true, [](S& s) { s.toLowerCase(); }},
        {folded, "toFoldedCase", "in place", true, [](S& s) { s.toFoldedCase(); }},
        {upper, "getAsUpperCase", "const", false, [](S& s) { s = std::as_const(s).getAsUpperCase(); }},
        {lower, "getAsLowerCase", "const", false, [](S& s) { s = std::as_const(s).getAsLowerCase(); }},
        {folded, "getAsFoldedCase", "const", false, [](S& s) { s = std::as_const(s).getAsFoldedCase(); }},
        {upper, "getAsUpperCase", "static", false, [](S& s) { s = S::getAsUpperCase(V(s)); }},
        {lower, "getAsLowerCase", "static", false, [](S& s) { s = S::getAsLowerCase(V(s)); }},
        {folded, "getAsFoldedCase", "static", false, [](S& s) { s = S::getAsFoldedCase(V(s)); }},
    };
}

/// A text for each type, from UTF-8; ASCII where the type takes nothing else.
template <std::uint32_t N>
UString<N> sample(const char* text, const char* ascii) {
    return UString<N>(N == Encoding::UsAscii ? ascii : text);
}

template <typename Type>
class UStringCase : public ::testing::Test {
public:
    static constexpr std::uint32_t number = Type::number;
    static constexpr bool refuses = number == Encoding::Binary || number == Encoding::Unknown;
};
TYPED_TEST_SUITE(UStringCase, AllStringTypes, StringTypeName);

TYPED_TEST(UStringCase, AllNineMembersMapTheTextOrRefuse) {
    constexpr auto N = TestFixture::number;
    const UString<N> text = sample<N>("Abc Straße ΑΒΓ αβγ", "Abc {XYZ} @[`z");
    const std::array expected = {sample<N>("ABC STRASSE ΑΒΓ ΑΒΓ", "ABC {XYZ} @[`Z"),
                                 sample<N>("abc straße αβγ αβγ", "abc {xyz} @[`z"),
                                 sample<N>("abc strasse αβγ αβγ", "abc {xyz} @[`z")};
    for (const Member<N>& member : nineMembers<N>()) {
        SCOPED_TRACE(member.name + " "s + member.form);
        UString<N> result(text);
        const FailureRecord failure = failureOf([&] { member.run(result); });
        if constexpr (N == Encoding::Binary) {
            EXPECT_EQ(failure, notImplementedFailure(member.name));
            EXPECT_EQ(result, text);
        } else if constexpr (N == Encoding::Unknown) {
            EXPECT_EQ(failure, invalidEncodingFailure("unknown"));
            EXPECT_EQ(result, text);
        } else {
            EXPECT_EQ(failure, noFailure());
            EXPECT_EQ(shown(result), shown(expected[member.mapping]));
        }
    }
}

TYPED_TEST(UStringCase, AnEmptyStringIsMappedWithoutIcuOrRefusedLikeAnyOther) {
    constexpr auto N = TestFixture::number;
    for (const Member<N>& member : nineMembers<N>()) {
        SCOPED_TRACE(member.name + " "s + member.form);
        InterceptedCaseMapping icu;
        UString<N> empty;
        const FailureRecord failure = failureOf([&] { member.run(empty); });
        EXPECT_EQ(failure, N == Encoding::Binary    ? notImplementedFailure(member.name)
                           : N == Encoding::Unknown ? invalidEncodingFailure("unknown")
                                                    : noFailure());
        EXPECT_TRUE(empty.isEmpty());
        EXPECT_TRUE(icu.calls.empty());
    }
    if constexpr (!TestFixture::refuses) {
        EXPECT_TRUE(UString<N>::getAsFoldedCase(UStringView<N>()).isEmpty()) << "a view without data";
    }
}

TYPED_TEST(UStringCase, AsksTheFunctionOfItsFormOnce) {
    constexpr auto N = TestFixture::number;
    const std::array<std::uint32_t, 3> options = {0, 0, 0};
    for (const Member<N>& member : nineMembers<N>()) {
        SCOPED_TRACE(member.name + " "s + member.form);
        InterceptedCaseMapping icu;
        UString<N> text = sample<N>("aB é", "aB c");
        const auto size = static_cast<std::int32_t>(text.size());
        failureOf([&] { member.run(text); });
        std::vector<CaseCall> expected;
        if (N == Encoding::Utf8) {
            expected.push_back({utf8Functions[member.mapping], size, size, 0, "none", 0, lastCaseMap()});
        } else if (N != Encoding::UsAscii && !TestFixture::refuses) {
            expected.push_back({utf16Functions[member.mapping], 4, 4, 0,
                                member.mapping == folded ? "none" : "null", options[member.mapping],
                                nullptr});
        }
        EXPECT_EQ(icu.calls, expected);
    }
}

TYPED_TEST(UStringCase, AFailureOfIcuSaysWhatTextItWasAbout) {
    constexpr auto N = TestFixture::number;
    if constexpr (N != Encoding::UsAscii && !TestFixture::refuses) {
        for (const Member<N>& member : nineMembers<N>()) {
            SCOPED_TRACE(member.name + " "s + member.form);
            InterceptedCaseMapping icu;
            icu.answer(1, U_ILLEGAL_ARGUMENT_ERROR);
            const UString<N> original("Größe 1");
            UString<N> text(original);
            const std::string prefix =
                N == Encoding::Utf8 ? utf8Prefixes[member.mapping] : utf16Prefixes[member.mapping];
            try {
                member.run(text);
                ADD_FAILURE() << "nothing was thrown";
            } catch (const kvt::ex::Throwable& failure) {
                EXPECT_EQ(failure.className().toStdString(), "kvt::ex::UStringException");
                EXPECT_EQ(failure.what().toStdString(),
                          "[0] icuStringHelper() failed\n[1] " + prefix + "Größe 1");
            }
            EXPECT_EQ(text, original);
        }
    }
}

TYPED_TEST(UStringCase, AForeignExceptionBecomesFatal) {
    constexpr auto N = TestFixture::number;
    if constexpr (N != Encoding::UsAscii && !TestFixture::refuses) {
        const std::vector<std::function<void()>> foreign = {[] { throw std::runtime_error("standard"); },
                                                            [] { throw std::bad_alloc(); }, [] { throw 42; }};
        for (const Member<N>& member : nineMembers<N>()) {
            for (const auto& thrown : foreign) {
                SCOPED_TRACE(member.name + " "s + member.form);
                InterceptedCaseMapping icu;
                icu.fail(thrown);
                const UString<N> original("Größe 2");
                UString<N> text(original);
                const std::string prefix =
                    N == Encoding::Utf8 ? utf8Prefixes[member.mapping] : utf16Prefixes[member.mapping];
                try {
                    member.run(text);
                    ADD_FAILURE() << "nothing was thrown";
                } catch (const kvt::ex::FatalError& failure) {
                    EXPECT_EQ(failure.className().toStdString(), "kvt::ex::FatalError");
                    EXPECT_EQ(failure.what().toStdString(),
                              "[0] Exception of unexpected type encountered\n[1] " + prefix + "Größe 2");
                }
                EXPECT_EQ(text, original);
            }
        }
    }
}

TYPED_TEST(UStringCase, WithoutMemoryTheStringStaysAsItWas) {
    constexpr auto N = TestFixture::number;
    if constexpr (!TestFixture::refuses) {
        std::string utf8;
        std::string ascii;
        for (int i = 0; i < 20; ++i) {
            utf8 += "Straße ﬃ K";
            ascii += "Strasse K";
        }
        const UString<N> original = sample<N>(utf8.c_str(), ascii.c_str());
        for (const Member<N>& member : nineMembers<N>()) {
            if (!member.inPlace) {
                continue;
            }
            SCOPED_TRACE(member.name);
            UString<N> expected(original);
            member.run(expected);
            const std::string prefix =
                N == Encoding::Utf8 ? utf8Prefixes[member.mapping] : utf16Prefixes[member.mapping];
            std::size_t failures = 0;
            for (std::size_t index = 0;; ++index) {
                UString<N> text(original);
                std::string thrown;
                try {
                    const OneFailingAllocation failing(index);
                    member.run(text);
                } catch (const kvt::ex::FatalError& failure) {
                    thrown = failure.what().toStdString();
                    EXPECT_EQ(thrown, "[0] Exception of unexpected type encountered\n[1] " + prefix + utf8);
                } catch (const std::bad_alloc&) {
                    thrown = "std::bad_alloc";
                    EXPECT_FALSE(N == Encoding::Utf8 || N == Encoding::Utf16LE) << "allocation " << index;
                }
                EXPECT_EQ(text, thrown.empty() ? expected : original) << "allocation " << index;
                if (!OneFailingAllocation::happened()) {
                    break;
                }
                failures += thrown.empty() ? 0 : 1;
                ASSERT_LT(index, 1000U);
            }
            EXPECT_EQ(failures == 0, N == Encoding::UsAscii) << failures;
        }
    }
}

TYPED_TEST(UStringCase, ConstFormsLeaveTheStringAlone) {
    constexpr auto N = TestFixture::number;
    const UString<N> text = sample<N>("aBß", "aBc");
    const UString<N> copy(text);
    failureOf([&] { text.getAsUpperCase(); });
    failureOf([&] { text.getAsLowerCase(); });
    failureOf([&] { text.getAsFoldedCase(); });
    EXPECT_EQ(text, copy);
}

// ---- UString<0> and UString<2>: the length rule

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

// ---- The answers of ICU

template <std::uint32_t N>
void expectStatuses() {
    const UString<N> text("abc");
    const auto map = [&] { return text.getAsUpperCase(); };
    for (int status = U_ERROR_WARNING_START; status <= 40; ++status) {
        SCOPED_TRACE(status);
        const bool usable = status == 0 || status == -124 || status == 15;
        {
            InterceptedCaseMapping icu;
            icu.answer(3, status);
            EXPECT_EQ(failureOf(map).type, usable ? "" : "kvt::ex::UStringException");
            EXPECT_EQ(icu.calls.size(), 1U);
        }
        {
            InterceptedCaseMapping icu;
            icu.answer(5, U_BUFFER_OVERFLOW_ERROR);
            icu.answer(5, status);
            EXPECT_EQ(failureOf(map).type, usable ? "" : "kvt::ex::UStringException") << "in the second call";
            ASSERT_EQ(icu.calls.size(), 2U);
            EXPECT_EQ(icu.calls[1].status, 0);
        }
    }
}

TEST(UStringCaseIcu, OnlyThreeStatusesPass) {
    expectStatuses<0>();
    expectStatuses<2>();
}

template <std::uint32_t N>
void expectAnswers() {
    const UString<N> text("abc");
    struct Row {
        const char* reason;
        std::int32_t first;
        int status;
        std::int32_t second;
        std::vector<std::int32_t> capacities;
        std::size_t size;
    };
    for (const Row& row : {
             Row{"less than there is room for", 1, 0, 0, {3}, 3},
             Row{"nothing", 0, 0, 0, {3}, 3},
             Row{"just what there is room for", 3, U_STRING_NOT_TERMINATED_WARNING, 0, {3}, 3},
             Row{"more", 7, U_BUFFER_OVERFLOW_ERROR, 7, {3, 7}, 7},
             Row{"more, without an overflow", 4, 0, 4, {3, 4}, 4},
             Row{"less in the second call", 7, U_BUFFER_OVERFLOW_ERROR, 2, {3, 7}, 7},
             Row{"still more in the second call, which is the last",
                 7,
                 U_BUFFER_OVERFLOW_ERROR,
                 9,
                 {3, 7},
                 7},
             Row{"an overflow that is none", 2, U_BUFFER_OVERFLOW_ERROR, 0, {3}, 3},
         }) {
        SCOPED_TRACE(row.reason);
        InterceptedCaseMapping icu;
        icu.answer(row.first, row.status);
        icu.answer(row.second, U_BUFFER_OVERFLOW_ERROR);
        const UString<N> result = text.getAsFoldedCase();
        std::vector<std::int32_t> capacities;
        for (const CaseCall& call : icu.calls) {
            capacities.push_back(call.capacity);
            EXPECT_EQ(call.length, 3);
        }
        EXPECT_EQ(capacities, row.capacities);
        EXPECT_EQ(unitsOf(result), Units<N>(row.size, 0)) << "nothing was written, so the units are zeros";
    }
}

TEST(UStringCaseIcu, TheResultGrowsToWhatIsNeededAndNeverShrinks) {
    expectAnswers<0>();
    expectAnswers<2>();
}

TEST(UStringCaseIcu, AFailureOfTheLibrarysOwnKindKeepsItsClassAndItems) {
    const auto thrownBy = [](auto thrown) -> std::string {
        InterceptedCaseMapping icu;
        icu.fail([=] { throw thrown; });
        try {
            UString<2>("x").toLowerCase();
        } catch (const kvt::ex::Throwable& failure) {
            return (failure.className() + UString<0>("\n") + failure.what()).toStdString();
        }
        return "nothing";
    };
    const std::string line = std::string("\n[1] ") + utf16Prefixes[lower] + 'x';
    EXPECT_EQ(thrownBy(kvt::ex::InvalidEncodingException("n")),
              "kvt::ex::InvalidEncodingException\n[0] msgnum=910005 %0=n" + line);
    EXPECT_EQ(thrownBy(kvt::ex::FatalError("f")), "kvt::ex::FatalError\n[0] f" + line);
    EXPECT_EQ(thrownBy(kvt::ex::Throwable("t")), "kvt::ex::Throwable\n[0] t" + line);
}

TEST(UStringCaseIcu, TheContextShowsTextThatIsNoneAsWellAsItCan) {
    const auto contextOf = [](const auto& text) {
        InterceptedCaseMapping icu;
        icu.answer(0, U_INTERNAL_PROGRAM_ERROR);
        return failureOf([&] { text.getAsUpperCase(); }).text;
    };
    const std::u16string lone = {u'a', 0xD800, u'b'};
    EXPECT_EQ(contextOf(UString<2>(lone.data(), lone.size())),
              "icuStringHelper() failed" + std::string(utf16Prefixes[upper]) + "a\uFFFDb");
    EXPECT_EQ(contextOf(UString<0>("a\xFF"
                                   "b")),
              "icuStringHelper() failed" + std::string(utf8Prefixes[upper]) +
                  "a\xFF"
                  "b");
}

TEST(UStringCaseIcu, Utf16FollowsTheDefaultLocale) {
    const std::string before = uloc_getDefault();
    UErrorCode status = U_ZERO_ERROR;
    uloc_setDefault("tr", &status);
    const UString<2> dotted = UString<2>(u"i", 1).getAsUpperCase();
    const UString<2> dotless = UString<2>(u"I", 1).getAsLowerCase();
    const UString<2> plainFold = UString<2>(u"I", 1).getAsFoldedCase();
    uloc_setDefault(before.c_str(), &status);
    EXPECT_EQ(shown(dotted), "{130}");
    EXPECT_EQ(shown(dotless), "{131}");
    EXPECT_EQ(shown(plainFold), "i");
}

// ---- UString<1>

TEST(UStringCaseAscii, OnlyTheLettersChange) {
    std::string all;
    for (int byte = 0; byte < 256; ++byte) {
        all += static_cast<char>(byte);
    }
    std::array<std::string, 3> expected = {all, all, all};
    for (std::size_t i = 0; i < 26; ++i) {
        expected[upper]['a' + i] = static_cast<char>('A' + i);
        expected[lower]['A' + i] = static_cast<char>('a' + i);
        expected[folded]['A' + i] = static_cast<char>('a' + i);
    }
    for (const Member<1>& member : nineMembers<1>()) {
        SCOPED_TRACE(member.name + " "s + member.form);
        UString<1> text{UStringView<1>(all)};
        member.run(text);
        EXPECT_EQ(text.toStdString(), expected[member.mapping]);
    }
}

TEST(UStringCaseAscii, InPlaceItWorksOnTheBufferItself) {
    for (const Member<1>& member : nineMembers<1>()) {
        if (member.inPlace) {
            SCOPED_TRACE(member.name);
            UString<1> text(std::string(100, 'q').c_str());
            const char* const buffer = text.rawData();
            const std::size_t before = allocationCount();
            member.run(text);
            EXPECT_EQ(allocationCount(), before);
            EXPECT_EQ(text.rawData(), buffer);
        }
    }
}

// ---- The way through UTF-16

TEST(UStringCaseByUtf16, BothWaysOfTheConversionAreThoseOfStrings) {
    // The zeros that stand for a loss of units would survive; UTF-16 loses none here.
    EXPECT_EQ(shown(UString<3>("K\u212A\U00010400").getAsFoldedCase()), "kk{10428}");
    EXPECT_EQ(UString<27>("K\u212A\u00DF").getAsFoldedCase().toStdString(), "kkss")
        << "no longer three bytes and two";
    EXPECT_EQ(UString<29>(UStringView<29>("A<u00df><comma><U>")).getAsFoldedCase().toStdString(),
              "ass<comma><lt>u<gt>");
}

TEST(UStringCaseByUtf16, FailuresOfTheConversionComeOutAsTheyAre) {
    const std::u32string wrong = {U'a', 0x110000, U'b'};
    const UString<3> utf32(wrong.data(), wrong.size());
    const UString<27> system{UStringView<27>("a\xFF"
                                             "b")};
    const UString<29> wwjd{UStringView<29>("a\xE9")};
    const FailureRecord utf32Failure = failureOf([&] { UString<2>{utf32}; });
    const FailureRecord systemFailure = failureOf([&] { UString<2>{system}; });
    const FailureRecord wwjdFailure = failureOf([&] { UString<2>{wwjd}; });
    EXPECT_EQ(utf32Failure.number, 910002U);
    EXPECT_EQ(systemFailure.number, 910002U);
    EXPECT_EQ(wwjdFailure.number, 910002U);
    const auto expectAll = [](const auto& text, const auto& members, const FailureRecord& expected) {
        for (const auto& member : members) {
            auto copy = text;
            EXPECT_EQ(failureOf([&] { member.run(copy); }), expected) << member.name << ' ' << member.form;
            EXPECT_EQ(copy, text);
        }
    };
    expectAll(utf32, nineMembers<3>(), utf32Failure);
    expectAll(system, nineMembers<27>(), systemFailure);
    expectAll(wwjd, nineMembers<29>(), wwjdFailure);
}

// ---- UString<30>

TEST(UStringCaseAny, EveryEncodingIsRefused) {
    for (const char* name : {"UTF-8", "UTF-16LE", "US-ASCII", "windows-1252", "zqt-wwjd", "zqt-binary"}) {
        for (const Member<30>& member : nineMembers<30>()) {
            UString<30> text("ab", 2, Encoding(kvt::future::string_view(name)));
            EXPECT_EQ(failureOf([&] { member.run(text); }), invalidEncodingFailure("unknown"))
                << name << member.name;
            EXPECT_EQ(shown(text), "ab");
            EXPECT_EQ(text.encoding(), Encoding(kvt::future::string_view(name)));
        }
    }
}

// ---- The one case map. Each of these needs a process in which nothing was mapped yet.

class UStringCaseProcess : public ::testing::Test {
protected:
    void SetUp() override { GTEST_FLAG_SET(death_test_style, "threadsafe"); }
};

/// Ends the process: well, or with what was different on the standard error stream.
[[noreturn]] void finish(const std::vector<std::pair<std::string, std::string>>& comparisons) {
    int status = 0;
    for (const auto& [actual, expected] : comparisons) {
        if (actual != expected) {
            std::cerr << "is:     " << actual << "\nwanted: " << expected << std::endl;
            status = 1;
        }
    }
    std::_Exit(status);
}

std::string upperOr(const UString<0>& text) {
    try {
        return text.getAsUpperCase().toStdString();
    } catch (const kvt::ex::UStringException& failure) {
        return failure.className().toStdString() + ' ' + failure.what().toStdString();
    }
}

[[noreturn]] void mapWhileTheMapCannotBeOpened() {
    const std::string refused =
        "kvt::ex::UStringException [0] Unable to open an ICU case map for the default locale."
        "\n[1] UString<Encoding::Utf8>::toUpperCase() failed on ";
    setCaseMapStatus(U_MISSING_RESOURCE_ERROR);
    const std::string byError = upperOr("a");
    const std::string empty = upperOr("");
    const std::string utf16 = UString<2>(u"a", 1).getAsUpperCase().getAsUtf8().toStdString();
    const std::string utf32 = UString<3>("a").getAsFoldedCase().getAsUtf8().toStdString();
    setCaseMapStatus(U_USING_DEFAULT_WARNING);
    const std::string byWarning = upperOr("b");
    const int leaked = openedCaseMaps() - closedCaseMaps();
    setCaseMapStatus(U_ZERO_ERROR);
    const std::string opened = upperOr("c");
    setCaseMapStatus(U_MISSING_RESOURCE_ERROR);
    const std::string stillOpen = upperOr("d");
    finish({{byError, refused + 'a'},
            {empty, ""},
            {utf16, "A"},
            {utf32, "a"},
            {byWarning, refused + 'b'},
            {std::to_string(leaked), "0"},
            {opened, "C"},
            {stillOpen, "D"}});
}

TEST_F(UStringCaseProcess, AMapThatCannotBeOpenedIsTriedAgain) {
    EXPECT_EXIT(mapWhileTheMapCannotBeOpened(), ::testing::ExitedWithCode(0), "");
}

[[noreturn]] void mapNothingInUtf8() {
    UString<0>().toUpperCase();
    UString<0>::getAsFoldedCase(UStringView<0>());
    UString<1>("a").toUpperCase();
    UString<2>("a").toUpperCase();
    UString<3>("a").toFoldedCase();
    UString<27>("a").toLowerCase();
    UString<29>("a").toUpperCase();
    finish({{std::to_string(openedCaseMaps()), "0"}});
}

TEST_F(UStringCaseProcess, OnlyUtf8WithUnitsNeedsTheMap) {
    EXPECT_EXIT(mapNothingInUtf8(), ::testing::ExitedWithCode(0), "");
}

[[noreturn]] void mapOnManyThreads() {
    std::vector<std::thread> threads;
    std::vector<std::string> results(8);
    for (std::string& result : results) {
        threads.emplace_back([&result] {
            for (int i = 0; i < 200; ++i) {
                result = upperOr("straße");
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    std::vector<std::pair<std::string, std::string>> comparisons = {{std::to_string(openedCaseMaps()), "1"},
                                                                    {lastCaseMapArguments(), "\"\" 0"},
                                                                    {std::to_string(closedCaseMaps()), "0"}};
    for (const std::string& result : results) {
        comparisons.emplace_back(result, "STRASSE");
    }
    finish(comparisons);
}

TEST_F(UStringCaseProcess, ThreadsShareOneMap) {
    EXPECT_EXIT(mapOnManyThreads(), ::testing::ExitedWithCode(0), "");
}

[[noreturn]] void mapAndLeave() {
    upperOr("a");
    announceClosing();
    std::exit(7);
}

TEST_F(UStringCaseProcess, TheMapIsClosedAtExit) {
    EXPECT_EXIT(mapAndLeave(), ::testing::ExitedWithCode(7), "case map closed");
}

// y with diaeresis has its capital outside Latin-1.
[[noreturn]] void mapInLatin1() {
    setenv("LC_ALL", "C.UTF-8", 1);
    setCodeSet("ISO-8859-1");
    UString<27> text{UStringView<27>("\xE9\xFFz")};
    const FailureRecord failure = failureOf([&] { text.toUpperCase(); });
    const FailureRecord expected = failureOf([] { UString<27>{UString<2>(u"\u00C9\u0178Z", 3)}; });
    finish({{std::to_string(expected.number), "910003"},
            {expected.parameters.at(0), "\u00C9\u0178Z"},
            {::testing::PrintToString(failure), ::testing::PrintToString(expected)},
            {shown(text), "{E9}{FF}z"},
            {shown(UString<27>{UStringView<27>("\xE9")}.getAsUpperCase()), "{C9}"}});
}

TEST_F(UStringCaseProcess, ACapitalThatTheSystemEncodingLacksFailsAsAConversion) {
    EXPECT_EXIT(mapInLatin1(), ::testing::ExitedWithCode(0), "");
}

} // namespace
} // namespace kvt::test
