// `kvt number`: the shortest text of numbers, and what is none.

#include "host_test.h"

#include <csignal>

namespace kvt::test {

namespace {

using Strings = std::vector<std::string>;

} // namespace

class KvtNumber : public HostTest {
protected:
    ChildResult number(Strings arguments, const std::string& input = {}) {
        arguments.insert(arguments.begin(), "number");
        return kvt(std::move(arguments), input);
    }
};

TEST_F(KvtNumber, PrintsTheFewestDigits) {
    struct Row {
        std::string number;
        std::string plain;
        std::string xml;
        std::string single;
        std::string singleXml;
    };
    for (const Row& row : {
             Row{"0", "0", "0", "0", "0"},
             Row{"-0.000", "-0", "-0", "-0", "-0"},
             Row{"0e999", "0", "0", "0", "0"},
             Row{"1.500", "1.5", "1.5", "1.5", "1.5"},
             Row{"+.5", "0.5", "0.5", "0.5", "0.5"},
             Row{"5.", "5", "5", "5", "5"},
             Row{" \t7 ", "7", "7", "7", "7"},
             Row{"0.1000000000000000055511151231257827", "0.1", "0.1", "0.1", "0.1"},
             Row{"0.30000000000000004", "0.30000000000000004", "0.30000000000000004", "0.3", "0.3"},
             Row{"16777217", "16777217", "16777217", "16777216", "16777216"},
             Row{"1e9", "1000000000", "1000000000", "1e+9", "1e+9"},
             Row{"1E17", "1e+17", "1e+17", "1e+17", "1e+17"},
             Row{"0.00001", "1e-5", "1e-5", "1e-5", "1e-5"},
             Row{"1e-45", "1e-45", "1e-45", "1e-45", "1e-45"},
             Row{"inf", "inf", "INF", "inf", "INF"},
             Row{"-Infinity", "-inf", "-INF", "-inf", "-INF"},
             Row{"NaN", "nan", "NaN", "nan", "NaN"},
             Row{"-nan", "-nan", "NaN", "-nan", "NaN"},
         }) {
        EXPECT_EQ(number({}, row.number + "\n").out, row.plain + "\n") << row.number;
        EXPECT_EQ(number({"--xml"}, row.number + "\n").out, row.xml + "\n") << row.number;
        EXPECT_EQ(number({"--single"}, row.number + "\n").out, row.single + "\n") << row.number;
        EXPECT_EQ(number({"--single", "--xml"}, row.number + "\n").out, row.singleXml + "\n") << row.number;
        const ChildResult result = number({"--", row.number});
        EXPECT_EQ(result.out, row.plain + "\n") << row.number;
        EXPECT_EQ(result.err, "");
        EXPECT_EQ(result.status, 0);
    }
}

TEST_F(KvtNumber, ASingleNumberIsRoundedOnce) {
    // Just above the middle of two neighbours, where a detour by double precision would land in the middle and then
    // go to the even one below.
    EXPECT_EQ(number({"--single", "1.00000005960464477540"}).out, "1.0000001\n");
}

TEST_F(KvtNumber, ExtremesAreNumbersAndWhatLiesBeyondIsNot) {
    EXPECT_EQ(number({"1.7976931348623157e308", "4.9406564584124654e-324", "2.5e-324"}).out,
              "1.7976931348623157e+308\n5e-324\n5e-324\n");
    EXPECT_EQ(number({"--single", "3.4028235e38", "1.4e-45"}).out, "3.4028235e+38\n1e-45\n");
    for (const std::string far : {"1.8e308", "-1e400", "1e-400", "2e-324", "0.0000001e-330"}) {
        const ChildResult result = number({"--", far});
        EXPECT_EQ(result.status, 2) << far;
        EXPECT_EQ(result.out, "");
        EXPECT_EQ(result.err,
                  "kvt: argument 1: \"" + far + "\" is outside the range of double-precision numbers\n");
    }
    for (const std::string far : {"3.5e38", "1e-46"}) {
        EXPECT_EQ(number({"--single", far}).err,
                  "kvt: argument 1: \"" + far + "\" is outside the range of single-precision numbers\n");
    }
}

TEST_F(KvtNumber, ALineThatIsNoNumberIsSaidAndTheRestGoesOn) {
    for (const std::string bad : {"", " ", "abc", "1x", "1 2", "1,5", "0x10", "+-1", "-+1", "--1", "++1",
                                  "1e", "e5", ".", "+", "nan(1)", "infinit", "1_000"}) {
        const ChildResult result = number({"-o", "out"}, "1\r\n2.0\n" + bad + "\n4\n");
        EXPECT_EQ(result.status, 1) << bad;
        EXPECT_EQ(result.err, "kvt: standard input: line 3: \"" + bad + "\" is not a number\n");
        EXPECT_EQ(read("out"), "1\n2\n\n4\n");
    }
    const ChildResult result = number({"1", "2.0", "bad", "4"});
    EXPECT_EQ(result.out, "1\n2\n");
    EXPECT_EQ(result.err, "kvt: argument 3: \"bad\" is not a number\n");
    EXPECT_EQ(result.status, 2);
    EXPECT_EQ(number({}, "1\n\xff\n3\n").err, "kvt: standard input: line 2: \"\\xFF\" is not a number\n");
    EXPECT_EQ(number({"1", "--max-errors", "x"}, "").status, 0);
    EXPECT_EQ(number({"--max-errors", "x"}, "1\n").status, 2);
}

TEST_F(KvtNumber, ManyFailuresAreCounted) {
    std::string input;
    for (int line = 0; line < 25; ++line) {
        input += "x" + std::to_string(line) + "\n";
    }
    input += "1e999\n7\n";
    const ChildResult result = number({"--file", write("one", input), "--file", write("two", "y\n")});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, std::string(26, '\n') + "7\n\n");
    EXPECT_TRUE(
        contains(result.err, "one: line 10: \"x9\" is not a number\n     More of this kind are counted.\n"))
        << result.err;
    EXPECT_FALSE(contains(result.err, "line 11:")) << result.err;
    EXPECT_TRUE(contains(result.err, "kvt: 27 lines failed:\n      26  such as ")) << result.err;
    EXPECT_TRUE(contains(result.err, "       1  such as " + path("one") + ": line 26: \"1e999\" is outside"))
        << result.err;

    const ChildResult reported = number({"--file", "one", "--report", "report"});
    EXPECT_FALSE(contains(reported.err, "line 2:")) << reported.err;
    const std::string report = read("report");
    EXPECT_EQ(std::count(report.begin(), report.end(), '\n'), 26);
    EXPECT_TRUE(report.starts_with("{\"file\":\"one\",\"line\":1,\"value\":\"x0\",\"reason\":")) << report;

    const ChildResult ended = number({"--file", "one", "--max-errors", "3", "-o", "out"});
    EXPECT_EQ(ended.status, 2);
    EXPECT_TRUE(contains(ended.err, "more than 3 lines failed")) << ended.err;
    EXPECT_FALSE(exists("out"));
    EXPECT_EQ(number({"--file", "one", "--max-errors", "26"}).status, 1);
}

TEST_F(KvtNumber, LinesMayBeInAnyEncoding) {
    const std::string text = convert("UTF-8", "UTF-16BE", "1.50\nx\n", {"--bom", "add"}).out;
    const ChildResult result = number({"--encoding", "UTF-16", "--progress=never"}, text);
    EXPECT_EQ(result.out, "1.5\n\n");
    EXPECT_TRUE(contains(result.err, "line 2: \"x\"")) << result.err;
    EXPECT_EQ(number({"--encoding", "nosuch"}, text).status, 2);
    EXPECT_EQ(number({"--progress=often"}, text).status, 2);
}

TEST_F(KvtNumber, LinesAreReadToTheLastOne) {
    EXPECT_EQ(number({}, "").out, "");
    EXPECT_EQ(number({}, "1").out, "1\n");
    EXPECT_EQ(number({}, "1\n2\r3\r\n").out, "1\n2\n3\n");
    std::string input;
    std::string output;
    for (int value = 0; value < 60000; ++value) {
        input += std::to_string(value) + ".0\n";
        output += std::to_string(value) + "\n";
    }
    EXPECT_TRUE(number({}, input).out == output);
}

TEST_F(KvtNumber, FailuresOfTheOutputAreAsElsewhere) {
    EXPECT_EQ(number({"1", "-o", "/dev/full"}).status, 2);
    EXPECT_EQ(number({"1.0", "-o", "out"}).out, "");
    EXPECT_EQ(read("out"), "1\n");
    ChildSetup made = setup({"number", "1"});
    made.readNothing = true;
    const ChildResult result = runChild(made);
    EXPECT_EQ(result.status, 128 + SIGPIPE);
    EXPECT_EQ(result.err, "");
}

TEST_F(KvtNumber, NumbersMayBeRecords) {
    const ChildResult lines = number({"--json"}, "1.50\nx\xff\n1e5\n");
    EXPECT_EQ(lines.out,
              "{\"line\":1,\"value\":\"1.50\",\"result\":\"1.5\"}\n"
              "{\"line\":2,\"value\":\"x\ufffd\",\"result\":null,\"message\":\"\\\"x\\\\xFF\\\" is not a "
              "number\"}\n"
              "{\"line\":3,\"value\":\"1e5\",\"result\":\"100000\"}\n");
    EXPECT_EQ(lines.err, "");
    EXPECT_EQ(lines.status, 1);
    const ChildResult given = number({"--json", "2.0", "y"});
    EXPECT_EQ(given.out, "{\"value\":\"2.0\",\"result\":\"2\"}\n"
                         "{\"value\":\"y\",\"result\":null,\"message\":\"\\\"y\\\" is not a number\"}\n");
    EXPECT_EQ(given.status, 2);
}

} // namespace kvt::test
