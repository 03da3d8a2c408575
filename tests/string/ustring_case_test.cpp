// Upper case, lower case and case folding of each string type: that all nine members do the same, what they ask of ICU,
// what a failure says, and what is particular to a type. Lengths of results are in ustring_case_length_test.cpp, the
// answers of ICU in ustring_case_icu_test.cpp, the one case map in ustring_case_process_test.cpp. How single characters
// map is checked against Unicode's own data in ustring_case_data_test.cpp.
#include <string/case_mapping_members.h>
#include <string/intercepted_case_mapping.h>
#include <support/allocations.h>
#include <support/failure_record.h>
#include <support/string_types.h>

#include <kvt/foundation/throwable.h>

#include <gtest/gtest.h>

#include <array>
#include <functional>
#include <new>
#include <stdexcept>
#include <string>
#include <vector>

namespace kvt::test {
namespace {

using namespace std::string_literals;
using kvt::ex::Encoding;
using kvt::ex::UString;
using kvt::ex::UStringView;

template <typename Type>
class UStringCase : public ::testing::Test {
public:
    static constexpr std::uint32_t number = Type::value;
    static constexpr bool refuses = number == Encoding::Binary || number == Encoding::Unknown;
};
TYPED_TEST_SUITE(UStringCase, StringTypes, StringTypeNames);

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
                    const FailingAllocations failing(index, 1);
                    member.run(text);
                } catch (const kvt::ex::FatalError& failure) {
                    thrown = failure.what().toStdString();
                    EXPECT_EQ(thrown, "[0] Exception of unexpected type encountered\n[1] " + prefix + utf8);
                } catch (const std::bad_alloc&) {
                    thrown = "std::bad_alloc";
                    EXPECT_FALSE(N == Encoding::Utf8 || N == Encoding::Utf16LE) << "allocation " << index;
                }
                EXPECT_EQ(text, thrown.empty() ? expected : original) << "allocation " << index;
                if (!FailingAllocations::happened()) {
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

} // namespace
} // namespace kvt::test
