// `kvt date why`: what each element of a format took, and where reading stopped.

#include "host_test.h"

#include <nlohmann/json.hpp>

#include <random>

namespace kvt::test {

class KvtDateWhy : public HostTest {
protected:
    nlohmann::json why(const std::string& value, const std::string& format,
                       std::vector<std::string> more = {}) {
        more.insert(more.begin(), {"date", "why", "--json"});
        more.insert(more.end(), {"--", value, format});
        const ChildResult result = kvt(std::move(more));
        EXPECT_EQ(result.status, 0) << result.err;
        return nlohmann::json::parse(result.out);
    }

    // "%Y=2020 -=- %m!13-01 -. %d." : taken, stopped before, not reached; "~" where it is not known.
    std::string steps(const std::string& value, const std::string& format,
                      std::vector<std::string> more = {}) {
        const nlohmann::json told = why(value, format, std::move(more));
        std::string text;
        for (const auto& step : told["steps"]) {
            text += (text.empty() ? "" : " ") + step["element"].get<std::string>();
            if (step["state"] == "read") {
                text += "=" + step["taken"].get<std::string>();
            } else if (step["state"] == "stopped") {
                text +=
                    "!" + (step["offset"].is_null()
                               ? std::string("~")
                               : told["value"].get<std::string>().substr(step["offset"].get<std::size_t>()));
            } else {
                text += step["state"] == "not known" ? "~" : ".";
            }
        }
        return text;
    }
};

TEST_F(KvtDateWhy, EachElementTellsWhatItTook) {
    struct Row {
        std::string value;
        std::string format;
        std::string steps;
    };
    const std::vector<Row> rows = {
        {"20200102", "%Y%m%d", "%Y=2020 %m=01 %d=02"},
        {"2020-1-2", "%Y-%m-%d$", "%Y=2020 -=- %m=1 -=- %d=2 $="},
        {"2020-13-01", "%Y-%m-%d", "%Y=2020 -=- %m!13-01 -. %d."},
        {"2020-01", "%Y-%m-%d", "%Y=2020 -=- %m=01 -! %d."},
        {"2020-01-02xyz", "%Y-%m-%d$", "%Y=2020 -=- %m=01 -=- %d=02 $!xyz"},
        // All is read before the calendar is asked.
        {"2020-02-30", "%Y-%m-%d", "%Y=2020 -=- %m=02 -=- %d=30"},
        {"12:30:15.250 pm", "%T %p", "%T=12:30:15.250  =  %p=pm"},
        {"12:3x:15", "%T", "%T!12:3x:15"},
        {"7 March 2020 +01:30", "%d %B %Y %z", "%d=7  =  %B=March  =  %Y=2020  =  %z=+01:30"},
        {"7 Mar 2020 +0130x", "%d %b %Y %Ez", "%d=7  =  %b=Mar  =  %Y=2020  =  %Ez=+0130"},
        {"-12.5 x", "%s x", "%s=-12.5  x= x"},
        // Blanks at the end of a piece.
        {"12   30", "%H   %M", "%H=12    =    %M=30"},
        {"x? y", "?%? ?", "?=x %?=?  =  ?=y"},
        {"a b", "???%%", "?=a ?=  ?=b %%!"},
        // A literal that fails in its middle.
        {"year2020", "yearly %Y", "year=year ly !2020 %Y."},
        {"\u00e9\u00e9 12", "\u00e9\u00e8 %H", "\u00e9=\u00e9 \u00e8 !\u00e9 12 %H."},
        // Words.
        {"abcT 12", "*T %H", "*T=abcT  =  %H=12"},
        {"abcT12", "*T%H", "*T%H!abcT12"},
        {"abc 12", "* %H", "*=abc  =  %H=12"},
        {"abc% 12", "*%% %H", "*%%=abc%  =  %H=12"},
        {"one two 12:30", "* * %H:%M", "*=one  =  *=two  =  %H=12 :=: %M=30"},
        {"one 5x", "* %d*y %m", "*=one  =  %d=5 *y!x  . %m."},
        // What is wrong with the format or with a number as such.
        {"5 x", "%d %q", "%d=5  =  %q!x"},
        {"5 99999999999999", "%d %s", "%d=5  =  %s!99999999999999"},
        {"5", "%d%", "%d=5 %!"},
        {"5 x", "%d %E", "%d=5  =  %E!x"},
        {"abc 5", "*%", "*=abc %! 5"},
        // Both are read, and only then found to exclude each other.
        {"5 Z", "%s %z", "%s=5  =  %z=Z"},
        {"-0.5", "%s%z", "%s=-0.5 %z!"},
        {"5 Z x", "%s %z x", "%s=5  =  %z=Z  x= x"},
        {"Z 5 x", "%z %s x", "%z=Z  =  %s=5  x= x"},
        {"5 Zx", "%s %z$", "%s=5  =  %z=Z $!x"},
        {"5 Z", "%s %z$x", "%s=5  =  %z=Z $! x."},
        // Behind a "%T", which the message tells as what it stands for.
        {"12:30:05x", "%T$", "%T=12:30:05 $!x"},
        {"12:30:05 1:2", "%T %T", "%T=12:30:05  =  %T!1:2"},
        {"%T 1:2:3 x", "%%T %T y", "%%=% T =T  %T=1:2:3  =  y!x"},
        {"*T 1:2:3 x", "*T %T %H", "*T=*T  =  %T=1:2:3  =  %H!x"},
        // "$" ends what a word has to end in, also that of "%$".
        {"x", "%H*%$", "%H!x *. %$."},
    };
    for (const Row& row : rows) {
        EXPECT_EQ(steps(row.value, row.format), row.steps) << row.value << " | " << row.format;
    }
}

TEST_F(KvtDateWhy, PartsOfCharactersAreNotGuessed) {
    EXPECT_EQ(steps("\u00e9"
                    "12",
                    "??%H"),
              "?~ ?~ %H=12");
    EXPECT_EQ(steps("\u00e9"
                    "12",
                    "?%H"),
              "?~ %H!~");
}

TEST_F(KvtDateWhy, LenientIsAsInParse) {
    EXPECT_EQ(steps("2020-13-01", "%Y-%m-%d", {"--lenient"}), "%Y=2020 -=- %m=13 -=- %d=01");
    EXPECT_EQ(why("2020-13-01", "%Y-%m-%d", {"--lenient"})["result"], "20210101");
}

// What the elements took makes up the value without gaps, and the outcome is that of `parse`.
TEST_F(KvtDateWhy, StepsAddUpForRandomPairs) {
    const std::vector<std::string> elements = {"%Y", "%m", "%d", "%H", "%M", "%S", "%b",
                                               "%z", "-",  " ",  "?",  "*",  "T"};
    const std::vector<std::string> texts = {"2020",   "12", "05", "9", "30.5", "Jan",
                                            "+01:00", "-",  " ",  "x", "T"};
    std::minstd_rand random(20200102);
    for (int round = 0; round < 150; ++round) {
        std::string format = "%H";
        std::string value = "12";
        for (int i = 0; i < 4; ++i) {
            format += elements[random() % elements.size()];
            value += texts[random() % texts.size()];
        }
        const nlohmann::json told = why(value, format);
        std::size_t place = 0;
        bool stopped = false;
        for (const auto& step : told["steps"]) {
            if (step["state"] == "read") {
                EXPECT_FALSE(stopped);
                EXPECT_EQ(step["offset"], place) << value << " | " << format;
                const std::string taken = step["taken"];
                EXPECT_EQ(told["value"].get<std::string>().substr(place, taken.size()), taken);
                place += taken.size();
            } else {
                stopped = stopped || step["state"] == "stopped";
                EXPECT_TRUE(stopped) << value << " | " << format;
            }
        }
        const nlohmann::json parsed =
            nlohmann::json::parse(kvt({"date", "parse", "--json", "--", value, format}).out);
        EXPECT_EQ(told["result"], parsed["result"]);
        EXPECT_EQ(stopped, parsed.contains("message") && parsed["message"]["number"] == 933067)
            << value << " | " << format;
    }
}

TEST_F(KvtDateWhy, ShowsATable) {
    const ChildResult result = kvt({"date", "why", "2020-13-01", "%Y-%m-%d"});
    EXPECT_EQ(result.out,
              "element  reads                                      took\n"
              "\"%Y\"     year: up to 4 digits, 1000 to 9999         \"2020\"\n"
              "\"-\"      itself                                     \"-\"\n"
              "\"%m\"     month: up to 2 digits, 1 to 12             stopped at \"13-01\"\n"
              "\"-\"      itself                                     not reached\n"
              "\"%d\"     day of the month: up to 2 digits, 1 to 31  not reached\n"
              "no result: The value fits the format up to \"%Y-\" but not where the format goes on with "
              "\"%m-%d\". (933067)\n"
              "     %Y-%m-%d\n"
              "        ^\n");
    EXPECT_EQ(result.err, "");
    const std::string rest = kvt({"date", "why", "2020010203", "%Y%m%d"}).out;
    EXPECT_TRUE(contains(rest, "exactly 2 digits")) << rest;
    EXPECT_TRUE(contains(rest, "not looked at: \"03\"\nresult: 20200102\n")) << rest;
    EXPECT_TRUE(contains(kvt({"date", "why", "", "%Y"}).out, "no result: The value is empty.\n"));
}

TEST_F(KvtDateWhy, KeywordsAreToldFormByForm) {
    EXPECT_EQ(kvt({"date", "why", "2020-01-02T03:04:05", "foo|zqt|ISO"}).out,
              "keyword  form                   result\n"
              "foo      no known keyword       passed over\n"
              "zqt      the canonical form     does not fit\n"
              "ISO      %Y-%m-%d$              \"$\" stopped at \"T03:04:05\"\n"
              "ISO      %Y-%m-%dT%H:%M:%S$     fits\n"
              "ISO      %Y-%m-%dT%H:%M:%S%Ez$  not tried\n"
              "ISO      %H:%M:%S$              not tried\n"
              "ISO      %H:%M:%S%Ez$           not tried\n"
              "result: 20200102030405\n");
    EXPECT_TRUE(contains(kvt({"date", "why", "20200102", "foo"}).out, "(933075)\n"));
    const nlohmann::json told = why("20200102", "ZQT|ISO");
    EXPECT_EQ(told["result"], "20200102");
    EXPECT_EQ(told["tries"][0]["fits"], true);
    EXPECT_EQ(told["tries"][1]["tried"], false);
}

TEST_F(KvtDateWhy, AnUnknownFlagIsAnsweredWithThoseThatThereAre) {
    const ChildResult result = kvt({"date", "why", "2020", "%Q"});
    EXPECT_TRUE(contains(result.out, "\"%Q\" is no flag that 'parse' knows. There are %")) << result.out;
    const ChildResult record = kvt({"date", "why", "2020", "%Q", "--json"});
    EXPECT_FALSE(contains(record.out, "@")) << record.out;
}

} // namespace kvt::test
