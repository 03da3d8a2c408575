// now, timezoneGet, timezoneSet and timezoneRemove, with a zone database at hand. What they do without one stands in
// missing_zone_database_test.cpp.
#include "answer.h"
#include "machine_zone.h"
#include "zone_folder.h"

#include <kvt/datetime/datetime.h>

#include <algorithm>
#include <chrono>
#include <ratio>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::failure;
using kvt::test::outOfRange;
using kvt::test::setMachineZone;
using kvt::test::setMachineZonePath;
using kvt::test::silentFailure;
using kvt::test::success;

constexpr auto automatic = SetZoneMode::Automatic;
constexpr auto replace = SetZoneMode::Replace;
constexpr auto convert = SetZoneMode::Convert;

class WithZones : public testing::Test {
public:
    static void SetUpTestSuite() {
        static const kvt::test::ZoneFolder folder(kvt::test::databaseOfTheSystem());
        setInstallPathWrapper(folder.path());
    }
    void SetUp() override { setMachineZone("Europe/Berlin"); }
};

using Now = WithZones;
using LocalZone = WithZones;

// ---- timezoneGet

TEST(TimezoneGet, GivesTheOffsetAsTextOrNumber) {
    const struct {
        int line;
        const char* value;
        const char* text;
        const char* minutes;
        const char* seconds;
    } rows[] = {
        {__LINE__, "120000+01:00", "+01:00", "60", "3600"},
        {__LINE__, "20200101120000-03:30", "-03:30", "-210", "-12600"},
        {__LINE__, " 20200101120000.5-0330\t", "-03:30", "-210", "-12600"},
        {__LINE__, "120000-05", "-05:00", "-300", "-18000"},
        {__LINE__, "120000-00:30", "-00:30", "-30", "-1800"},
        {__LINE__, "120000+00:00", "+00:00", "0", "0"},
        {__LINE__, "120000-00:00", "-00:00", "0", "0"},
        {__LINE__, "120000+1075", "+10:75", "675", "40500"},
        {__LINE__, "120000-99:59", "-99:59", "-5999", "-359940"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        EXPECT_EQ(answerOf(timezoneGet(row.value, UTCOffsetType::OffsetText)), success(row.text));
        EXPECT_EQ(answerOf(timezoneGet(row.value, UTCOffsetType::OffsetInMinutes)), success(row.minutes));
        EXPECT_EQ(answerOf(timezoneGet(row.value, UTCOffsetType::OffsetInSeconds)), success(row.seconds));
        EXPECT_EQ(answerOf(timezoneGet(row.value, static_cast<UTCOffsetType>(3))), silentFailure());
    }
}

TEST(TimezoneGet, LooksAtTheValueBeforeTheType) {
    for (const char* value :
         {"20200101", "120000", "20200101120000.5", "", "abc", "20200101+01:00", "120000+1"}) {
        SCOPED_TRACE(value);
        for (const unsigned type : {0U, 1U, 2U, 3U, 99U}) {
            EXPECT_EQ(answerOf(timezoneGet(value, static_cast<UTCOffsetType>(type))),
                      failure(933071, {value}));
        }
    }
}

TEST(TimezoneGet, SaysWhichPartIsOutOfRange) {
    EXPECT_EQ(answerOf(timezoneGet("240000+01:00", UTCOffsetType::OffsetText)),
              outOfRange("24", "hours", "0", "23"));
    EXPECT_EQ(answerOf(timezoneGet("20210229", static_cast<UTCOffsetType>(3))),
              outOfRange("29", "day", "1", "28"));
}

// ---- timezoneRemove

TEST(TimezoneRemove, LeavesTheWallClock) {
    const struct {
        int line;
        const char* value;
        const char* result;
    } rows[] = {
        {__LINE__, "120000+01:00", "120000"},
        {__LINE__, " 120000.500-05 ", "120000.5"},
        {__LINE__, "20200101233000-12:00", "20200101233000"},
        {__LINE__, "20200101233000.123456789+10:75", "20200101233000.123456789"},
        // What has none comes back as it was given, blanks and zeros included.
        {__LINE__, "20200101", "20200101"},
        {__LINE__, " 20200101\t", " 20200101\t"},
        {__LINE__, "120000.500", "120000.500"},
        {__LINE__, "\n20200101120000.0", "\n20200101120000.0"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        EXPECT_EQ(answerOf(timezoneRemove(row.value)), success(row.result));
    }
}

TEST(TimezoneRemove, RefusesWhatIsNoValue) {
    for (const char* value : {"", "abc", "20200101+01:00", "2020-01-01", " +01:00"}) {
        EXPECT_EQ(answerOf(timezoneRemove(value)), failure(933063, {value})) << value;
    }
    EXPECT_EQ(answerOf(timezoneRemove("126000+01:00")), outOfRange("60", "minutes", "0", "59"));
    EXPECT_EQ(answerOf(timezoneRemove("00000101")), outOfRange("0", "year", "1000", "9999"));
}

// ---- timezoneSet

TEST(TimezoneSet, AttachesOrConverts) {
    const struct {
        int line;
        const char* value;
        const char* zone;
        SetZoneMode mode;
        const char* result;
    } rows[] = {
        {__LINE__, "20200101120000", "+02:00", automatic, "20200101120000+02:00"},
        {__LINE__, "20200101120000", "+02:00", replace, "20200101120000+02:00"},
        {__LINE__, "20200101120000+00:00", "+02:00", automatic, "20200101140000+02:00"},
        {__LINE__, "20200101120000+00:00", "+02:00", replace, "20200101120000+02:00"},
        {__LINE__, "20200101120000+00:00", "+02:00", convert, "20200101140000+02:00"},
        {__LINE__, "20200101120000.250+01:00", "-0330", convert, "20200101073000.25-03:30"},
        {__LINE__, "20191231233000-01:00", "utc", convert, "20200101003000+00:00"},
        // A date gets a time, as midnight.
        {__LINE__, "20200101", "+02", automatic, "20200101000000+02:00"},
        {__LINE__, " 20200101 ", "utc", replace, "20200101000000+00:00"},
        // A time stays one, and wraps.
        {__LINE__, "120000", "+02", automatic, "120000+02:00"},
        {__LINE__, "120000.5", "utc", replace, "120000.5+00:00"},
        {__LINE__, "233000+00:00", "+01:00", automatic, "003000+01:00"},
        {__LINE__, "003000+01:00", "utc", convert, "233000+00:00"},
        {__LINE__, "003000+01:00", "-12", replace, "003000-12:00"},
        // Keywords and offsets with blanks around them, keywords in any case.
        {__LINE__, "20200101120000", "UTC", automatic, "20200101120000+00:00"},
        {__LINE__, "20200101120000", " \tuTc\r\n\f\v", automatic, "20200101120000+00:00"},
        {__LINE__, "20200101120000", "\v+0100 ", automatic, "20200101120000+01:00"},
        // The offset is written from its minutes.
        {__LINE__, "20200101120000", "+1075", automatic, "20200101120000+11:15"},
        {__LINE__, "20200101120000", "-00:00", automatic, "20200101120000+00:00"},
        // What is not an offset takes it away, after the way to UTC where there was one.
        {__LINE__, "20200101120000", "Europe/Berlin", automatic, "20200101120000"},
        {__LINE__, "20200101120000+01:00", "+1", replace, "20200101120000"},
        {__LINE__, "20200101120000+01:00", "+1", convert, "20200101110000"},
        {__LINE__, "120000+01:00", "u t c", automatic, "110000"},
        // Nothing holds the result against the years of a value.
        {__LINE__, "99991231233000+00:00", "+01:00", convert, "100000101003000+01:00"},
        {__LINE__, "10000101000000+00:00", "-01:00", automatic, "09991231230000-01:00"},
        // A mode that is none goes to UTC and not on from there.
        {__LINE__, "20200101120000+01:00", "+02:00", static_cast<SetZoneMode>(3), "20200101110000+02:00"},
        {__LINE__, "20200101120000", "+02:00", static_cast<SetZoneMode>(3), "20200101120000+02:00"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        EXPECT_EQ(answerOf(timezoneSet(row.value, row.zone, row.mode)), success(row.result));
    }
}

TEST(TimezoneSet, ChecksInAFixedOrder) {
    const struct {
        int line;
        const char* value;
        const char* zone;
        SetZoneMode mode;
        Answer answer;
    } rows[] = {
        // Each row fails by its own check and by all that come later.
        {__LINE__, "246000", "", convert, outOfRange("24", "hours", "0", "23")},
        {__LINE__, "20201301", "", convert, outOfRange("13", "month", "1", "12")},
        {__LINE__, "abc", "", convert, failure(933063, {"abc"})},
        {__LINE__, "", " ", automatic, failure(933063, {""})},
        {__LINE__, "120000", "local", convert, failure(933096, {"120000"})},
        {__LINE__, " 120000+01:00", " LoCaL\n", replace, failure(933096, {" 120000+01:00"})},
        {__LINE__, "120000", "local", automatic, failure(933096, {"120000"})},
        {__LINE__, "120000", "", convert, failure(933073, {"120000"})},
        {__LINE__, "20200101", " ", convert, failure(933073, {"20200101"})},
        {__LINE__, "20200101 ", "local", convert, failure(933073, {"20200101 "})},
        {__LINE__, "20200101120000", "", automatic, failure(933092)},
        {__LINE__, "20200101120000+01:00", " \t\r\n\f\v", convert, failure(933092)},
        {__LINE__, "120000", "", replace, failure(933092)},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        EXPECT_EQ(answerOf(timezoneSet(row.value, row.zone, row.mode)), row.answer);
    }
}

TEST_F(LocalZone, IsFoundForTheMomentOfTheValue) {
    const struct {
        int line;
        const char* zone;
        const char* value;
        SetZoneMode mode;
        const char* result;
    } rows[] = {
        {__LINE__, "Europe/Berlin", "20200101120000", automatic, "20200101120000+01:00"},
        {__LINE__, "Europe/Berlin", "20200701120000", replace, "20200701120000+02:00"},
        {__LINE__, "Europe/Berlin", "20200701", automatic, "20200701000000+02:00"},
        {__LINE__, "Europe/Berlin", "20200701120000-05:00", replace, "20200701120000+02:00"},
        {__LINE__, "Europe/Berlin", "20200701120000+00:00", convert, "20200701140000+02:00"},
        {__LINE__, "Europe/Berlin", "20200701120000.125+00:00", automatic, "20200701140000.125+02:00"},
        {__LINE__, "Europe/Berlin", "20191231233000+00:00", automatic, "20200101003000+01:00"},
        {__LINE__, "America/St_Johns", "20200101120000+00:00", convert, "20200101083000-03:30"},
        {__LINE__, "Asia/Kathmandu", "20200101", automatic, "20200101000000+05:45"},
        {__LINE__, "Etc/UTC", "20200701120000", automatic, "20200701120000+00:00"},
        // By the name of a link.
        {__LINE__, "Japan", "20200701120000", automatic, "20200701120000+09:00"},
        // Seconds of an offset are cut off, on either side of zero.
        {__LINE__, "Europe/Berlin", "18000101120000", automatic, "18000101120000+00:53"},    // +00:53:28
        {__LINE__, "America/New_York", "18000101120000", automatic, "18000101120000-04:56"}, // -04:56:02
        {__LINE__, "Europe/Berlin", "10000101000000+00:00", convert, "10000101005300+00:53"},
        {__LINE__, "Europe/Berlin", "99990701120000", automatic, "99990701120000+02:00"},
        // Both ends of the hours that are skipped and repeated.
        {__LINE__, "Europe/Berlin", "20200329015959.999999999", automatic, "20200329015959.999999999+01:00"},
        {__LINE__, "Europe/Berlin", "20200329030000", automatic, "20200329030000+02:00"},
        {__LINE__, "Europe/Berlin", "20201025015959.999999999", automatic, "20201025015959.999999999+02:00"},
        {__LINE__, "Europe/Berlin", "20201025030000", automatic, "20201025030000+01:00"},
        // From UTC there is neither gap nor overlap.
        {__LINE__, "Europe/Berlin", "20200329005959.5+00:00", convert, "20200329015959.5+01:00"},
        {__LINE__, "Europe/Berlin", "20200329010000+00:00", convert, "20200329030000+02:00"},
        {__LINE__, "Europe/Berlin", "20201025003000+00:00", convert, "20201025023000+02:00"},
        {__LINE__, "Europe/Berlin", "20201025013000+00:00", automatic, "20201025023000+01:00"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        setMachineZone(row.zone);
        EXPECT_EQ(answerOf(timezoneSet(row.value, "local", row.mode)), success(row.result));
        EXPECT_EQ(answerOf(timezoneSet(row.value, "\tLOCAL ", row.mode)), success(row.result));
    }
}

TEST_F(LocalZone, HasNoOffsetForAWallClockThatIsSkippedOrRepeated) {
    const struct {
        int line;
        const char* zone;
        const char* value;
        SetZoneMode mode;
        std::uint32_t message;
        const char* parameter;
    } rows[] = {
        {__LINE__, "Europe/Berlin", "20200329020000", automatic, 933094, "20200329020000"},
        {__LINE__, "Europe/Berlin", "20200329023000.5", replace, 933094, "20200329023000.5"},
        {__LINE__, "Europe/Berlin", "20200329025959.999999999", replace, 933094, "20200329025959.999999999"},
        {__LINE__, "Europe/Berlin", "20200329023000.50+05", replace, 933094, "20200329023000.5"},
        {__LINE__, "America/Sao_Paulo", "20181104", automatic, 933094, "20181104"},
        {__LINE__, "Europe/Berlin", "20201025020000", automatic, 933095, "20201025020000"},
        {__LINE__, "Europe/Berlin", "20201025025959.999999999", replace, 933095, "20201025025959.999999999"},
        {__LINE__, "Europe/Berlin", "20201025023000-11:30", replace, 933095, "20201025023000"},
        {__LINE__, "America/Havana", "20201101", automatic, 933095, "20201101"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        setMachineZone(row.zone);
        EXPECT_EQ(answerOf(timezoneSet(row.value, "local", row.mode)), failure(row.message, {row.parameter}));
    }
}

TEST_F(LocalZone, IsAskedForEachTimeAnew) {
    setMachineZone("Asia/Tokyo");
    EXPECT_EQ(answerOf(timezoneSet("20200101", "local", automatic)), success("20200101000000+09:00"));
    setMachineZone("America/Denver");
    EXPECT_EQ(answerOf(timezoneSet("20200101", "local", automatic)), success("20200101000000-07:00"));
}

TEST_F(LocalZone, ThatIsNotFoundIsToldByNowAlone) {
    const struct {
        const char* path;
        const char* text;
    } rows[] = {
        {"/usr/share/zoneinfo/Nowhere/Land", "Nowhere/Land not found in timezone database"},
        {"/srv/clock", "current_zone() failed to find \"zoneinfo\" in /srv/clock"},
        {"/nowhere", "realpath() failed: No such file or directory"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.path);
        setMachineZonePath(row.path);
        const Answer error = {ReturnState::Error, "", 0.0, 933050, {row.text}};
        EXPECT_EQ(answerOf(now(ZoneMode::LocalWithOffset)), error);
        EXPECT_EQ(answerOf(now(ZoneMode::LocalWithoutOffset)), error);
        EXPECT_EQ(std::get<0>(now(ZoneMode::Utc)), ReturnState::Success);
        EXPECT_EQ(answerOf(timezoneSet("20200101", "local", automatic)), silentFailure());
        EXPECT_EQ(answerOf(timezoneSet("20200101120000+01:00", "local", convert)), silentFailure());
    }
}

// ---- now

using Ticks = std::chrono::duration<std::int64_t, std::ratio<1, 10'000'000>>;

Ticks clock() {
    return std::chrono::floor<Ticks>(std::chrono::system_clock::now().time_since_epoch());
}

// A wall clock, "20200102030405.25", as time since 1970; its fraction has no more digits than the clock.
Ticks wallClock(const std::string& text) {
    using namespace std::chrono;
    EXPECT_TRUE(text.size() == 14 || (text.size() >= 16 && text.size() <= 22 && text[14] == '.')) << text;
    const auto number = [&](std::size_t at, std::size_t length) {
        return std::stoi(text.substr(at, length));
    };
    const sys_days day = year(number(0, 4)) / number(4, 2) / number(6, 2);
    std::string fraction = text.size() > 15 ? text.substr(15) : "";
    fraction.resize(7, '0');
    return day.time_since_epoch() + hours(number(8, 2)) + minutes(number(10, 2)) + seconds(number(12, 2)) +
           Ticks(std::stoll(fraction));
}

// Calls now() and holds it against the clock; the result, without the wall clock in front.
std::string restOfNow(ZoneMode mode, std::chrono::minutes offset) {
    const Ticks before = clock();
    const Answer answer = answerOf(now(mode));
    const Ticks after = clock();
    EXPECT_EQ(answer, success(answer.text));
    const std::size_t end = std::min(answer.text.find_first_of("+-"), answer.text.size());
    const Ticks moment = wallClock(answer.text.substr(0, end)) - offset;
    EXPECT_LE(before.count(), moment.count()) << answer.text;
    EXPECT_LE(moment.count(), after.count()) << answer.text;
    return answer.text.substr(end);
}

TEST_F(Now, IsThePresentMoment) {
    using std::chrono::minutes;
    for (int i = 0; i < 1000; ++i) {
        EXPECT_EQ(restOfNow(ZoneMode::Utc, minutes(0)), "+00:00");
    }
    setMachineZone("Asia/Kathmandu"); // no summer time
    EXPECT_EQ(restOfNow(ZoneMode::LocalWithOffset, minutes(345)), "+05:45");
    EXPECT_EQ(restOfNow(ZoneMode::LocalWithoutOffset, minutes(345)), "");
    setMachineZone("Pacific/Marquesas");
    EXPECT_EQ(restOfNow(ZoneMode::LocalWithOffset, minutes(-570)), "-09:30");
    EXPECT_EQ(restOfNow(ZoneMode::LocalWithoutOffset, minutes(-570)), "");
    EXPECT_EQ(restOfNow(ZoneMode::Utc, minutes(0)), "+00:00");
}

TEST_F(Now, SeesTheClockMove) {
    const Answer first = answerOf(now(ZoneMode::Utc));
    Answer second = first;
    for (int i = 0; i < 1'000'000 && second == first; ++i) {
        second = answerOf(now(ZoneMode::Utc));
    }
    EXPECT_NE(first, second);
}

TEST_F(Now, RefusesAnUnknownModeWithoutAMessage) {
    for (const unsigned mode : {3U, 4U, 0xFFFF'FFFFU}) {
        EXPECT_EQ(answerOf(now(static_cast<ZoneMode>(mode))), (Answer{ReturnState::Error, "", 0.0, 0, {}}));
    }
}

} // namespace
