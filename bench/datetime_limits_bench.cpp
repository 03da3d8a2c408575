// What the date and time functions may cost beside the C library's and Abseil's, each as a ratio with its limit.
//
// The C library's strptime and strftime know no fraction of a second. Beside a value that has one stands what reads or
// writes all of it by that library: strptime, strtod and strptime again for the offset, then timegm; strftime and
// snprintf. What strptime alone takes for the part that it knows is shown without a limit. Adding a month stands beside
// Abseil's way from text to text: ParseTime, the civil calendar, FormatTime.
#include "limits.h"

#include <kvt/datetime/datetime.h>

#include <absl/time/civil_time.h>
#include <absl/time/time.h>

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <map>
#include <string>

namespace {

using namespace kvt::ex::datetime;
using kvt::bench::Bound;
using kvt::bench::Row;
using kvt::bench::way;
using kvt::bench::Way;
using kvt::ex::UString;

constexpr int rounds = 101;
constexpr int callsInRound = 2'000;

Way parsing(const char* value, const char* format) {
    return way(
        [value = UString<0>(value), format = UString<0>(format)] { return parse(value, format, false); });
}

Way formatting(const char* value, const char* pattern) {
    return way([value = UString<0>(value), pattern = UString<0>(pattern)] { return format(value, pattern); });
}

Way strptimeWay(const char* value, const char* pattern) {
    return way([value, pattern] {
        std::tm time{};
        benchmark::DoNotOptimize(value);
        benchmark::DoNotOptimize(pattern);
        return ::strptime(value, pattern, &time) != nullptr ? time.tm_mday : 0;
    });
}

// All of a value with fraction and offset.
Way strptimeOffsetWay() {
    return way([] {
        std::tm time{};
        const char* value = "2020-01-02T03:04:05.123456789+01:00";
        benchmark::DoNotOptimize(value);
        char* rest = ::strptime(value, "%Y-%m-%dT%H:%M:%S", &time);
        const double fraction = std::strtod(rest, &rest);
        rest = ::strptime(rest, "%z", &time);
        const long offset = time.tm_gmtoff;
        return static_cast<double>(::timegm(&time) - offset) + fraction;
    });
}

std::tm someTime() {
    std::tm time{};
    time.tm_year = 2020 - 1900;
    time.tm_mday = 2;
    time.tm_hour = 3;
    time.tm_min = 4;
    time.tm_sec = 5;
    return time;
}

Way strftimeWay(const char* pattern) {
    return way([time = someTime(), pattern] {
        char text[64];
        benchmark::DoNotOptimize(pattern);
        return std::string(text, std::strftime(text, sizeof text, pattern, &time));
    });
}

// All of a value with fraction and offset.
Way strftimeOffsetWay() {
    return way([time = someTime()] {
        char text[64];
        long nanoseconds = 123456789;
        benchmark::DoNotOptimize(nanoseconds);
        std::size_t size = std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S", &time);
        size +=
            static_cast<std::size_t>(std::snprintf(text + size, sizeof text - size, ".%09ld", nanoseconds));
        size += std::strftime(text + size, sizeof text - size, "%z", &time);
        return std::string(text, size);
    });
}

Way adding(const char* value, const char* interval) {
    return way([value = UString<0>(value), interval = UString<0>(interval)] { return add(value, interval); });
}

// The same day of the next month or, where that is too short, its last one.
absl::CivilDay monthLater(absl::CivilDay day) {
    const absl::CivilMonth next = absl::CivilMonth(day) + 1;
    const absl::CivilDay last = absl::CivilDay(next + 1) - 1;
    return absl::CivilDay(next.year(), next.month(), std::min(day.day(), last.day()));
}

// A month later, from text to text, by Abseil.
Way abslMonthWay(const char* value, const char* pattern, absl::TimeZone zone) {
    return way([value = std::string(value), pattern = std::string(pattern), zone] {
        absl::Time time;
        std::string error;
        if (!absl::ParseTime(pattern, value, &time, &error)) {
            std::abort();
        }
        const absl::CivilSecond clock = absl::ToCivilSecond(time, zone);
        const absl::Duration fraction = time - absl::FromCivil(clock, zone);
        const absl::CivilDay day = monthLater(absl::CivilDay(clock));
        const absl::CivilSecond later(day.year(), day.month(), day.day(), clock.hour(), clock.minute(),
                                      clock.second());
        return absl::FormatTime(pattern, absl::FromCivil(later, zone) + fraction, zone);
    });
}

const std::map<std::string, Way>& ways() {
    static const std::map<std::string, Way> all = {
        {"parse date", parsing("2020-01-02", "%Y-%m-%d")},
        {"parse offset", parsing("2020-01-02T03:04:05.123456789+01:00", "%Y-%m-%dT%H:%M:%S%Ez")},
        {"parse ISO", parsing("2020-01-02T03:04:05.123456789+01:00", "ISO")},
        {"parse name", parsing("02/Jan/2020 13:14:15", "%d/%b/%Y %H:%M:%S")},
        {"parse date fails", parsing("2020-01-x2", "%Y-%m-%d")},
        {"parse offset fails", parsing("2020-01-02T03:04:05.123456789*01:00", "%Y-%m-%dT%H:%M:%S%Ez")},
        {"parse name fails", parsing("02/Jan/2020 13:14:x5", "%d/%b/%Y %H:%M:%S")},
        {"format date", formatting("20200102", "%Y-%m-%d")},
        {"format offset", formatting("20200102030405.123456789+01:00", "%Y-%m-%dT%H:%M:%S%Ez")},
        {"format name", formatting("20200102131415", "%d/%b/%Y %H:%M:%S")},
        {"strptime and timegm date", way([] {
             std::tm time{};
             const char* value = "2020-01-02";
             const char* pattern = "%Y-%m-%d";
             benchmark::DoNotOptimize(value);
             benchmark::DoNotOptimize(pattern);
             return ::strptime(value, pattern, &time) != nullptr ? ::timegm(&time) : 0;
         })},
        {"strptime offset", strptimeOffsetWay()},
        {"strptime datetime", strptimeWay("2020-01-02T03:04:05", "%Y-%m-%dT%H:%M:%S")},
        {"strptime name", strptimeWay("02/Jan/2020 13:14:15", "%d/%b/%Y %H:%M:%S")},
        {"strftime date", strftimeWay("%Y-%m-%d")},
        {"strftime offset", strftimeOffsetWay()},
        {"strftime datetime", strftimeWay("%Y-%m-%dT%H:%M:%S")},
        {"strftime name", strftimeWay("%d/%b/%Y %H:%M:%S")},
        {"add date", adding("20200131", "P1M")},
        {"add offset", adding("20200131123456.5+01:00", "P1M")},
        {"Abseil date", abslMonthWay("2020-01-31", "%Y-%m-%d", absl::UTCTimeZone())},
        {"Abseil offset",
         abslMonthWay("2020-01-31T12:34:56.5+01:00", absl::RFC3339_full, absl::FixedTimeZone(3600))},
        {"cast offset", way([value = UString<0>("20200131123456.5+01:00")] {
             return cast(value, CastToTemporalType::Datetime);
         })},
        {"diff offset", way([first = UString<0>("20200131123456.5+01:00"),
                             second = UString<0>("19991231235959.5+05:30")] { return diff(first, second); })},
        {"compare offset",
         way([first = UString<0>("20200131123456.5+01:00"), second = UString<0>("19991231235959.5+05:30")] {
             return compare(first, second);
         })},
    };
    return all;
}

const Row rows[] = {
    {"parse date", "strptime and timegm date", Bound::atMost, 0.6},
    {"parse offset", "strptime offset", Bound::atMost, 0.6},
    {"parse offset", "strptime datetime"},
    {"parse ISO", "parse offset", Bound::atMost, 1.7},
    {"parse name", "strptime name", Bound::atMost, 0.15},
    {"parse date fails", "parse date", Bound::atMost, 1.5},
    {"parse offset fails", "parse offset", Bound::atMost, 1.5},
    {"parse name fails", "parse name", Bound::atMost, 1.5},
    {"format date", "strftime date", Bound::atMost, 1.0},
    {"format offset", "strftime offset", Bound::atMost, 0.65},
    {"format offset", "strftime datetime"},
    {"format name", "strftime name", Bound::atMost, 1.0},
    {"add date", "Abseil date", Bound::atMost, 0.12},
    {"add offset", "Abseil offset", Bound::atMost, 0.12},
    {"cast offset", "parse date", Bound::atMost, 1.2},
    {"diff offset", "parse date", Bound::atMost, 2.5},
    {"compare offset", "parse date", Bound::atMost, 1.5},
};

} // namespace

int main(int argc, char** argv) {
    kvt::bench::Limits limits(rounds, callsInRound);
    for (const auto& [name, measured] : ways()) {
        limits.add(name, measured);
    }
    for (const Row& row : rows) {
        limits.hold(row);
    }
    return limits.run(argc, argv);
}
