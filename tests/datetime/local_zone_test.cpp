// The step below the zone functions, and what it throws.
#include "machine_zone.h"
#include "zone_folder.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/local_zone.h>

#include <date/tz.h>

#include <gtest/gtest.h>

#include <thread>
#include <vector>

namespace {

using namespace kvt::ex::datetime::detail;

class LocalOffset : public testing::Test {
public:
    static void SetUpTestSuite() {
        static const kvt::test::ZoneFolder folder(kvt::test::databaseOfTheSystem());
        kvt::ex::datetime::setInstallPathWrapper(folder.path());
    }
    void SetUp() override { kvt::test::setMachineZone("Europe/Berlin"); }
};

TimeCount at(std::int64_t year, unsigned month, unsigned day, std::int64_t hour = 0,
             std::int64_t minute = 0) {
    return timeCount(daysFromCivil(year, month, day), (hour * 60 + minute) * nanosPerMinute);
}

// The nanosecond before.
TimeCount before(const TimeCount& count) {
    return timeCount(count.days, count.nanoseconds - 1);
}

TEST_F(LocalOffset, OfAnInstantWithOffsetIsThatOfTheMoment) {
    EXPECT_EQ(localOffsetMinutes({at(2020, 7, 1), 0}), 120);
    EXPECT_EQ(localOffsetMinutes({at(2020, 1, 1), 0}), 60);
    // 2020-03-29T01:00Z, by three wall clocks, and the nanosecond before.
    EXPECT_EQ(localOffsetMinutes({at(2020, 3, 29, 1), 0}), 120);
    EXPECT_EQ(localOffsetMinutes({at(2020, 3, 29, 2), 60}), 120);
    EXPECT_EQ(localOffsetMinutes({at(2020, 3, 28, 13, 30), -690}), 120);
    EXPECT_EQ(localOffsetMinutes({before(at(2020, 3, 29, 1)), 0}), 60);
    EXPECT_EQ(localOffsetMinutes({before(at(2020, 3, 29, 2)), 60}), 60);
    EXPECT_EQ(localOffsetMinutes({before(at(2020, 3, 28, 13, 30)), -690}), 60);
}

TEST_F(LocalOffset, OfAnInstantWithoutIsThatOfTheWallClock) {
    EXPECT_EQ(localOffsetMinutes({before(at(2020, 3, 29, 2)), {}}), 60);
    EXPECT_EQ(localOffsetMinutes({at(2020, 3, 29, 3), {}}), 120);
    EXPECT_EQ(localOffsetMinutes({before(at(2020, 10, 25, 2)), {}}), 120);
    EXPECT_EQ(localOffsetMinutes({at(2020, 10, 25, 3), {}}), 60);
}

TEST_F(LocalOffset, IsNotGuessedInGapAndOverlap) {
    EXPECT_THROW(localOffsetMinutes({at(2020, 3, 29, 2), {}}), date::nonexistent_local_time);
    EXPECT_THROW(localOffsetMinutes({before(at(2020, 3, 29, 3)), {}}), date::nonexistent_local_time);
    EXPECT_THROW(localOffsetMinutes({at(2020, 10, 25, 2), {}}), date::ambiguous_local_time);
    EXPECT_THROW(localOffsetMinutes({before(at(2020, 10, 25, 3)), {}}), date::ambiguous_local_time);
}

TEST_F(LocalOffset, IsCutTowardsZero) {
    kvt::test::setMachineZone("America/New_York"); // -04:56:02 before there was standard time
    EXPECT_EQ(localOffsetMinutes({at(1800, 1, 1), 0}), -296);
    kvt::test::setMachineZone("Europe/Berlin"); // +00:53:28
    EXPECT_EQ(localOffsetMinutes({at(1800, 1, 1), 0}), 53);
    kvt::test::setMachineZone("Africa/Monrovia"); // -00:44:30 up to 1972
    EXPECT_EQ(localOffsetMinutes({at(1971, 6, 1), 0}), -44);
}

TEST_F(LocalOffset, ReachesAllYears) {
    EXPECT_EQ(localOffsetMinutes({at(1000, 1, 1), 0}), 53);
    EXPECT_EQ(localOffsetMinutes({at(1000, 1, 1), {}}), 53);
    EXPECT_EQ(localOffsetMinutes({at(9999, 12, 31), 0}), 60);
    EXPECT_EQ(localOffsetMinutes({at(9999, 7, 1), {}}), 120);
}

TEST_F(LocalOffset, ThrowsWhereTheZoneIsNotThere) {
    kvt::test::setMachineZone("Nowhere/Land");
    EXPECT_THROW(localOffsetMinutes({at(2020, 1, 1), 0}), std::runtime_error);
    EXPECT_THROW(localOffsetMinutes({at(2020, 1, 1), {}}), std::runtime_error);
}

TEST_F(LocalOffset, MayBeAskedForByManyThreads) {
    std::vector<std::thread> threads;
    std::vector<int> wrong(8, -1);
    for (std::size_t thread = 0; thread < wrong.size(); ++thread) {
        threads.emplace_back([&, thread] {
            int count = 0;
            for (int year = 1970; year < 2070; ++year) {
                count += localOffsetMinutes({at(year, 1, 1), 0}) == 60 ? 0 : 1;
            }
            wrong[thread] = count;
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(wrong, std::vector<int>(8, 0));
}

} // namespace
