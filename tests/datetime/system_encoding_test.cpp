// parse() and format() on a system whose encoding is ISO-8859-1: patterns and values are bytes of that encoding.
//
// This program answers the question for the locale's encoding itself, for the library as well; no such locale needs to
// be installed. The encoding is found out once, so that the program stands apart.

#include "pattern_rows.h"

#include <kvt/datetime/pattern_trace.h>
#include <kvt/encoding/encoding.h>

#include <cstdlib>
#include <langinfo.h>

namespace {

const char* systemName = "ISO-8859-1"; // asked for once in a process; each test has its own

} // namespace

extern "C" char* nl_langinfo(nl_item) noexcept {
    return const_cast<char*>(systemName);
}

namespace {

using kvt::test::expectFormatted;
using kvt::test::expectParsed;
using kvt::test::failure;
using kvt::test::genericFailure;
using kvt::test::mismatch;
using kvt::test::success;

// The plain "C" locale would count as UTF-8.
const bool hasLocale = setenv("LC_ALL", "C.UTF-8", 1) == 0;

TEST(SystemEncoding, IsWhatThisProgramSays) {
    ASSERT_TRUE(hasLocale);
    EXPECT_EQ(kvt::ex::Encoding(kvt::ex::Encoding::System).getName(), "ISO-8859-1");
}

TEST(SystemEncoding, ACharacterIsOneByteOfAPattern) {
    expectParsed({
        {"2020\xC3\xA9"
         "01-02",
         "%Y?%m-%d", success("20200102")},
        {"2020\xC3\xA9"
         "01-02",
         "%Y\xC3\xA9%m-%d", success("20200102")},
        {"\xC3\xA9t\xC3\xA9\xC3\xA9 12", "*\xC3\xA9\xC3\xA9 %H", success("120000")},
    });
}

TEST(SystemEncoding, MessagesAreTextAgain) {
    expectParsed({
        {"2020\xC3\xA9", "%Y\xC3\xA8%m", mismatch("%Y", "\xC3\xA8%m")},
        {"2020\xC3\xA9", "%Y\xC3\xA9%m", mismatch("%Y\xC3\xA9", "%m")},
        {"2020", "%\xC3\xA9", failure(933079, {"%\xC3\xA9", "@DateTimeParse()"})},
        {"2020", "%E\xC3\xA9", failure(933079, {"%E\xC3\xA9", "@DateTimeParse()"})},
        {"2020\xC3\xA9", "%Y\xC3\xA9", failure(933082, {"%Y\xC3\xA9"})},
    });
}

TEST(SystemEncoding, WhatItDoesNotHaveDoesNotSurvive) {
    expectParsed({
        {"2020\xE5\xB9\xB4", "%Y", genericFailure()},
        {"2020-01-02", "%Y-%m-%d\xE5\xB9\xB4", genericFailure()},
        {"2020\xFF", "%Y", genericFailure()},
    });
    expectFormatted({
        {"20200102", "%Y\xE5\xB9\xB4", failure(933084)},
        {"20200102", "\xE5\xB9\xB4", failure(933084)},
        {"20200102", "%Y\xFF", failure(933084)},
    });
}

TEST(SystemEncoding, KeywordsPassOverAValueThatItDoesNotHave) {
    expectParsed({
        {"2020-01-02\xE5\xB9\xB4", "ISO", failure(933097, {"2020-01-02\xE5\xB9\xB4"})},
        {"2020-01-02\xE5\xB9\xB4", "\xE5\xB9\xB4|ISO|ZQT", failure(933097, {"2020-01-02\xE5\xB9\xB4"})},
        {"2020-01-02", "\xE5\xB9\xB4|ISO", success("20200102")},
    });
}

TEST(SystemEncoding, FormatsComeBackAsText) {
    expectFormatted({
        {"20200102", "%Y\xC3\xA9%m",
         success("2020\xC3\xA9"
                 "01")},
        {"20200102", "\xC3\xA9", success("\xC3\xA9")},
        {"20200102", "%\xC3\xA9", failure(933079, {"%\xC3\xA9", "@DateTimeFormat()"})},
    });
}

TEST(SystemEncoding, ATraceCountsBytesOfTheValue) {
    using namespace kvt::ex::datetime;
    const auto traces = traceParse("\xC3\xA9"
                                   "2020x",
                                   "\xC3\xA9%Y%m", false);
    ASSERT_EQ(traces.size(), 1u);
    const auto& steps = traces[0].steps;
    ASSERT_EQ(steps.size(), 3u);
    EXPECT_EQ(steps[0].element, "\xC3\xA9");
    EXPECT_EQ(steps[0].taken, "\xC3\xA9");
    EXPECT_EQ(steps[0].at, 0u);
    EXPECT_EQ(steps[1].taken, "2020");
    EXPECT_EQ(steps[1].at, 2u);
    EXPECT_EQ(steps[2].state, PatternStepState::Stopped);
    EXPECT_EQ(steps[2].at, 6u);
}

// Characters of two bytes that differ in the second one only: the place where they part is within a character.
TEST(SystemEncoding, HalfACharacterIsShownAsALoss) {
    systemName = "EUC-JP";
    expectParsed({
        {"2020\u3042", "%Y\u3042%m", mismatch("%Y\u3042", "%m")},
        {"2020\u3042", "%Y\u3044%m", mismatch("%Y\uFFFD", "\uFFFD%m")},
    });
}

TEST(SystemEncoding, ATraceOfWhatItDoesNotHaveIsUnknown) {
    using namespace kvt::ex::datetime;
    const auto traces = traceParse("2020\xE5\xB9\xB4", "%Y-%m", false);
    ASSERT_EQ(traces.size(), 1u);
    ASSERT_EQ(traces[0].steps.size(), 3u);
    for (const PatternStep& step : traces[0].steps) {
        EXPECT_EQ(step.state, PatternStepState::Unknown);
        EXPECT_TRUE(step.taken.isEmpty());
    }
    EXPECT_FALSE(traces[0].end);
}

} // namespace
