// parse() and format(): keywords, patterns, and what they say when a value or a pattern does not do.
#include "answer.h"

#include <kvt/datetime/datetime.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace kvt::test {
namespace {

using namespace kvt::ex;
using namespace kvt::ex::datetime;

UString<0> utf8(const std::string& text) {
    return UString<0>(UStringView<0>(text));
}

struct ParseRow {
    const char* value;
    const char* format;
    bool lenient;
    Answer answer;
};

Answer reads(const char* text) {
    return success(text);
}

Answer fails(std::uint32_t number, std::vector<std::string> parameters = {}) {
    return failure(number, parameters);
}

const std::string parser = "@DateTimeParse()";
const std::string formatter = "@DateTimeFormat()";

void expectParse(const std::vector<ParseRow>& rows) {
    for (const ParseRow& row : rows) {
        EXPECT_EQ(answerOf(parse(utf8(row.value), utf8(row.format), row.lenient)), row.answer)
            << "value [" << row.value << "] format [" << row.format << "] lenient " << row.lenient;
    }
}

TEST(Parse, KeywordsAreTriedInOrder) {
    expectParse({
        {"20200102", "ZQT|ISO", false, reads("20200102")},
        {"2020-01-02", "ZQT|ISO", false, reads("20200102")},
        {"2020-01-02", " iso ", false, reads("20200102")},
        {"2020-01-02", "nonsense | Iso", false, reads("20200102")},
        {"2020-01-02T03:04:05", "ISO", false, reads("20200102030405")},
        {"2020-01-02T03:04:05.25Z", "ISO", false, reads("20200102030405.25+00:00")},
        {"03:04:05", "ISO", false, reads("030405")},
        {"03:04:05+0130", "ISO", false, reads("030405+01:30")},
        {"20200102120000.500+0100", "zqt", false, reads("20200102120000.5+01:00")},
        {"abc", "ZQT", false, fails(933097, {"abc"})},
        {" abc ", "ISO", false, fails(933097, {" abc "})},
        {"20200102", "FOO", false, fails(933075, {"FOO"})},
        {"20200102", " FOO|BAR ", false, fails(933075, {" FOO|BAR "})},
        {"20200230", "ZQT|ISO", false, fails(933065, {"30", "day", "1", "29"})},
        {"20200230", "ZQT", true, reads("20200301")},
    });
}

TEST(Parse, EmptyTextsHaveAnswersOfTheirOwn) {
    expectParse({
        {"   ", "%Y", false, Answer{ReturnState::Failure, "", 0.0, 0, {}}},
        {"20200102", " \t ", false, fails(933074)},
        {"", "", false, Answer{ReturnState::Failure, "", 0.0, 0, {}}},
    });
}

TEST(Parse, ThePatternDecidesTheKind) {
    expectParse({
        {"2020-01-02", "%Y-%m-%d", false, reads("20200102")},
        {"2020-1-2", "%Y-%m-%d", false, reads("20200102")},
        {"20200102", "%Y%m%d", false, reads("20200102")},
        {"2020012", "%Y%m%d", false, fails(933067, {"%Y%m", "%d"})},
        {"12:30", "%H:%M", false, reads("123000")},
        {"2020-01-02 12:30:15.5", "%Y-%m-%d %T", false, reads("20200102123015.5")},
        {"20200102 7", "%Y%m%d %k", false, reads("20200102")}, // the hour alone does not count
        {"12:30 AM", "%I:%M %p", false, reads("003000")},
        {"12:30 pm", "%I:%M %p", false, reads("123000")},
        {"1:30 pm", "%I:%M %p", false, reads("133000")},
        {"13:30 PM", "%I:%M %p", false, fails(933067, {"", "%I:%M %p"})},
        {"02 jAN 2020", "%d %b %Y", false, reads("20200102")},
        {"02 January 2020", "%d %B %Y", false, reads("20200102")},
        {"2020-366", "%Y-%j", false, reads("20201231")},
        {"10 %*", "%H %%%*", false, reads("100000")},
    });
}

TEST(Parse, SaysWhichElementDidNotMatch) {
    expectParse({
        {"2020-01-02xyz", "%Y-%m-%d", false, reads("20200102")},
        {"2020-01-02xyz", "%Y-%m-%d$", false, fails(933067, {"%Y-%m-%d", "$"})},
        {"02/xyz/2020", "%d/%b/%Y", false, fails(933082, {"%d/%b/%Y"})},
        {"02/xyz/2020", "%d/%B/%Y", false, fails(933067, {"%d/", "%B/%Y"})},
        {"2020-01-02T12:99:00", "%Y-%m-%dT%T", false, fails(933067, {"%Y-%m-%dT", "%T"})},
        {"12:00:00x", "%T%H", false, fails(933067, {"%H:%M:%S", "%H"})}, // what was read stands as it was read
        {"2020-01-02T00:00:00+01:", "%Y-%m-%dT%H:%M:%S%Ez", false, fails(933067, {"%Y-%m-%dT%H:%M:%S", "%Ez"})},
        {"2020", "%Y$x", false, fails(933067, {"%Y", "$x"})},
        {"x", "?%Y", false, fails(933067, {"?", "%Y"})},
    });
}

TEST(Parse, UnknownFlagsAreNamed) {
    expectParse({
        {"x", "%q", false, fails(933079, {"%q", parser})},
        {"2020", "%Y%", false, fails(933079, {"%", parser})},
        {"x", "%Ex", false, fails(933079, {"%Ex", parser})},
        {"x", "%E", false, fails(933079, {"%E", parser})},
    });
}

TEST(Parse, FieldsHaveToMakeUpAValue) {
    expectParse({
        {"366", "%j", false, fails(933081, {"%j"})},
        {"2020", "%Y", false, fails(933082, {"%Y"})},
        {"2020-01", "%Y-%m", false, fails(933082, {"%Y-%m"})},
        {"01-02", "%m-%d", false, fails(933082, {"%m-%d"})},
        {"Z", "%z", false, fails(933085, {"%z"})},
        {"10 10", "%H %S", false, fails(933086, {"%H %S"})},
        {"1210", "%H%S", false, fails(933086, {"%H%S"})},
        {"30", "%M", false, fails(933086, {"%M"})},
        {"x", "x%%", false, fails(933067, {"x", "%%"})},
        {"x%", "x%%", false, fails(933087, {"x%%"})},
        {"2020-01-02 PM", "%Y-%m-%d %p", false, fails(933088, {"%Y-%m-%d %p"})},
        {"2021-366", "%Y-%j", false, fails(933089, {"%Y-%j"})},
        {"2021-366", "%Y-%j", true, reads("20220101")},
        {"2020-02-30", "%Y-%m-%d", false, fails(933090, {"%Y-%m-%d"})},
        {"2020-02-30", "%Y-%m-%d", true, reads("20200301")},
        {"2020-14-01", "%Y-%m-%d", true, reads("20210201")},
        {"9999-12-31 25", "%Y-%m-%d %H", true, fails(933091, {"%Y-%m-%d %H"})},
        // A literal "%z" still makes an offset wanted, and an offset needs a time.
        {"2020-01-02 %z", "%Y-%m-%d %%z", false, fails(933085, {"%Y-%m-%d %%z"})},
    });
}

TEST(Parse, SecondsSince1970AreReadWhole) {
    expectParse({
        {"-1.5", "%s", false, reads("19691231235958.5+00:00")},
        {"-1.5", "%Es", false, reads("19691231235958.5")},
        {"-0.5", "%s", false, reads("19700101000000.5+00:00")}, // the sign is that of the whole seconds
        {"253402300799", "%s", false, reads("99991231235959+00:00")},
        {"253402300800", "%s", false, fails(933093, {"253402300800"})},
        {"1234567890123", "%s", false, fails(933093, {"1234567890123"})},
        {"-30610224001", "%s", false, fails(933093, {"-30610224001"})},
        {".5", "%s", false, fails(933067, {"", "%s"})},
        {"1Z", "%s%z", false, fails(933083, {"%s", "%z"})},
        {"1Z", "%Es%Ez", false, fails(933083, {"%Es", "%z"})},
    });
}

TEST(Parse, OffsetsComeInFourForms) {
    for (const auto& [text, offset] : std::vector<std::pair<std::string, std::string>>{
             {"Z", "+00:00"}, {"+01", "+01:00"}, {"+0100", "+01:00"}, {"-01:30", "-01:30"}}) {
        for (const char* flag : {"%z", "%Ez"}) {
            EXPECT_EQ(answerOf(parse(utf8("12" + text), utf8(std::string("%H") + flag), false)),
                      reads(("120000" + offset).c_str()))
                << text << " by " << flag;
        }
    }
}

TEST(Parse, FuzzyWordsEndInWhatTheFormatSaysNext) {
    expectParse({
        {"abcT 12", "*T %H", false, reads("120000")},
        {"abcT12", "*T%H", false, fails(933067, {"", "*T%H"})},
        {"abc 12", "* %H", false, reads("120000")},
        {"abc12", "*%H", false, fails(933067, {"*", "%H"})},
        {"12 abc", "%H *", false, reads("120000")},
        {"abc% 12", "*%% %H", false, reads("120000")},
        {"abc 12", "** %H", false, fails(933067, {"", "** %H"})},
        {"x12", "?%H", false, reads("120000")},
    });
}

struct FormatRow {
    const char* value;
    const char* format;
    Answer answer;
};

void expectFormat(const std::vector<FormatRow>& rows) {
    for (const FormatRow& row : rows) {
        EXPECT_EQ(answerOf(format(utf8(row.value), utf8(row.format))), row.answer)
            << "value [" << row.value << "] format [" << row.format << "]";
    }
}

TEST(Format, KeywordsGiveTheTwoForms) {
    expectFormat({
        {"20200102120000.500+0100", "ZQT", reads("20200102120000.5+01:00")},
        {"20200102", "ISO", reads("2020-01-02")},
        {"120000", "iso", reads("12:00:00")},
        {"120000-05", "ISO", reads("12:00:00-05:00")},
        {"20200102120000", "ISO", reads("2020-01-02T12:00:00")},
        {"20200102120000.5+00:00", "ISO", reads("2020-01-02T12:00:00.5Z")},
        {"20200102", "Hello", reads("Hello")},
        {"20200102", "zqt|Hello", reads("20200102")},
        {"20200102", "Hello|ISO", reads("2020-01-02")},
        {"abc", "ZQT", fails(933063, {"abc"})},
        {"abc", "ISO", fails(933063, {"abc"})},
        {"abc", "Hello", fails(933063, {"abc"})},
    });
}

TEST(Format, PatternsAreCheckedAgainstTheKind) {
    expectFormat({
        {"   ", "%Y", Answer{ReturnState::Failure, "", 0.0, 0, {}}},
        {"20200102", "  ", fails(933074)},
        {"20200102", "%Y%", fails(933076)},
        {"20200102", "%%", reads("%")},
        {"20200102", "%%Q", reads("%Q")},
        {"20200102", "%H", reads("00")},
        {"120000", "%Y", fails(933078, {"%Y", "time"})},
        {"120000", "%Ez", fails(933078, {"%Ez", "time"})},
        {"120000+01:00", "%j", fails(933078, {"%j", "time with UTC offset"})},
        {"20200102", "%z", fails(933078, {"%z", "date"})},
        {"20200102000000", "%s", fails(933078, {"%s", "datetime"})},
        {"20200102000000+01:00", "%Es", fails(933078, {"%Es", "datetime with UTC offset"})},
        {"20200102", "%Q", fails(933079, {"%Q", formatter})},
        {"20200102", "%Z", fails(933079, {"%Z", formatter})},
        {"20200102", "%Ex", fails(933079, {"%Ex", formatter})},
        {"20200102", "%E", fails(933079, {"%E", formatter})},
        {"20200102000000+01:00", "%s %z", fails(933083, {"%s", "%z"})},
        {"20200230", "%Y", fails(933065, {"30", "day", "1", "29"})},
        {"abc", "%Y", fails(933063, {"abc"})},
    });
}

TEST(Format, WritesEveryFlag) {
    expectFormat({
        {"20200102030405.25", "%Y %y %m %N %d %e %j", reads("2020 20 01 1 02 2 002")},
        {"20200102150405.25", "%H %k %I %l %M %S %T %p", reads("15 15 03 3 04 05.25 15:04:05.25 PM")},
        {"20200102000000", "%k %l %I %p", reads("0 12 12 AM")},
        {"20200102", "%a %A %b %B %u %w", reads("Thu Thursday Jan January 4 4")},
        {"20200105", "%u %w %U %W", reads("7 0 01 00")},
        {"20200102", "%N/%e/%Y", reads("1/2/2020")},
        {"20200102", "%%%Y%%", reads("%2020%")},
        {"20200102000000", "%Es", reads("1577923200")},
        {"19700101000001.5+00:00", "%s", reads("1.5")},
        {"19700101010000+01:00", "%s", reads("0")},
        {"19691231235959+00:00", "%s", reads("-1")},
        {"120000+00:00", "%Ez %z", reads("Z +00:00")},
        {"120000-00:00", "%Ez %z", reads("Z +00:00")},
        {"120000+01:00", "%Ez %z", reads("+01:00 +01:00")},
        {"000000.25", "%S", reads("00.25")},
    });
}

TEST(Format, ComesBackThroughParse) {
    for (const char* value : {"20200229235959.123456789", "10000101000000", "99991231235959.999999999"}) {
        const auto text = std::get<1>(format(utf8(value), "%d.%m.%Y %H|%M|%S"));
        EXPECT_EQ(answerOf(parse(text, "%d.%m.%Y %H|%M|%S$", false)), reads(value));
    }
}

} // namespace
} // namespace kvt::test
