// add, intervalNegate, and the reader of intervals behind them.

#include "answer.h"
#include "naive_calendar.h"

#include <kvt/datetime/datetime.h>

#include <random>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::failure;
using kvt::test::genericFailure;
using kvt::test::NaiveDateTime;
using kvt::test::outOfRange;
using kvt::test::repaired;
using kvt::test::success;
using kvt::test::ustring;

struct Row {
    int line;
    const char* value;
    const char* interval;
    Answer answer;
};

void expectSums(const std::vector<Row>& rows) {
    for (const Row& row : rows) {
        EXPECT_EQ(answerOf(add(row.value, row.interval)), row.answer)
            << "line " << row.line << ": " << row.value << " plus " << row.interval;
    }
}

TEST(Add, CutsTheDayOnceAfterYearsAndMonths) {
    expectSums({
        {__LINE__, "20200131", "P1M", success("20200229")},
        {__LINE__, "20200131", "P13M", success("20210228")},
        {__LINE__, "20200131", "P1Y1M", success("20210228")},
        {__LINE__, "20200229", "P1Y", success("20210228")},
        {__LINE__, "20200229", "P4Y", success("20240229")},
        {__LINE__, "20200229", "-P1Y", success("20190228")},
        {__LINE__, "20200229", "P1Y12M", success("20220228")},
        {__LINE__, "20200331", "-P1M", success("20200229")},
        {__LINE__, "20200331", "-P13M", success("20190228")},
        {__LINE__, "20200131", "P2M", success("20200331")},
        {__LINE__, "20200229", "P1M", success("20200329")},
        {__LINE__, "20200131", "-P1M", success("20191231")},
        {__LINE__, "20200131", "-P2M", success("20191130")},
        {__LINE__, "20200131", "P1M1D", success("20200301")},
        {__LINE__, "20200101", "P0Y12M", success("20210101")},
        {__LINE__, "20201231", "P1M", success("20210131")},
        {__LINE__, "20200115", "-P1M", success("20191215")},
    });
}

TEST(Add, ADateStaysADateUntilATimeIsAdded) {
    expectSums({
        {__LINE__, "20200101", "PT1H", success("20200101010000")},
        {__LINE__, "20200101", "P1D", success("20200102")},
        {__LINE__, "20200101", "PT0S", success("20200101")},
        {__LINE__, "20200101", "-PT", success("20200101")},
        {__LINE__, "20200101", "PT0H0M0.0S", success("20200101")},
        {__LINE__, "20200101", "P1DT1M", success("20200102000100")},
        {__LINE__, "20200101", "-PT1S", success("20191231235959")},
        {__LINE__, "20200101", "PT0.000000001S", success("20200101000000.000000001")},
        {__LINE__, "20200101", "PT24H", success("20200102000000")},
        {__LINE__, " 20200101 ", " P1D ", success("20200102")},
    });
}

TEST(Add, ATimeWrapsAndTakesNoDateParts) {
    expectSums({
        {__LINE__, "230000", "PT2H", success("010000")},
        {__LINE__, "010000", "-PT2H", success("230000")},
        {__LINE__, "000000", "-PT0.5S", success("235959.5")},
        {__LINE__, "120000-05:00", "PT13H", success("010000-05:00")},
        {__LINE__, "120000-05", "PT1M", repaired("120100-05:00")},
        {__LINE__, "120000", "P0D", success("120000")},
        {__LINE__, "120000", "P0Y0M0D", success("120000")},
        {__LINE__, "120000", "PT48H", success("120000")},
        {__LINE__, "120000", "P1D", failure(933060, {"120000", "P1D"})},
        {__LINE__, "120000", "-P1M", failure(933060, {"120000", "-P1M"})},
        {__LINE__, " 120000+01", "P1YT1H ", failure(933060, {" 120000+01", "P1YT1H "})},
    });
}

TEST(Add, KeepsTheOffsetAndTellsOfItsRepair) {
    expectSums({
        {__LINE__, "20200101000000+0100", "PT1H", repaired("20200101010000+01:00")},
        {__LINE__, "20200101000000+01:00", "PT1H", success("20200101010000+01:00")},
        {__LINE__, "20200101000000+01:00", "P1M", success("20200201000000+01:00")},
        {__LINE__, "20200101000000+10:75", "PT0S", success("20200101000000+11:15")}, // from its minutes
        {__LINE__, "20200101000000-00:00", "PT0S", success("20200101000000+00:00")},
    });
}

TEST(Add, AFractionThatIsRoundedUpBehindTheLastYearIsOutOfRange) {
    expectSums({
        {__LINE__, "99991231235959.9999999999", "PT0S", outOfRange("10000", "year", "1000", "9999")},
        {__LINE__, "99991231235959.9999999999", "-P1Y", outOfRange("10000", "year", "1000", "9999")},
    });
}

TEST(Add, NothingIsCarriedBetweenTheIntervalsParts) {
    expectSums({
        {__LINE__, "20200101000000", "PT90M", success("20200101013000")},
        {__LINE__, "20200101000000", "PT3600.25S", success("20200101010000.25")},
        {__LINE__, "20200101000000", "P400D", success("20210204000000")},
        {__LINE__, "20200101000000.75", "PT0.5S", success("20200101000001.25")},
        {__LINE__, "20200101000000", "PT59.9999999999S", success("20200101000100")},
        {__LINE__, "20200101235959.999999999", "PT0.000000001S", success("20200102000000")},
        {__LINE__, "20200101000000", "PT2147483647S", success("20880119031407")},
        {__LINE__, "20200101000000", "-P1Y2M3DT4H5M6.5S", success("20181028195453.5")},
    });
}

TEST(Add, BeyondTheYearsOfAValue) {
    expectSums({
        {__LINE__, "99991231", "P1D", success("")},
        {__LINE__, "99991231235959", "PT1S", success("")},
        {__LINE__, "99991231235959+01", "PT1S", repaired("")},
        {__LINE__, "10000101", "-P1D", outOfRange("999", "year", "1000", "9999")},
        {__LINE__, "20200101", "-P2020Y", outOfRange("0", "year", "1000", "9999")},
        {__LINE__, "20200101", "-P2021Y", success("")},
        {__LINE__, "20200101", "P7980Y", success("")},
        {__LINE__, "20200101", "P7979Y", success("99990101")},
        {__LINE__, "120000", "PT2147483647H", success("")},
        {__LINE__, "120000", "-PT9000000H", outOfRange("943", "year", "1000", "9999")},
        {__LINE__, "20200101", "P2147483647D", success("")},
        {__LINE__, "20200101", "-P2147483647D", success("")},
        {__LINE__, "20200101", "P2147483647M", success("")},
        {__LINE__, "20200101", "-P2147483647M", success("")},
        {__LINE__, "20200101", "P65537Y", success("20210101")}, // the sum of years has 16 bits
        {__LINE__, "20200101", "PT9223372036854775807.0S", success("")},
        {__LINE__, "20200101", "PT99999999999999999999999.0S", success("")},
    });
}

TEST(Add, ChecksTheValueThenTheInterval) {
    expectSums({
        {__LINE__, "abc", "x", failure(933063, {"abc"})},
        {__LINE__, "20210229", "x", outOfRange("29", "day", "1", "28")},
        {__LINE__, "20210228", " x ", failure(933064, {" x "})},
        {__LINE__, "120000", "P1.5D", genericFailure()},
    });
}

// ---- The text of an interval

TEST(IntervalText, IsReadInOrderEachDesignatorOnce) {
    for (const char* text : {"P1Y2M3DT4H5M6.5S",
                             "-P1D",
                             "PT0S",
                             "-PT",
                             "P1Y",
                             "P1M",
                             "P1D",
                             "PT1H",
                             "PT1M",
                             "PT1S",
                             "P1YT",
                             "P1Y1D",
                             "P1YT1M",
                             "P1MT1M",
                             "PT1H1S",
                             "P00000000000000001Y",
                             "PT1.S",
                             "PT1.5S",
                             "P2147483647Y",
                             "PT2147483647S",
                             " P1D\f",
                             "PT2147483648.0S"}) {
        EXPECT_EQ(answerOf(intervalNegate(text)).state, ReturnState::Success) << text;
    }
}

TEST(IntervalText, RefusesOtherShapes) {
    for (const char* text :
         {"",       "P",      "-P",     "PT",       "1D",    "P1",    "PT1",   "P1D1Y",  "P1D1M",
          "P1M1Y",  "PT1H1H", "P1H",    "P1S",      "PT1Y",  "PT1D",  "P1Y1Y", "P1M1M",  "P1D1D",
          "PT1M1M", "PT1S1S", "PT1S1M", "PT1M1H",   "PTT1H", "PT1HT", "P1X",   "PT1X",   "p1D",
          "P1d",    "+P1D",   "--P1D",  "P-1D",     "P 1D",  "P1 D",  "PT.5S", "PT1,5S", "PT1.2.3S",
          "P1.5",   "P1.5H",  "P1.5X",  "20200101", "PDT",   "P1DT1", "P1D ."}) {
        EXPECT_EQ(answerOf(intervalNegate(text)), failure(933064, {text})) << text;
        EXPECT_EQ(answerOf(add("20200101", text)), failure(933064, {text})) << text;
    }
}

TEST(IntervalText, NumbersThatCannotBeStoredAreAnotherFailure) {
    for (const char* text : {"P1.5D", "P1.5Y", "P1.0M", "PT1.5H", "PT1.5M", "P1.D", "P2147483648Y",
                             "PT2147483648S", "PT99999999999999999999S", "P99999999999"}) {
        EXPECT_EQ(answerOf(intervalNegate(text)), genericFailure()) << text;
        EXPECT_EQ(answerOf(add("20200101", text)), genericFailure()) << text;
    }
    const std::string endless = "PT" + std::string(400, '9') + ".5S";
    EXPECT_EQ(answerOf(intervalNegate(ustring(endless))), genericFailure());
    const std::string tiny = "PT0." + std::string(400, '0') + "1S";
    EXPECT_EQ(answerOf(add("20200101", ustring(tiny))), success("20200101"));
}

TEST(IntervalNegate, TurnsTheSignAndLeavesTheRest) {
    const struct {
        const char* text;
        const char* negated;
    } rows[] = {
        {"P1D", "-P1D"},   {"-P1D", "P1D"},         {"PT0S", "-PT0S"}, {"-PT0S", "PT0S"}, {"P001Y", "-P001Y"},
        {"-PT", "PT"},     {"PT1.50S", "-PT1.50S"}, {"P1D ", "-P1D "}, {" P1D", "- P1D"}, // the text as given
        {" -P1D", "-P1D"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(answerOf(intervalNegate(row.text)), success(row.negated)) << row.text;
    }
}

// ---- Against counting

TEST(Add, ExactPartsAgreeWithACount) {
    std::mt19937_64 random(66);
    for (int i = 0; i < 50'000; ++i) {
        NaiveDateTime at{3000 + static_cast<std::int64_t>(random() % 4000),
                         1 + static_cast<int>(random() % 12), 1};
        at.day =
            1 + static_cast<int>(random() % static_cast<unsigned>(kvt::test::daysInMonth(at.year, at.month)));
        at.hours = static_cast<int>(random() % 24);
        at.minutes = static_cast<int>(random() % 60);
        at.seconds = static_cast<int>(random() % 60);
        at.nanoseconds = random() % 4 == 0 ? 0 : static_cast<int>(random() % 1'000'000'000);
        const auto days = static_cast<std::int64_t>(random() % 700'000);
        const auto hours = static_cast<std::int64_t>(random() % 100'000);
        const auto minutes = static_cast<std::int64_t>(random() % 1'000'000);
        const auto seconds = static_cast<std::int64_t>(random() % 60);
        const auto nanoseconds = static_cast<int>(random() % 1'000'000'000);
        const bool negative = random() % 2 == 0;
        const std::string interval = std::string(negative ? "-P" : "P") + std::to_string(days) + "DT" +
                                     std::to_string(hours) + "H" + std::to_string(minutes) + "M" +
                                     std::to_string(seconds) + kvt::test::naiveFraction(nanoseconds) + "S";
        const std::int64_t wholeSeconds = days * 86400 + hours * 3600 + minutes * 60 + seconds;
        const kvt::test::Int128 length =
            static_cast<kvt::test::Int128>(wholeSeconds) * 1000000000 + nanoseconds;
        const NaiveDateTime sum =
            kvt::test::naiveDateTime(kvt::test::naiveNanoseconds(at) + (negative ? -length : length));
        ASSERT_EQ(answerOf(add(ustring(kvt::test::naiveText(at)), ustring(interval))),
                  success(kvt::test::naiveText(sum)))
            << kvt::test::naiveText(at) << " plus " << interval;
    }
}

TEST(Add, MonthsAgreeWithStepsOfOne) {
    std::mt19937_64 random(67);
    for (int i = 0; i < 20'000; ++i) {
        NaiveDateTime at{2000 + static_cast<std::int64_t>(random() % 400),
                         1 + static_cast<int>(random() % 12), 1};
        at.day =
            1 + static_cast<int>(random() % static_cast<unsigned>(kvt::test::daysInMonth(at.year, at.month)));
        const int years = static_cast<int>(random() % 20);
        const int months = static_cast<int>(random() % 60);
        const bool negative = random() % 2 == 0;
        NaiveDateTime sum = at;
        for (int step = 0; step < years * 12 + months; ++step) {
            sum.month += negative ? -1 : 1;
            if (sum.month == 0 || sum.month == 13) {
                sum.year += negative ? -1 : 1;
                sum.month = negative ? 12 : 1;
            }
        }
        sum.day = std::min(at.day, kvt::test::daysInMonth(sum.year, sum.month));
        const std::string interval =
            std::string(negative ? "-P" : "P") + std::to_string(years) + "Y" + std::to_string(months) + "M";
        ASSERT_EQ(answerOf(add(ustring(kvt::test::naiveDateText(at)), ustring(interval))),
                  success(kvt::test::naiveDateText(sum)))
            << kvt::test::naiveDateText(at) << " plus " << interval;
    }
}

} // namespace
