// What becomes of ICU's answers to a case mapping: statuses, lengths, exceptions that pass, and its default locale.
#include <string/case_mapping_members.h>
#include <string/intercepted_case_mapping.h>
#include <support/failure_record.h>
#include <support/string_types.h>

#include <kvt/foundation/throwable.h>

#include <gtest/gtest.h>
#include <unicode/uloc.h>

#include <string>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::UString;

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

// Of a long text ICU is asked for the words that the tables leave to it.
TEST(UStringCaseIcu, AFailureWithinALongTextIsOne) {
    std::string words;
    for (int i = 0; i < 500; ++i) {
        words += "\u039f\u0394\u039f\u03a3 ";
    }
    const UString<0> text(words.data(), words.size());
    const auto map = [&] { return text.getAsLowerCase(); };
    EXPECT_EQ(failureOf(map).type, ""); // and the tables are made
    InterceptedCaseMapping icu;
    icu.answer(0, U_ILLEGAL_ARGUMENT_ERROR);
    EXPECT_EQ(failureOf(map).type, "kvt::ex::UStringException");
    EXPECT_EQ(icu.calls.size(), 1U);
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

TEST(UStringCaseIcu, Utf16ThatIsNotWellFormedIsFoldedToo) {
    std::u16string text(1000, u'A');
    text[500] = u'\xD800';
    std::u16string folded(1000, u'a');
    folded[500] = u'\xD800';
    const UString<2> result = UString<2>(text.data(), text.size()).getAsFoldedCase();
    EXPECT_EQ(std::u16string(result.rawData(), result.size()), folded);
}

} // namespace
} // namespace kvt::test
