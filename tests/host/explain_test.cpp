// `kvt explain`, and that the program itself speaks by the same catalogue.

#include "host_test.h"

namespace kvt::test {

class KvtExplain : public HostTest {};

TEST_F(KvtExplain, EveryMessageOfTheLibraryHasAText) {
    struct Row {
        std::string number;
        std::vector<std::string> placeholders;
    };
    for (const Row& row : {Row{"910002", {"%0", "%1"}}, Row{"910003", {"%0", "%1", "%2"}},
                           Row{"910004", {"%0"}}, Row{"910005", {"%0"}}}) {
        const ChildResult result = kvt({"explain", row.number});
        EXPECT_EQ(result.status, 0);
        EXPECT_EQ(result.err, "");
        for (const std::string& placeholder : row.placeholders) {
            EXPECT_TRUE(contains(result.out, placeholder)) << result.out;
        }
        EXPECT_EQ(result.out.back(), '\n');
    }
}

TEST_F(KvtExplain, ParametersTakeTheirPlaces) {
    EXPECT_EQ(kvt({"explain", "910003", "Caf\u00e9", "UTF-8", "US-ASCII"}).out,
              "The text \"Caf\u00e9\", read as UTF-8, holds something that does not exist in US-ASCII.\n");
    EXPECT_EQ(kvt({"explain", "910002", "\\xE9"}).out, "The bytes \"\\xE9\" are not valid %1.\n");
}

TEST_F(KvtExplain, ParametersAreNotLookedAtAgain) {
    EXPECT_EQ(kvt({"explain", "910002", "%1%0%", "%0"}).out, "The bytes \"%1%0%\" are not valid %0.\n");
    EXPECT_EQ(kvt({"explain", "910005", ""}).out,
              "\"\" is not the name of an encoding that can be used here.\n");
}

TEST_F(KvtExplain, UnknownNumbersAreRefusedWithTheKnownOnes) {
    for (const std::string number : {"1", "910006", "91000", "910002x", "", "99999999999999999999"}) {
        const ChildResult result = kvt({"explain", number});
        EXPECT_EQ(result.status, 2) << number;
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(result.err,
                  "kvt: there is no message " + number + "; there are 910002, 910003, 910004, 910005\n");
    }
}

TEST_F(KvtExplain, ParametersThatHaveNoPlaceAreRefused) {
    const ChildResult result = kvt({"explain", "910004", "a", "b"});
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(result.err, "kvt: message 910004 takes 1 parameter, not 2\n");
}

TEST_F(KvtExplain, TheProgramsOwnFailuresSpeakByTheCatalogue) {
    const auto explained = [&](std::vector<std::string> arguments) {
        arguments.insert(arguments.begin(), "explain");
        const std::string text = kvt(arguments).out;
        return text.substr(0, text.size() - 1);
    };
    EXPECT_TRUE(contains(convert("UTF-8", "US-ASCII", "\u0141").err,
                         explained({"910003", "\u0141", "UTF-8", "US-ASCII"})));
    EXPECT_TRUE(contains(convert("UTF-8", "US-ASCII", "\xff").err, explained({"910002", "\\xFF", "UTF-8"})));
    EXPECT_TRUE(contains(convert("UTF-9x", "US-ASCII", "").err, explained({"910005", "UTF-9x"})));
}

} // namespace kvt::test
