// `kvt tzdata`: the folder it writes, what it says, and that nothing is written when something cannot be read. What
// becomes of the rules is tested with the writer itself (tests/datetime/zone_database_test.cpp).

#include "host_test.h"

namespace kvt::test {

namespace {

constexpr const char* rules = "# version 2031x\n"
                              "R E 1990 o - Mar lastSu 1u 1 S\n"
                              "R E 1990 o - O lastSu 1u 0 -\n"
                              "Z Europe/Here 1 E CE%sT\n"
                              "L Europe/Here There\n";

} // namespace

class KvtTzdata : public HostTest {
protected:
    // Whether the package is on this machine must not matter.
    ChildResult tzdata(std::vector<std::string> more) {
        more.insert(more.begin(),
                    {"tzdata", "--output", "zones", "--windows-zones", write("names.xml", "<a/>\n")});
        return kvt(std::move(more));
    }
};

TEST_F(KvtTzdata, WritesWhatTheDateFunctionsRead) {
    const ChildResult written = tzdata({});
    EXPECT_EQ(written.status, 0) << written.err;
    EXPECT_EQ(written.err, "");
    EXPECT_TRUE(written.out.starts_with("version 2"));
    EXPECT_TRUE(written.out.ends_with(", with windowsZones.xml\n")) << written.out;
    EXPECT_EQ(read("zones/windowsZones.xml"), "<a/>\n");
    EXPECT_EQ("version " + read("zones/version").substr(0, 5), written.out.substr(0, 13));

    const ChildResult used = kvt({"date", "now", "--zone-database", "zones"});
    EXPECT_EQ(used.err, "");
    EXPECT_EQ(used.status, 0);
}

TEST_F(KvtTzdata, TakesAnyFileOfTheZoneCompilersLanguage) {
    write("mine.zi", rules);
    write("leapseconds", "Leap 1972 Jun 30 23:59:60 + S\n");
    const ChildResult written = tzdata({"--from", "mine.zi"});
    EXPECT_EQ(written.err, "");
    EXPECT_EQ(written.out, "version 2031x: 1 zone, 1 link, 1 leap second, with windowsZones.xml\n");
    EXPECT_EQ(written.status, 0);
    EXPECT_EQ(read("zones/version"), "2031x\n");
    EXPECT_TRUE(contains(read("zones/europe"), "Zone\tEurope/Here"));
    EXPECT_TRUE(contains(read("zones/europe"), "Rule\tE\t1990\tonly\t-\tMar\tlastSun"));
}

TEST_F(KvtTzdata, TakesTheLeapSecondsOfTheSystemWhereNoneStandBesideTheFile) {
    const ChildResult written = tzdata({"--from", write("mine.zi", rules)});
    EXPECT_EQ(written.status, 0) << written.err;
    const std::string leapSeconds = read("zones/leapseconds");
    EXPECT_TRUE(leapSeconds.starts_with("Leap\t1972\tJun\t30\t23:59:60\t+\tS\n")) << leapSeconds;
    EXPECT_GE(std::count(leapSeconds.begin(), leapSeconds.end(), '\n'), 27) << leapSeconds;
}

TEST_F(KvtTzdata, TakesTheNamesOfWindowsFromThePackageIfItIsThere) {
    const std::filesystem::path package = "/usr/share/unicode/cldr";
    const bool isThere = std::filesystem::exists(package / "common/supplemental/windowsZones.xml") ||
                         std::filesystem::exists(package / "supplemental/windowsZones.xml");
    const ChildResult written = kvt({"tzdata", "-o", "zones", "--from", write("mine.zi", rules)});
    EXPECT_EQ(written.status, 0) << written.err;
    EXPECT_TRUE(written.out.ends_with(isThere ? ", with windowsZones.xml\n" : ", without windowsZones.xml\n"))
        << written.out;
    EXPECT_EQ(exists("zones/windowsZones.xml"), isThere);
}

TEST_F(KvtTzdata, RefusesWhatTheLibraryCouldNotLive) {
    for (const auto& [text, part] :
         {std::pair{"", "there is no zone"},
          {"Z Etc/UTC 0 - UTC 2020 Jan 99\n", "line 1"},
          {"Z Etc/UTC 0 - UTC 2020 Jan 99\n 0 - UTC\n", "line 1: \"99\" is not a day of that month"},
          {"R X 1917 1318 - Jan 1 0 0 -\nZ Etc/UTC 0 X UTC\n", "line 1: the rule ends before it begins"},
          {"Z Etc/UTC - - UTC\n", "line 1: \"-\" is not a length of time"}}) {
        const ChildResult result = tzdata({"--from", write("mine.zi", text)});
        EXPECT_TRUE(contains(result.err, part)) << text << result.err;
        EXPECT_EQ(result.status, 2) << text;
        EXPECT_FALSE(exists("zones")) << text;
    }
}

TEST_F(KvtTzdata, WritesAnewIntoAFolderThatIsThere) {
    std::filesystem::create_directory(path("zones"));
    write("zones/version", "old");
    write("zones/mine", "kept");
    EXPECT_EQ(tzdata({"--from", write("mine.zi", rules)}).status, 0);
    EXPECT_EQ(read("zones/version"), "2031x\n");
    EXPECT_EQ(read("zones/mine"), "kept");
}

TEST_F(KvtTzdata, WritesNothingWhenSomethingCannotBeRead) {
    const ChildResult bad = tzdata({"--from", write("bad.zi", "# version 2031x\nQ nonsense\n")});
    EXPECT_EQ(bad.status, 2);
    EXPECT_TRUE(bad.err.starts_with("kvt: " + path("bad.zi") + ": ")) << bad.err;
    EXPECT_TRUE(contains(bad.err, "line 2")) << bad.err;

    const ChildResult missing = tzdata({"--from", "missing.zi"});
    EXPECT_EQ(missing.status, 2);
    EXPECT_EQ(missing.err, "kvt: cannot read missing.zi: No such file or directory\n");

    const ChildResult noNames = kvt({"tzdata", "-o", "zones", "--windows-zones", "missing.xml"});
    EXPECT_EQ(noNames.status, 2);
    EXPECT_EQ(noNames.err, "kvt: cannot read missing.xml: No such file or directory\n");
    EXPECT_FALSE(exists("zones"));
}

TEST_F(KvtTzdata, WritesNothingThatTheLibraryWouldRefuse) {
    struct Row {
        const char* text;
        const char* fault;
    };
    for (const Row& row :
         {Row{"", "there is no zone in any file"}, Row{"# version 2031x\n", "there is no zone in any file"},
          Row{"Z Etc/UTC 0 - UTC 2020 Jan 99\n0 - UTC\n", "line 1: \"99\" is not a day of that month"},
          Row{"L Etc/UTC UTC\nR E 1917 1318 - Ap 1 0 0 -\nZ Etc/UTC 0 E UTC\n",
              "line 2: the rule ends before it begins"},
          Row{"Z Etc/UTC 0 E UTC\n", "line 1: there is no rule \"E\""},
          Row{"L Etc/UTC UTC\n\n\nL A B\nZ Etc/UTC 0 - UTC\n", "line 4: there is no zone \"A\""}}) {
        const ChildResult refused = tzdata({"--from", write("bad.zi", row.text)});
        EXPECT_EQ(refused.status, 2) << row.fault;
        EXPECT_EQ(refused.err, "kvt: " + path("bad.zi") + ": " + row.fault + "\n");
        EXPECT_FALSE(exists("zones"));
    }
    write("leapseconds", "Leap 1972 Jun 31 23:59:60 + S\n");
    EXPECT_EQ(tzdata({"--from", write("mine.zi", rules)}).err,
              "kvt: " + path("mine.zi") + ": leap seconds, line 1: \"31\" is not a day of that month\n");
}

TEST_F(KvtTzdata, WritesChecksumsThatAnybodyCanCheck) {
    ASSERT_EQ(tzdata({}).status, 0);
    ChildSetup made = setup({});
    made.command = {"sh", "-c", "cksum $(cut -d ' ' -f 3 kvt-checksums)"};
    made.folder = path("zones");
    EXPECT_EQ(runChild(made).out, read("zones/kvt-checksums"));
}

TEST_F(KvtTzdata, SaysWhereItCannotWrite) {
    write("zones", "a file");
    const ChildResult result = tzdata({});
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(result.err.starts_with("kvt: cannot create zones: ")) << result.err;
    EXPECT_EQ(read("zones"), "a file");
}

} // namespace kvt::test
