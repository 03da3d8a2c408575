// The folder that `kvt tzdata` writes: its text, how it is loaded, and whether every zone then says what the system's
// own compiled zone files say.
#include "machine_zone.h"
#include "zone_folder.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/local_zone.h>

#include <date/tz.h>

#include <gtest/gtest.h>

#include <ctime>
#include <set>
#include <sstream>
#include <vector>

namespace {

namespace fs = std::filesystem;
using host::makeZoneDatabase;
using host::ZoneDatabase;
using host::ZoneDatabaseError;
using kvt::test::contentsOf;

std::string joinedFiles(const ZoneDatabase& database) {
    std::string all;
    for (const auto& [name, text] : database.files) {
        if (!text.empty() && name != "version" && name != "kvt-checksums") {
            all += "[" + name + "]\n" + text;
        }
    }
    return all;
}

// ---- The writer

TEST(ZoneDatabaseWriter, WritesAllWordsInFull) {
    const ZoneDatabase database = makeZoneDatabase("# version 2020a\n"
                                                   "# ddeps\n"
                                                   "R e 1977 1980 - Ap Su>=1 1u 1 S\n"
                                                   "R e mi o - S lastSu 1g 0 -\n"
                                                   "R e 1996 ma - O F<=25 2:30s 1:30d -\n"
                                                   "R e 1996 o - Ja 31 24w 0s D\n"
                                                   "Z Europe/A 0:53:28 - LMT 1893 Ap\n"
                                                   "1 e CE%sT 1945 May 24 2\n"
                                                   "1 1 +02 1950 D lastSa 1z\n"
                                                   "1 e %z\n"
                                                   "Z Etc/B -0 - UTC\n"
                                                   "L Europe/A A\n",
                                                   "");
    EXPECT_EQ(joinedFiles(database), "[backward]\n"
                                     "Link\tEurope/A\tA\n"
                                     "[etcetera]\n"
                                     "Zone\tEtc/B\t-0\t-\tUTC\n"
                                     "[europe]\n"
                                     "Rule\te\t1977\t1980\t-\tApr\tSun>=1\t1u\t1\tS\n"
                                     "Rule\te\tmin\tonly\t-\tSep\tlastSun\t1u\t0\t-\n"
                                     "Rule\te\t1996\tmax\t-\tOct\tFri<=25\t2:30s\t1:30\t-\n"
                                     "Rule\te\t1996\tonly\t-\tJan\t31\t24\t0\tD\n"
                                     "Zone\tEurope/A\t0:53:28\t-\tLMT\t1893\tApr\n"
                                     "\t\t\t1\te\tCE%sT\t1945\tMay\t24\t2\n"
                                     "\t\t\t1\t1\t+02\t1950\tDec\tlastSat\t1u\n"
                                     "\t\t\t1\te\t%z\n");
    EXPECT_EQ(database.files.at("version"), "2020a\n");
    EXPECT_EQ(database.version, "2020a");
    EXPECT_EQ(database.zones, 2u);
    EXPECT_EQ(database.links, 1u);
    EXPECT_EQ(database.rules, 4u);
    EXPECT_EQ(database.leapSeconds, 0u);
}

TEST(ZoneDatabaseWriter, ReadsWordsInFullAndItsOwnOutput) {
    const char* text = "Rule\tEU\t1977\tonly\t-\tApr\tlastSun\t 1:00u\t1:00\tS # why\n"
                       "\n"
                       "   # nothing\n"
                       "zone  Europe/A\t1:00\tEU\tCE%sT\t1990 January 1\r\n"
                       "\t\t\t1:00\t-\tCET\n"
                       "LINK\tEurope/A\tA";
    const ZoneDatabase database = makeZoneDatabase(text, "");
    EXPECT_EQ(joinedFiles(database), "[backward]\nLink\tEurope/A\tA\n"
                                     "[europe]\nRule\tEU\t1977\tonly\t-\tApr\tlastSun\t1:00u\t1:00\tS\n"
                                     "Zone\tEurope/A\t1:00\tEU\tCE%sT\t1990\tJan\t1\n\t\t\t1:00\t-\tCET\n");
    EXPECT_EQ(database.version, "unknown");
    const std::string again = database.files.at("europe") + database.files.at("backward");
    EXPECT_EQ(joinedFiles(makeZoneDatabase(again, "")), joinedFiles(database));
}

TEST(ZoneDatabaseWriter, SaysWhereItStopped) {
    const struct {
        int line;
        const char* text;
        const char* message;
    } rows[] = {
        {__LINE__, "\n\nX a", "line 3: \"X\" is neither Rule, Zone nor Link"},
        {__LINE__, "Rules e", "line 1: \"Rules\" is neither Rule, Zone nor Link"},
        {__LINE__, "R e 1977 1980 - Ap Su>=1 1u 1", "line 1: a rule has ten fields"},
        {__LINE__, "R e 1977 1980 - M Su>=1 1u 1 S", "line 1: \"M\" may be more than one month"},
        {__LINE__, "R e 1977 1980 - X Su>=1 1u 1 S", "line 1: \"X\" is no month"},
        {__LINE__, "R e 1977 1980 - Ap S>=1 1u 1 S", "line 1: \"S\" may be more than one weekday"},
        {__LINE__, "R e 1977 1980 - Ap lastX 1u 1 S", "line 1: \"X\" is no weekday"},
        {__LINE__, "R e 1977 1980 - Ap Su>1 1u 1 S", "line 1: \"Su>1\" is no day"},
        {__LINE__, "R e 1977 1980 - Ap Su>= 1u 1 S", "line 1: \"\" is no number"},
        {__LINE__, "R e 1977 x - Ap 1 1u 1 S", "line 1: \"x\" is no number"},
        {__LINE__, "R e m 1977 - Ap 1 1u 1 S", "line 1: \"m\" may be minimum or maximum"},
        {__LINE__, "Z", "line 1: a zone has a name"},
        {__LINE__, "Z Etc/A", "line 1: a line of a zone has three to seven fields"},
        {__LINE__, "Z Etc/A 0 - A 1 Ja 1 1 x", "line 1: a line of a zone has three to seven fields"},
        {__LINE__, "Z Etc/A 0 - A 1900\n", "line 1: the last zone is cut off"},
        {__LINE__, "Z Etc/A 0 - A 1900\nL Etc/A", "line 2: a line of a zone has three to seven fields"},
        {__LINE__, "L Etc/A", "line 1: a link has three fields"},
        {__LINE__, "Z Etc/A 0 - \"A B\"", "line 1: quoted words are not understood"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.line);
        try {
            makeZoneDatabase(row.text, "");
            ADD_FAILURE() << "no failure";
        } catch (const ZoneDatabaseError& error) {
            EXPECT_STREQ(error.what(), row.message);
        }
    }
    EXPECT_THROW(makeZoneDatabase("", "Leap\t1972\tJun"), ZoneDatabaseError);
    EXPECT_THROW(makeZoneDatabase("", "nothing"), ZoneDatabaseError);
    EXPECT_THROW(makeZoneDatabase("", "2272060800 x"), ZoneDatabaseError);
}

TEST(ZoneDatabaseWriter, ReadsLeapSecondsInBothForms) {
    const ZoneDatabase lines = makeZoneDatabase("", "# comment\n"
                                                    "Leap\t1972\tJun\t30\t23:59:60\t+\tStationary\n"
                                                    "L 1972 D 31 23:59:60 + S\n"
                                                    "#expires 1782604800\n"
                                                    "Expires\t2026\tJun\t28\t00:00:00\n");
    EXPECT_EQ(lines.files.at("leapseconds"), "Leap\t1972\tJun\t30\t23:59:60\t+\tS\n"
                                             "Leap\t1972\tDec\t31\t23:59:60\t+\tS\n");
    EXPECT_EQ(lines.leapSeconds, 2u);
    const ZoneDatabase list = makeZoneDatabase("", "#$\t3676924800\n"
                                                   "2272060800      10      # 1 Jan 1972\n"
                                                   "2287785600      11      # 1 Jul 1972\n"
                                                   "2303683200      12      # 1 Jan 1973\n");
    EXPECT_EQ(list.files.at("leapseconds"), lines.files.at("leapseconds"));
    EXPECT_EQ(list.leapSeconds, 2u);
}

TEST(ZoneDatabaseWriter, GivesEveryFileThatIsRead) {
    const ZoneDatabase database = kvt::test::databaseOfTheSystem();
    for (const char* name :
         {"africa", "antarctica", "asia", "australasia", "backward", "etcetera", "europe", "pacificnew",
          "northamerica", "southamerica", "systemv", "leapseconds", "version", "kvt-checksums"}) {
        EXPECT_TRUE(database.files.contains(name)) << name;
    }
    EXPECT_EQ(database.files.size(), 14u);
    for (const auto& [name, text] : database.files) {
        EXPECT_EQ(text.find('#'), std::string::npos) << name;
        EXPECT_TRUE(text.empty() || text.back() == '\n') << name;
        EXPECT_EQ(text.find("\n\n"), std::string::npos) << name;
    }
}

TEST(ZoneDatabaseWriter, FindsTheSameLeapSecondsInBothFilesOfTheSystem) {
    const fs::path system = kvt::test::systemZones;
    const ZoneDatabase list = makeZoneDatabase("", contentsOf(system / "leap-seconds.list"));
    EXPECT_GE(list.leapSeconds, 27u);
    EXPECT_EQ(list.files, makeZoneDatabase("", contentsOf(system / "leapseconds")).files);
}

// ---- What is loaded

class LoadedZones : public testing::Test {
public:
    static void SetUpTestSuite() {
        static const kvt::test::ZoneFolder folder(database());
        kvt::ex::datetime::setInstallPathWrapper(folder.path());
    }
    static const ZoneDatabase& database() {
        static const ZoneDatabase made = kvt::test::databaseOfTheSystem();
        return made;
    }
};

TEST_F(LoadedZones, AreThoseOfTheInput) {
    testing::internal::CaptureStderr();
    const date::tzdb& loaded = date::get_tzdb();
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "");

    std::set<std::string> zones;
    std::set<std::string> links;
    std::istringstream input(contentsOf(fs::path(kvt::test::systemZones) / "tzdata.zi"));
    std::string version;
    for (std::string line; std::getline(input, line);) {
        std::istringstream words(line);
        std::string first, second, third;
        words >> first >> second >> third;
        if (first == "Z") {
            zones.insert(second);
        } else if (first == "L") {
            links.insert(third);
        } else if (first == "#" && second == "version") {
            version = third;
        }
    }
    std::set<std::string> loadedZones;
    for (const date::time_zone& zone : loaded.zones) {
        loadedZones.insert(zone.name());
    }
    std::set<std::string> loadedLinks;
    for (const date::time_zone_link& link : loaded.links) {
        loadedLinks.insert(link.name());
        EXPECT_NO_THROW(loaded.locate_zone(link.name())) << link.name();
    }
    EXPECT_GT(zones.size(), 300u);
    EXPECT_EQ(loadedZones, zones);
    EXPECT_EQ(loaded.zones.size(), zones.size());
    EXPECT_EQ(database().zones, zones.size());
    EXPECT_EQ(loadedLinks, links);
    EXPECT_EQ(database().links, links.size());
    EXPECT_EQ(loaded.version, version);
    EXPECT_EQ(loaded.leap_seconds.size(), database().leapSeconds);
    EXPECT_GE(loaded.leap_seconds.size(), 27u);
}

constexpr std::int64_t year1970 = 0;
constexpr std::int64_t year2038 = 2'145'916'800;

std::int64_t bigEndian(const std::string& data, std::size_t at, std::size_t bytes) {
    std::uint64_t value = static_cast<signed char>(data.at(at)) < 0 ? ~std::uint64_t{0} : 0;
    for (std::size_t i = 0; i < bytes; ++i) {
        value = value << 8 | static_cast<unsigned char>(data.at(at + i));
    }
    return static_cast<std::int64_t>(value);
}

// The transitions listed in a compiled zone file (RFC 8536): behind a first part with times of 32 bits the same again
// with 64.
std::vector<std::int64_t> transitionsInFile(const std::string& data) {
    constexpr std::size_t header = 44;
    const auto count = [&](std::size_t part, std::size_t index) {
        return static_cast<std::size_t>(bigEndian(data, part + 20 + 4 * index, 4));
    };
    EXPECT_EQ(data.substr(0, 4), "TZif");
    EXPECT_GE(data.at(4), '2');
    const std::size_t second = header + count(0, 3) * 5 + count(0, 4) * 6 + count(0, 5) + count(0, 2) * 8 +
                               count(0, 1) + count(0, 0);
    std::vector<std::int64_t> times;
    for (std::size_t i = 0; i < count(second, 3); ++i) {
        times.push_back(bigEndian(data, second + header + 8 * i, 8));
    }
    return times;
}

// What the system's C library says about a zone that it was told to be in.
std::int64_t systemOffset(std::int64_t moment) {
    const std::time_t time = moment;
    std::tm fields = {};
    EXPECT_NE(::localtime_r(&time, &fields), nullptr);
    return fields.tm_gmtoff;
}

// The moments at which a zone is asked: both sides of every transition that either side knows of, and two days of each
// year, for rules that the file has only as a formula.
std::set<std::int64_t> momentsOf(const std::string& compiled, const date::time_zone& zone) {
    std::set<std::int64_t> moments;
    const auto add = [&](std::int64_t transition) {
        for (const std::int64_t moment : {transition - 1, transition}) {
            if (moment >= year1970 && moment < year2038) {
                moments.insert(moment);
            }
        }
    };
    for (const std::int64_t transition : transitionsInFile(compiled)) {
        add(transition);
    }
    for (std::int64_t moment = year1970; moment < year2038;) {
        const auto end = zone.get_info(date::sys_seconds(std::chrono::seconds(moment))).end;
        moment = end.time_since_epoch().count();
        add(moment);
    }
    for (std::int64_t half = 0; half < 2 * 68; ++half) {
        moments.insert(year1970 + half * 15'778'476);
    }
    return moments;
}

TEST_F(LoadedZones, HaveTheOffsetsOfTheCompiledZoneFiles) {
    const date::tzdb& loaded = date::get_tzdb();
    std::vector<std::string> names;
    for (const date::time_zone& zone : loaded.zones) {
        names.push_back(zone.name());
    }
    for (const date::time_zone_link& link : loaded.links) {
        names.push_back(link.name());
    }
    std::set<std::string> compared;
    std::size_t moments = 0;
    std::vector<std::string> wrong;
    for (const std::string& name : names) {
        const fs::path file = kvt::test::systemZones + name;
        if (!fs::exists(file)) {
            continue; // some distributions have names of old in another package; see below
        }
        compared.insert(name);
        ::setenv("TZ", (":" + file.string()).c_str(), 1);
        ::tzset();
        kvt::test::setMachineZone(name);
        const date::time_zone& zone = *loaded.locate_zone(name);
        for (const std::int64_t moment : momentsOf(contentsOf(file), zone)) {
            ++moments;
            const std::int64_t expected = systemOffset(moment);
            const std::int64_t offset =
                zone.get_info(date::sys_seconds(std::chrono::seconds(moment))).offset.count();
            const kvt::ex::datetime::detail::TemporalInstant instant = {
                kvt::ex::datetime::detail::timeCountOfSeconds(moment, 0), 0};
            const std::int64_t minutes = kvt::ex::datetime::detail::localOffsetMinutes(instant);
            if (offset != expected || minutes != expected / 60) {
                wrong.push_back(name + " at " + std::to_string(moment) + ": " + std::to_string(offset) +
                                " s, " + std::to_string(minutes) + " min instead of " +
                                std::to_string(expected) + " s");
            }
        }
    }
    for (std::size_t i = 0; i < wrong.size() && i < 20; ++i) {
        ADD_FAILURE() << wrong[i];
    }
    EXPECT_EQ(wrong.size(), 0u);
    EXPECT_GT(moments, 50'000u);
    // All zones that the system lists for its users have been compared.
    std::istringstream table(contentsOf(fs::path(kvt::test::systemZones) / "zone.tab"));
    for (std::string line; std::getline(table, line);) {
        if (!line.empty() && line[0] != '#') {
            std::istringstream words(line);
            std::string country, place, name;
            words >> country >> place >> name;
            EXPECT_TRUE(compared.contains(name)) << name;
        }
    }
}

} // namespace
