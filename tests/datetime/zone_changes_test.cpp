// "local" on both sides of a change of the clock, for every function that knows it: timezoneSet(), from values with
// all kinds of offsets and from wall clocks, and now(), whose clock is steered. What is right is found from the moment
// of the change and the two offsets around it, without a zone database.
#include "answer.h"
#include "machine_zone.h"
#include "naive_calendar.h"
#include "zone_folder.h"

#include <kvt/datetime/datetime.h>

#include <cerrno>
#include <cstdint>
#include <ctime>
#include <dlfcn.h>
#include <ostream>
#include <string>
#include <vector>

namespace {

/// What the clock says instead of the present moment, in nanoseconds since 1970; 0 for no steering.
std::int64_t steeredClock = 0;

} // namespace

// Stands before that of the C library, for every part of the program.
extern "C" int clock_gettime(clockid_t clock, timespec* time) noexcept {
    using ClockGettime = int (*)(clockid_t, timespec*);
    static const auto real = reinterpret_cast<ClockGettime>(::dlsym(RTLD_NEXT, "clock_gettime"));
    if (clock != CLOCK_REALTIME || steeredClock == 0) {
        return real(clock, time);
    }
    time->tv_sec = steeredClock / 1'000'000'000;
    time->tv_nsec = steeredClock % 1'000'000'000;
    return 0;
}

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::failure;
using kvt::test::Int128;
using kvt::test::NaiveDateTime;
using kvt::test::success;

constexpr Int128 second = 1'000'000'000;
constexpr Int128 minute = 60 * second;

struct Change {
    int line;
    const char* zone;
    NaiveDateTime moment; ///< in UTC
    int before;           ///< the offset up to then, in minutes
    int after;

    friend std::ostream& operator<<(std::ostream& stream, const Change& change) {
        return stream << change.zone;
    }
};

const Change changes[] = {
    {__LINE__, "Europe/Berlin", {2020, 3, 29, 1}, 60, 120},
    {__LINE__, "Europe/Berlin", {2020, 10, 25, 1}, 120, 60},
    {__LINE__, "America/New_York", {2020, 3, 8, 7}, -300, -240},
    {__LINE__, "America/New_York", {2020, 11, 1, 6}, -240, -300},
    {__LINE__, "Australia/Lord_Howe", {2020, 4, 4, 15}, 660, 630}, // half an hour
    {__LINE__, "Australia/Lord_Howe", {2020, 10, 3, 15, 30}, 630, 660},
    {__LINE__, "Asia/Kathmandu", {1985, 12, 31, 18, 30}, 330, 345}, // a new standard time, and a new year
    {__LINE__, "Pacific/Apia", {2011, 12, 30, 10}, -600, 840},      // over the date line, a day is skipped
};

std::string offsetText(int minutes) {
    const int magnitude = minutes < 0 ? -minutes : minutes;
    char text[32];
    std::snprintf(text, sizeof text, "%c%02d:%02d", minutes < 0 ? '-' : '+', magnitude / 60, magnitude % 60);
    return text;
}

std::string wallClock(Int128 nanoseconds) {
    return kvt::test::naiveText(kvt::test::naiveDateTime(nanoseconds));
}

/// The moment as a value with this offset.
std::string textAt(Int128 moment, int offset) {
    return wallClock(moment + offset * minute) + offsetText(offset);
}

/// Distances from a change at which an offset that is taken twice, or not at all, leads to the other side.
std::vector<Int128> distances() {
    std::vector<Int128> all = {-1, 0, 1, -second, second};
    for (const int minutes : {1, 29, 30, 31, 59, 60, 61, 119, 120, 121, 300, 690, 1439, 1440, 1441}) {
        all.insert(all.end(), {-minutes * minute, minutes * minute - 1, minutes * minute});
    }
    return all;
}

class ZoneChanges : public testing::TestWithParam<Change> {
public:
    static void SetUpTestSuite() {
        static const kvt::test::ZoneFolder folder(kvt::test::databaseOfTheSystem());
        setInstallPathWrapper(folder.path());
    }
    void SetUp() override { kvt::test::setMachineZone(change().zone); }
    void TearDown() override { steeredClock = 0; }

    static const Change& change() { return GetParam(); }
    static Int128 momentOfChange() { return kvt::test::naiveNanoseconds(change().moment); }
    static int offsetAt(Int128 moment) {
        return moment < momentOfChange() ? change().before : change().after;
    }
};

TEST_P(ZoneChanges, ConvertFromEveryOffset) {
    for (const Int128 distance : distances()) {
        const Int128 moment = momentOfChange() + distance;
        const Answer expected = success(textAt(moment, offsetAt(moment)));
        for (const int offset : {0, 60, 120, -60, -300, 330, 345, 660, -690, 840, 5'999, -5'999}) {
            const std::string value = textAt(moment, offset);
            for (const SetZoneMode mode : {SetZoneMode::Convert, SetZoneMode::Automatic}) {
                ASSERT_EQ(answerOf(timezoneSet(value.c_str(), "local", mode)), expected)
                    << value << " in row " << change().line;
            }
        }
    }
}

// A wall clock that is shown once has the offset at that moment; the others have none.
TEST_P(ZoneChanges, ReplaceOnEveryWallClock) {
    for (const int near : {change().before, change().after}) {
        for (const Int128 distance : distances()) {
            const Int128 wall = momentOfChange() + near * minute + distance;
            const bool isBefore = wall - change().before * minute < momentOfChange();
            const bool isAfter = wall - change().after * minute >= momentOfChange();
            const std::string text = wallClock(wall);
            const Answer expected =
                isBefore && isAfter ? failure(933095, {text})
                : isBefore || isAfter
                    ? success(text + offsetText(isBefore ? change().before : change().after))
                    : failure(933094, {text});
            for (const SetZoneMode mode : {SetZoneMode::Replace, SetZoneMode::Automatic}) {
                ASSERT_EQ(answerOf(timezoneSet(text.c_str(), "LOCAL", mode)), expected)
                    << text << " in row " << change().line;
            }
            for (const int offset : {0, 60, -690}) {
                const std::string value = text + offsetText(offset);
                ASSERT_EQ(answerOf(timezoneSet(value.c_str(), "local", SetZoneMode::Replace)), expected)
                    << value << " in row " << change().line;
            }
        }
    }
}

TEST_P(ZoneChanges, NowOnBothSides) {
    for (const Int128 distance : distances()) {
        // The clock is read in ticks of 100 nanoseconds.
        const Int128 moment = (momentOfChange() + distance) / 100 * 100;
        steeredClock = static_cast<std::int64_t>(moment);
        const Int128 local = moment + offsetAt(moment) * minute;
        ASSERT_EQ(answerOf(now(ZoneMode::LocalWithOffset)), success(textAt(moment, offsetAt(moment))));
        ASSERT_EQ(answerOf(now(ZoneMode::LocalWithoutOffset)), success(wallClock(local)));
        ASSERT_EQ(answerOf(now(ZoneMode::Utc)), success(textAt(moment, 0)));
    }
}

INSTANTIATE_TEST_SUITE_P(Rows, ZoneChanges, testing::ValuesIn(changes),
                         [](const auto& row) { return "Line" + std::to_string(row.param.line); });

} // namespace
