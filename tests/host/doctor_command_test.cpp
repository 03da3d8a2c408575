// `kvt doctor`: what it finds in surroundings that a test can make.

#include "host_test.h"

#include <nlohmann/json.hpp>

namespace kvt::test {

class KvtDoctor : public HostTest {
protected:
    nlohmann::json finding(const std::string& subject,
                           std::vector<std::pair<std::string, std::string>> environment,
                           std::vector<std::string> more = {}) {
        more.insert(more.begin(), {"doctor", "--json"});
        ChildSetup made = setup(std::move(more));
        made.environment = std::move(environment);
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.err, "");
        bool anyWarning = false;
        nlohmann::json found;
        for (const auto& entry : nlohmann::json::parse(result.out)) {
            anyWarning = anyWarning || !entry["warning"].is_null();
            if (entry["subject"].get<std::string>().starts_with(subject)) {
                found = entry;
                break;
            }
        }
        EXPECT_TRUE(result.status == 1 || (result.status == 0 && !anyWarning)) << result.status;
        return found;
    }
};

TEST_F(KvtDoctor, TheEncodingComesFromTheFirstVariableThatIsSet) {
    struct Row {
        std::vector<std::pair<std::string, std::string>> environment;
        std::string source;
    };
    for (const Row& row :
         {Row{{{"LC_ALL", "C.UTF-8"}, {"LC_CTYPE", "C"}, {"LANG", "C"}}, "LC_ALL=C.UTF-8"},
          Row{{{"LC_ALL", ""}, {"LC_CTYPE", "C.UTF-8"}, {"LANG", "C"}}, "LC_CTYPE=C.UTF-8"},
          Row{{{"LC_ALL", ""}, {"LC_CTYPE", ""}, {"LANG", "C"}}, "LANG=C, which counts as UTF-8"},
          Row{{{"LC_ALL", ""}, {"LC_CTYPE", ""}, {"LANG", ""}},
              "none of LC_ALL, LC_CTYPE and LANG is set, which counts as UTF-8"}}) {
        const nlohmann::json found = finding("system encoding", row.environment);
        EXPECT_EQ(found["source"], row.source);
        EXPECT_EQ(found["value"], "UTF-8") << row.source;
        EXPECT_TRUE(found["warning"].is_null()) << row.source;
    }
    const nlohmann::json unknown = finding("system encoding", {{"LC_ALL", "xx_YY.zz"}});
    EXPECT_TRUE(contains(unknown["warning"].get<std::string>(), "xx_YY.zz"));
}

TEST_F(KvtDoctor, TheZoneIsThatOfTheMachineAndNotOfTheVariable) {
    const nlohmann::json zone = finding("zone of the machine", {{"TZ", "Asia/Tokyo"}});
    std::error_code error;
    const std::string link = std::filesystem::read_symlink("/etc/localtime", error).string();
    if (!error) {
        EXPECT_EQ(zone["source"], "the link /etc/localtime to " + link);
        const std::string target = std::filesystem::canonical("/etc/localtime").string();
        EXPECT_TRUE(target.ends_with("/" + zone["value"].get<std::string>())) << zone;
    }
    const nlohmann::json variable = finding("variable TZ", {{"TZ", "Asia/Tokyo"}});
    EXPECT_EQ(variable["value"], "\"Asia/Tokyo\"");
    EXPECT_FALSE(variable["warning"].is_null());
}

TEST_F(KvtDoctor, TheDatabaseIsLookedForAndItsVersionCompared) {
    const std::vector<std::pair<std::string, std::string>> home = {{"HOME", folder_.string()},
                                                                   {"XDG_CACHE_HOME", path("kept")}};
    const nlohmann::json kept = finding("zone database", home);
    EXPECT_TRUE(kept["value"].get<std::string>().starts_with(path("kept/kvt/tzdata-"))) << kept;
    EXPECT_EQ(kept["source"], "kept by the command, made from /usr/share/zoneinfo/tzdata.zi");
    EXPECT_TRUE(kept["warning"].is_null());
    std::filesystem::create_directories(path("Downloads/tzdata"));
    const nlohmann::json byItself = finding("zone database", home);
    EXPECT_EQ(byItself["value"], path("Downloads/tzdata"));
    EXPECT_EQ(byItself["source"], "where the library looks by itself");
    const nlohmann::json nowhere = finding("zone database", {{"HOME", "/dev/null"}, {"XDG_CACHE_HOME", ""}});
    EXPECT_EQ(nowhere["value"], "/dev/null/Downloads/tzdata");
    EXPECT_FALSE(nowhere["warning"].is_null());

    std::filesystem::create_directory(path("zones"));
    const nlohmann::json given = finding("zone database", {}, {"--zone-database", path("zones")});
    EXPECT_EQ(given["source"], "--zone-database");
    EXPECT_TRUE(given["warning"].is_null());
    EXPECT_EQ(finding("its version", {}, {"--zone-database", path("zones")})["value"], "not known");
    // The version that counts is the one that the library finds.
    write("zones/+VERSION", "1998a\n");
    EXPECT_EQ(finding("its version", {}, {"--zone-database", path("zones")})["value"], "not known");
    write("zones/NEWS", "News for the zones\n\nRelease 1999b - 1999-02-03\n\nRelease 1999a - 1999-01-02\n");
    EXPECT_EQ(finding("its version", {}, {"--zone-database", path("zones")})["value"], "1999b");
    write("zones/version", "1999z\n");
    const nlohmann::json old = finding("its version", {}, {"--zone-database", path("zones")});
    EXPECT_EQ(old["value"], "1999z");

    std::ifstream distribution("/usr/share/zoneinfo/tzdata.zi");
    std::string head;
    if (std::getline(distribution, head) && head.starts_with("# version ")) {
        EXPECT_EQ(old["source"], "the distribution has " + head.substr(10));
        EXPECT_FALSE(old["warning"].is_null());
        write("zones/version", head.substr(10) + "\n");
        EXPECT_TRUE(finding("its version", {}, {"--zone-database", path("zones")})["warning"].is_null());
    }
}

TEST_F(KvtDoctor, ADamagedDatabaseIsNamedWithFileAndLine) {
    ASSERT_EQ(kvt({"tzdata", "--output", "zones"}).status, 0);
    const nlohmann::json good = finding("its files", {}, {"--zone-database", "zones"});
    EXPECT_EQ(good["value"], "good");
    EXPECT_TRUE(good["warning"].is_null()) << good;

    const std::string europe = read("zones/europe");
    const std::string line = std::to_string(std::count(europe.begin(), europe.end(), '\n') + 1);
    write("zones/europe", europe + "Zone\tEurope/Berlin\tgarbage\n");
    const nlohmann::json bad = finding("its files", {}, {"--zone-database", "zones"});
    EXPECT_EQ(bad["value"], "europe, line " + line);
    EXPECT_EQ(bad["warning"],
              "zones/europe, line " + line +
                  ": the zone \"Europe/Berlin\" is there already. The library takes nothing from "
                  "such a folder.");
    const ChildResult now = kvt({"date", "now", "--zone-database", "zones"});
    EXPECT_TRUE(contains(now.err, "zones/europe, line " + line)) << now.err;
    EXPECT_NE(now.status, 0);

    write("zones/europe", europe.substr(0, europe.size() / 2) + "\n");
    EXPECT_FALSE(finding("its files", {}, {"--zone-database", "zones"})["warning"].is_null());
    EXPECT_EQ(finding("its files", {}, {"--zone-database", "none"})["value"], "none");
}

TEST_F(KvtDoctor, TheSpaceIsThatOfTheTemporaryFolderAndOfThisOne) {
    const nlohmann::json space = finding("space in " + folder_.string(), {{"TMPDIR", folder_.string()}});
    EXPECT_EQ(space["source"], "for temporary files, by TMPDIR");
    EXPECT_TRUE(space["value"].get<std::string>().ends_with(" GiB free")) << space;
    const nlohmann::json missing = finding("space in " + path("none"), {{"TMPDIR", path("none")}});
    EXPECT_EQ(missing["value"], "not known");
    EXPECT_TRUE(contains(missing["warning"].get<std::string>(), "No such file or directory"));
    EXPECT_EQ(finding("space in .", {})["source"], "for files in this folder");
}

TEST_F(KvtDoctor, WarningsStandBelowTheTable) {
    const ChildResult result = kvt({"doctor", "--zone-database", path("none")});
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(contains(result.out, "\n!  zone database ")) << result.out;
    EXPECT_TRUE(contains(result.out, "\n! zone database: There is no such folder")) << result.out;
    EXPECT_TRUE(contains(result.out, "(933050)")) << result.out;
}

} // namespace kvt::test
