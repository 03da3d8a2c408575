// format(): keywords, the check of a pattern against the kind of the value, and each flag.

#include "pattern_rows.h"

#include <string>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::expectFormatted;
using kvt::test::failure;
using kvt::test::outOfRange;
using kvt::test::silentFailure;
using kvt::test::success;
using kvt::test::ustring;

constexpr const char* date = "20200102";
constexpr const char* time = "120000.25";
constexpr const char* timeWithOffset = "120000.25+01:00";
constexpr const char* datetime = "20200102120000.25";
constexpr const char* datetimeWithOffset = "20200102120000.25+01:00";
constexpr const char* all[] = {date, time, timeWithOffset, datetime, datetimeWithOffset};
constexpr const char* words[] = {"date", "time", "time with UTC offset", "datetime",
                                 "datetime with UTC offset"};

Answer notFor(std::string flag, std::string word) {
    return failure(933078, {std::move(flag), std::move(word)});
}

Answer unknownFlag(std::string flag) {
    return failure(933079, {std::move(flag), "@DateTimeFormat()"});
}

// ---- What comes before the format is looked at

TEST(Format, FailsWithoutMessageOnAnEmptyValue) {
    expectFormatted(
        {{"", "%Y", silentFailure()}, {" \t\r\n\f\v", "%Y", silentFailure()}, {"", "", silentFailure()}});
}

TEST(Format, FailsOnAnEmptyFormat) {
    expectFormatted(
        {{date, "", failure(933074)}, {date, " \t\r\n\f\v", failure(933074)}, {"abc", "", failure(933074)}});
}

TEST(Format, StripsWhiteSpace) {
    expectFormatted(
        {{" 20200102\n", " %Y\t", success("2020")}, {" 20200102\n", " ISO ", success("2020-01-02")}});
}

TEST(Format, ChecksTheValueBeforeTheFormat) {
    expectFormatted({
        {"20210229", "%Y", outOfRange("29", "day", "1", "28")},
        {"20210229", "%Q", outOfRange("29", "day", "1", "28")},
        {"20210229", "Hello", outOfRange("29", "day", "1", "28")},
        {"240000", "ISO", outOfRange("24", "hours", "0", "23")},
    });
}

TEST(Format, NamesAnUnsupportedValueAsGiven) {
    for (const char* format : {"%Y", "ZQT", "ISO", "Hello", "%Q", "%Y%"}) {
        expectFormatted(
            {{"abc", format, failure(933063, {"abc"})}, {" 20 ", format, failure(933063, {" 20 "})}});
    }
}

// ---- Keywords

TEST(FormatKeywords, ZqtNormalises) {
    expectFormatted({
        {date, "ZQT", success("20200102")},
        {"120000.500", "ZQT", success("120000.5")},
        {"120000.000-05", "ZQT", success("120000-05:00")},
        {"20200102120000.500", "ZQT", success("20200102120000.5")},
        {"20200102120000.500+0100", "ZQT", success("20200102120000.5+01:00")},
    });
}

TEST(FormatKeywords, IsoIsTheExtendedForm) {
    expectFormatted({
        {date, "ISO", success("2020-01-02")},
        {"120000", "ISO", success("12:00:00")},
        {time, "ISO", success("12:00:00.25")},
        {timeWithOffset, "ISO", success("12:00:00.25+01:00")},
        {datetime, "ISO", success("2020-01-02T12:00:00.25")},
        {datetimeWithOffset, "ISO", success("2020-01-02T12:00:00.25+01:00")},
        {"20200102120000.5+00:00", "ISO", success("2020-01-02T12:00:00.5Z")},
        {"120000-00", "ISO", success("12:00:00Z")},
    });
}

TEST(FormatKeywords, TheFirstKnownOneCounts) {
    expectFormatted({
        {date, "zqt|Hello", success("20200102")},
        {date, "Hello|ISO", success("2020-01-02")},
        {date, "iso|zqt", success("2020-01-02")},
        {date, "zqt|iso", success("20200102")},
        {date, "|x| iSo |", success("2020-01-02")},
    });
}

TEST(FormatKeywords, WithoutOneTheFormatComesOut) {
    expectFormatted({
        {date, "Hello", success("Hello")},
        {time, "a|b", success("a|b")},
        {date, "ZQTT", success("ZQTT")},
        {date, " \xE5\xB9\xB4 ", success("\xE5\xB9\xB4")},
    });
}

// ---- The check of a pattern

TEST(FormatCheck, APercentSignAtTheEndIsNoFlag) {
    expectFormatted({
        {date, "%", failure(933076)},
        {date, "%Y%", failure(933076)},
        {date, "%%%", failure(933076)},
        {date, "%%Q%", failure(933076)},
        {date, "%Q%", unknownFlag("%Q")}, // what comes first is told first
        {date, "%z%", notFor("%z", "date")},
    });
}

TEST(FormatCheck, PercentPairsAreLiteral) {
    expectFormatted({
        {date, "%%", success("%")},
        {date, "%%Q", success("%Q")},
        {date, "%%z", success("%z")},
        {date, "%%%Y", success("%2020")},
        {date, "%%%%Y", success("%%Y")},
        {date, "100%% %Y", success("100% 2020")},
        {date, "%%Q%Q", unknownFlag("%Q")},
        {date, "%%ES", success("%ES")},
    });
}

TEST(FormatCheck, UnknownFlagsAreTold) {
    for (const char c : std::string("CDFGJKLOPQRVXZcfghinoqrtvx019 -_#.$*?|")) {
        expectFormatted({{datetime, std::string{'%', c} + ".", unknownFlag(std::string{'%', c})}});
    }
    expectFormatted({
        {datetime, "%Ex", unknownFlag("%Ex")},
        {datetime, "%EY", unknownFlag("%EY")},
        {datetime, "%ES", unknownFlag("%ES")},
        {datetime, "%E", unknownFlag("%E")},
        {datetime, "%E%%", unknownFlag("%E")},
        {datetime, "%Od", unknownFlag("%O")},
        {datetime, "%\xC3\xA9", unknownFlag("%\xC3\xA9")},
        {datetime, "%E\xC3\xA9", unknownFlag("%E\xC3\xA9")},
    });
}

TEST(FormatCheck, EachKindForbidsWhatItHasNot) {
    const char* const forbidden[] = {
        "s z Ez", "s Es Y y m N b B u U w W d e j a A z Ez", "s Es Y y m N b B u U w W d e j a A", "s z Ez",
        "Es",
    };
    const char* const flags[] = {"A", "B", "H", "I", "M", "N", "S", "T", "U", "W", "Y", "a",  "b", "d",
                                 "e", "j", "k", "l", "m", "p", "s", "u", "w", "y", "z", "Es", "Ez"};
    for (std::size_t kind = 0; kind < std::size(all); ++kind) {
        for (const std::string flag : flags) {
            const Answer answer = answerOf(format(ustring(all[kind]), ustring("%" + flag)));
            const bool isForbidden =
                (" " + std::string(forbidden[kind]) + " ").find(" " + flag + " ") != std::string::npos;
            if (isForbidden) {
                EXPECT_EQ(answer, notFor("%" + flag, words[kind]));
            } else {
                EXPECT_EQ(answer.state, ReturnState::Success) << answer << flag << " of " << all[kind];
                EXPECT_FALSE(answer.text.empty());
            }
        }
    }
}

TEST(FormatCheck, TheFirstBadFlagIsTold) {
    expectFormatted({
        {time, "%H %Y %Q", notFor("%Y", "time")},
        {time, "%H %Q %Y", unknownFlag("%Q")},
        {datetimeWithOffset, "%s %z %Es", notFor("%Es", "datetime with UTC offset")},
    });
}

TEST(FormatCheck, SecondsSince1970AndOffsetExcludeEachOther) {
    for (const char* format : {"%s %z", "%z %s", "%s%Ez", "%s %Y %Ez"}) {
        expectFormatted({{datetimeWithOffset, format, failure(933083, {"%s", "%z"})}});
    }
}

// ---- The flags

TEST(FormatFlags, Dates) {
    expectFormatted({
        {date, "%Y %y %m %d %j", success("2020 20 01 02 002")},
        {date, "%N/%e/%Y", success("1/2/2020")},
        {"20201231", "%N/%e/%j", success("12/31/366")},
        {"10050101", "%Y %y", success("1005 05")},
        {date, "%b %B %a %A", success("Jan January Thu Thursday")},
        {date, "%u %w", success("4 4")},
        {"20200105", "%u %w %a", success("7 0 Sun")},
        {"20200101", "%U %W", success("00 00")},
        {"20200105", "%U %W", success("01 00")},
        {"20200106", "%U %W", success("01 01")},
        {"20231231", "%U %W", success("53 52")},
        {"20171231", "%U %W", success("53 52")},
        {"20180101", "%U %W", success("00 01")},
    });
}

TEST(FormatFlags, Times) {
    expectFormatted({
        {"000509", "%H|%I|%k|%l|%M|%S|%p|%T", success("00|12|0|12|05|09|AM|00:05:09")},
        {"090509", "%H|%I|%k|%l|%p", success("09|09|9|9|AM")},
        {"120509", "%H|%I|%k|%l|%p", success("12|12|12|12|PM")},
        {"130509", "%H|%I|%k|%l|%p", success("13|01|13|1|PM")},
        {"230509", "%H|%I|%k|%l|%p", success("23|11|23|11|PM")},
        {date, "%H:%M:%S %p %k %l %T", success("00:00:00 AM 0 12 00:00:00")},
    });
}

TEST(FormatFlags, SecondsHaveTheFraction) {
    expectFormatted({
        {time, "%S", success("00.25")},
        {time, "%T", success("12:00:00.25")},
        {time, "%M", success("00")},
        {"120005.000000001", "%S %T", success("05.000000001 12:00:05.000000001")},
        {"120005.123456789", "%S", success("05.123456789")},
        {"120005.1234567891", "%S", success("05.123456789")},
        {"120005.100", "%S", success("05.1")},
        {"120005", "%S", success("05")},
        {time, "%S%S", success("00.2500.25")},
        {time, "%%S", success("%S")},
    });
}

TEST(FormatFlags, AFractionThatRoundsUpRunsOver) {
    expectFormatted({
        {"20201231235959.9999999999", "%Y-%m-%d %T", success("2021-01-01 00:00:00")},
        {"99991231235959.9999999999", "%Y", success("10000")},
        {"235959.9999999999", "%T", success("00:00:00")},
    });
}

TEST(FormatFlags, SecondsSince1970) {
    expectFormatted({
        {"19700101000001.5+00:00", "%s", success("1.5")},
        {"19700101010000+01:00", "%s", success("0")},
        {"19691231235959+00:00", "%s", success("-1")},
        {"19691231235958.5+00:00", "%s", success("-1.5")},
        {"19691231235959.5+00:00", "%s", success("-0.5")},
        {"19691231235959.999999999+00:00", "%s", success("-0.000000001")},
        {"19700101000000.000000001-00:00", "%s", success("0.000000001")},
        {"20200102120000.25", "%Es", success("1577966400.25")},
        {date, "%Es", success("1577923200")},
        {"10000101", "%Es", success("-30610224000")},
        {"99991231235959.999999999", "%Es", success("253402300799.999999999")},
        {"10000101000000+99:59", "%s", success("-30610583940")},
    });
}

TEST(FormatFlags, Offsets) {
    expectFormatted({
        {"120000+00:00", "%z %Ez", success("+00:00 Z")},
        {"120000-00:00", "%z %Ez", success("+00:00 Z")},
        {"120000+01:00", "%z %Ez", success("+01:00 +01:00")},
        {"120000-0130", "%z %Ez", success("-01:30 -01:30")},
        {"120000-00:30", "%z %Ez", success("-00:30 -00:30")},
        {"120000+1075", "%z", success("+11:15")},
        {"120000+99", "%z", success("+99:00")},
    });
}

TEST(FormatFlags, TheWallClockIsShownAsItStands) {
    expectFormatted({{"20200102003000+01:00", "%Y-%m-%d %T", success("2020-01-02 00:30:00")}});
}

TEST(FormatLiterals, PassThrough) {
    expectFormatted({
        {date, "E%YE O T $ * ? |", success("E2020E O T $ * ? |")},
        {date, "%Y\xE5\xB9\xB4%m\xE6\x9C\x88%d\xE6\x97\xA5",
         success("2020\xE5\xB9\xB4"
                 "01\xE6\x9C\x88"
                 "02\xE6\x97\xA5")},
    });
}

TEST(FormatLiterals, MayBeLong) {
    std::string pattern;
    std::string text;
    for (int i = 0; i < 200; ++i) {
        pattern += "%Y-some text-%A|";
        text += "2020-some text-Thursday|";
    }
    expectFormatted({{date, pattern, success(text)}});
    for (std::size_t length = 240; length < 270; ++length) {
        const std::string literal(length, 'x');
        expectFormatted({{date, literal + "%Y%m", success(literal + "202001")}});
    }
}

} // namespace
