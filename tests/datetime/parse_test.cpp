// parse() by patterns: literal text, names, seconds since 1970, offsets, and what kind of value comes out. Numbers,
// fuzzy words and keywords have files of their own.

#include "pattern_rows.h"

#include <kvt/datetime/datetime.h>

#include <cctype>
#include <string>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::expectParsed;
using kvt::test::failure;
using kvt::test::mismatch;
using kvt::test::silentFailure;
using kvt::test::success;
using kvt::test::ustring;

Answer unknownFlag(std::string flag) {
    return failure(933079, {std::move(flag), "@DateTimeParse()"});
}

// ---- What comes before any format is looked at

TEST(Parse, FailsWithoutMessageOnAnEmptyValue) {
    expectParsed({
        {"", "%Y", silentFailure()},
        {"   ", "%Y", silentFailure()},
        {" \t\r\n\f\v", "ZQT", silentFailure()},
        {"", "", silentFailure()}, // the value is looked at first
    });
}

TEST(Parse, FailsOnAnEmptyFormat) {
    expectParsed({
        {"20200102", "", failure(933074)},
        {"20200102", " \t\r\n\f\v", failure(933074)},
    });
}

TEST(Parse, StripsWhiteSpaceFromValueAndFormat) {
    expectParsed({
        {" \t2020-01-02\r\n", "\f%Y-%m-%d$\v", success("20200102")},
        {" 20200102 ", " ZQT ", success("20200102")},
    });
}

// ---- Literal text

TEST(ParseLiterals, MatchByteForByte) {
    expectParsed({
        {"on 2020-01-02", "on %Y-%m-%d", success("20200102")},
        {"On 2020-01-02", "on %Y-%m-%d", mismatch("", "on %Y-%m-%d")},
        {"2020  01-02", "%Y %m-%d", mismatch("%Y ", "%m-%d")},
        {"2020 01-02", "%Y  %m-%d", mismatch("%Y ", " %m-%d")},
        {"2020\t01-02", "%Y %m-%d", mismatch("%Y", " %m-%d")},
        {"2020\xE5\xB9\xB4"
         "1-2",
         "%Y\xE5\xB9\xB4%m-%d", success("20200102")},
        {"2020-01", "%Y-%m-%d", mismatch("%Y-%m", "-%d")},
    });
}

// The first two bytes of the two characters are the same.
TEST(ParseLiterals, AMismatchWithinACharacterIsOneOfTheCharacter) {
    expectParsed({
        {"2020\xE6\x97\xA5", "%Y\xE6\x9C\x88", mismatch("%Y", "\xE6\x9C\x88")},
        {"2020\xE5\xB9\xB4", "%Y\xE5\xB9\xB5%m", mismatch("%Y", "\xE5\xB9\xB5%m")},
        {"2020\xC3\xA4", "%Y\xC3\xA4\xC3\xB6", mismatch("%Y\xC3\xA4", "\xC3\xB6")},
    });
    // A format that is not text is shown byte by byte, and what was read stays read.
    EXPECT_EQ(answerOf(parse(ustring("2020"), ustring("%Y\xB5"), false)), mismatch("%Y", "\xB5"));
}

TEST(ParseLiterals, TheFlagsOfSpecialCharacters) {
    expectParsed({
        {"%2020$*?01-02", "%%%Y%$%*%?%m-%d", success("20200102")},
        {"x2020", "%%%Y", mismatch("", "%%%Y")},
        {"2020x", "%Y%$", mismatch("%Y", "%$")},
        {"2020x", "%Y%*", mismatch("%Y", "%*")},
        {"2020x", "%Y%?", mismatch("%Y", "%?")},
        {"2020", "%Y%%", mismatch("%Y", "%%")},
    });
}

TEST(ParseLiterals, WhatIsLeftOfTheValueIsIgnored) {
    expectParsed({
        {"2020-01-02xyz", "%Y-%m-%d", success("20200102")},
        {"2020-01-02xyz", "%Y-%m-%d$", mismatch("%Y-%m-%d", "$")},
        {"2020-01-02", "%Y-%m-%d$", success("20200102")},
    });
}

TEST(ParseLiterals, DollarIsTheLastOfTheFormat) {
    expectParsed({
        {"2020-01-02", "%Y-%m-%d$x", mismatch("%Y-%m-%d", "$x")},
        {"2020-01-02", "%Y-%m-%d$$", mismatch("%Y-%m-%d", "$$")},
        {"2020$01-02", "%Y$%m-%d", mismatch("%Y", "$%m-%d")},
    });
}

// ---- Names

TEST(ParseNames, MonthsMatchInAnyCase) {
    const char* const names[] = {"January", "February", "March",     "April",   "May",      "June",
                                 "July",    "August",   "September", "October", "November", "December"};
    for (int month = 1; month <= 12; ++month) {
        const std::string name = names[month - 1];
        std::string upper = name;
        for (char& c : upper) {
            c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
        }
        const std::string date = std::string("2020") + (month < 10 ? "0" : "") + std::to_string(month) + "02";
        expectParsed({
            {"2 " + name + " 2020", "%d %B %Y$", success(date)},
            {"2 " + upper + " 2020", "%d %B %Y$", success(date)},
            {"2 " + name.substr(0, 3) + " 2020", "%d %b %Y$", success(date)},
            {"2 " + upper.substr(0, 3) + " 2020", "%d %b %Y$", success(date)},
        });
    }
}

TEST(ParseNames, AShortNameIsThreeCharactersAndAFullOneAllLetters) {
    expectParsed({
        {"02January2020", "%d%buary%Y", success("20200102")},
        {"02/Jan", "%d/%B", mismatch("%d/", "%B")},
        {"02/Januaryx/2020", "%d/%B/%Y", mismatch("%d/", "%B/%Y")},
        {"02/May2020", "%d/%B%Y", success("20200502")},
        {"02/Ja", "%d/%b", mismatch("%d/", "%b")},
        {"02/1", "%d/%B", mismatch("%d/", "%B")},
    });
}

TEST(ParseNames, AnUnknownShortNameLeavesTheMonthOpen) {
    expectParsed({
        {"02/xyz/2020", "%d/%b/%Y", failure(933082, {"%d/%b/%Y"})},
        {"02/xyz/2020", "%d/%B/%Y", mismatch("%d/", "%B/%Y")},
        {"2020-003 xyz", "%Y-%j %b", success("20200103")},
        {"xyz 03", "%b %H", success("19700101030000")}, // nothing of a date is given
    });
}

TEST(ParseNames, TheMeridiemMovesHours) {
    expectParsed({
        {"12:30 AM", "%I:%M %p", success("003000")},
        {"12:30 pm", "%I:%M %p", success("123000")},
        {"1:30 aM", "%I:%M %p", success("013000")},
        {"1:30 Pm", "%I:%M %p", success("133000")},
        {"11:30 PM", "%I:%M %p", success("233000")},
        {"pm 3", "%p %H", success("150000")},
        {"12 am", "%k %p", success("000000")},
        {"13:30 PM", "%I:%M %p", mismatch("", "%I:%M %p")},
        {"1:30 xm", "%I:%M %p", mismatch("%I:%M ", "%p")},
        {"1:30 p", "%I:%M %p", mismatch("%I:%M ", "%p")},
    });
}

// ---- Seconds since 1970

TEST(ParseEpoch, ReadsUtcOrTheWallClock) {
    expectParsed({
        {"0", "%s", success("19700101000000+00:00")},
        {"-1.5", "%s", success("19691231235958.5+00:00")},
        {"-1.5", "%Es", success("19691231235958.5")},
        {"1.5", "%Es", success("19700101000001.5")},
        {"1.", "%s$", success("19700101000001+00:00")},
        {"1.5.5", "%s.5$", success("19700101000001.5+00:00")},
        {"253402300799.5", "%s", success("99991231235959.5+00:00")},
        {"-30610224000", "%s", success("10000101000000+00:00")},
        {"1580474096,x", "%Es,x$", success("20200131123456")},
    });
}

// The sign is that of the whole seconds, and "-0" has none.
TEST(ParseEpoch, TheFractionOfMinusZeroIsPositive) {
    expectParsed({
        {"-0.5", "%s", success("19700101000000.5+00:00")},
        {"-0.5", "%Es", success("19700101000000.5")},
        {"-1.25", "%Es", success("19691231235958.75")},
    });
}

TEST(ParseEpoch, HasTheRangeOfYears) {
    const auto tooFar = [](const char* seconds) { return failure(933093, {seconds}); };
    expectParsed({
        {"253402300800", "%s", tooFar("253402300800")},
        {"253402300800", "%Es", tooFar("253402300800")},
        {"253402300800.25 x", "%s x", tooFar("253402300800.25")},
        {"253402300799.9999999999", "%s", tooFar("253402300799.9999999999")},
        {"-30610224001", "%s", tooFar("-30610224001")},
        {"-30610224000.5", "%s", tooFar("-30610224000.5")},
        {"1234567890123", "%s", tooFar("1234567890123")},
        {"0000000000001", "%s", tooFar("0000000000001")},
        {"-000000000001", "%s", tooFar("-000000000001")},
        {"000000000001", "%s", success("19700101000001+00:00")},
        {"-00000000001.", "%s", success("19691231235959+00:00")},
        {"1234567890123.5", "%s", tooFar("1234567890123.5"), true},
    });
}

TEST(ParseEpoch, NeedsDigits) {
    expectParsed({
        {"x", "%s", mismatch("", "%s")},
        {".5", "%s", mismatch("", "%s")},
        {"-", "%s", mismatch("", "%s")},
        {"-.5", "%s", mismatch("", "%s")},
        {"+5", "%s", mismatch("", "%s")},
        {"at ", "at %Es", mismatch("at", " %Es")},
        {"at x", "at %Es", mismatch("at ", "%Es")},
    });
}

TEST(ParseEpoch, MakesAllOtherFieldsVoid) {
    expectParsed({
        {"5 2020", "%s %Y", success("19700101000005+00:00")},
        {"2020-02-31 5", "%Y-%m-%d %s", success("19700101000005+00:00")},
        {"5 366", "%s %j", success("19700101000005+00:00")},
        {"5 59.5", "%s %S", success("19700101000005+00:00")},
        {"59.5 5", "%S %s", success("19700101000005+00:00")},
        {"5 6", "%s %Es", success("19700101000006+00:00")},
        {"5 61", "%s %S", mismatch("%s ", "%S")},
        {"5 3 am", "%s %I %p", success("19700101000005+00:00")},
    });
}

TEST(ParseEpoch, AndAnOffsetExcludeEachOther) {
    const auto exclude = [](const char* first) { return failure(933083, {first, "%z"}); };
    expectParsed({
        {"5Z", "%s%z", exclude("%s")},
        {"5+01:00", "%s%Ez", exclude("%s")},
        {"5 Z", "%Es %z", exclude("%Es")},
        {"Z 5", "%Ez %Es", exclude("%Es")},
        {"5 6 Z", "%s %Es %z", exclude("%Es")},
        {"6 5 Z", "%Es %s %z", exclude("%s")},
        // It is the format that is wrong, also where the value would not do.
        {"-1.5", "%s%z", exclude("%s")},
        {"5 Zx", "%s %z$", exclude("%s")},
        // But what comes before both is only a mismatch.
        {"5x", "%s %z", mismatch("%s", " %z")},
    });
}

// ---- Offsets

TEST(ParseOffset, HasFourForms) {
    for (const char* flag : {"%z", "%Ez"}) {
        const std::string format = std::string("%Y-%m-%dT%H:%M:%S") + flag;
        const auto expectOffset = [&](const char* text, const char* offset) {
            expectParsed({{std::string("2020-01-02T03:04:05") + text, format,
                           success(std::string("20200102030405") + offset)}});
        };
        expectOffset("Z", "+00:00");
        expectOffset("+01", "+01:00");
        expectOffset("+0130", "+01:30");
        expectOffset("+01:30", "+01:30");
        expectOffset("-01:30", "-01:30");
        expectOffset("-00:30", "-00:30");
        expectOffset("-00", "+00:00");
        expectOffset("+10:75", "+11:15");
        expectOffset("+99:59", "+99:59");
        expectOffset("+99:60", ""); // 100 hours cannot be written
        expectOffset("-9999", "");
        const auto expectMismatch = [&](const char* text) {
            expectParsed(
                {{std::string("2020-01-02T03:04:05") + text, format, mismatch("%Y-%m-%dT%H:%M:%S", flag)}});
        };
        expectMismatch("");
        expectMismatch("z");
        expectMismatch("01:00");
        expectMismatch("+");
        expectMismatch("+1");
        expectMismatch("+01:");
        expectMismatch("+01:3");
        expectMismatch("+01:x0");
        expectMismatch("+013");
    }
}

TEST(ParseOffset, EndsBeforeWhatIsNoDigit) {
    expectParsed({
        {"12+01x", "%H%zx$", success("120000+01:00")},
        {"12+01:30:00", "%H%z:00$", success("120000+01:30")},
    });
}

TEST(ParseOffset, NeedsATime) {
    expectParsed({
        {"Z", "%z", failure(933085, {"%z"})},
        {"2020-01-02Z", "%Y-%m-%d%Ez", failure(933085, {"%Y-%m-%d%Ez"})},
        {"5 pmZ", "%H %p%z", success("170000+00:00")},
    });
}

// The flags are sought in the text of the format, in which "%%z" holds "%z".
TEST(ParseOffset, IsWantedByAnyTextThatLooksLikeIt) {
    expectParsed({
        {"12%z", "%H%%z", success("120000+00:00")},
        {"12%Ez", "%H%%Ez", success("120000+00:00")},
        {"12%s", "%H%%s", success("120000+00:00")},
        {"12%Es", "%H%%Es", success("120000")},
        {"5%z", "%Es%%z", success("19700101000005+00:00")},
        {"2020-01-02%z", "%Y-%m-%d%%z", failure(933085, {"%Y-%m-%d%%z"})},
    });
}

// ---- The kind of the result

TEST(ParseKind, IsWhatTheFormatAsksFor) {
    expectParsed({
        {"2020-01-02", "%Y-%m-%d", success("20200102")},
        {"2020-01-02 12", "%Y-%m-%d %H", success("20200102120000")},
        {"12:30", "%H:%M", success("123000")},
        {"12", "%I", success("120000")},
        {"12:30:00+01:00", "%T%z", success("123000+01:00")},
        {"2020-002", "%Y-%j", success("20200102")},
        {"2020-002 1", "%Y-%j %H", success("20200102010000")},
        {"2020-01-02 12 am", "%Y-%m-%d %l %p", success("20200102000000")},
    });
}

// %k and %l do not count as flags of time.
TEST(ParseKind, UnpaddedHoursAloneAreDropped) {
    expectParsed({
        {"20200102 7", "%Y%m%d %k", success("20200102")},
        {"20200102 7", "%Y%m%d %l", success("20200102")},
        {"7", "%k", success("19700101")},
        {"20200102 7+01:00", "%Y%m%d %k%z", success("20200102")},
        {"20200102 7:30", "%Y%m%d %k:%M", success("20200102073000")},
    });
}

TEST(ParseKind, PercentPairsAskForNothing) {
    expectParsed({
        {"2020-01-02 %H", "%Y-%m-%d %%H", success("20200102")},
        {"12 %Y", "%H %%Y", success("120000")},
        {"2020-01-02 %12", "%Y-%m-%d %%%H", success("20200102120000")},
        {"2020-01-02 %%H", "%Y-%m-%d %%%%H", success("20200102")},
    });
}

// ---- Unknown flags

TEST(ParseFlags, UnknownOnesAreTold) {
    expectParsed({
        {"2020", "%q", unknownFlag("%q")},
        {"2020", "%Y%", unknownFlag("%")},
        {"2020", "%", unknownFlag("%")},
        {"2020", "%Ex", unknownFlag("%Ex")},
        {"2020", "%EY", unknownFlag("%EY")},
        {"2020", "%E", unknownFlag("%E")},
        {"2020", "%E%", unknownFlag("%E%")},
        {"2020", "% Y", unknownFlag("% ")},
        {"2020", "%Y%y", unknownFlag("%y")},
        {"2020", "%\xC3\xA9x", unknownFlag("%\xC3\xA9")},
        {"2020", "%E\xE6\x97\xA5", unknownFlag("%E\xE6\x97\xA5")},
    });
    for (const char c : std::string("ACDFGJKLOPQRUVWXZacfghinqortuvwxy0-_#.")) {
        const std::string flag{'%', c};
        expectParsed({{"2020", flag, unknownFlag(flag)}});
    }
}

TEST(ParseFlags, UnknownOnesAreMetInTheirTurn) {
    expectParsed({
        {"x", "%Y%q", mismatch("", "%Y%q")},
        {"2020", "%Y%q-%m", unknownFlag("%q")},
        {"2020", "*%q", unknownFlag("%q")},
    });
}

} // namespace
