// ObsoleteTime beside Boost.DateTime used directly, on random moments and formats.
#include "legacy_support.h"

#include <boost/date_time/posix_time/posix_time.hpp>

#include <climits>
#include <iterator>
#include <random>
#include <sstream>

namespace kvt::test {
namespace {

namespace greg = boost::gregorian;
namespace posix = boost::posix_time;

class TimeDifferential : public ::testing::Test {
protected:
    unsigned int upTo(unsigned int last) {
        return std::uniform_int_distribution<unsigned int>(0, last)(random_);
    }

    greg::date anyDate() {
        const auto first = greg::date(greg::min_date_time).day_number();
        const auto last = greg::date(greg::max_date_time).day_number();
        return greg::date(first + upTo(last - first));
    }

    std::mt19937 random_{20240229};
};

ObsoleteDate mine(const greg::date& date) {
    return ObsoleteDate(date.day(), date.month(), date.year());
}

std::string theirText(const posix::ptime& time, const char* format) {
    std::ostringstream stream;
    stream.imbue(std::locale(stream.getloc(), new posix::time_facet(format)));
    stream << time;
    return stream.str();
}

// Fields, text, or the failure.
std::string described(const ObsoleteTime& time, const char* format) {
    std::string text;
    const std::string failure = failureOf([&] { text = time.asString(format); });
    return text + '|' + failure;
}

std::string described(const posix::ptime& time, const char* format) {
    std::string text;
    const std::string failure = failureOf([&] { text = theirText(time, format); });
    return text + '|' + failure;
}

const char* const formats[] = {
    "%Y-%m-%d %H:%M:%S", "%x %X",    "%c",       "%a %d %b %Y %I:%M:%S %p", "%T %R",
    "%f %F %s",          "%z%Z %zP", "%ZP %q%Q", "%Y%m%dT%H%M%S%F",         "%E%O%"};

TEST_F(TimeDifferential, BuildsReadsAndWritesTheSameMoments) {
    for (int round = 0; round < 20000; ++round) {
        const greg::date day = anyDate();
        const bool isWild = upTo(3) == 0;
        const unsigned int hours = upTo(isWild ? 100000 : 23);
        const unsigned int minutes = upTo(isWild ? UINT_MAX : 59);
        const unsigned int seconds = upTo(isWild ? UINT_MAX : 59);
        const posix::ptime theirs(day, posix::time_duration(hours, minutes, seconds));
        const ObsoleteTime time(mine(day), hours, minutes, seconds);
        ASSERT_EQ(time.hour(), theirs.time_of_day().hours()) << theirs;
        ASSERT_EQ(time.minute(), theirs.time_of_day().minutes()) << theirs;
        ASSERT_EQ(time.second(), theirs.time_of_day().seconds()) << theirs;
        ASSERT_TRUE(time.isValid());
        const char* format = formats[upTo(std::size(formats) - 1)];
        ASSERT_EQ(described(time, format), described(theirs, format)) << format;
    }
}

TEST_F(TimeDifferential, ExtractsTheSameFieldsAndTakesThemBack) {
    for (int round = 0; round < 20000; ++round) {
        const greg::date day = anyDate();
        const posix::ptime theirs(day, posix::seconds(upTo(86399)));
        const auto ofDay = theirs.time_of_day();
        const ObsoleteTime time(mine(day), static_cast<unsigned int>(ofDay.hours()),
                                static_cast<unsigned int>(ofDay.minutes()),
                                static_cast<unsigned int>(ofDay.seconds()));
        const std::tm expected = posix::to_tm(theirs);
        std::tm fields{};
        time.extract(&fields);
        for (const auto field :
             {&std::tm::tm_sec, &std::tm::tm_min, &std::tm::tm_hour, &std::tm::tm_mday, &std::tm::tm_mon,
              &std::tm::tm_year, &std::tm::tm_wday, &std::tm::tm_yday, &std::tm::tm_isdst}) {
            ASSERT_EQ(fields.*field, expected.*field) << theirs;
        }
        ObsoleteTime again(&fields);
        ASSERT_FALSE(again < time || again > time) << theirs;
    }
}

TEST_F(TimeDifferential, TakesTheSameFieldsFromATm) {
    for (int round = 0; round < 20000; ++round) {
        std::tm fields{};
        fields.tm_year = static_cast<int>(upTo(9000)) - 550;
        fields.tm_mon = static_cast<int>(upTo(12)) - (upTo(20) == 0 ? 1 : 0);
        fields.tm_mday = static_cast<int>(upTo(32));
        fields.tm_hour = static_cast<int>(upTo(30)) - 3;
        fields.tm_min = static_cast<int>(upTo(70)) - 5;
        fields.tm_sec = static_cast<int>(upTo(UINT_MAX));
        std::string theirs;
        const std::string theirFailure = failureOf([&] {
            greg::date_from_tm(fields);
            theirs = described(posix::ptime_from_tm(fields), formats[0]);
        });
        std::string mineIs;
        const std::string mineFailure =
            failureOf([&] { mineIs = described(ObsoleteTime(&fields), formats[0]); });
        // More than one bad field may be found in another order.
        if (theirFailure == "none" || mineFailure == "none") {
            ASSERT_EQ(mineFailure, theirFailure) << round;
        }
        ASSERT_EQ(mineIs, theirs) << round;
    }
}

TEST_F(TimeDifferential, MovesAndComparesAlike) {
    for (int round = 0; round < 20000; ++round) {
        const greg::date day = anyDate();
        const unsigned int second = upTo(86399);
        const posix::ptime theirs(day, posix::seconds(second));
        ObsoleteTime time(mine(day), 0, 0, second);
        const unsigned int amount = upTo(2) == 0 ? upTo(UINT_MAX) : upTo(200000) - 100000;
        const auto moved = posix::seconds(static_cast<std::int32_t>(amount));
        ASSERT_EQ(described(time + amount, formats[0]), described(theirs + moved, formats[0])) << amount;
        ASSERT_EQ(described(time - amount, formats[0]), described(theirs - moved, formats[0])) << amount;
        ObsoleteTime sum = time + amount;
        ASSERT_EQ(time < sum, theirs < theirs + moved) << amount;
        ASSERT_EQ(time > sum, theirs > theirs + moved) << amount;
        ObsoleteTime back = sum - amount;
        ASSERT_FALSE(back < time || back > time) << amount;
    }
}

} // namespace
} // namespace kvt::test
