// The one case map of the process. Each of these tests needs a process in which nothing was mapped yet.
#include <string/intercepted_case_mapping.h>
#include <support/failure_record.h>
#include <support/string_types.h>

#include <kvt/foundation/throwable.h>

#include <gtest/gtest.h>

#include <cstdlib>
#include <iostream>
#include <string>
#include <thread>
#include <utility>
#include <vector>

namespace kvt::test {
namespace {

using kvt::ex::UString;
using kvt::ex::UStringView;

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

// It folds by way of UTF-8 where there is a map for that.
[[noreturn]] void foldLongUtf16WhileTheMapCannotBeOpened() {
    const std::string capitals(5000, 'A');
    const UString<2> text = UString<0>(capitals.data(), capitals.size()).getAsUtf16();
    setCaseMapStatus(U_MISSING_RESOURCE_ERROR);
    const std::string without = text.getAsFoldedCase().getAsUtf8().toStdString();
    setCaseMapStatus(U_ZERO_ERROR);
    const std::string with = text.getAsFoldedCase().getAsUtf8().toStdString();
    finish({{without, std::string(5000, 'a')}, {with, without}});
}

TEST_F(UStringCaseProcess, LongUtf16FoldsWithoutTheMapToo) {
    EXPECT_EXIT(foldLongUtf16WhileTheMapCannotBeOpened(), ::testing::ExitedWithCode(0), "");
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

[[noreturn]] void mapInADestructorThatRunsLate() {
    static const struct Late {
        ~Late() {
            finish({{std::to_string(closedCaseMaps()), "1"},
                    {upperOr("straße"), "STRASSE"},
                    {upperOr("é"), "É"},
                    {std::to_string(openedCaseMaps()), "2"}});
        }
    } madeBeforeTheMap;
    upperOr("a");
    std::exit(1);
}

TEST_F(UStringCaseProcess, ADestructorThatRunsLaterMapsWithAMapOfItsOwn) {
    EXPECT_EXIT(mapInADestructorThatRunsLate(), ::testing::ExitedWithCode(0), "");
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
