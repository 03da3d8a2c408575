// The table of the pattern language, in words and on paper, and what a trace reports.

#include "answer.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/pattern_trace.h>

#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::ustring;

// ---- The table

std::string contentOf(const std::string& file) {
    std::ifstream stream(KVT_SOURCE_DIR "/" + file);
    std::stringstream content;
    content << stream.rdbuf();
    return content.str();
}

// An element in a row of a table of the guide.
std::string cell(const kvt::ex::UString<0>& words) {
    return words.isEmpty() ? "-" : words.toStdString();
}

// The elements that have these words, as the comment of a function lists them.
std::string commentOf(kvt::ex::UString<0> PatternElement::*words) {
    std::string text;
    for (const PatternElement& row : patternElements()) {
        if (!(row.*words).isEmpty()) {
            std::string element = row.element.toStdString();
            element.resize(5, ' ');
            text += "///     " + element + (row.*words).toStdString() + "\n";
        }
    }
    return text;
}

TEST(PatternTable, IsTheOneOfTheGuide) {
    std::string table = "| flag | `parse` reads | `format` writes |\n|---|---|---|\n";
    for (const PatternElement& row : patternElements()) {
        table +=
            "| `" + row.element.toStdString() + "` | " + cell(row.reads) + " | " + cell(row.writes) + " |\n";
    }
    EXPECT_NE(contentOf("docs/dates.md").find("\n" + table + "\n"), std::string::npos)
        << "docs/dates.md has to have this table:\n"
        << table;
}

TEST(PatternTable, IsTheOneOfTheDeclarations) {
    for (const auto words : {&PatternElement::reads, &PatternElement::writes}) {
        const std::string comment = commentOf(words);
        EXPECT_NE(contentOf("kvt/datetime/datetime.h").find("///\n" + comment + "///\n"), std::string::npos)
            << "kvt/datetime/datetime.h has to have this comment:\n"
            << comment;
    }
}

// What the table says about a flag is what the functions do with it.
TEST(PatternTable, KnowsWhatTheFunctionsKnow) {
    for (const PatternElement& row : patternElements()) {
        SCOPED_TRACE(row.element.toStdString());
        if (row.element.size() == 1) {
            continue;
        }
        const auto read = parse("x", row.element, false);
        EXPECT_EQ(!row.reads.isEmpty(), !std::get<2>(read) || std::get<2>(read)->messageNumber != 933079u);
        bool isKnown = false;
        for (const char* value :
             {"20200102", "030405", "20200102030405", "030405+01:00", "20200102030405+01:00"}) {
            const auto written = format(value, row.element);
            isKnown |= std::get<0>(written) == ReturnState::Success;
        }
        EXPECT_EQ(!row.writes.isEmpty(), isKnown);
    }
}

// ---- Traces

struct Step {
    std::string element;
    PatternStepState state;
    std::string taken;
    std::string why;

    friend bool operator==(const Step&, const Step&) = default;
    friend std::ostream& operator<<(std::ostream& stream, const Step& step) {
        return stream << step.element << " " << static_cast<unsigned>(step.state) << " [" << step.taken
                      << "] " << step.why;
    }
};

std::vector<Step> stepsOf(const PatternTrace& trace) {
    std::vector<Step> steps;
    for (const PatternStep& step : trace.steps) {
        steps.push_back(
            {step.element.toStdString(), step.state, step.taken.toStdString(), step.why.toStdString()});
    }
    return steps;
}

std::vector<Step> stepsOf(const std::string& value, const std::string& format, bool lenient = false) {
    return stepsOf(traceParse(ustring(value), ustring(format), lenient).front());
}

constexpr auto Read = PatternStepState::Read;
constexpr auto Stopped = PatternStepState::Stopped;
constexpr auto NotReached = PatternStepState::NotReached;
constexpr auto Unknown = PatternStepState::Unknown;

TEST(ParseTrace, ReportsWhatEachElementTook) {
    EXPECT_EQ(stepsOf(" 2020-1-02T3:4:5.25x ", "%Y-%m-%dT%T"),
              (std::vector<Step>{{"%Y", Read, "2020", ""},
                                 {"-", Read, "-", ""},
                                 {"%m", Read, "1", ""},
                                 {"-", Read, "-", ""},
                                 {"%d", Read, "02", ""},
                                 {"T", Read, "T", ""},
                                 {"%T", Read, "3:4:5.25", ""}}));
    const auto traces = traceParse(" 2020-1-02T3:4:5.25x ", "%Y-%m-%dT%T", false);
    ASSERT_EQ(traces.size(), 1u);
    EXPECT_EQ(traces[0].end, 18u);
    EXPECT_EQ(kvt::test::answerOf(traces[0].result), kvt::test::success("20200102030405.25"));
    EXPECT_EQ(traces[0].steps[2].at, 5u);
}

TEST(ParseTrace, ReportsWhyAnElementStopped) {
    const struct {
        const char* value;
        const char* format;
        const char* element;
        const char* why;
    } rows[] = {
        {"2020-13", "%Y-%m", "%m", "The number is out of its bounds."},
        {"2020-x", "%Y-%m", "%m", "No digit stands here."},
        {"20201", "%Y%m", "%m", "There are too few digits."},
        {"2020", "%Y%m", "%m", "The value ends here."},
        {"2020", "%Y-", "-", "The value ends here."},
        {"2020/", "%Y-", "-", "Another character stands here."},
        {"2020/", "%Y$", "$", "The value goes on."},
        {"2020", "%Y$x", "$", "The format goes on behind it."},
        {"1 Mai", "%d %B", "%B", "The name is not known."},
        {"1 Ma", "%d %b", "%b", "The value ends here."},
        {"1 xm", "%I %p", "%p", "The name is not known."},
        {"12x", "%H%z", "%z", "An offset begins with Z, + or -."},
        {"12:3x", "%T", "%T", "Another character stands here."},
        {"abc 1", "*x %d", "*x", "The word ends in something else."},
        {"abc 1", "*? %d", "*?", "What follows a * has to be known text or a flag."},
        {"1", "%d%q", "%q", "There is no such flag."},
        {"253402300800", "%s", "%s", "The seconds are outside of the years 1000 to 9999."},
        {"-", "%s", "%s", "No digit stands here."},
    };
    for (const auto& row : rows) {
        const std::vector<Step> steps = stepsOf(row.value, row.format);
        const auto stopped =
            std::find_if(steps.begin(), steps.end(), [](const Step& step) { return step.state == Stopped; });
        ASSERT_NE(stopped, steps.end()) << row.value << " by " << row.format;
        EXPECT_EQ(*stopped, (Step{row.element, Stopped, "", row.why})) << row.value << " by " << row.format;
    }
}

TEST(ParseTrace, GoesByWholeCharacters) {
    EXPECT_EQ(stepsOf("\u00e9\u00e9 12", "\u00e9\u00e8 %H"),
              (std::vector<Step>{{"\u00e9", Read, "\u00e9", ""},
                                 {"\u00e8 ", Stopped, "", "Another character stands here."},
                                 {"%H", NotReached, "", ""}}));
    EXPECT_EQ(stepsOf("\u00e9", "??%%"), (std::vector<Step>{{"?", Unknown, "", ""},
                                                            {"?", Unknown, "", ""},
                                                            {"%%", Stopped, "", "The value ends here."}}));
    EXPECT_EQ(stepsOf("1", "%\u00e9x").front(), (Step{"%\u00e9", Stopped, "", "There is no such flag."}));
}

TEST(ParseTrace, TellsWhatAnElementReadsHere) {
    const auto traces = traceParse("20200102", "%Y%m%j*x %S", false);
    const char* const reads[] = {"year: up to 4 digits, 1000 to 9999",
                                 "month: exactly 2 digits, 1 to 12",
                                 "day of the year: up to 3 digits, 1 to 366",
                                 "one word, up to a blank, that ends in what follows",
                                 "itself",
                                 "second: up to 2 digits, 0 to 59, and a fraction"};
    ASSERT_EQ(traces[0].steps.size(), std::size(reads));
    for (std::size_t i = 0; i < std::size(reads); ++i) {
        EXPECT_EQ(traces[0].steps[i].reads, reads[i]);
    }
    EXPECT_EQ(traceParse("13", "%m", true)[0].steps[0].reads, "month: up to 2 digits, from 1");
}

TEST(ParseTrace, HasOneForEachFormOfAKeyword) {
    const auto traces = traceParse("2020-01-02T03:04:05", "foo| zqt |ISO", false);
    ASSERT_EQ(traces.size(), 7u);
    EXPECT_FALSE(traces[0].isKnown);
    EXPECT_EQ(traces[1].keyword, "zqt");
    EXPECT_FALSE(traces[1].isPattern);
    EXPECT_EQ(kvt::test::answerOf(traces[1].result), kvt::test::failure(933097, {"2020-01-02T03:04:05"}));
    EXPECT_EQ(traces[2].form, "%Y-%m-%d$");
    EXPECT_EQ(traces[2].steps.back().state, Stopped);
    EXPECT_EQ(kvt::test::answerOf(traces[3].result), kvt::test::success("20200102030405"));
    for (std::size_t i = 0; i < traces.size(); ++i) {
        EXPECT_EQ(traces[i].wasTried, i >= 1 && i <= 3) << i;
    }
}

TEST(ParseTrace, EndsWithTheKeywordThatSettlesIt) {
    for (const char* const value : {"20200102", "20201302"}) { // read, or such a form but out of range
        const auto traces = traceParse(ustring(value), "ZQT|ISO|ZQT", false);
        ASSERT_EQ(traces.size(), 7u);
        EXPECT_EQ(kvt::test::answerOf(traces[0].result),
                  kvt::test::answerOf(parse(ustring(value), "ZQT", false)));
        for (std::size_t i = 0; i < traces.size(); ++i) {
            EXPECT_EQ(traces[i].wasTried, i == 0) << value << ": " << i;
        }
    }
}

TEST(ParseTrace, OfNothingReachesNothing) {
    EXPECT_EQ(stepsOf("", "%Y-"), (std::vector<Step>{{"%Y", NotReached, "", ""}, {"-", NotReached, "", ""}}));
    EXPECT_EQ(stepsOf("2020", ""), std::vector<Step>());
}

} // namespace
