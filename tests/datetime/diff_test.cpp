// diff, diffAsNumber and compare.

#include "answer.h"
#include "naive_calendar.h"

#include <kvt/datetime/datetime.h>

#include <array>
#include <random>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::failure;
using kvt::test::genericFailure;
using kvt::test::Int128;
using kvt::test::NaiveDateTime;
using kvt::test::outOfRange;
using kvt::test::success;
using kvt::test::ustring;

constexpr UnitType units[] = {UnitType::Years, UnitType::Months,  UnitType::Weeks,  UnitType::Days,
                              UnitType::Hours, UnitType::Minutes, UnitType::Seconds};

TEST(Diff, CountsWholeYearsAndMonthsFromTheSecondValue) {
    const struct {
        int line;
        const char* first;
        const char* second;
        const char* interval;
    } rows[] = {
        {__LINE__, "20200102", "20200101", "P1D"},
        {__LINE__, "20200101", "20200102", "-P1D"},
        {__LINE__, "20200101", "20200101", "PT0S"},
        {__LINE__, "20200301", "20200131", "P1M1D"},   // 31 January and a month is 29 February
        {__LINE__, "20200131", "20200301", "-P1M1D"},  // 1 March less a month is 1 February
        {__LINE__, "20210228", "20200229", "P1Y"},     // cut to the end of February
        {__LINE__, "20200229", "20210228", "-P11M28D"}, // 28 February less a year is a day too far
        {__LINE__, "20210331", "20200229", "P1Y1M3D"},
        {__LINE__, "20201231", "20200101", "P11M30D"},
        {__LINE__, "20210101", "20201231", "P1D"},
        {__LINE__, "20201231", "20210101", "-P1D"},
        {__LINE__, "20210102", "20200103", "P11M30D"},
        {__LINE__, "20210103", "20200103", "P1Y"},
        {__LINE__, "20200103", "20210103", "-P1Y"},
        {__LINE__, "20200103", "20210102", "-P11M30D"},
        {__LINE__, "99991231", "10000101", "P8999Y11M30D"},
        {__LINE__, "10000101", "99991231", "-P8999Y11M30D"},
        {__LINE__, "20200101000000", "20200101", "PT0S"},
        {__LINE__, "20200101", "20200101000000", "PT0S"},
        {__LINE__, "20200102030405.5", "20200101", "P1DT3H4M5.5S"},
        {__LINE__, "20200101", "20200102030405.5", "-P1DT3H4M5.5S"},
        {__LINE__, "20200201000000", "20200101000000.000000001", "P30DT23H59M59.999999999S"},
        {__LINE__, "20200101000000+01:00", "20200101000000+00:00", "-PT1H"},
        {__LINE__, "20200101000000+01", "20191231230000+0000", "PT0S"},
        {__LINE__, "20200201003000+01:00", "20200101000000+00:00", "P30DT23H30M"}, // in UTC still January
        {__LINE__, "120000", "110000", "PT1H"},
        {__LINE__, "110000", "120000.25", "-PT1H0.25S"},
        {__LINE__, "120000+01:00", "110000+00:00", "PT0S"},
        {__LINE__, "230000-12:00", "010000+12:00", "P1DT22H"},
        {__LINE__, "010000+12:00", "230000-12:00", "-P1DT22H"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(answerOf(diff(row.first, row.second)), success(row.interval)) << "line " << row.line;
    }
}

// The same failures in the same order for all three; compare() only says that there is one.
TEST(Diff, FailuresAreThoseOfDiffAsNumberToo) {
    const struct {
        int line;
        const char* first;
        const char* second;
        Answer answer;
    } rows[] = {
        {__LINE__, "abc", "def", failure(933063, {"abc"})},
        {__LINE__, "20200101", "def", failure(933063, {"def"})},
        {__LINE__, "", "20200101", failure(933063, {""})},
        {__LINE__, "120000", "20200101", failure(933059, {"120000", "20200101"})},
        {__LINE__, " 20200101", "120000 ", failure(933059, {" 20200101", "120000 "})},
        {__LINE__, "120000", "120000+00:00", failure(933059, {"120000", "120000+00:00"})},
        {__LINE__, "20200101000000", "20200101000000+00:00",
         failure(933059, {"20200101000000", "20200101000000+00:00"})},
        {__LINE__, "20200101", "20200101000000+00:00", failure(933059, {"20200101", "20200101000000+00:00"})},
        {__LINE__, "20200101000000+00:00", "20200101", failure(933059, {"20200101000000+00:00", "20200101"})},
        {__LINE__, "20200101000000", "120000", failure(933059, {"20200101000000", "120000"})},
        {__LINE__, "240000", "20210229", outOfRange("29", "day", "1", "28")}, // the second is read first
        {__LINE__, "abc", "20210229", outOfRange("29", "day", "1", "28")},
        {__LINE__, "240000", "abc", outOfRange("24", "hours", "0", "23")},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        EXPECT_EQ(answerOf(diff(row.first, row.second)), row.answer);
        for (const UnitType unit : units) {
            EXPECT_EQ(answerOf(diffAsNumber(row.first, row.second, unit)), row.answer);
        }
        EXPECT_EQ(answerOf(diffAsNumber(row.first, row.second, static_cast<UnitType>(7))), row.answer);
        EXPECT_EQ(compare(row.first, row.second), -3);
    }
}

TEST(Diff, AnOffsetMayMoveAValueOutOfTheYears) {
    // In UTC the second value lies in 999, from where no calendar step is made.
    const Answer answer = outOfRange("999", "year", "1000", "9999");
    EXPECT_EQ(answerOf(diff("10010101000000+00:00", "10000101000000+01:00")), answer);
    EXPECT_EQ(answerOf(diffAsNumber("10010101000000+00:00", "10000101000000+01:00", UnitType::Years)), answer);
    EXPECT_EQ(answerOf(diffAsNumber("10000101010000+00:00", "10000101000000+01:00", UnitType::Hours)), success(2.0));
    EXPECT_EQ(compare("10000101010000+00:00", "10000101000000+01:00"), 1);
}

TEST(DiffAsNumber, HasAnAnswerInEachUnit) {
    const struct {
        int line;
        const char* first;
        const char* second;
        UnitType unit;
        double number;
    } rows[] = {
        {__LINE__, "20200201", "20200101", UnitType::Months, 1.0},
        {__LINE__, "20200201", "20200101", UnitType::Years, 1.0 / 12.0},
        {__LINE__, "20200101", "20200201", UnitType::Months, -1.0},
        {__LINE__, "20200116", "20200101", UnitType::Months, 15.0 / 31.0},
        {__LINE__, "20200101", "20200116", UnitType::Months, -(15.0 / 31.0)},
        {__LINE__, "20200216", "20200201", UnitType::Months, 15.0 / 29.0},
        {__LINE__, "20200301", "20200131", UnitType::Months, 1.0 + 1.0 / 29.0}, // the day is in February
        {__LINE__, "20200131", "20200301", UnitType::Months, -(1.0 + 1.0 / 31.0)}, // here in January
        {__LINE__, "060000", "000000", UnitType::Months, 0.25 / 31.0},
        {__LINE__, "20200101", "20200101", UnitType::Years, 0.0},
        {__LINE__, "20200115", "20200101", UnitType::Weeks, 2.0},
        {__LINE__, "20200115", "20200101", UnitType::Days, 14.0},
        {__LINE__, "20200115", "20200101", UnitType::Hours, 336.0},
        {__LINE__, "20200115", "20200101", UnitType::Minutes, 20160.0},
        {__LINE__, "20200115", "20200101", UnitType::Seconds, 1209600.0},
        {__LINE__, "20200101", "20200115", UnitType::Seconds, -1209600.0},
        {__LINE__, "000000.000000001", "000000", UnitType::Seconds, 1e-9},
        {__LINE__, "110000+00:00", "120000+01:00", UnitType::Seconds, 0.0},
        {__LINE__, "99991231235959", "10000101000000", UnitType::Seconds, 284012524799.0},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(answerOf(diffAsNumber(row.first, row.second, row.unit)), success(row.number)) << "line " << row.line;
    }
}

TEST(DiffAsNumber, RefusesOtherUnits) {
    for (const std::uint32_t unit : {7U, 8U, 0xFFFFFFFFU}) {
        EXPECT_EQ(answerOf(diffAsNumber("20200101", "20200101", static_cast<UnitType>(unit))), genericFailure());
    }
}

TEST(Compare, OrdersMoments) {
    const struct {
        const char* first;
        const char* second;
        int order;
    } rows[] = {
        {"20200101", "20200102", -1},
        {"20200102", "20200101", 1},
        {"20200101", "20200101", 0},
        {"20200101", "20200101000000", 0},
        {"20200101000000", "20200101", 0},
        {"20200101", "20200101000000.000000001", -1},
        {"99991231235959.999999999", "99991231235959.999999998", 1},
        {"120000+01:00", "110000+00:00", 0},
        {"120000+01:00", "110001+00:00", -1},
        {"20200101000000+01:00", "20191231230000+00:00", 0},
        {"20200101000000+0100", "20191231230000+00:00", 0},
        {"20200101", "abc", -3},
        {"20200101000000", "20200101000000+00:00", -3},
        {"120000", "20200101", -3},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(compare(row.first, row.second), row.order) << row.first << " " << row.second;
    }
}

// ---- Against counting and walking

class Values {
public:
    explicit Values(unsigned seed) : random_(seed) {}

    NaiveDateTime dateTime(int highestDay = 31) {
        NaiveDateTime at{1000 + static_cast<std::int64_t>(random_() % 9000), 1 + static_cast<int>(random_() % 12), 1};
        const int days = std::min(highestDay, kvt::test::daysInMonth(at.year, at.month));
        at.day = random_() % 4 == 0 ? days : 1 + static_cast<int>(random_() % static_cast<unsigned>(days));
        if (random_() % 4 != 0) {
            at.hours = static_cast<int>(random_() % 24);
            at.minutes = static_cast<int>(random_() % 60);
            at.seconds = static_cast<int>(random_() % 60);
            at.nanoseconds = random_() % 2 == 0 ? 0 : static_cast<int>(random_() % 1'000'000'000);
        }
        return at;
    }

    // Another value, often near the first.
    NaiveDateTime near(const NaiveDateTime& at) {
        if (random_() % 2 == 0) {
            return dateTime();
        }
        constexpr Int128 perDay = static_cast<Int128>(86400) * 1000000000;
        const Int128 distance = (static_cast<Int128>(random_() % 1'600) - 800) * perDay +
                                (random_() % 2 == 0 ? 0 : static_cast<std::int64_t>(random_() % 1000));
        const NaiveDateTime other = kvt::test::naiveDateTime(kvt::test::naiveNanoseconds(at) + distance);
        return other.year < 1000 || other.year > 9999 ? at : other;
    }

private:
    std::mt19937_64 random_;
};

NaiveDateTime plusMonths(NaiveDateTime at, std::int64_t months) {
    const std::int64_t sum = at.year * 12 + at.month - 1 + months;
    at.year = sum / 12;
    at.month = static_cast<int>(sum % 12) + 1;
    at.day = std::min(at.day, kvt::test::daysInMonth(at.year, at.month));
    return at;
}

// The difference as it is defined, step by step from zero and not down from a guess.
struct NaiveDifference {
    std::int64_t years = 0;
    std::int64_t months = 0;
    Int128 rest = 0;
    double inMonths = 0.0;
};

NaiveDifference naiveDifference(const NaiveDateTime& first, const NaiveDateTime& second) {
    const Int128 target = kvt::test::naiveNanoseconds(first);
    const Int128 start = kvt::test::naiveNanoseconds(second);
    const int direction = target < start ? -1 : 1;
    const auto passes = [&](const NaiveDateTime& at) {
        const Int128 count = kvt::test::naiveNanoseconds(at);
        return direction > 0 ? count > target : count < target;
    };
    NaiveDifference difference;
    difference.years = std::max<std::int64_t>((first.year - second.year) * direction - 2, 0);
    while (!passes(plusMonths(second, direction * (difference.years + 1) * 12))) {
        ++difference.years;
    }
    NaiveDateTime at = plusMonths(second, direction * difference.years * 12);
    const NaiveDateTime afterYears = at;
    while (!passes(plusMonths(afterYears, direction * (difference.months + 1)))) {
        ++difference.months;
    }
    at = plusMonths(afterYears, direction * difference.months);
    difference.rest = (target - kvt::test::naiveNanoseconds(at)) * direction;
    const NaiveDateTime& earlier = direction > 0 ? at : first;
    difference.inMonths = direction * (static_cast<double>(difference.years * 12 + difference.months) +
                                       static_cast<double>(difference.rest) / 1e9 / 86400.0 /
                                           kvt::test::daysInMonth(earlier.year, earlier.month));
    return difference;
}

std::string naiveIntervalText(const NaiveDifference& difference, bool negative) {
    const auto nanoseconds = static_cast<int>(difference.rest % 1000000000);
    const auto seconds = static_cast<std::int64_t>(difference.rest / 1000000000);
    const auto put = [](std::int64_t number, const char* designator) {
        return number == 0 ? std::string() : std::to_string(number) + designator;
    };
    const std::string date = put(difference.years, "Y") + put(difference.months, "M") + put(seconds / 86400, "D");
    std::string time = put(seconds / 3600 % 24, "H") + put(seconds / 60 % 60, "M");
    if (seconds % 60 != 0 || nanoseconds != 0) {
        time += std::to_string(seconds % 60) + kvt::test::naiveFraction(nanoseconds) + "S";
    }
    if (date.empty() && time.empty()) {
        return "PT0S";
    }
    return (negative ? "-P" : "P") + date + (time.empty() ? "" : "T" + time);
}

TEST(DiffAsNumber, IsRightToTheLastBit) {
    Values values(933059);
    for (int i = 0; i < 40'000; ++i) {
        const NaiveDateTime second = values.dateTime();
        const NaiveDateTime first = values.near(second);
        const std::string firstText = kvt::test::naiveText(first);
        const std::string secondText = kvt::test::naiveText(second);
        const double seconds =
            static_cast<double>(kvt::test::naiveNanoseconds(first) - kvt::test::naiveNanoseconds(second)) / 1e9;
        const double minutes = seconds / 60.0;
        const double hours = minutes / 60.0;
        const double days = hours / 24.0;
        const double months = naiveDifference(first, second).inMonths;
        const std::array<double, 7> expected = {months / 12.0, months, days / 7.0, days, hours, minutes, seconds};
        for (const UnitType unit : units) {
            ASSERT_EQ(std::get<1>(diffAsNumber(ustring(firstText), ustring(secondText), unit)),
                      expected[static_cast<std::size_t>(unit)])
                << firstText << " minus " << secondText << " in " << static_cast<int>(unit);
        }
        const int order = seconds < 0 ? -1 : seconds > 0 ? 1 : 0;
        ASSERT_EQ(compare(ustring(firstText), ustring(secondText)), order) << firstText << " " << secondText;
        ASSERT_EQ(compare(ustring(secondText), ustring(firstText)), -order) << firstText << " " << secondText;
    }
}

TEST(Diff, AgreesWithCountingSteps) {
    Values values(2);
    for (int i = 0; i < 40'000; ++i) {
        const NaiveDateTime second = values.dateTime();
        const NaiveDateTime first = values.near(second);
        const bool negative = kvt::test::naiveNanoseconds(first) < kvt::test::naiveNanoseconds(second);
        ASSERT_EQ(answerOf(diff(ustring(kvt::test::naiveText(first)), ustring(kvt::test::naiveText(second)))),
                  success(naiveIntervalText(naiveDifference(first, second), negative)))
            << kvt::test::naiveText(first) << " minus " << kvt::test::naiveText(second);
    }
}

// From a day that every month has, no step is cut, and adding the difference leads back.
TEST(Diff, ThenAddComesBack) {
    Values values(3);
    for (int i = 0; i < 40'000; ++i) {
        const NaiveDateTime second = values.dateTime(28);
        const std::string first = kvt::test::naiveText(values.near(second));
        const std::string start = kvt::test::naiveText(second);
        const std::string interval = kvt::test::textOf(diff(ustring(first), ustring(start)));
        ASSERT_EQ(answerOf(add(ustring(start), ustring(interval))), success(first)) << start << " plus " << interval;
    }
}

TEST(Diff, OfDatesThenAddComesBackToADate) {
    Values values(4);
    for (int i = 0; i < 20'000; ++i) {
        const NaiveDateTime second = values.dateTime(28);
        const std::string first = kvt::test::naiveDateText(values.near(second));
        const std::string start = kvt::test::naiveDateText(second);
        const std::string interval = kvt::test::textOf(diff(ustring(first), ustring(start)));
        ASSERT_EQ(answerOf(add(ustring(start), ustring(interval))), success(first)) << start << " plus " << interval;
    }
}

TEST(Diff, OfTimesThenAddComesBack) {
    Values values(5);
    for (int i = 0; i < 20'000; ++i) {
        const std::string first = kvt::test::naiveTimeText(values.dateTime());
        const std::string second = kvt::test::naiveTimeText(values.dateTime());
        const std::string interval = kvt::test::textOf(diff(ustring(first), ustring(second)));
        ASSERT_EQ(answerOf(add(ustring(second), ustring(interval))), success(first)) << second << " plus " << interval;
    }
}

// With offsets: the difference is that of the moments, and the sum keeps the offset of the value it began with.
TEST(Diff, WithOffsetsThenAddReachesTheSameMoment) {
    Values values(6);
    std::mt19937_64 random(7);
    for (int i = 0; i < 20'000; ++i) {
        NaiveDateTime second = values.dateTime(27);
        NaiveDateTime other = values.near(second);
        second.year = std::clamp<std::int64_t>(second.year, 1001, 9998);
        other.year = std::clamp<std::int64_t>(other.year, 1001, 9998);
        other.day = std::min(other.day, 28);
        const std::string first = kvt::test::naiveText(other) + (random() % 2 == 0 ? "+05:30" : "-11:59");
        const std::string start = kvt::test::naiveText(second) + "+00:00"; // steps are made in UTC
        const std::string interval = kvt::test::textOf(diff(ustring(first), ustring(start)));
        const Answer sum = answerOf(add(ustring(start), ustring(interval)));
        ASSERT_EQ(sum.state, ReturnState::Success) << start << " plus " << interval;
        ASSERT_EQ(compare(ustring(sum.text), ustring(first)), 0) << start << " plus " << interval;
    }
}

} // namespace
