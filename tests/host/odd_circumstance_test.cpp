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

} // namespace kvt::test
