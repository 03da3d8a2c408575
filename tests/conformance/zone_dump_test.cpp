// Every change of every zone up to 2038, as the system's own tool lists them from its compiled files, against the zone database that
// kvt makes and reads.
#include "suite.h"

#include <datetime/zone_folder.h>

#include <zone/named_zone.h>

#include <date/tz.h>

#include <gtest/gtest.h>

#include <chrono>
#include <cstdio>
#include <cstring>

namespace conformance {
namespace {

// "Europe/Berlin  Sun Apr  6 00:59:59 1980 UT = Sun Apr  6 01:59:59 1980 CET isdst=0 gmtoff=3600".
struct Change {
    std::chrono::sys_seconds moment;
    long offset = 0; ///< in seconds
};

bool readChange(const std::string& line, Change& change) {
    char zone[128];
    char weekday[8];
    char month[8];
    int day = 0;
    int hour = 0;
    int minute = 0;
    int second = 0;
    int year = 0;
    const std::size_t offset = line.find("gmtoff=");
    if (offset == std::string::npos ||
        std::sscanf(line.c_str(), "%127s %7s %7s %d %d:%d:%d %d UT", zone, weekday, month, &day, &hour,
                    &minute, &second, &year) != 8) {
        return false;
    }
    const char* const months = "JanFebMarAprMayJunJulAugSepOctNovDec";
    const auto number = static_cast<unsigned>((std::strstr(months, month) - months) / 3 + 1);
    using namespace std::chrono;
    change.moment = sys_days(std::chrono::year(year) / std::chrono::month(number) / day) + hours(hour) +
                    minutes(minute) + seconds(second);
    change.offset = std::stol(line.substr(offset + 7));
    return true;
}

TEST(ConformanceZoneDump, EveryChangeOfEveryZone) {
    const kvt::test::ZoneFolder folder(kvt::test::databaseOfTheSystem());
    // The names come from the same text as the database. A link is the same zone once more.
    Suite suite("zdump of every zone", "tzdata " + packageVersion("tzdata"));
    std::string all;
    for (const std::string& line :
         linesOf(kvt::test::contentsOf(std::string(kvt::test::systemZones) + "tzdata.zi"))) {
        char kind = 0;
        char name[128];
        if (std::sscanf(line.c_str(), "%c %127s", &kind, name) == 2 && kind == 'Z') {
            all += std::string(" ") + name;
        }
    }
    // The first zone has the folder read, the look at all of its files included; the others need no second one.
    const host::NamedZone first("UTC", folder.path());
    std::string current;
    const date::time_zone* zone = nullptr;
    for (const std::string& line : linesOf(outputOf("zdump -v -c 1800,2038" + all))) {
        Change change;
        if (!readChange(line, change)) {
            suite.leaveOut("moments before the first and behind the last change");
            continue;
        }
        if (const std::string name = line.substr(0, line.find(' ')); name != current) {
            zone = date::locate_zone(name);
            current = name;
        }
        const auto offset = zone->get_info(change.moment).offset.count();
        suite.check(offset == change.offset, line + ": " + std::to_string(offset));
    }
    suite.finish();
}

} // namespace
} // namespace conformance
