// What the command says where its surroundings are odd: no folder for temporary files, a zone database that is none,
// words that nobody meant.

#include "host_test.h"

#include <nlohmann/json.hpp>

namespace kvt::test {

class KvtOddCircumstance : public HostTest {
protected:
    ChildResult with(const std::string& name, const std::string& value, std::vector<std::string> arguments,
                     std::string input = {}) const {
        ChildSetup made = setup(std::move(arguments));
        made.environment = {{name, value}};
        made.input = std::move(input);
        return runChild(made);
    }
};

TEST_F(KvtOddCircumstance, AnInputThatIsReadTwiceNeedsAFolderForItsCopy) {
    const ChildResult result = with("TMPDIR", path("none"), {"infer"}, "a\n");
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(result.err.starts_with("kvt: " + path("none") + "/kvt-")) << result.err;
    EXPECT_TRUE(result.err.ends_with(": No such file or directory\n")) << result.err;
    // A file is read where it is.
    write("in", "a\n");
    EXPECT_EQ(with("TMPDIR", path("none"), {"infer", "in"}).status, 0);
    EXPECT_EQ(with("TMPDIR", "", {"infer"}, "a\n").status, 0);
}

TEST_F(KvtOddCircumstance, ASortThatOutgrowsItsMemoryNeedsAFolder) {
    std::string lines;
    for (int line = 0; line < 60'000; ++line) {
        lines += std::to_string(line) + " is a line of some length, of which there are many\n";
    }
    const ChildResult result = with("TMPDIR", path("none"), {"sort", "--memory", "1M"}, lines);
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(result.err.starts_with("kvt: cannot create the workspace " + path("none"))) << result.err;
    EXPECT_EQ(with("TMPDIR", "", {"sort", "--memory", "1M"}, lines).status, 0);
}

TEST_F(KvtOddCircumstance, AZoneDatabaseThatIsNoneIsNamed) {
    std::filesystem::create_directory(path("zones"));
    for (const std::vector<std::string>& arguments :
         {std::vector<std::string>{"date", "zone", "set", "20200131120000", "Europe/Berlin"},
          {"translate", "--zone", "1=Europe/Berlin"}}) {
        std::vector<std::string> all = arguments;
        all.insert(all.end(), {"--zone-database", path("zones")});
        const ChildResult result = kvt(all, "a\n");
        EXPECT_EQ(result.status, 2);
        EXPECT_TRUE(contains(result.err, "the zone database cannot be used: " + path("zones") + "/version: "))
            << result.err;
        EXPECT_TRUE(result.err.ends_with("('kvt doctor' says more)\n")) << result.err;
    }
}

TEST_F(KvtOddCircumstance, OneResultIsAnObjectToo) {
    const auto object = [&](std::vector<std::string> arguments) {
        return nlohmann::json::parse(kvt(std::move(arguments)).out);
    };
    EXPECT_EQ(object({"date", "interval", "create", "--days", "3", "--json"}),
              nlohmann::json({{"state", "Success"}, {"result", "P3D"}}));
    const nlohmann::json now = object({"date", "now", "--utc", "--json"});
    EXPECT_EQ(now["state"], "Success");
    EXPECT_TRUE(now["result"].get<std::string>().ends_with("+00:00")) << now;
}

TEST_F(KvtOddCircumstance, NothingIsProposedForAWordThatNobodyMeant) {
    EXPECT_TRUE(contains(kvt({"convret"}).err, "Did you mean 'convert'?"));
    EXPECT_FALSE(contains(kvt({"convert" + std::string(100, 't')}).err, "Did you mean"));
    EXPECT_FALSE(contains(kvt({"qqqqqq"}).err, "Did you mean"));
}

TEST_F(KvtOddCircumstance, AnEmptyFileHasNoHeaderAndNoDelimiter) {
    const ChildResult result = kvt({"infer"}, "");
    EXPECT_EQ(result.status, 0);
    EXPECT_TRUE(contains(result.out, "# Because there is no row.\nheader = false\n")) << result.out;
    EXPECT_TRUE(contains(result.out, "# No delimiter parts the rows: there is one column.\n")) << result.out;
}

TEST_F(KvtOddCircumstance, MoreColumnsThanAreLookedAtAreRefused) {
    const ChildResult result = kvt({"infer"}, std::string(1'000'000, ',') + "\n");
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.err,
              "kvt: standard input: row 1 has 1000001 cells; no more than 1000000 columns are looked at\n");
}

TEST_F(KvtOddCircumstance, ASurveySaysWhyItTakesAFormOfRows) {
    const ChildResult quoted = kvt({"infer"}, "'a';'b'\n'1;5';'2'\n'x;y';'3'\n");
    EXPECT_TRUE(contains(quoted.out, "# No cell stands in double quotes.\nquote = \"'\"\n")) << quoted.out;
    const std::string table = "name,b\n1,2\n3,4\n5,6\n";
    for (const std::string encoding : {"UTF-32BE", "UTF-32LE", "UTF-16BE", "UTF-16LE"}) {
        const ChildResult wide = kvt({"infer"}, convert("UTF-8", encoding, table).out);
        EXPECT_TRUE(contains(wide.out, "encoding = \"" + encoding + "\"\n")) << wide.out;
    }
}

TEST_F(KvtOddCircumstance, PlacesThatTakeNoFileAreNamed) {
    write("plain", "x");
    std::filesystem::create_symlink("loop", path("loop"));
    const std::pair<const char*, const char*> rows[] = {
        {"plain/x", "cannot write plain/x: Not a directory"},
        {"loop", "cannot write loop: Too many levels of symbolic links"},
        {"/dev/fd/x", "cannot create /dev/fd/x: No such file or directory"},
        {"/dev/fd/1234567", "cannot create /dev/fd/1234567: No such file or directory"},
    };
    for (const auto& [place, said] : rows) {
        const ChildResult result = kvt({"text", "upper", "-o", place}, "a\n");
        EXPECT_EQ(result.status, 2);
        EXPECT_EQ(result.err, std::string("kvt: ") + said + "\n");
    }
    EXPECT_EQ(names(), (std::vector<std::string>{"loop", "plain"}));
}

TEST_F(KvtOddCircumstance, AStandardStreamThatIsClosedIsNoFileThatWasOpenedSince) {
    const auto shell = [&](const std::string& line) {
        ChildSetup made;
        made.command = {"/bin/sh", "-c", line};
        made.folder = folder_.string();
        return runChild(made);
    };
    const std::string command = std::string("'") + KVT_PROGRAM + "' text upper ";
    write("in", "a\n");
    EXPECT_EQ(shell(command + "<&-").err, "kvt: cannot read standard input: Bad file descriptor\n");
    EXPECT_EQ(shell(command + "in >&-").err, "kvt: cannot write to standard output: Bad file descriptor\n");
    const ChildResult unsaid = shell(command + "none 2>&-");
    EXPECT_EQ(unsaid.status, 2);
    EXPECT_EQ(unsaid.out, "");
    EXPECT_EQ(shell(command + "in -o out <&- 2>&-").status, 0);
    EXPECT_EQ(read("out"), "A\n");
}

TEST_F(KvtOddCircumstance, WhatIsNoDateStandsAtTheEndAsItStood) {
    const ChildResult result = kvt({"sort", "--date", "%d.%m.%Y"}, "1.1.2020\n\xFF\n1.1.2019\n\n31.2.2018\n");
    EXPECT_EQ(result.out, "1.1.2019\n1.1.2020\n\xFF\n\n31.2.2018\n");
    EXPECT_TRUE(contains(result.err, "3 lines have no date of that format")) << result.err;
}

TEST_F(KvtOddCircumstance, NumbersThatAreNoneStandAtTheEnd) {
    const ChildResult result =
        kvt({"sort", "--number"}, "1e\n1e+\n.\n1e99999999999999999999\n0e5\n-inf\n1e-3\ninfinity\n2.50\n");
    EXPECT_TRUE(result.out.starts_with("-inf\n0e5\n1e-3\n2.50\n")) << result.out;
}

TEST_F(KvtOddCircumstance, AZoneDatabaseThatCannotBeKeptIsAsIfThereWereNone) {
    for (const char* call : {"rename", "mkdtemp"}) {
        ChildSetup made = setup({"date", "zone", "set", "20200131120000", "Europe/Berlin"});
        made.environment = {{"HOME", path("home")},
                            {"XDG_CACHE_HOME", path("cache")},
                            {"LD_PRELOAD", KVT_FAILING_CALLS},
                            {"KVT_FAULT", call},
                            {"ASAN_OPTIONS", "verify_asan_link_order=0"}};
        const ChildResult result = runChild(made);
        EXPECT_EQ(result.status, 2) << call;
        EXPECT_TRUE(contains(result.err, "kvt doctor")) << result.err;
        EXPECT_TRUE(std::filesystem::is_empty(path("cache/kvt"))) << call;
    }
}

TEST_F(KvtOddCircumstance, AWorkspaceThatCannotGrowIsRemoved) {
    ChildSetup made = setup({"sort", "--memory", "100K"});
    made.environment = {{"TMPDIR", folder_.string()}};
    for (int line = 0; line < 20'000; ++line) {
        made.input += std::to_string(line) + " is a line\n";
    }
    made.mostFileBytes = 1;
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.err, "the workspace " + folder_.string())) << result.err;
    EXPECT_TRUE(names().empty());
}

TEST_F(KvtOddCircumstance, GroupsThatTookNoPartAreNamedByFileAndLineToo) {
    write("one", "ab\ncd\n");
    write("two", "c\n");
    EXPECT_EQ(kvt({"match", "--groups", "(b)|c", "one", "two"}).out,
              "one:1:2:1:0:1:b\none:1:2:1:1:1:b\none:2:1:3:0:1:c\none:2:-:-:1:-:\n"
              "two:1:1:0:0:1:c\ntwo:1:-:-:1:-:\n");
}

} // namespace kvt::test
