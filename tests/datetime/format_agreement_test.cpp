// format() against strftime of the C locale, for every day of the nine thousand years, and against parse(), which has
// to bring back what format() wrote.

#include "pattern_rows.h"

#include "naive_calendar.h"

#include <cstdio>
#include <ctime>
#include <random>
#include <string>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::ustring;

// All flags that both have and mean alike.
constexpr const char* flags = "%Y|%y|%m|%d|%j|%H|%I|%M|%S|%T|%p|%a|%A|%b|%B|%u|%w|%U|%W|%%";

class FormatAgreement : public testing::TestWithParam<int> {};

TEST_P(FormatAgreement, WithStrftimeOnEveryDayOfAThousandYears) {
    const auto format = ustring(flags);
    std::tm fields{};
    char value[32];
    char expected[256];
    std::int64_t days = 0;
    for (int year = GetParam(); year < GetParam() + 1000; ++year) {
        fields.tm_yday = 0;
        for (int month = 1; month <= 12; ++month) {
            for (int day = 1; day <= kvt::test::daysInMonth(year, month); ++day, ++fields.tm_yday, ++days) {
                const auto second = static_cast<int>((days * 7919 + year) % 86400); // all of the day in turn
                fields.tm_year = year - 1900;
                fields.tm_mon = month - 1;
                fields.tm_mday = day;
                fields.tm_wday = static_cast<int>(((kvt::test::naiveDays(year, month, day) + 4) % 7 + 7) % 7);
                fields.tm_hour = second / 3600;
                fields.tm_min = second / 60 % 60;
                fields.tm_sec = second % 60;
                std::snprintf(value, sizeof value, "%04d%02d%02d%02d%02d%02d", year, month, day,
                              fields.tm_hour, fields.tm_min, fields.tm_sec);
                const std::size_t length = std::strftime(expected, sizeof expected, flags, &fields);
                const TextResult result = kvt::ex::datetime::format(kvt::ex::UString<0>(value), format);
                const auto& text = std::get<1>(result);
                ASSERT_EQ(std::string_view(text.rawData(), text.size()), std::string_view(expected, length))
                    << value;
            }
        }
    }
    EXPECT_GE(days, 365242);
    EXPECT_LE(days, 365243);
}

INSTANTIATE_TEST_SUITE_P(From, FormatAgreement, testing::Range(1000, 10000, 1000));

// A canonical value of each kind in turn.
std::string randomValue(std::mt19937_64& random, TemporalType type) {
    const auto below = [&](std::uint64_t bound) { return static_cast<int>(random() % bound); };
    const int year = 1000 + below(9000);
    const int month = 1 + below(12);
    char text[64];
    std::snprintf(text, sizeof text, "%04d%02d%02d", year, month, 1 + below(28));
    const std::string date = text;
    std::snprintf(text, sizeof text, "%02d%02d%02d", below(24), below(60), below(60));
    std::string time = text;
    if (random() % 2 == 0) {
        std::snprintf(text, sizeof text, ".%09d", below(1000000000));
        time += std::string(text).substr(0, 2 + random() % 9);
        time.erase(time.find_last_not_of('0') + 1);
        time.erase(time.find_last_not_of('.') + 1);
    }
    std::snprintf(text, sizeof text, "%c%02d:%02d", random() % 2 == 0 ? '+' : '-', below(24), 1 + below(59));
    const std::string offset = text;
    switch (type) {
    case TemporalType::Date:
        return date;
    case TemporalType::Time:
        return time;
    case TemporalType::TimeWithOffset:
        return time + offset;
    case TemporalType::Datetime:
        return date + time;
    default:
        return date + time + offset;
    }
}

TEST(FormatRoundTrip, ParseBringsBackWhatFormatWrote) {
    const std::vector<const char*> formats[] = {
        {"%Y-%m-%d", "%Y%m%d", "%d %B %Y", "%b %e, %Y", "%Y/%j", "%N/%e/%Y", "ISO", "ZQT"},
        {"%T", "%H:%M:%S", "%H%M%S", "%I:%M:%S %p", "%k:%M:%S", "ISO", "ZQT"},
        {"%T%z", "%T %Ez", "%l:%M:%S %p %z", "ISO", "ZQT"},
        {"%Y-%m-%dT%T", "%Y%m%d%H%M%S", "%d %B %Y at %I:%M:%S %p", "%Y-%j %T", "%Es", "ISO", "ZQT"},
        {"%Y-%m-%dT%T%Ez", "%T %z on %d/%m/%Y", "%Y%m%d%H%M%S%z", "ISO", "ZQT"},
    };
    std::mt19937_64 random(20260130);
    for (int round = 0; round < 20'000; ++round) {
        const std::size_t kind = random() % 5;
        const std::string value = randomValue(random, static_cast<TemporalType>(kind));
        const std::string format = formats[kind][random() % formats[kind].size()];
        const TextResult written = kvt::ex::datetime::format(ustring(value), ustring(format));
        ASSERT_EQ(std::get<0>(written), ReturnState::Success) << value << " as " << format;
        ASSERT_EQ(kvt::test::answerOf(parse(std::get<1>(written), ustring(format), round % 2 == 0)),
                  kvt::test::success(value))
            << kvt::test::textOf(written) << " by " << format;
    }
}

// %s counts from UTC, so that the moment comes back and not the offset.
TEST(FormatRoundTrip, SecondsSince1970BringBackTheMoment) {
    std::mt19937_64 random(20260131);
    for (int round = 0; round < 20'000; ++round) {
        const auto value = ustring(randomValue(random, TemporalType::DatetimeWithOffset));
        const TextResult written = format(value, ustring("%s"));
        const TextResult back = parse(std::get<1>(written), ustring("%s"), false);
        ASSERT_EQ(compare(std::get<1>(back), value), 0) << kvt::test::textOf(written) << " of " << value;
    }
}

} // namespace
