// The reader that looks zone files over: what it takes, what it refuses, and where it says the fault is.
#include <kvt/datetime/zone_folder.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sys/stat.h>
#include <unistd.h>

namespace {

using kvt::ex::datetime::zoneChecksums;
using kvt::ex::datetime::ZoneFiles;
using kvt::ex::datetime::zoneFilesFault;
using kvt::ex::datetime::ZoneFolderFault;
using kvt::ex::datetime::zoneFolderFault;

// "europe:3: reason", or "good".
std::string textOf(const kvt::future::optional<ZoneFolderFault>& fault) {
    return fault ? fault->file + ":" + std::to_string(fault->line) + ": " + fault->reason : "good";
}

// One zone, and what it needs, that rows add lines to.
const std::string standard = "Rule\tEU\t1996\tmax\t-\tMar\tlastSun\t1:00u\t1:00\tS\n"
                             "Rule\tEU\t1996\tmax\t-\tOct\tlastSun\t1:00u\t0\t-\n"
                             "Zone\tEurope/Here\t0:53:28\t-\tLMT\t1893\tApr\n"
                             "\t\t\t1:00\tEU\tCE%sT\n";

std::string faultBehind(const std::string& lines) {
    return textOf(zoneFilesFault({{"europe", standard + lines}}));
}

TEST(ZoneFiles, AreGoodInAllThatTheLanguageHas) {
    EXPECT_EQ(faultBehind(""), "good");
    EXPECT_EQ(faultBehind("# a comment of any bytes but zero: \xC3\xBC \x01 \"\n"
                          "\n"
                          "Link\tEurope/Here\tHere # why\n"
                          "Link Here There\n"
                          "Leap\t1972\tJun\t30\t23:59:60\t+\tS\n"
                          "Leap 2035 Dec 31 23:59:59 - Rolling\n"
                          "Rule X min only - Jan 1 0 0 -\n"
                          "Rule X 1941 1943 - Feb Sun>=28 24:00s 2:00 D # why\n"
                          "Rule X 1944 only - Feb 29 25:00w 0:20 LETTERS\n"
                          "Rule X 1945 max - Sep Fri<=30 -2 -1:00 -\n"
                          "Zone Etc/A -15:13:42 X A/B 1900 # why\n"
                          "\t\t# nothing\n"
                          "\n"
                          "# nothing\n"
                          "\t-0 - A%s 1901 Jan\n"
                          "\t+24 1:30 %z 1904 Feb 29\n"
                          "\t1:0:5 X %z 1905 Feb Sun<=28 # why\n"
                          "\t1 X %z 1906 Mar lastFri 24u\n"
                          "\t1 X - 1906 Apr 5 -1:00s # why\n"
                          "\t1 X -\n"
                          "\t\n"),
              "good");
    // Carriage returns are blanks.
    EXPECT_EQ(faultBehind("Zone Etc/A 0 - A\r\nLink Etc/A B\r\n"), "good");
}

TEST(ZoneFiles, HaveAFaultInTheLineThatIsNamed) {
    const struct {
        int row;
        const char* lines; ///< behind the four that are good
        const char* fault;
    } rows[] = {
        // Lines and words.
        {__LINE__, "X", "europe:5: the file ends within a line, as if it were cut off"},
        {__LINE__, "\n# x", "europe:6: the file ends within a line, as if it were cut off"},
        {__LINE__, "\n  \n", "europe:6: a line of blanks is not empty"},
        {__LINE__, "Link Europe/Here A\n\t\n", "europe:6: a line of blanks is not empty"},
        {__LINE__, "rule X\n",
         "europe:5: \"rule\" begins neither a Rule, Zone, Link or Leap nor, behind a tab, the next line of a "
         "zone"},
        {__LINE__, "Link Europe/Here A\tB\n", "europe:5: a link has three words, not 4"},
        {__LINE__, "Link Europe/Here A#B\n", "europe:5: a \"#\" stands within a word"},
        {__LINE__, "Link Europe/Here \"A\"\n", "europe:5: quoted words are not understood"},
        {__LINE__, "Link Europe/Here \xC3\xBC\n", "europe:5: a word has the byte 0xC3"},
        {__LINE__, "1 2 3 4 5 6 7 8 9 10 11 12\n", "europe:5: there are more words than any line has"},
        // Rules.
        {__LINE__, "Rule X 1917 1318 - Jan 1 0 0 -\n", "europe:5: the rule ends before it begins"},
        {__LINE__, "Rule X 1917 only - Jan 1 0 0\n", "europe:5: a rule has ten words, not 9"},
        {__LINE__, "Rule X 1917 only - Jan 1 0 0 - -\n", "europe:5: a rule has ten words, not 11"},
        {__LINE__, "Rule X 1917 only - Jan # 1 0 0 -\n", "europe:5: a rule has ten words, not 6"},
        {__LINE__, "Rule 1 1917 only - Jan 1 0 0 -\n", "europe:5: \"1\" is not a name for a rule"},
        {__LINE__, "Rule - 1917 only - Jan 1 0 0 -\n", "europe:5: \"-\" is not a name for a rule"},
        {__LINE__, "Rule X 19x7 only - Jan 1 0 0 -\n", "europe:5: \"19x7\" is not a year"},
        {__LINE__, "Rule X mini only - Jan 1 0 0 -\n", "europe:5: \"mini\" is not a year"},
        {__LINE__, "Rule X 1917 10000 - Jan 1 0 0 -\n", "europe:5: \"10000\" is not a year"},
        {__LINE__, "Rule X 1917 maximum - Jan 1 0 0 -\n", "europe:5: \"maximum\" is not a year"},
        {__LINE__, "Rule X 1917 only odd Jan 1 0 0 -\n", "europe:5: \"odd\" stands where a \"-\" should"},
        {__LINE__, "Rule X 1917 only - jan 1 0 0 -\n", "europe:5: \"jan\" is not a month, as \"Jan\""},
        {__LINE__, "Rule X 1917 only - March 1 0 0 -\n", "europe:5: \"March\" is not a month, as \"Jan\""},
        {__LINE__, "Rule X 1917 only - Jan 0 0 0 -\n", "europe:5: \"0\" is not a day of that month"},
        {__LINE__, "Rule X 1917 only - Apr 31 0 0 -\n", "europe:5: \"31\" is not a day of that month"},
        {__LINE__, "Rule X 1917 only - Feb 29 0 0 -\n", "europe:5: \"29\" is not a day of that month"},
        {__LINE__, "Rule X 1916 1920 - Feb 29 0 0 -\n", "europe:5: \"29\" is not a day of that month"},
        {__LINE__, "Rule X 1917 only - Jan Sun>=32 0 0 -\n",
         "europe:5: \"Sun>=32\" is not a day of that month"},
        {__LINE__, "Rule X 1917 only - Jan Sun>8 0 0 -\n",
         "europe:5: \"Sun>8\" is not a day, as \"5\", \"lastSun\", \"Sun>=8\" or \"Sun<=25\""},
        {__LINE__, "Rule X 1917 only - Jan lastSunday 0 0 -\n",
         "europe:5: \"lastSunday\" is not a day, as \"5\", \"lastSun\", \"Sun>=8\" or \"Sun<=25\""},
        {__LINE__, "Rule X 1917 only - Jan 1st 0 0 -\n",
         "europe:5: \"1st\" is not a day, as \"5\", \"lastSun\", \"Sun>=8\" or \"Sun<=25\""},
        {__LINE__, "Rule X 1917 only - Jan 1 - 0 -\n",
         "europe:5: \"-\" is not a time, as \"2:00\", \"2:00s\" or \"1:00u\""},
        {__LINE__, "Rule X 1917 only - Jan 1 1:00g 0 -\n",
         "europe:5: \"1:00g\" is not a time, as \"2:00\", \"2:00s\" or \"1:00u\""},
        {__LINE__, "Rule X 1917 only - Jan 1 1:60 0 -\n",
         "europe:5: \"1:60\" is not a time, as \"2:00\", \"2:00s\" or \"1:00u\""},
        {__LINE__, "Rule X 1917 only - Jan 1 168 0 -\n",
         "europe:5: \"168\" is not a time, as \"2:00\", \"2:00s\" or \"1:00u\""},
        {__LINE__, "Rule X 1917 only - Jan 1 1:00:00:00 0 -\n",
         "europe:5: \"1:00:00:00\" is not a time, as \"2:00\", \"2:00s\" or \"1:00u\""},
        {__LINE__, "Rule X 1917 only - Jan 1 -2:30 0 -\n",
         "europe:5: \"-2:30\" is a negative time with minutes, which is misread"},
        {__LINE__, "Rule X 1917 only - Jan 1 0 1:00d -\n",
         "europe:5: \"1:00d\" is not a length of time, as \"1:00\""},
        {__LINE__, "Rule X 1917 only - Jan 1 0 - -\n",
         "europe:5: \"-\" is not a length of time, as \"1:00\""},
        {__LINE__, "Rule X 1917 only - Jan 1 0 2:01 -\n",
         "europe:5: \"2:01\" is not a saving in whole minutes from -1:00 to 2:00"},
        {__LINE__, "Rule X 1917 only - Jan 1 0 0:00:01 -\n",
         "europe:5: \"0:00:01\" is not a saving in whole minutes from -1:00 to 2:00"},
        {__LINE__, "Rule X 1917 1920 - Jan 1 0 0 -\nRule X 1920 max - Jan 1 2 1 -\n",
         "europe:6: the rule \"X\" has two lines for one day of one year"},
        {__LINE__, "Rule X 1917 1920 - Jan 4 0 0 -\nRule X 1920 max - Jan Sun>=1 2 1 -\n",
         "europe:6: the rule \"X\" has two lines for one day of one year"},
        {__LINE__, "Rule X 1901 1917 - Apr Sat<=7 0 1 -\nRule X 1901 1920 - Apr Sun>=1 2 0 -\n",
         "europe:6: the rule \"X\" has two lines of which the days change places in some years"},
        {__LINE__, "Rule X 1901 1920 - Sep Sun>=1 2 0 -\nRule X 1911 only - Sep 1 0 0 -\n",
         "europe:6: the rule \"X\" has two lines of one year that name the same day, as \"1\" and "
         "\"Sun>=1\""},
        {__LINE__, "Rule X 1911 only - Sep 1 0 0 -\nRule X 1901 1920 - Sep Sun>=1 2 0 -\n",
         "europe:6: the rule \"X\" has two lines of one year that name the same day, as \"1\" and "
         "\"Sun>=1\""},
        {__LINE__, "Rule X 1917 1920 - Apr 30 23:59:59 1 -\nRule X 1920 max - May 1 0 0 -\n",
         "europe:6: the rule \"X\" has two lines that are less than two days apart"},
        {__LINE__, "Rule X 1917 1920 - Apr 29 0:00:01 1 -\nRule X 1920 max - May 1 0 0 -\n",
         "europe:6: the rule \"X\" has two lines that are less than two days apart"},
        {__LINE__, "Rule X 1917 1920 - Jan 1 0 1 -\nRule X 1919 only - Dec 31 0 0 -\n",
         "europe:6: the rule \"X\" has two lines that are less than two days apart"},
        {__LINE__, "Rule X 1917 1920 - Oct 1 167 1 -\nRule X 1920 max - Oct 2 0 0 -\n",
         "europe:6: the rule \"X\" has two lines of which the days change places in some years"},
        {__LINE__, "Rule X 1917 only - Dec Sun>=26 0 0 -\n",
         "europe:5: \"Sun>=26\" is not a day of one year, but of two"},
        // Zones.
        {__LINE__, "Zone A -15:13:42 - LMT 1901 Jan Fri<=6\n",
         "europe:5: \"Fri<=6\" is not a day of one year, but of two"},
        {__LINE__, "Zone\n", "europe:5: the zone has no name"},
        {__LINE__, "Zone A 0 -\n",
         "europe:5: a line of a zone has three to seven words behind its name, not 2"},
        {__LINE__, "Zone A 0 - B 1900 Jan 1 0 0\n",
         "europe:5: a line of a zone has three to seven words behind its name, not 8"},
        {__LINE__, "Zone A 0 - B\nZone A 0 - B\n", "europe:6: the zone \"A\" is there already"},
        {__LINE__, "Zone A - - B\n", "europe:5: \"-\" is not a length of time, as \"1:00\""},
        {__LINE__, "Zone A 25 - B\n", "europe:5: \"25\" is not a length of time, as \"1:00\""},
        {__LINE__, "Zone A 0 0:00:30 B\n",
         "europe:5: \"0:00:30\" is not a saving in whole minutes from -1:00 to 2:00"},
        {__LINE__, "Zone A 0 X B\n", "europe:5: there is no rule \"X\""},
        {__LINE__, "Rule X 1917 only - Jan 1 0 1 -\nZone A 0 X B\n",
         "europe:6: the rule \"X\" has no standard time"},
        {__LINE__, "Zone A 0 - B 2020 Jan 99\n\t0 - B\n", "europe:5: \"99\" is not a day of that month"},
        {__LINE__, "Zone A 0 - B 2021 Feb 29\n\t0 - B\n", "europe:5: \"29\" is not a day of that month"},
        {__LINE__, "Zone A 0 - B 2020\n",
         "europe:5: the zone \"A\" ends by an UNTIL, as if the rest were cut off"},
        {__LINE__, "Zone A 0 - B 2020\n# x\nLink A B\n",
         "europe:5: the zone \"A\" ends by an UNTIL, as if the rest were cut off"},
        {__LINE__, "Zone A 0 - B\n\t0 - B\n", "europe:6: the zone \"A\" has ended, by a line without UNTIL"},
        {__LINE__, "Zone A 0 - B 1900\n 0 - B\n",
         "europe:6: \"0\" begins neither a Rule, Zone, Link or Leap nor, behind a tab, the next line of a "
         "zone"},
        {__LINE__, "Zone A 0 - B 1950\n\t0 - B 1949 Dec 31\n\t0 - B\n",
         "europe:6: the line's UNTIL is not after that of the line before"},
        {__LINE__, "Zone A 0 - B 1950\n\t12 - B 1950 Jan 2\n\t0 - B\n",
         "europe:6: the line's UNTIL is not after that of the line before"},
        // Links and leap seconds.
        {__LINE__, "Link A\n", "europe:5: a link has three words, not 2"},
        {__LINE__, "Link A B\n", "europe:5: there is no zone \"A\""},
        {__LINE__, "Link Europe/Here Europe/Here\n", "europe:5: \"Europe/Here\" is a zone already"},
        {__LINE__, "Zone A 0 - B\nLink Europe/Here B\nLink A B\n",
         "europe:7: the link \"B\" leads elsewhere already"},
        {__LINE__, "Leap 1972 Jun 30 23:59:60 +\n", "europe:5: a leap second has seven words, not 6"},
        {__LINE__, "Leap 1972 Jun 31 23:59:60 + S\n", "europe:5: \"31\" is not a day of that month"},
        {__LINE__, "Leap 1972 Jun 30 23:59:61 + S\n",
         "europe:5: \"23:59:61\" is not a time, as \"23:59:60\""},
        {__LINE__, "Leap 1972 Jun 30 23:59:60 1 S\n", "europe:5: \"1\" stands where \"+\" or \"-\" should"},
        {__LINE__, "Leap 1972 Jun 30 23:59:60 + X\n", "europe:5: \"X\" is neither \"S\" nor \"R\""},
        {__LINE__, "Expires 2026 Jun 28 00:00:00\n",
         "europe:5: \"Expires\" begins neither a Rule, Zone, Link or Leap nor, behind a tab, the next line "
         "of a zone"},
    };
    for (const auto& row : rows) {
        SCOPED_TRACE(row.row);
        EXPECT_EQ(faultBehind(row.lines), row.fault);
    }
    // Zeros are no text, where nobody reads it either.
    EXPECT_EQ(faultBehind(std::string("Link Europe/Here A\0\n", 20)), "europe:5: a line has a byte of zero");
    EXPECT_EQ(faultBehind(std::string("\n# x\0y\n", 7)), "europe:6: a line has a byte of zero");
}

TEST(ZoneFiles, AreLookedOverTogether) {
    EXPECT_EQ(textOf(zoneFilesFault({})), ":0: there is no zone in any file");
    EXPECT_EQ(textOf(zoneFilesFault({{"europe", ""}, {"mine", "garbage"}})),
              ":0: there is no zone in any file");
    const ZoneFiles spread = {
        {"asia", "Zone A 1 EU A%s\n"}, {"europe", standard}, {"backward", "Link A B\n"}};
    EXPECT_EQ(textOf(zoneFilesFault(spread)), "good");
    // A zone ends with its file, though the next file might go on with it.
    EXPECT_EQ(textOf(zoneFilesFault({{"africa", "Zone A 1 - A 1900\n"}, {"asia", "\t1 - A\n"}})),
              "africa:1: the zone \"A\" ends by an UNTIL, as if the rest were cut off");
    EXPECT_EQ(
        textOf(zoneFilesFault({{"africa", standard}, {"asia", "\t1 - A\n"}})),
        "asia:1: \"1\" begins neither a Rule, Zone, Link or Leap nor, behind a tab, the next line of a zone");
}

TEST(ZoneFiles, HaveRulesThatAreLoadedSoon) {
    // Each line reaches over the beginnings of all later ones, so that 60 of them make 1830 pieces.
    std::string lines;
    for (int i = 0; i < 60; ++i) {
        if (i == 40) {
            EXPECT_EQ(faultBehind(lines), "good");
        }
        constexpr const char* months[] = {"Jan", "Feb", "Mar", "Apr", "May", "Jun", "Jul"};
        lines += "Rule X " + std::to_string(1900 + i) + " max - " + months[i / 9] + " " +
                 std::to_string(i % 9 * 3 + 1) + " 0 0 -\n";
    }
    EXPECT_EQ(faultBehind(lines), "europe:24: the rule \"X\" has too many lines");
}

TEST(ZoneChecksums, AreThoseOfThePosixCommand) {
    ZoneFiles files = {{"asia", "123456789"}, {"europe", standard}};
    const std::string list = zoneChecksums(files);
    EXPECT_NE(list.find("\n930766865 9 asia\n"), std::string::npos) << list;
    EXPECT_EQ(list.rfind("4294967295 0 africa\n", 0), 0u) << list;
    EXPECT_EQ(std::count(list.begin(), list.end(), '\n'), 12);
}

TEST(ZoneChecksums, FindAnyChange) {
    ZoneFiles files = {{"europe", standard}};
    files["kvt-checksums"] = zoneChecksums(files);
    EXPECT_EQ(textOf(zoneFilesFault(files)), "good");
    files["asia"] = ""; // as good as none
    files["version"] = "2025b\n";
    EXPECT_EQ(textOf(zoneFilesFault(files)), "good");
    files["asia"] = "\n";
    EXPECT_EQ(textOf(zoneFilesFault(files)), "asia:0: the file is not the one that line 3 of "
                                             "\"kvt-checksums\" was written for; if it was changed on "
                                             "purpose, remove that list");
    files.erase("asia");
    std::string& list = files["kvt-checksums"];
    const std::string whole = list;
    for (std::size_t cut = 0; cut < whole.size(); ++cut) {
        list = whole.substr(0, cut);
        EXPECT_NE(textOf(zoneFilesFault(files)), "good") << cut;
    }
    list = whole + "\n";
    EXPECT_EQ(textOf(zoneFilesFault(files)), "kvt-checksums:13: there are more lines than files");
}

// ---- On the disk

class ZoneFolderOnDisk : public testing::Test {
protected:
    void SetUp() override {
        folder_ = (std::filesystem::temp_directory_path() / "kvt-zones-XXXXXX").string();
        ASSERT_NE(::mkdtemp(folder_.data()), nullptr);
        write("version", "2025b\n");
        write("europe", standard);
    }
    void TearDown() override { std::filesystem::remove_all(folder_); }
    std::string path(const std::string& name) const { return folder_ + "/" + name; }
    void write(const std::string& name, const std::string& text) {
        std::ofstream(path(name), std::ios::binary | std::ios::trunc) << text;
    }
    std::string fault() const { return textOf(zoneFolderFault(folder_)); }

    std::string folder_;
};

TEST_F(ZoneFolderOnDisk, NeedsAVersion) {
    EXPECT_EQ(fault(), "good");
    write("version", "2025b"); // a line feed is not asked for here
    EXPECT_EQ(fault(), "good");
    write("version", "\n");
    const std::string missing = "version:0: Unable to get Timezone database version from " + folder_ + "/";
    EXPECT_EQ(fault(), missing);
    write("version", std::string(100, '1'));
    EXPECT_EQ(fault(), missing);
    write("version", "20\x01\n");
    EXPECT_EQ(fault(), missing);
    std::filesystem::remove(path("version"));
    EXPECT_EQ(fault(), missing);
    write("NEWS", "News for the zones\n\nRelease 2025b - 2025-03-22\n");
    EXPECT_EQ(fault(), "good");
    write("NEWS", "News for the zones\n\nRelease");
    EXPECT_EQ(fault(), missing);
}

TEST_F(ZoneFolderOnDisk, NeedsFilesThatCanBeRead) {
    std::filesystem::create_directory(path("asia"));
    EXPECT_EQ(fault(), "asia:0: it is not a file");
    std::filesystem::remove(path("asia"));
    ASSERT_EQ(::mkfifo(path("asia").c_str(), 0600), 0);
    EXPECT_EQ(fault(), "asia:0: it is not a file");
    std::filesystem::remove(path("asia"));
    std::filesystem::create_symlink("asia", path("asia"));
    EXPECT_EQ(fault().rfind("asia:0: it cannot be read: ", 0), 0u) << fault();
    std::filesystem::remove(path("asia"));
    write("asia", "");
    std::filesystem::resize_file(path("asia"), std::uintmax_t{1} << 40);
    EXPECT_EQ(fault(), "asia:0: it is too large for a zone file");
    std::filesystem::remove(path("asia"));
    write("mine", "garbage");
    EXPECT_EQ(fault(), "good");
}

TEST_F(ZoneFolderOnDisk, MayBeMissing) {
    EXPECT_EQ(textOf(zoneFolderFault("/nowhere")), ":0: Timezone database not found at \"/nowhere\"");
    EXPECT_EQ(textOf(zoneFolderFault(path("europe"))),
              "version:0: Unable to get Timezone database version from " + path("europe") + "/");
}

} // namespace
