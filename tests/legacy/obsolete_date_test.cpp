// ObsoleteDate: how it is built, asked, moved and compared.
#include "legacy_support.h"
#include "machine_clock.h"

#include <climits>
#include <concepts>
#include <type_traits>
#include <utility>
#include <vector>

namespace kvt::test {
namespace {

template <typename T>
concept HasUnequal = requires {
    &T::operator!=;
};

static_assert(!HasUnequal<ObsoleteDate>, "unequal is what is not equal");
static_assert(sizeof(ObsoleteDate) == sizeof(void*), "an object is one pointer");
static_assert(std::is_same_v<decltype(std::declval<const ObsoleteDate&>() - std::declval<ObsoleteDate>()),
                             unsigned long>);
static_assert(std::is_same_v<decltype(++std::declval<ObsoleteDate&>()), ObsoleteDate&>);
static_assert(std::is_same_v<decltype(std::declval<ObsoleteDate&>()++), ObsoleteDate>);
static_assert(
    std::is_same_v<decltype(&ObsoleteDate::operator<), bool (ObsoleteDate::*)(const ObsoleteDate&) const>);

struct PartsRow {
    int line;
    unsigned int day, month, year;
    Parts expected;
};

const PartsRow partsRows[] = {
    {__LINE__, 1, 2, 2020, {2020, 2, 1, 32}},
    {__LINE__, 1, 1, 1400, {1400, 1, 1, 1}},
    {__LINE__, 31, 12, 9999, {9999, 12, 31, 365}},
    {__LINE__, 29, 2, 2000, {2000, 2, 29, 60}},
    {__LINE__, 31, 12, 2020, {2020, 12, 31, 366}},
    // The low 16 bits of each part count.
    {__LINE__, 65537, 2, 2020, {2020, 2, 1, 32}},
    {__LINE__, 1, 65536 + 3, 2021, {2021, 3, 1, 60}},
    {__LINE__, 1, 2, 0xFFFF0000U + 2020, {2020, 2, 1, 32}},
};

TEST(ObsoleteDateParts, AreTheOnesGiven) {
    for (const PartsRow& row : partsRows) {
        EXPECT_EQ(partsOf(ObsoleteDate(row.day, row.month, row.year)), row.expected) << "row " << row.line;
    }
}

struct DayOfYearRow {
    int line;
    unsigned int dayOfYear, year;
    Parts expected;
};

const DayOfYearRow dayOfYearRows[] = {
    {__LINE__, 1, 2020, {2020, 1, 1, 1}},
    {__LINE__, 31, 2020, {2020, 1, 31, 31}},
    {__LINE__, 32, 2020, {2020, 2, 1, 32}},
    {__LINE__, 60, 2020, {2020, 2, 29, 60}},
    {__LINE__, 60, 2021, {2021, 3, 1, 60}},
    {__LINE__, 59, 1900, {1900, 2, 28, 59}},
    {__LINE__, 60, 1900, {1900, 3, 1, 60}},
    {__LINE__, 60, 2000, {2000, 2, 29, 60}},
    {__LINE__, 366, 2020, {2020, 12, 31, 366}},
    {__LINE__, 365, 2021, {2021, 12, 31, 365}},
    {__LINE__, 60, 65536 + 2020, {2020, 2, 29, 60}},
};

TEST(ObsoleteDateDayOfYear, CountsThroughTheMonths) {
    for (const DayOfYearRow& row : dayOfYearRows) {
        EXPECT_EQ(partsOf(ObsoleteDate(row.dayOfYear, row.year)), row.expected) << "row " << row.line;
    }
}

TEST(ObsoleteDateDayOfYear, IsWhatDayGivesForEveryDayOfEveryYear) {
    for (unsigned int year = 1400; year <= 9999; ++year) {
        const unsigned int last = year % 4 == 0 && (year % 100 != 0 || year % 400 == 0) ? 366 : 365;
        for (unsigned int day = 1; day <= last; day += 1 + day % 3) {
            const ObsoleteDate date(day, year);
            ASSERT_EQ(date.day(), day) << year;
            ASSERT_EQ(date.year(), year) << day;
        }
        ASSERT_EQ(failureOf([&] { ObsoleteDate(last + 1, year); }), badMonth) << year;
    }
}

struct FailureRow {
    int line;
    std::vector<unsigned int> arguments;
    std::string expected;
};

const FailureRow failureRows[] = {
    {__LINE__, {0, 1, 2020}, badDay},
    {__LINE__, {32, 1, 2020}, badDay},
    {__LINE__, {65536, 1, 2020}, badDay},
    {__LINE__, {UINT_MAX, 1, 2020}, badDay},
    {__LINE__, {31, 4, 2020}, badDayOfMonth},
    {__LINE__, {30, 2, 2020}, badDayOfMonth},
    {__LINE__, {29, 2, 2021}, badDayOfMonth},
    {__LINE__, {29, 2, 1900}, badDayOfMonth},
    {__LINE__, {1, 0, 2020}, badMonth},
    {__LINE__, {1, 13, 2020}, badMonth},
    {__LINE__, {1, 65536, 2020}, badMonth},
    {__LINE__, {1, 1, 1399}, badYear},
    {__LINE__, {1, 1, 10001}, badYear},
    {__LINE__, {1, 1, 0}, badYear},
    {__LINE__, {1, 1, 65536}, badYear},
    // In the order of the parameters.
    {__LINE__, {0, 0, 0}, badDay},
    {__LINE__, {31, 0, 0}, badMonth},
    {__LINE__, {31, 2, 0}, badYear},
    // The day of a year: the year is looked at first.
    {__LINE__, {0, 2020}, badDay},
    {__LINE__, {366, 2021}, badMonth},
    {__LINE__, {367, 2020}, badMonth},
    {__LINE__, {65537, 2020}, badMonth},
    {__LINE__, {UINT_MAX, 2020}, badMonth},
    {__LINE__, {1, 1399}, badYear},
    {__LINE__, {1, 10001}, badYear},
    {__LINE__, {0, 0}, badYear},
    {__LINE__, {1, 65536}, badYear},
};

TEST(ObsoleteDateFailures, HaveTheirClassesAndWords) {
    for (const FailureRow& row : failureRows) {
        const auto& given = row.arguments;
        EXPECT_EQ(failureOf([&] {
                      given.size() == 3 ? ObsoleteDate(given[0], given[1], given[2])
                                        : ObsoleteDate(given[0], given[1]);
                  }),
                  row.expected)
            << "row " << row.line;
    }
}

TEST(ObsoleteDateFailures, TheLastYearIsThatOfBoost) {
    const unsigned int last = (boost::gregorian::greg_year::max)();
    EXPECT_EQ(ObsoleteDate(31, 12, last).year(), last);
    EXPECT_EQ(ObsoleteDate(365, last).year(), last);
    EXPECT_EQ(failureOf([&] { ObsoleteDate(1, 1, last + 1); }), badYear);
    EXPECT_EQ(failureOf([&] { ObsoleteDate(1, last + 1); }), badYear);
}

TEST(ObsoleteDateOfTm, TakesTheDateAndNothingElse) {
    std::tm time = calendarTime(2020, 2, 29, 99, -5, 1000);
    time.tm_wday = 77;
    time.tm_yday = 88;
    EXPECT_EQ(partsOf(ObsoleteDate(&time)), (Parts{2020, 2, 29, 60}));
}

TEST(ObsoleteDateOfTm, NarrowsAndChecksAsThePartsAre) {
    std::tm time = calendarTime(2020 + 65536, 2 - 65536, 29 + 65536);
    EXPECT_EQ(partsOf(ObsoleteDate(&time)), (Parts{2020, 2, 29, 60}));
    const std::pair<std::tm, std::string> rows[] = {
        {calendarTime(2020, 2, 0), badDay},   {calendarTime(2020, 2, 32), badDay},
        {calendarTime(2020, 2, -1), badDay},  {calendarTime(2020, 2, 30), badDayOfMonth},
        {calendarTime(2020, 0, 1), badMonth}, {calendarTime(2020, 13, 1), badMonth},
        {calendarTime(1399, 1, 1), badYear},  {calendarTime(0, 1, 1), badYear},
        {calendarTime(10001, 1, 1), badYear},
    };
    for (const auto& [bad, expected] : rows) {
        std::tm given = bad;
        EXPECT_EQ(failureOf([&] { const ObsoleteDate date(&given); }), expected)
            << bad.tm_year << ' ' << bad.tm_mon << ' ' << bad.tm_mday;
    }
    std::tm extreme{};
    extreme.tm_year = INT_MAX;
    extreme.tm_mon = INT_MAX;
    extreme.tm_mday = INT_MAX;
    EXPECT_EQ(failureOf([&] { const ObsoleteDate date(&extreme); }), badDay);
}

TEST(ObsoleteDateCopies, AreIndependent) {
    ObsoleteDate first(1, 2, 2020);
    const ObsoleteDate copy(first);
    ++first;
    EXPECT_EQ(partsOf(copy), (Parts{2020, 2, 1, 32}));
    ObsoleteDate assigned(5, 5, 1955);
    assigned = first;
    --first;
    EXPECT_EQ(partsOf(assigned), (Parts{2020, 2, 2, 33}));
    const ObsoleteDate& itself = assigned;
    assigned = itself;
    EXPECT_EQ(partsOf(assigned), (Parts{2020, 2, 2, 33}));
}

TEST(ObsoleteDateArithmetic, AddsDays) {
    EXPECT_EQ(partsOf(ObsoleteDate(28, 2, 2020) + 1), (Parts{2020, 2, 29, 60}));
    EXPECT_EQ(partsOf(ObsoleteDate(31, 12, 1999) + 1), (Parts{2000, 1, 1, 1}));
    EXPECT_EQ(partsOf(ObsoleteDate(1, 1, 2000) + 366), (Parts{2001, 1, 1, 1}));
    EXPECT_EQ(partsOf(ObsoleteDate(1, 1, 2000) + 0), (Parts{2000, 1, 1, 1}));
}

TEST(ObsoleteDateArithmetic, CountsTheLow32BitsAndWraps) {
    const ObsoleteDate date(1, 3, 2020);
    EXPECT_EQ(partsOf(date + 4294967295UL), (Parts{2020, 2, 29, 60}));
    EXPECT_EQ(partsOf(date + 4294967296UL), (Parts{2020, 3, 1, 61}));
    EXPECT_EQ(partsOf(date + ((1UL << 40) + 1)), (Parts{2020, 3, 2, 62}));
    EXPECT_TRUE((date + 0x7FFFFFFFUL) + 0x80000001UL == date);
}

TEST(ObsoleteDateArithmetic, DifferenceIsUnsignedIn32Bits) {
    const ObsoleteDate earlier(1, 1, 2020);
    const ObsoleteDate later(1, 3, 2020);
    EXPECT_EQ(later - earlier, 60U);
    EXPECT_EQ(earlier - later, 4294967236U);
    EXPECT_EQ(later - later, 0U);
    EXPECT_EQ(ObsoleteDate(1, 1, 1400) - ObsoleteDate(31, 12, 9999), 4294967296U - 3141084U);
}

TEST(ObsoleteDateArithmetic, StepsByOneDay) {
    ObsoleteDate date(28, 2, 2021);
    EXPECT_EQ(&++date, &date);
    EXPECT_EQ(partsOf(date), (Parts{2021, 3, 1, 60}));
    EXPECT_EQ(&--date, &date);
    EXPECT_EQ(partsOf(date), (Parts{2021, 2, 28, 59}));
    EXPECT_EQ(partsOf(date++), (Parts{2021, 2, 28, 59}));
    EXPECT_EQ(partsOf(date), (Parts{2021, 3, 1, 60}));
    EXPECT_EQ(partsOf(date--), (Parts{2021, 3, 1, 60}));
    EXPECT_EQ(partsOf(date), (Parts{2021, 2, 28, 59}));
}

TEST(ObsoleteDateArithmetic, MayLeaveTheCalendarAndComeBack) {
    ObsoleteDate date(1, 1, 1400);
    --date;
    EXPECT_TRUE(date.isValid());
    const struct {
        const char* name;
        unsigned int (ObsoleteDate::*part)() const;
    } rows[] = {
        {"year", &ObsoleteDate::year},
        {"month", &ObsoleteDate::month},
        {"dayOfMonth", &ObsoleteDate::dayOfMonth},
        {"day", &ObsoleteDate::day},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(failureOf([&] { (date.*row.part)(); }), badYear) << row.name;
    }
    EXPECT_EQ(failureOf([&] { date.asString(); }), badYear);
    ++date;
    EXPECT_EQ(partsOf(date), (Parts{1400, 1, 1, 1}));
    ObsoleteDate last(31, 12, (boost::gregorian::greg_year::max)());
    EXPECT_EQ(failureOf([&] { (++last).year(); }), badYear);
}

// The number wraps within Boost: the year looks like 1400, but is 65536 years later.
TEST(ObsoleteDateArithmetic, ADayFarBeyondTheCalendarIsNoneOfAYear) {
    const ObsoleteDate date = dateNumbered(26169016);
    EXPECT_EQ(date.year(), 1400U);
    EXPECT_EQ(failureOf([&] { date.day(); }), badDayOfYear);
}

const unsigned int ascendingNumbers[] = {
    negativeInfinity, 1,          numberOf2000 - 1, numberOf2000, numberOf2000 + 1,
    0x7FFFFFFF,       0x80000000, 0xFFFFFFFD,       notADate,     positiveInfinity};

TEST(ObsoleteDateComparison, IsThatOfTheDayNumbersUnsigned) {
    for (const unsigned int left : ascendingNumbers) {
        for (const unsigned int right : ascendingNumbers) {
            const ObsoleteDate a = dateNumbered(left);
            const ObsoleteDate b = dateNumbered(right);
            EXPECT_EQ(a == b, left == right) << left << ' ' << right;
            EXPECT_EQ(a < b, left < right) << left << ' ' << right;
            EXPECT_EQ(a <= b, left <= right) << left << ' ' << right;
            EXPECT_EQ(a > b, left > right) << left << ' ' << right;
            EXPECT_EQ(a >= b, left >= right) << left << ' ' << right;
        }
    }
}

TEST(ObsoleteDateSpecial, OnlyNotADateTimeIsInvalid) {
    for (const unsigned int number : ascendingNumbers) {
        EXPECT_EQ(dateNumbered(number).isValid(), number != notADate) << number;
    }
}

TEST(ObsoleteDateSpecial, ValuesStayUnderArithmetic) {
    const unsigned long amounts[] = {0, 1, 365, 0x7FFFFFFE, 0x7FFFFFFF, 0x80000000, 0xFFFFFFFE, 0xFFFFFFFF};
    for (const unsigned int number : {notADate, positiveInfinity, negativeInfinity}) {
        const ObsoleteDate special = dateNumbered(number);
        for (const unsigned long days : amounts) {
            EXPECT_TRUE(special + days == special) << number << " + " << days;
        }
        ObsoleteDate moved = special;
        EXPECT_TRUE(++moved == special && moved++ == special && moved == special) << number;
        EXPECT_TRUE(--moved == special && moved-- == special && moved == special) << number;
    }
}

TEST(ObsoleteDateSpecial, ValuesHaveNoParts) {
    for (const unsigned int number : {notADate, positiveInfinity, negativeInfinity}) {
        const ObsoleteDate special = dateNumbered(number);
        EXPECT_EQ(failureOf([&] { special.year(); }), badYear) << number;
        EXPECT_EQ(failureOf([&] { special.month(); }), badYear) << number;
        EXPECT_EQ(failureOf([&] { special.dayOfMonth(); }), badYear) << number;
        EXPECT_EQ(failureOf([&] { special.day(); }), badYear) << number;
    }
}

TEST(ObsoleteDateSpecial, DifferencesAreSpecialToo) {
    const ObsoleteDate date(1, 1, 2000);
    const auto special = [](unsigned int number) { return dateNumbered(number); };
    EXPECT_EQ(special(notADate) - date, notADate);
    EXPECT_EQ(date - special(notADate), notADate);
    EXPECT_EQ(special(positiveInfinity) - date, positiveInfinity);
    EXPECT_EQ(date - special(positiveInfinity), negativeInfinity);
    EXPECT_EQ(special(negativeInfinity) - date, negativeInfinity);
    EXPECT_EQ(date - special(negativeInfinity), positiveInfinity);
    EXPECT_EQ(special(positiveInfinity) - special(positiveInfinity), notADate);
}

} // namespace
} // namespace kvt::test
