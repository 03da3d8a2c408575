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

TEST_F(KvtExplain, EveryMessageOfTheCommandHasAText) {
    EXPECT_EQ(kvt({"explain", "920001"}).out, "The quote that opens here is never closed.\n");
    EXPECT_EQ(kvt({"explain", "920002"}).out, "There is text behind the closing quote.\n");
    EXPECT_EQ(kvt({"explain", "920003"}).out, "The row has a byte of zero.\n");
    EXPECT_EQ(kvt({"explain", "920004", "1 cell", "2 columns"}).out,
              "The row has 1 cell, but the table has 2 columns.\n");
    EXPECT_EQ(kvt({"explain", "920005", "n/a", "de"}).out,
              "\"n/a\" is not a number as it is written in de.\n");
    EXPECT_EQ(kvt({"explain", "920006", "a-b-c", "3 pieces", "2"}).out,
              "\"a-b-c\" gives 3 pieces, but there are columns for 2.\n");
    EXPECT_EQ(kvt({"explain", "920007", "aaa"}).out, "The regular expression takes too long on \"aaa\".\n");
}

// The numbers as the library declares them, ordered.
std::vector<std::string> dateNumbers() {
    std::ifstream header(KVT_SOURCE_DIR "/kvt/datetime/message_numbers.h");
    std::vector<std::string> numbers;
    for (std::string line; std::getline(header, line);) {
        const std::size_t number = line.find(" 933");
        if (number != std::string::npos && line.substr(number + 7, 1) == ";") {
            numbers.push_back(line.substr(number + 1, 6));
        }
    }
    std::sort(numbers.begin(), numbers.end());
    return numbers;
}

TEST_F(KvtExplain, EveryNumberOfTheDateFunctionsHasAText) {
    const std::vector<std::string> numbers = dateNumbers();
    ASSERT_EQ(numbers.size(), 33u);
    for (const std::string& number : numbers) {
        const ChildResult result = kvt({"explain", number});
        EXPECT_EQ(result.status, 0) << number;
        EXPECT_GT(result.out.size(), 10u) << number;
    }
}

TEST_F(KvtExplain, TextsOfTheDateFunctionsTakeAsManyParametersAsThereAre) {
    struct Row {
        std::string number;
        std::size_t parameters;
    };
    for (const Row& row :
         {Row{"933050", 1}, Row{"933052", 2}, Row{"933059", 2}, Row{"933060", 2}, Row{"933063", 1},
          Row{"933064", 1}, Row{"933065", 4}, Row{"933067", 2}, Row{"933068", 0}, Row{"933071", 1},
          Row{"933073", 1}, Row{"933074", 0}, Row{"933075", 1}, Row{"933076", 0}, Row{"933078", 2},
          Row{"933079", 2}, Row{"933081", 1}, Row{"933082", 1}, Row{"933083", 2}, Row{"933084", 0},
          Row{"933085", 1}, Row{"933086", 1}, Row{"933087", 1}, Row{"933088", 1}, Row{"933089", 1},
          Row{"933090", 1}, Row{"933091", 1}, Row{"933092", 0}, Row{"933093", 1}, Row{"933094", 1},
          Row{"933095", 1}, Row{"933096", 1}, Row{"933097", 1}}) {
        std::vector<std::string> arguments = {"explain", row.number};
        for (std::size_t i = 0; i < row.parameters; ++i) {
            arguments.push_back("<" + std::to_string(i) + ">");
        }
        const ChildResult result = kvt(arguments);
        EXPECT_EQ(result.status, 0) << row.number << result.err;
        for (std::size_t i = 0; i < row.parameters; ++i) {
            EXPECT_TRUE(contains(result.out, arguments[i + 2])) << result.out;
        }
        arguments.push_back("more");
        EXPECT_EQ(kvt(arguments).status, 2) << row.number;
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
    std::string numbers = "910002, 910003, 910004, 910005";
    for (int own = 920001; own <= 920007; ++own) {
        numbers += ", " + std::to_string(own);
    }
    for (const std::string& known : dateNumbers()) {
        numbers += ", " + known;
    }
    for (const std::string number :
         {"1", "910006", "920008", "933051", "933098", "91000", "910002x", "", "99999999999999999999"}) {
        const ChildResult result = kvt({"explain", number});
        EXPECT_EQ(result.status, 2) << number;
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(result.err, "kvt: there is no message " + number + "; there are " + numbers + "\n");
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
