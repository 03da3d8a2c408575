// parse() by keywords.

#include "pattern_rows.h"

#include <kvt/datetime/datetime.h>

#include <string>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::expectParsed;
using kvt::test::failure;
using kvt::test::outOfRange;
using kvt::test::success;

// ---- Keywords

TEST(ParseKeywords, ZqtNormalisesAValue) {
    expectParsed({
        {"20200102", "ZQT", success("20200102")},
        {"120000.500", "ZQT", success("120000.5")},
        {"120000.000", "ZQT", success("120000")},
        {"120000-05", "ZQT", success("120000-05:00")},
        {"20200102120000.250", "ZQT", success("20200102120000.25")},
        {"20200102120000.500+0100", "ZQT", success("20200102120000.5+01:00")},
        {"20200102120000+1075", "ZQT", success("20200102120000+10:75")},
    });
}

TEST(ParseKeywords, ZqtTakesNumbersOutOfRangeWhenLenient) {
    expectParsed({
        {"20200231", "ZQT", success("20200302"), true},
        {"20200102250000", "ZQT", success("20200103010000"), true},
        {"240000", "ZQT", success("000000"), true},
        {"20200231", "ZQT", outOfRange("31", "day", "1", "29")},
        {"240000", "ZQT", outOfRange("24", "hours", "0", "23")},
        {"00000101", "ZQT", outOfRange("0", "year", "1000", "9999"), true},
    });
}

TEST(ParseKeywords, ABadNumberEndsTheSearch) {
    expectParsed({{"20201301", "ZQT|ISO", outOfRange("13", "month", "1", "12")}});
}

TEST(ParseKeywords, IsoReadsFiveForms) {
    expectParsed({
        {"2020-01-02", "ISO", success("20200102")},
        {"2020-01-02T03:04:05", "ISO", success("20200102030405")},
        {"2020-01-02T03:04:05.250", "ISO", success("20200102030405.25")},
        {"2020-01-02T03:04:05Z", "ISO", success("20200102030405+00:00")},
        {"2020-01-02T03:04:05+01", "ISO", success("20200102030405+01:00")},
        {"2020-01-02T03:04:05-0130", "ISO", success("20200102030405-01:30")},
        {"03:04:05", "ISO", success("030405")},
        {"03:04:05.5+05:30", "ISO", success("030405.5+05:30")},
        {"2020-1-2T3:4:5", "ISO", success("20200102030405")},
        {"2020-02-31", "ISO", success("20200302"), true},
    });
}

TEST(ParseKeywords, IsoTakesNothingElse) {
    expectParsed({
        {"2020-01-02x", "ISO", failure(933097, {"2020-01-02x"})},
        {"2020-01-02 03:04:05", "ISO", failure(933097, {"2020-01-02 03:04:05"})},
        {"2020-02-31", "ISO", failure(933097, {"2020-02-31"})},
        {"20200102", "ISO", failure(933097, {"20200102"})},
        {"03:04", "ISO", failure(933097, {"03:04"})},
        {"2020-01-02\xC3\xA9", "ISO", failure(933097, {"2020-01-02\xC3\xA9"})},
        {"2020-01-02\xFF", "ISO", failure(933097, {"2020-01-02\xFF"})},
    });
}

TEST(ParseKeywords, AreTriedInTheirOrder) {
    expectParsed({
        {"20200102", "ZQT|ISO", success("20200102")},
        {"2020-01-02", "ZQT|ISO", success("20200102")},
        {"20200102", "ISO|ZQT", success("20200102")},
        {"2020-01-02", "ISO|ZQT", success("20200102")},
    });
}

TEST(ParseKeywords, MatchInAnyCaseAndWithBlanks) {
    expectParsed({
        {"2020-01-02", "iso", success("20200102")},
        {"2020-01-02", "zQt | \tIso ", success("20200102")},
        {"20200102", "zqt", success("20200102")},
        // The dotless i and the long s are ASCII letters in upper case, but the text then has a zero at its end.
        {"2020-01-02", "\xC4\xB1so", failure(933075, {"\xC4\xB1so"})},
        {"2020-01-02", "i\xC5\xBFo", failure(933075, {"i\xC5\xBFo"})},
    });
}

TEST(ParseKeywords, UnknownOnesArePassedOver) {
    expectParsed({
        {"20200102", "FOO||\xC3\xA9|ZQT", success("20200102")},
        {"20200102", "FOO", failure(933075, {"FOO"})},
        {"20200102", "|", failure(933075, {"|"})},
        {"20200102", " FOO|BAR ", failure(933075, {" FOO|BAR "})}, // the format as given
        {"20200102", "ZQTX", failure(933075, {"ZQTX"})},
        {"20200102", "Z QT", failure(933075, {"Z QT"})},
    });
}

TEST(ParseKeywords, WithoutAMatchNameTheValueAsGiven) {
    expectParsed({
        {"abc", "ZQT", failure(933097, {"abc"})},
        {" abc ", "foo|zqt", failure(933097, {" abc "})},
    });
}

} // namespace
