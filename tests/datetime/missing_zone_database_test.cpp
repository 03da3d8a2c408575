// The zone functions where there is no zone database. A program of its own, since a database that has been loaded
// stays.
#include "answer.h"
#include "machine_zone.h"

#include <kvt/datetime/datetime.h>

#include <cstdlib>
#include <filesystem>
#include <unistd.h>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::failure;
using kvt::test::silentFailure;
using kvt::test::success;

Answer zoneError(const std::string& text) {
    return {ReturnState::Error, "", 0.0, 933050, {text}};
}

TEST(MissingZoneDatabase, IsToldByNow) {
    kvt::test::setMachineZone("Europe/Berlin");
    setInstallPathWrapper("/nowhere/zone database");
    for (int i = 0; i < 2; ++i) {
        for (const ZoneMode mode : {ZoneMode::LocalWithOffset, ZoneMode::LocalWithoutOffset}) {
            EXPECT_EQ(answerOf(now(mode)),
                      zoneError("Timezone database not found at \"/nowhere/zone database\""));
        }
    }
}

TEST(MissingZoneDatabase, GoesUnsaidInTimezoneSet) {
    setInstallPathWrapper("/nowhere");
    EXPECT_EQ(answerOf(timezoneSet("20200101120000", "local", SetZoneMode::Automatic)), silentFailure());
    EXPECT_EQ(answerOf(timezoneSet("20200101120000+01:00", "local", SetZoneMode::Convert)), silentFailure());
    EXPECT_EQ(answerOf(timezoneSet("20200101", "local", SetZoneMode::Replace)), silentFailure());
}

TEST(MissingZoneDatabase, DoesNotMatterForTheRest) {
    setInstallPathWrapper("/nowhere");
    EXPECT_EQ(std::get<0>(now(ZoneMode::Utc)), ReturnState::Success);
    EXPECT_EQ(answerOf(now(static_cast<ZoneMode>(3))), (Answer{ReturnState::Error, "", 0.0, 0, {}}));
    EXPECT_EQ(answerOf(timezoneSet("20200101", "utc", SetZoneMode::Automatic)),
              success("20200101000000+00:00"));
    EXPECT_EQ(answerOf(timezoneSet("20200101", "+01", SetZoneMode::Automatic)),
              success("20200101000000+01:00"));
    EXPECT_EQ(answerOf(timezoneSet("120000", "local", SetZoneMode::Automatic)), failure(933096, {"120000"}));
    EXPECT_EQ(answerOf(timezoneSet("20200101", "local", SetZoneMode::Convert)),
              failure(933073, {"20200101"}));
}

TEST(MissingZoneDatabase, IsAFolderWithoutVersionToo) {
    std::string folder = (std::filesystem::temp_directory_path() / "kvt-no-zones-XXXXXX").string();
    ASSERT_NE(::mkdtemp(folder.data()), nullptr);
    setInstallPathWrapper(folder);
    const Answer answer = answerOf(now(ZoneMode::LocalWithOffset));
    std::filesystem::remove(folder);
    EXPECT_EQ(answer, zoneError("Unable to get Timezone database version from " + folder + "/"));
}

// In a process of its own, in which nobody has named a folder.
TEST(MissingZoneDatabaseDeathTest, IsLookedForAmongDownloads) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    EXPECT_EXIT(
        {
            ::setenv("HOME", "/nowhere/home", 1);
            const bool asExpected =
                answerOf(now(ZoneMode::LocalWithOffset)) ==
                zoneError("Timezone database not found at \"/nowhere/home/Downloads/tzdata\"");
            std::exit(asExpected ? 0 : 1);
        },
        testing::ExitedWithCode(0), "");
}

} // namespace
