// `kvt encodings`.

#include "host_test.h"

#include <nlohmann/json.hpp>

#include <set>

namespace kvt::test {

class KvtEncodings : public HostTest {
protected:
    nlohmann::json json(std::vector<std::string> names) {
        names.insert(names.begin(), {"encodings", "--json"});
        const ChildResult result = kvt(std::move(names));
        EXPECT_EQ(result.status, 0) << result.err;
        return nlohmann::json::parse(result.out);
    }
    static bool hasAlias(const nlohmann::json& entry, const std::string& alias) {
        const auto& aliases = entry["aliases"];
        return std::find(aliases.begin(), aliases.end(), alias) != aliases.end();
    }
};

TEST_F(KvtEncodings, AllOfThemWithoutAName) {
    const nlohmann::json all = json({});
    std::set<std::string> names;
    std::set<std::uint32_t> ids;
    for (const auto& entry : all) {
        EXPECT_TRUE(names.insert(entry["name"].get<std::string>()).second) << entry;
        EXPECT_TRUE(ids.insert(entry["id"].get<std::uint32_t>()).second) << entry;
    }
    // The fixed ids come first and in order, without the one that means none.
    for (std::uint32_t id = 0; id < 30; ++id) {
        EXPECT_EQ(all[id]["id"], id);
    }
    EXPECT_FALSE(ids.contains(30));
    for (const char* name : {"UTF-8", "windows-1258", "zqt-system", "zqt-binary", "zqt-wwjd", "Shift_JIS",
                             "KOI8-R", "GB18030", "UTF-7", "SCSU", "ISO-2022-JP"}) {
        EXPECT_TRUE(names.contains(name)) << name;
    }
    EXPECT_GT(all.size(), 150u);
}

TEST_F(KvtEncodings, EachHasItsProperties) {
    const nlohmann::json found = json({"latin1", "UTF-8", "Shift_JIS", "KOI8-R", "zqt-wwjd", "binary"});
    ASSERT_EQ(found.size(), 6u);
    EXPECT_EQ(found[0]["name"], "ISO-8859-1");
    EXPECT_EQ(found[0]["id"], 6);
    EXPECT_EQ(found[0]["singleByte"], true);
    EXPECT_EQ(found[0]["asciiCompatible"], true);
    EXPECT_TRUE(hasAlias(found[0], "latin1"));
    EXPECT_FALSE(hasAlias(found[0], "ISO-8859-1"));
    EXPECT_EQ(found[1]["id"], 0);
    EXPECT_EQ(found[1]["singleByte"], false);
    EXPECT_EQ(found[1]["asciiCompatible"], true);
    EXPECT_EQ(found[2]["name"], "Shift_JIS");
    EXPECT_GE(found[2]["id"], 31);
    EXPECT_EQ(found[2]["singleByte"], false);
    EXPECT_EQ(found[2]["asciiCompatible"], false);
    EXPECT_EQ(found[3]["singleByte"], true);
    EXPECT_TRUE(hasAlias(found[3], "koi8"));
    EXPECT_EQ(found[4]["id"], 29);
    EXPECT_EQ(found[4]["singleByte"], false);
    EXPECT_EQ(found[5]["name"], "zqt-binary");
    EXPECT_EQ(found[5]["id"], 28);
}

TEST_F(KvtEncodings, EveryAliasNamesItsEncoding) {
    const nlohmann::json all = json({});
    std::vector<std::string> arguments;
    std::vector<std::string> expected;
    for (const auto& entry : all) {
        for (const std::string alias : entry["aliases"]) {
            arguments.push_back(alias);
            expected.push_back(entry["name"]);
        }
    }
    const nlohmann::json found = json(arguments);
    ASSERT_EQ(found.size(), expected.size());
    for (std::size_t index = 0; index < expected.size(); ++index) {
        EXPECT_EQ(found[index]["name"], expected[index]) << arguments[index];
    }
}

TEST_F(KvtEncodings, WithoutAByteOrderItIsLittleEndian) {
    const nlohmann::json found = json({"UTF-16"});
    EXPECT_EQ(found[0]["name"], "UTF-16LE");
    EXPECT_TRUE(hasAlias(found[0], "UTF-16"));
}

TEST_F(KvtEncodings, TheTableHasTheSameContent) {
    const ChildResult result = kvt({"encodings", "KOI8-R", "US-ASCII"});
    EXPECT_EQ(result.status, 0);
    EXPECT_TRUE(contains(result.out, "name")) << result.out;
    EXPECT_TRUE(contains(result.out, "aliases\n")) << result.out;
    EXPECT_TRUE(contains(result.out, "\nUS-ASCII   1  yes          yes    ")) << result.out;
    EXPECT_TRUE(contains(result.out, "koi8")) << result.out;
}

TEST_F(KvtEncodings, AnUnknownNameIsToldAndTheOthersAreListed) {
    const ChildResult result = kvt({"encodings", "UTF-8", "windwos-1252", "KOI8-R"});
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.out, "\nUTF-8 ")) << result.out;
    EXPECT_TRUE(contains(result.out, "\nKOI8-R ")) << result.out;
    EXPECT_EQ(result.err,
              "kvt: \"windwos-1252\" is not the name of an encoding that can be used here. Did you mean "
              "'windows-1252'?\n");
    const ChildResult none = kvt({"encodings", "nothing at all like it"});
    EXPECT_EQ(none.status, 2);
    EXPECT_EQ(none.out, "");
    EXPECT_EQ(none.err,
              "kvt: \"nothing at all like it\" is not the name of an encoding that can be used here.\n");
}

} // namespace kvt::test
