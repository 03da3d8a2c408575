// `kvt date`: values from the command line and from standard input, failures, and JSON.

#include "host_test.h"

#include <nlohmann/json.hpp>

namespace kvt::test {

class KvtDate : public HostTest {
protected:
    ChildResult date(std::vector<std::string> arguments, std::string input = {}) {
        arguments.insert(arguments.begin(), "date");
        return kvt(std::move(arguments), std::move(input));
    }

    // A zone database in which the zone of this machine is one hour ahead of UTC.
    std::string zoneDatabase() {
        std::string zone;
        for (const auto& finding : nlohmann::json::parse(kvt({"doctor", "--json"}).out)) {
            if (finding["subject"] == "zone of the machine") {
                zone = finding["value"];
            }
        }
        std::filesystem::create_directory(path("zones"));
        for (const char* name : {"africa", "antarctica", "asia", "australasia", "backward", "europe",
                                 "pacificnew", "northamerica", "southamerica", "systemv"}) {
            write(std::string("zones/") + name, "");
        }
        write("zones/etcetera", "Zone " + zone + " 1:00 - HERE\n");
        write("zones/leapseconds", "Leap 1972 Jun 30 23:59:60 + S\n");
        write("zones/version", "2020a\n");
        return path("zones");
    }

    // The rules of the system.
    std::string systemZones() {
        EXPECT_EQ(kvt({"tzdata", "--output", "system"}).status, 0);
        return path("system");
    }
};

TEST_F(KvtDate, EachFunctionGivesItsResult) {
    struct Row {
        std::vector<std::string> arguments;
        std::string result;
    };
    const std::vector<Row> rows = {
        {{"parse", "31 Jan 2020", "%d %b %Y"}, "20200131"},
        {{"parse", "2020-01-31T12:30:00Z", "ISO"}, "20200131123000+00:00"},
        {{"parse", "2020-02-30", "%Y-%m-%d", "--lenient"}, "20200301"},
        {{"parse", "-1.5", "%s"}, "19691231235958.5+00:00"},
        {{"format", "20200131", "%A, %e %B %Y"}, "Friday, 31 January 2020"},
        {{"format", "20200131", "ISO"}, "2020-01-31"},
        {{"cast", "20200131123000", "date"}, "20200131"},
        {{"cast", "20200131123000", "time"}, "123000"},
        {{"cast", "20200131", "datetime"}, "20200131000000"},
        {{"add", "20200131", "P1M"}, "20200229"},
        {{"add", "20200131120000", "-PT90M"}, "20200131103000"},
        {{"add", "20200131120000+0100", "PT1S"}, "20200131120001+01:00"},
        {{"diff", "20200301", "20200130"}, "P1M1D"},
        {{"diff", "20200301", "20200130", "--unit", "days"}, "31"},
        {{"diff", "20200101120000", "20200101", "--unit", "days"}, "0.5"},
        {{"compare", "20200131120000+01:00", "20200131110000+00:00"}, "0"},
        {{"compare", "20200130", "20200131"}, "-1"},
        {{"compare", "20200131", "20200130"}, "1"},
        {{"interval", "negate", "P1M"}, "-P1M"},
        {{"interval", "negate", "-P1M"}, "P1M"},
        {{"interval", "create", "--days", "3", "--minutes", "90", "--seconds", "1.5"}, "P3DT90M1.5S"},
        {{"interval", "create", "--years", "1", "--negative"}, "-P1Y"},
        {{"interval", "create"}, "PT0S"},
        {{"zone", "get", "120000-03:30"}, "-03:30"},
        {{"zone", "get", "120000-03:30", "--as", "minutes"}, "-210"},
        {{"zone", "get", "120000-03:30", "--as", "seconds"}, "-12600"},
        {{"zone", "set", "20200131120000+01:00", "utc"}, "20200131110000+00:00"},
        {{"zone", "set", "20200131120000+01:00", "-05:00", "--mode", "replace"}, "20200131120000-05:00"},
        {{"zone", "set", "120000", "+02:00"}, "120000+02:00"},
        {{"zone", "remove", "20200131120000+01:00"}, "20200131120000"},
    };
    for (const Row& row : rows) {
        const ChildResult result = date(row.arguments);
        EXPECT_EQ(result.out, row.result + "\n") << row.arguments[0] << " " << row.arguments[1];
        EXPECT_EQ(result.err, "");
        EXPECT_EQ(result.status, 0);
    }
}

TEST_F(KvtDate, AFailureSaysWhyWithItsNumber) {
    struct Row {
        std::vector<std::string> arguments;
        std::string error;
    };
    const std::vector<Row> rows = {
        {{"add", "x", "P1D"}, "\"x\" is no date, time or datetime in canonical form. (933063)"},
        {{"add", "20201301", "P1D"}, "13 is out of range for the month, which goes from 1 to 12. (933065)"},
        {{"add", "120000", "P1D"},
         "\"120000\" is a time of day, and \"P1D\" has years, months or days, which cannot be added to it. "
         "(933060)"},
        {{"compare", "20200101", "120000"},
         "\"20200101\" and \"120000\" are not of kinds that can be compared. (933059)"},
        {{"cast", "120000", "date"}, "A value of the kind time cannot become one of the kind date. (933052)"},
        {{"parse", " ", "%Y"}, "The value is empty."},
        {{"zone", "set", "120000", "local"},
         "\"120000\" has no date, and without one the offset of this machine's zone is not known. (933096)"},
        {{"interval", "negate", "1"},
         "\"1\" is no interval, whose form is [-]P[nY][nM][nD][T[nH][nM][nS]]. (933064)"},
    };
    for (const Row& row : rows) {
        const ChildResult result = date(row.arguments);
        EXPECT_EQ(result.err, "kvt: " + row.error + "\n");
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(result.status, 2);
    }
}

TEST_F(KvtDate, AMismatchMarksTheElementThatFailed) {
    struct Row {
        std::string value;
        std::string format;
        std::string mark;
    };
    for (const Row& row : {Row{"2020-13-01", "%Y-%m-%d", "   ^"}, Row{"x", "%Y", "^"},
                           Row{"12:3x:00", "%T", "^"}, Row{"\u00e9 1", "\u00e9 %B", "  ^"},
                           Row{"\u00e9", "\u00e8%H", "^"}, Row{"2020-01-01x", "%Y-%m-%d$", "        ^"}}) {
        const ChildResult result = date({"parse", row.value, row.format});
        EXPECT_TRUE(contains(result.err, "(933067)\n     " + row.format + "\n     " + row.mark + "\n"))
            << result.err;
        EXPECT_EQ(result.status, 2);
    }
}

TEST_F(KvtDate, LinesOfStandardInputKeepTheirNumbers) {
    const ChildResult good = date({"add", "P1D"}, "20200131\r\n20200229\n20201231");
    EXPECT_EQ(good.out, "20200201\n20200301\n20210101\n");
    EXPECT_EQ(good.status, 0);
    for (const std::vector<std::string>& arguments :
         {std::vector<std::string>{"add", "P1D"}, {"add", "-", "P1D"}}) {
        const ChildResult some = date(arguments, "20200131\nx\n20200229\n");
        EXPECT_EQ(some.out, "20200201\n\n20200301\n");
        EXPECT_EQ(
            some.err,
            "kvt: standard input: line 2: \"x\" is no date, time or datetime in canonical form. (933063)\n");
        EXPECT_EQ(some.status, 1);
    }
    EXPECT_EQ(date({"add", "P1D"}, "").out, "");
    EXPECT_EQ(date({"interval", "negate"}, "P1D\n-P1D\n").out, "-P1D\nP1D\n");
    // The mark stands under the format for a line, too.
    EXPECT_TRUE(contains(date({"parse", "%H:%M"}, "12-30\n").err, "\n     %H:%M\n       ^\n"));
}

TEST_F(KvtDate, ParseTakesTheFirstOfSeveralFormatsThatFits) {
    struct Row {
        std::vector<std::string> formats;
        std::string value;
        std::string result;
    };
    for (const Row& row : {Row{{"%d.%m.%Y$", "%Y-%m-%d$", "ISO"}, "31.01.2024", "20240131"},
                           Row{{"%d.%m.%Y$", "%Y-%m-%d$", "ISO"}, "2024-01-31", "20240131"},
                           Row{{"%d.%m.%Y$", "%Y-%m-%d$", "ISO"}, "12:30:00", "123000"},
                           // Both fit, and the order counts.
                           Row{{"%d/%m/%Y", "%m/%d/%Y"}, "02/01/2024", "20240102"},
                           Row{{"%m/%d/%Y", "%d/%m/%Y"}, "02/01/2024", "20240201"},
                           Row{{"%m/%d/%Y", "%d/%m/%Y"}, "31/01/2024", "20240131"},
                           // A day that there is not does not end the search.
                           Row{{"%Y/%m/%d", "%Y/%m/3%e"}, "2024/02/31", "20240201"},
                           Row{{"%m.%d.%Y", "%d.%m.%Y"}, "2.30.2024", ""}}) {
        std::vector<std::string> arguments = {"parse", row.value, row.formats.front()};
        std::vector<std::string> fromInput = {"parse", row.formats.front()};
        for (std::size_t i = 1; i < row.formats.size(); ++i) {
            for (std::vector<std::string>* line : {&arguments, &fromInput}) {
                line->insert(line->end(), {"--or", row.formats[i]});
            }
        }
        EXPECT_EQ(date(arguments).out, row.result.empty() ? "" : row.result + "\n") << row.value;
        EXPECT_EQ(date(fromInput, row.value + "\n").out, row.result + "\n") << row.value;
    }
    // Before the format or behind it.
    EXPECT_EQ(date({"parse", "--or", "%Y", "--or", "%H:%M", "x", "%d"}).status, 2);
    EXPECT_EQ(date({"parse", "--or", "%Y", "--or", "%H:%M", "12:30", "%d.%m."}).out, "123000\n");
    EXPECT_EQ(date({"parse", "2024-02-30", "%d.%m.%Y", "--or", "%Y-%m-%d", "--lenient"}).out, "20240301\n");
}

TEST_F(KvtDate, AValueThatNoFormatFitsIsReportedByTheOneThatItFitsBest) {
    struct Row {
        std::string value;
        std::string error;
    };
    const std::string longest =
        "The value fits the format up to \"%Y-%m\" but not where the format goes on with "
        "\"-%d\". (933067)\n     %Y-%m-%d\n          ^\n";
    for (const Row& row :
         {// Further into its pattern than into another.
          Row{"2024-01/31", longest},
          // All of a pattern, but a day that there is not.
          Row{"2024-02-30",
              "By the format \"%Y-%m-%d\", the value is a day that the calendar does not have. (933090)\n"},
          // Into none: the first speaks.
          Row{"x", "The value fits the format up to \"\" but not where the format goes on with \"%d.%m.%Y\". "
                   "(933067)\n     %d.%m.%Y\n     ^\n"},
          Row{" ", "The value is empty.\n"}}) {
        EXPECT_EQ(
            date({"parse", row.value, "%d.%m.%Y", "--or", "ISO", "--or", "%Y-%m-%d", "--or", "%d/%m"}).err,
            "kvt: " + row.error);
    }
    // A format that is wrong in itself is said first.
    EXPECT_TRUE(contains(date({"parse", "12", "%H", "--or", "%q"}).err, "\"%q\" is no flag (933079)"));
    // As JSON, too.
    EXPECT_TRUE(contains(date({"parse", "30.02.2024", "ISO", "--or", "%d.%m.%Y", "--json"}).out,
                         "\"number\":933090"));
}

TEST_F(KvtDate, LinesComeOutAsTheyGoIn) {
    std::size_t sent = 0;
    std::size_t results = 0;
    ChildSetup made = setup({"date", "add", "P1D"});
    made.oneByOne = true;
    made.makeInput = [&]() -> std::string_view { return sent++ == 200 ? std::string_view() : "20200131\n"; };
    made.takeOutput = [&](std::string_view out) {
        results += static_cast<std::size_t>(std::count(out.begin(), out.end(), '\n'));
    };
    EXPECT_EQ(runChild(made).status, 0);
    EXPECT_EQ(results, 200u);
}

TEST_F(KvtDate, LinesThatAreNoValueDoNotEndTheRest) {
    std::string input = "20200131\n\xff\n" + std::string(1000000, '1') + "\n20200229\n";
    const ChildResult result = date({"add", "P1D"}, input);
    EXPECT_EQ(result.out, "20200201\n\n\n20200301\n");
    EXPECT_TRUE(contains(result.err, "standard input: line 2: ")) << result.err;
    EXPECT_TRUE(contains(result.err, "The line is too long for a value.\n")) << result.err;
    EXPECT_EQ(result.status, 1);
}

TEST_F(KvtDate, WhatIsWrongWithTheCommandLineIsSaidOnceAndFirst) {
    struct Row {
        std::vector<std::string> arguments;
        std::string part;
    };
    for (const Row& row :
         {Row{{"parse", "%Y-%Q"}, "\"%Q\" is no flag (933079); there are %$ "},
          Row{{"parse", "%\u00e9"}, "\"%\u00e9\" is no flag"}, Row{{"parse", "%Y %"}, "(933076)"},
          Row{{"parse", ""}, "(933074)"}, Row{{"parse", "ISO|x", "--or", "x"}, "(933075)"},
          Row{{"format", "%Y%U%*"}, "\"%*\" is no flag"}, Row{{"add", "P1"}, "whose form is [-]P[nY]"},
          Row{{"diff", "x"}, "(933063)"}, Row{{"compare", "20200230"}, "(933065)"},
          Row{{"parse", "%Y", "--encoding", "x"}, "\"x\" is not the name of an encoding"},
          Row{{"parse", "%Y", "--max-errors", "-1"}, "--max-errors takes a whole number"},
          Row{{"parse", "2020", "%Y", "--file", "x"}, "do not go together"},
          // A value for which the other argument is missing: no waiting for lines.
          Row{{"parse", "2020-01-01"}, "kvt date parse '2020-01-01' ISO"},
          Row{{"parse", "31.01.2020"}, "kvt date parse '31.01.2020' '%d.%m.%Y$'"},
          Row{{"parse", "x"}, "kvt date parse 'x' FORMAT"},
          Row{{"format", "20200131"}, "kvt date format '20200131' ISO"},
          Row{{"add", "20200131"}, "kvt date add '20200131' P1D"}}) {
        const ChildResult result = date(row.arguments, "20200131\n20200131\n");
        EXPECT_TRUE(contains(result.err, row.part)) << result.err;
        EXPECT_EQ(result.out, "") << row.part;
        EXPECT_EQ(result.status, 2) << row.part;
        EXPECT_LE(std::count(result.err.begin(), result.err.end(), '\n'), 2) << result.err;
    }
}

TEST_F(KvtDate, LinesOfFilesGoIntoAFile) {
    write("one", "\uFEFF2020-01-31\nx\n");
    write("two", convert("UTF-8", "UTF-16LE", "2020-02-01", {"--bom", "add"}).out);
    const ChildResult one = date({"parse", "%Y-%m-%d", "--file", "one", "-o", "out"});
    EXPECT_EQ(one.out, "");
    EXPECT_EQ(read("out"), "20200131\n\n");
    EXPECT_TRUE(one.err.starts_with("kvt: one: line 2: \"x\": The value fits")) << one.err;
    EXPECT_EQ(one.status, 1);
    EXPECT_EQ(date({"parse", "%Y-%m-%d", "--file", "two", "--encoding", "UTF-16"}).out, "20200201\n");
    EXPECT_TRUE(contains(date({"parse", "%Y-%m-%d", "--file", "one", "--json"}).out,
                         "{\"line\":1,\"value\":\"2020-01-31\""));
}

TEST_F(KvtDate, FailuresAreCountedByMessageAndFormat) {
    std::string input;
    for (int line = 0; line < 20; ++line) {
        input += "2020-02-3" + std::to_string(line % 2) + "\n";
        input += "30.02.2020\n";
    }
    const ChildResult result = date({"parse", "%Y-%m-%d$", "--or", "%d.%m.%Y$"}, input + "x\n");
    EXPECT_EQ(result.status, 1);
    EXPECT_TRUE(contains(result.err,
                         "kvt: 41 lines failed:\n"
                         "      20  such as standard input: line 1: \"2020-02-30\": By the format"))
        << result.err;
    EXPECT_TRUE(
        contains(result.err, "\n      20  such as standard input: line 2: \"30.02.2020\": By the format"))
        << result.err;
    EXPECT_TRUE(contains(result.err, "\n       1  such as standard input: line 41: \"x\"")) << result.err;
    EXPECT_EQ(std::count(result.err.begin(), result.err.end(), '^'), 1) << result.err;
}

TEST_F(KvtDate, JsonHasTheResultOrTheMessage) {
    EXPECT_EQ(date({"add", "20200131", "P1M", "--json"}).out,
              "{\"value\":\"20200131\",\"state\":\"Success\",\"result\":\"20200229\"}\n");
    EXPECT_EQ(
        date({"add", "20200131120000+0100", "PT1S", "--json"}).out,
        "{\"value\":\"20200131120000+0100\",\"state\":\"Repaired\",\"result\":\"20200131120001+01:00\"}\n");
    EXPECT_EQ(date({"compare", "20200131", "20200130", "--json"}).out,
              "{\"value\":\"20200131\",\"state\":\"Success\",\"result\":1}\n");
    const ChildResult lines = date({"parse", "%Y-%m-%d", "--json"}, "2020-01-02\n2020\n\n");
    EXPECT_EQ(
        lines.out,
        "{\"line\":1,\"value\":\"2020-01-02\",\"state\":\"Success\",\"result\":\"20200102\"}\n"
        "{\"line\":2,\"value\":\"2020\",\"state\":\"Failure\",\"result\":null,\"message\":{\"number\":933067,"
        "\"text\":\"The value fits the format up to \\\"%Y\\\" but not where the format goes on with "
        "\\\"-%m-%d\\\".\",\"parameters\":[\"%Y\",\"-%m-%d\"]}}\n"
        "{\"line\":3,\"value\":\"\",\"state\":\"Failure\",\"result\":null,\"message\":{\"number\":null,"
        "\"text\":\"The value is empty.\",\"parameters\":[]}}\n");
    EXPECT_EQ(lines.err, "");
    EXPECT_EQ(lines.status, 1);
    EXPECT_EQ(date({"add", "x", "P1M", "--json"}).status, 2);
}

TEST_F(KvtDate, TheZoneOfTheMachineComesFromTheDatabase) {
    const std::string zones = zoneDatabase();
    const ChildResult set = date({"zone", "set", "20200131120000", "local", "--zone-database", zones});
    EXPECT_EQ(set.out, "20200131120000+01:00\n") << set.err;
    const ChildResult converted =
        date({"zone", "set", "20200131120000+00:00", "LOCAL", "--zone-database", zones});
    EXPECT_EQ(converted.out, "20200131130000+01:00\n") << converted.err;
    const ChildResult now = date({"now", "--zone-database", zones});
    EXPECT_TRUE(now.out.ends_with("+01:00\n")) << now.out << now.err;
    const ChildResult bare = date({"now", "--no-offset", "--zone-database", zones});
    EXPECT_FALSE(contains(bare.out, "+")) << bare.out;
    EXPECT_EQ(bare.status, 0) << bare.err;
}

TEST_F(KvtDate, AMissingDatabaseIsNamed) {
    const ChildResult now = date({"now", "--zone-database", path("none")});
    EXPECT_EQ(now.status, 2);
    EXPECT_TRUE(contains(now.err, path("none"))) << now.err;
    EXPECT_TRUE(contains(now.err, "(933050)")) << now.err;
    const ChildResult set = date({"zone", "set", "20200131", "local", "--zone-database", path("none")});
    EXPECT_EQ(set.status, 2);
    EXPECT_TRUE(contains(set.err, "kvt doctor")) << set.err;
    // UTC needs none.
    EXPECT_TRUE(date({"now", "--utc", "--zone-database", path("none")}).out.ends_with("+00:00\n"));
}

TEST_F(KvtDate, AZoneHasANameAndTheOffsetOfTheMoment) {
    const std::string zones = systemZones();
    struct Row {
        std::string value;
        std::string zone;
        std::string mode;
        std::string result;
    };
    for (const Row& row : {Row{"20200131120000+02:00", "CET", "automatic", "20200131110000+01:00"},
                           Row{"20200131120000+02:00", "EST", "automatic", "20200131050000-05:00"},
                           Row{"20200731120000+02:00", "Europe/Berlin", "convert", "20200731120000+02:00"},
                           Row{"20200131120000+02:00", "Europe/Berlin", "replace", "20200131120000+01:00"},
                           Row{"20200131120000+02:00", "GMT", "automatic", "20200131100000+00:00"},
                           Row{"20200131120000.25", "Asia/Kolkata", "automatic", "20200131120000.25+05:30"},
                           Row{"20200701", "Europe/Berlin", "automatic", "20200701000000+02:00"},
                           Row{"20200131120000", " UTC ", "automatic", "20200131120000+00:00"},
                           // Across midnight, and in the hour that the clocks show twice.
                           Row{"20200101003000+01:00", "America/New_York", "convert", "20191231183000-05:00"},
                           Row{"20201025013000+00:00", "Europe/Berlin", "convert", "20201025023000+01:00"}}) {
        const ChildResult result =
            date({"zone", "set", row.value, row.zone, "--mode", row.mode, "--zone-database", zones});
        EXPECT_EQ(result.out, row.result + "\n") << row.zone << ": " << result.err;
        EXPECT_EQ(result.status, 0) << row.zone;
    }
    for (const auto& [value, number] : {std::pair{"20200329023000", "(933094)"},
                                        {"20201025023000", "(933095)"},
                                        {"120000", "(933096)"},
                                        {"20200230120000", "(933065)"},
                                        {"x", "(933063)"}}) {
        const ChildResult result = date({"zone", "set", value, "Europe/Berlin", "--zone-database", zones});
        EXPECT_TRUE(contains(result.err, number)) << value << ": " << result.err;
        EXPECT_EQ(result.out, "") << value;
        EXPECT_EQ(result.status, 2) << value;
    }
    EXPECT_TRUE(contains(
        date({"zone", "set", "20200131", "UTC+1", "--mode", "convert", "--zone-database", zones}).err,
        "neither an offset"));
}

TEST_F(KvtDate, AZoneThatThereIsNotIsFoundBeforeTheFirstLine) {
    const std::string zones = systemZones();
    for (const auto& [zone, part] : {std::pair{"+1", "such as +01:00"},
                                     {"Europe/Berln", "Did you mean 'Europe/Berlin'?"},
                                     {"", "ZONE is empty"},
                                     {"+24:0", "such as +01:00"}}) {
        const ChildResult result = date({"zone", "set", zone, "--zone-database", zones}, "20200131\n");
        EXPECT_TRUE(contains(result.err, part)) << result.err;
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(result.status, 2);
    }
}

TEST_F(KvtDate, LocalWorksWithoutAFolderOfTheUsersOwn) {
    ChildSetup made = setup({"date", "zone", "set", "20200131120000", "local"});
    made.environment = {{"HOME", folder_.string()}, {"XDG_CACHE_HOME", ""}};
    const ChildResult first = runChild(made);
    EXPECT_EQ(first.status, 0) << first.err;
    EXPECT_EQ(first.err, "");
    const std::vector<std::string> kept = names();
    EXPECT_EQ(kept, std::vector<std::string>{".cache"});
    const auto folder = std::filesystem::directory_iterator(folder_ / ".cache/kvt")->path();
    const auto written = std::filesystem::last_write_time(folder / "europe");
    EXPECT_EQ(runChild(made).out, first.out);
    EXPECT_EQ(std::filesystem::last_write_time(folder / "europe"), written);
    // What is damaged is made anew.
    std::ofstream(folder / "europe") << "Zone\n";
    EXPECT_EQ(runChild(made).out, first.out);
    // Nowhere to keep it: as if there were no rules.
    made.environment = {{"HOME", "/dev/null"}, {"XDG_CACHE_HOME", ""}};
    const ChildResult nowhere = runChild(made);
    EXPECT_TRUE(contains(nowhere.err, "kvt doctor")) << nowhere.err;
    EXPECT_EQ(nowhere.status, 2);
}

TEST_F(KvtDate, AResultWithoutAValueIsAFailure) {
    const ChildResult one = date({"add", "99991231", "P1D"});
    EXPECT_EQ(one.out, "");
    EXPECT_TRUE(contains(one.err, "outside the years")) << one.err;
    EXPECT_EQ(one.status, 2);
    const ChildResult lines = date({"add", "P1D"}, "99991230\n99991231\n");
    EXPECT_EQ(lines.out, "99991231\n\n");
    EXPECT_TRUE(contains(lines.err, "line 2")) << lines.err;
    EXPECT_EQ(lines.status, 1);
    const ChildResult json = date({"add", "99991231", "P1D", "--json"});
    EXPECT_TRUE(contains(json.out, "\"state\":\"Failure\",\"result\":null")) << json.out;
    EXPECT_EQ(json.status, 2);
}

TEST_F(KvtDate, AFormatThatWouldOnlyBeWrittenAsItStandsIsRefused) {
    for (const char* format : {"ISO8601", "dd.mm.yyyy", "|", "ISO x"}) {
        const ChildResult result = date({"format", format}, "20200131\n");
        EXPECT_TRUE(contains(result.err, "neither a known keyword")) << format << ": " << result.err;
        EXPECT_EQ(result.out, "") << format;
        EXPECT_EQ(result.status, 2) << format;
    }
    EXPECT_EQ(date({"format", "20200131", "x| iso "}).out, "2020-01-31\n");
    EXPECT_EQ(date({"format", "20200131", "%%"}).out, "%\n");
}

TEST_F(KvtDate, WrongCommandLinesAreRefused) {
    struct Row {
        std::vector<std::string> arguments;
        std::string part;
    };
    for (const Row& row :
         {Row{{"cast", "20200131", "dtae"}, "Did you mean 'date'?"},
          Row{{"diff", "20200131", "20200130", "--unit", "day"}, "Did you mean 'days'?"},
          Row{{"zone", "get", "120000+01:00", "--as", "hours"}, "text, minutes, seconds"},
          Row{{"zone", "set", "120000", "utc", "--mode", "keep"}, "automatic, replace, convert"},
          Row{{"add"}, "INTERVAL is required"}, Row{{"add", "20200131", "P1D", "P2D"}, "P2D"},
          Row{{"add", "20200131", "P1D", "-P2D"}, "-P2D"},
          Row{{"now", "--utc", "--no-offset"}, "do not go together"},
          Row{{"interval", "create", "--seconds=-1"}, "--negative"},
          Row{{"interval", "create", "--days", "-3"}, "--negative"},
          Row{{"interval", "create", "--days", "99999999999999999999"}, "'99999999999999999999'"},
          Row{{"interval", "create", "--days", "010"}, "'010'"},
          Row{{"interval", "create", "--days", "0x1F"}, "'0x1F'"},
          Row{{"interval", "create", "--days", ""}, "''"},
          Row{{"interval", "create", "--seconds", "1e3"}, "'1e3'"},
          Row{{"interval", "create", "--seconds", "1."}, "'1.'"},
          Row{{"interval", "create", "--seconds", "nan"}, "'nan'"}, Row{{"zone"}, "'get', 'set', 'remove'"},
          Row{{}, "'parse', 'format'"}}) {
        const ChildResult result = date(row.arguments, "20200131\n");
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.out, "");
        EXPECT_TRUE(contains(result.err, row.part)) << result.err;
    }
}

} // namespace kvt::test
