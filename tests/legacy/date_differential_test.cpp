// ObsoleteDate beside Boost.DateTime used directly, on random dates, numbers and formats.
#include "legacy_support.h"

#include <climits>
#include <iterator>
#include <random>
#include <sstream>

namespace kvt::test {
namespace {

namespace greg = boost::gregorian;

class DateDifferential : public ::testing::Test {
protected:
    unsigned int upTo(unsigned int last) {
        return std::uniform_int_distribution<unsigned int>(0, last)(random_);
    }

    // Parts in and around their ranges, at times with high bits that do not count.
    unsigned int part(unsigned int first, unsigned int last) {
        const unsigned int value = first - 2 + upTo(last - first + 4);
        return upTo(9) == 0 ? value + 65536 * upTo(65535) : value;
    }

    greg::date anyDate() {
        const auto first = greg::date(greg::min_date_time).day_number();
        const auto last = greg::date(greg::max_date_time).day_number();
        return greg::date(first + upTo(last - first));
    }

    // Dates, their neighbourhood, special values, and numbers that are not dates.
    unsigned int anyNumber() {
        switch (upTo(3)) {
        case 0:
            return upTo(UINT_MAX);
        case 1:
            return upTo(4) - 3; // 0xFFFFFFFD to 1
        default:
            return anyDate().day_number() + upTo(2) - 1;
        }
    }

    std::mt19937 random_{20240229};
};

ObsoleteDate mine(const greg::date& date) {
    return ObsoleteDate(date.day(), date.month(), date.year());
}

std::string theirText(const greg::date& date, const char* format) {
    std::ostringstream stream;
    stream.imbue(std::locale(stream.getloc(), new greg::date_facet(format)));
    stream << date;
    return stream.str();
}

const char* const formats[] = {"%Y-%m-%d", "%x",    "%a, %d %b %Y", "%A %B %j", "%U %W %V %G %u %w",
                               "%C|%y|%e", "%D %F", "%Ex%Od",       "%%%n%t%h", "%q%!%"};

TEST_F(DateDifferential, ReadsAndWritesTheSameDates) {
    for (int round = 0; round < 20000; ++round) {
        const greg::date theirs = anyDate();
        const ObsoleteDate date = mine(theirs);
        const Parts expected(theirs.year(), theirs.month(), theirs.day(), theirs.day_of_year());
        ASSERT_EQ(partsOf(date), expected) << theirs;
        ASSERT_EQ(numberOf(date), theirs.day_number()) << theirs;
        ASSERT_TRUE(ObsoleteDate(date.day(), date.year()) == date) << theirs;
        std::tm fields = greg::to_tm(theirs);
        ASSERT_TRUE(ObsoleteDate(&fields) == date) << theirs;
        const char* format = formats[upTo(std::size(formats) - 1)];
        ASSERT_EQ(date.asString(format), theirText(theirs, format)) << theirs;
    }
}

TEST_F(DateDifferential, TakesAndRefusesTheSameParts) {
    for (int round = 0; round < 20000; ++round) {
        const unsigned int day = part(1, 31);
        const unsigned int month = part(1, 12);
        const unsigned int year = upTo(1) == 0 ? part(1400, 9999) : 1998 + upTo(6);
        const std::string theirs = failureOf([&] {
            const greg::greg_day d(static_cast<unsigned short>(day));
            const greg::greg_month m(static_cast<unsigned short>(month));
            const greg::greg_year y(static_cast<unsigned short>(year));
            greg::date(y, m, d);
        });
        ASSERT_EQ(failureOf([&] { ObsoleteDate(day, month, year); }), theirs)
            << day << ' ' << month << ' ' << year;
    }
}

// By adding days to the first of January, which the library does not.
TEST_F(DateDifferential, CountsTheDaysOfAYearAlike) {
    for (int round = 0; round < 20000; ++round) {
        const unsigned int dayOfYear = 1 + upTo(369);
        const greg::date first(static_cast<unsigned short>(1400 + upTo(9999 - 1400)), 1, 1);
        const unsigned int length = greg::gregorian_calendar::is_leap_year(first.year()) ? 366 : 365;
        if (dayOfYear > length) {
            ASSERT_EQ(failureOf([&] { ObsoleteDate(dayOfYear, first.year()); }), badMonth)
                << first << dayOfYear;
        } else {
            const greg::date theirs = first + greg::days(dayOfYear - 1);
            ASSERT_EQ(numberOf(ObsoleteDate(dayOfYear, first.year())), theirs.day_number()) << theirs;
        }
    }
}

TEST_F(DateDifferential, CalculatesAlikeOnAllNumbers) {
    for (int round = 0; round < 40000; ++round) {
        const unsigned int left = anyNumber();
        const unsigned int right = anyNumber();
        const unsigned int days = upTo(1) == 0 ? upTo(UINT_MAX) : upTo(1000) - 500;
        const greg::date a{greg::date::date_int_type(left)};
        const greg::date b{greg::date::date_int_type(right)};
        const ObsoleteDate mineA = dateNumbered(left);
        const ObsoleteDate mineB = dateNumbered(right);
        const std::string what =
            std::to_string(left) + ' ' + std::to_string(right) + ' ' + std::to_string(days);
        ASSERT_EQ(mineA == mineB, a == b) << what;
        ASSERT_EQ(mineA < mineB, a < b) << what;
        ASSERT_EQ(mineA - mineB, static_cast<std::uint32_t>((a - b).days())) << what;
        ASSERT_EQ(mineA.isValid(), !a.is_not_a_date()) << what;
        const greg::date sum = a + greg::days(static_cast<int>(days));
        ASSERT_TRUE(mineA + days == dateNumbered(sum.day_number())) << what;
        ObsoleteDate moved = mineA;
        ASSERT_TRUE(++moved == dateNumbered((a + greg::days(1)).day_number())) << what;
        moved = mineA;
        ASSERT_TRUE(--moved == dateNumbered((a - greg::days(1)).day_number())) << what;
    }
}

TEST_F(DateDifferential, FailsAlikeOnNumbersThatAreNoDates) {
    for (int round = 0; round < 40000; ++round) {
        const unsigned int number = anyNumber();
        const greg::date theirs{greg::date::date_int_type(number)};
        const ObsoleteDate date = dateNumbered(number);
        unsigned int mineIs = 0;
        unsigned int theirIs = 0;
        ASSERT_EQ(failureOf([&] { mineIs = date.year(); }), failureOf([&] { theirIs = theirs.year(); }))
            << number;
        ASSERT_EQ(mineIs, theirIs) << number;
        ASSERT_EQ(failureOf([&] { mineIs = date.month(); }), failureOf([&] { theirIs = theirs.month(); }))
            << number;
        ASSERT_EQ(mineIs, theirIs) << number;
        ASSERT_EQ(failureOf([&] { mineIs = date.dayOfMonth(); }), failureOf([&] { theirIs = theirs.day(); }))
            << number;
        ASSERT_EQ(mineIs, theirIs) << number;
        ASSERT_EQ(failureOf([&] { mineIs = date.day(); }), failureOf([&] { theirIs = theirs.day_of_year(); }))
            << number;
        ASSERT_EQ(mineIs, theirIs) << number;
        std::string mineReads;
        std::string theirReads;
        ASSERT_EQ(failureOf([&] { mineReads = date.asString("%Y-%m-%d"); }),
                  failureOf([&] { theirReads = theirText(theirs, "%Y-%m-%d"); }))
            << number;
        ASSERT_EQ(mineReads, theirReads) << number;
    }
}

TEST_F(DateDifferential, SumsAndDifferencesGoBack) {
    for (int round = 0; round < 20000; ++round) {
        const ObsoleteDate from = mine(anyDate());
        const ObsoleteDate to = mine(anyDate());
        ASSERT_TRUE(from + (to - from) == to);
        ASSERT_EQ((to - from) + (from - to), to == from ? 0U : 4294967296U);
        ObsoleteDate moved = from;
        ASSERT_TRUE(moved++ == from);
        ASSERT_TRUE(moved == from + 1);
        ASSERT_TRUE(moved-- == from + 1);
        ASSERT_TRUE(moved == from);
    }
}

} // namespace
} // namespace kvt::test
