// `kvt translate` as its users run it.

#include "translate_test.h"

#include <nlohmann/json.hpp>

#include <random>
#include <sstream>

namespace kvt::test {

namespace {

const std::string people = "name;born;amount\r\nMüller;31.12.1999;1.234,50\r\n\"O;Neil\";01.02.2003;-7\r\n";

nlohmann::json firstLine(const std::string& text) {
    return nlohmann::json::parse(text.substr(0, text.find('\n')));
}

} // namespace

class KvtTranslate : public TranslateTest {};

// ---- Rows

TEST_F(KvtTranslate, WhatIsNotTouchedIsWrittenAsItStood) {
    for (const std::string input : {"a,b\n\"1\",  2\n", "a\r\nb\rc\nd", "\"a\nb\",\"\"\"\"\n,\n", "", "a"}) {
        EXPECT_EQ(out(input, {}), input);
    }
}

TEST_F(KvtTranslate, FormsOfRowsChange) {
    EXPECT_EQ(out("a;b\n1,5;\"x;y\"\n",
                  {"--delimiter", "semicolon", "--out-delimiter", ",", "--line-ends", "crlf"}),
              "a,b\r\n\"1,5\",\"x;y\"\r\n");
    EXPECT_EQ(out("a\tb\n1\t\"x\"\"\"\n", {"--delimiter", "tab", "--quote-all"}),
              "\"a\"\t\"b\"\n\"1\"\t\"x\"\"\"\n");
    EXPECT_EQ(out("1|2", {"--delimiter", "|", "--no-header", "--line-ends", "lf", "--drop", "1"}), "2\n");
}

TEST_F(KvtTranslate, EncodingsChange) {
    EXPECT_EQ(out("a\xFC;\n", {"--from", "windows-1252"}), "aü;\n");
    EXPECT_EQ(out("aü\n", {"--to", "UTF-16BE"}), std::string("\0a\0\xFC\0\n", 6));
    EXPECT_EQ(out(std::string("\xFF\xFE"
                              "a\0,\0b\0\n\0",
                              10),
                  {"--from", "UTF-16", "--drop", "b"}),
              "a\n");
}

TEST_F(KvtTranslate, SeveralFilesBecomeOneTable) {
    write("one", "a,b\n1,2");
    write("two", "a,b\n3,4\n");
    EXPECT_EQ(out("", {path("one"), path("two")}), "a,b\n1,2\n3,4\n");
    write("other", "a,c\n3,4\n");
    const ChildResult result = translate("", {path("one"), path("other"), "-o", path("out")});
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.err, "column 2 is called 'c', and 'b' in the first file")) << result.err;
    EXPECT_FALSE(exists("out"));
}

TEST_F(KvtTranslate, RowsThatAreNoneOfTheTableAreReportedAndNeverWritten) {
    const std::string input = "a,b\n1,2,3\n4\n\"x\"y,5\n" + std::string("\0,6\n", 4) + "7,8\n9,\"open\n";
    const ChildResult result =
        translate(input, {"--on-error", "keep", "--report", path("report"), "-o", path("out")});
    EXPECT_EQ(result.status, 1) << result.err;
    EXPECT_EQ(read("out"), "a,b\n7,8\n");
    std::vector<std::pair<std::uint64_t, std::uint64_t>> places;
    std::istringstream lines(read("report"));
    for (std::string line; std::getline(lines, line);) {
        const auto object = nlohmann::json::parse(line);
        EXPECT_TRUE(object.at("column").is_null());
        places.emplace_back(object.at("row"), object.at("offset"));
    }
    const std::vector<std::pair<std::uint64_t, std::uint64_t>> expected = {
        {2, 4}, {3, 10}, {4, 15}, {5, 19}, {7, 29}};
    EXPECT_EQ(places, expected);
}

// ---- Columns

TEST_F(KvtTranslate, DatesAndNumbersBecomeCanonical) {
    EXPECT_EQ(out(people, {"--delimiter", ";", "--date", "born=%d.%m.%Y", "--number", "3=de"}),
              "name;born;amount\r\nMüller;19991231;1234.50\r\n\"O;Neil\";20030201;-7\r\n");
}

TEST_F(KvtTranslate, SeveralFormatsAreTriedInTurn) {
    EXPECT_EQ(out("d\n2020-01-31\n3/4/2020\n1.2.2020\n\n", {"--date", "d=ISO|%d.%m.%Y|%m/%d/%Y"}),
              "d\n20200131\n20200304\n20200201\n\n");
    EXPECT_EQ(out("d\n1|2|2020\n", {"--date", "d=%d||%m||%Y"}), "d\n20200201\n");
}

TEST_F(KvtTranslate, YearsOfTwoDigitsNeedAPivot) {
    EXPECT_EQ(out("d\n31.01.69\n31.01.70\n1.1.00\n", {"--pivot", "70", "--date", "d=%d.%m.%y"}),
              "d\n20690131\n19700131\n20000101\n");
    const ChildResult result = translate("d\n1.1.20\n", {"--date", "d=%d.%m.%y"});
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.err, "pivot")) << result.err;
}

TEST_F(KvtTranslate, MonthsHaveNamesInOtherLanguages) {
    EXPECT_EQ(out("d\n3. März 2020\n4. DEZEMBER 2020\n5. Mai 2020\n6. Sept. 2020\n",
                  {"--months", "de", "--date", "d=%d. %B %Y"}),
              "d\n20200303\n20201204\n20200505\n20200906\n");
    EXPECT_EQ(out("d\n1 août 2020\n", {"--months", "fr_CA", "--date", "d=%d %b %Y"}), "d\n20200801\n");
    EXPECT_EQ(translate("d\n", {"--months", "xx", "--date", "d=%d %B %Y"}).status, 2);
}

TEST_F(KvtTranslate, TheWholeCellHasToFit) {
    EXPECT_EQ(translate("d\n2020-01-31x\n", {"--date", "d=%Y-%m-%d"}).status, 2);
    EXPECT_EQ(translate("d\n31.02.2020\n", {"--date", "d=%d.%m.%Y"}).status, 2);
}

TEST_F(KvtTranslate, DatesMoveAndAreWritten) {
    EXPECT_EQ(out("d\n20200131\n", {"--add", "d=P1M", "--write-date", "d=%d.%m.%Y"}), "d\n29.02.2020\n");
    EXPECT_EQ(out("d\n20200131120000+01:00\n", {"--zone", "d=+00:00:convert"}), "d\n20200131110000+00:00\n");
    EXPECT_EQ(out("d\n20200131120000\n", {"--zone", "d=+05:30"}), "d\n20200131120000+05:30\n");
}

TEST_F(KvtTranslate, NumbersAreReadByLanguage) {
    const auto number = [&](const std::string& typed, const std::string& language) {
        const ChildResult result =
            translate("n\n\"" + typed + "\"\n",
                      {"--number", language.empty() ? "n" : "n=" + language, "--on-error", "keep"});
        return result.status == 0 ? result.out.substr(2, result.out.size() - 3)
                                  : "?" + std::to_string(result.status);
    };
    EXPECT_EQ(number("1,234.50", ""), "1234.50");
    EXPECT_EQ(number("$ -1,234", "en"), "-1234");
    EXPECT_EQ(number("1 234,5 €", "fr"), "1234.5");
    EXPECT_EQ(number("1\u202F234\u00A0€", "fr"), "1234");
    EXPECT_EQ(number("1'234.5", "de_CH"), "1234.5");
    EXPECT_EQ(number("CHF 1’234.5", "de-CH"), "1234.5");
    EXPECT_EQ(number("12,50-", "de"), "-12.50");
    EXPECT_EQ(number("\u22123", "de"), "-3");
    EXPECT_EQ(number("0007,10", "de"), "7.10");
    EXPECT_EQ(number("-0,00", "de"), "0.00");
    EXPECT_EQ(number("123456789012345678901234567890,123456789012345678901234567890", "de"),
              "123456789012345678901234567890.123456789012345678901234567890");
    for (const std::string wrong :
         {"1.23", "1.234.5", "12.34.567", "1,2,3", "--1", "-1-", "abc", "€", "1e5", "1,", ","}) {
        EXPECT_EQ(number(wrong, "de"), "?1") << wrong;
    }
    EXPECT_EQ(translate("n\n1\n", {"--number", "n=xx"}).status, 2);
}

TEST_F(KvtTranslate, TextChanges) {
    EXPECT_EQ(out("a,b\nStraße, x \n", {"--case", "a=upper", "--strip", "b"}), "a,b\nSTRASSE,x\n");
    EXPECT_EQ(out("a\nxxabxx\n", {"--strip", "a=x", "--replace", "a=/(a)(b)/$2$1/"}), "a\nba\n");
    EXPECT_EQ(out("a\nu\u0308\n", {"--normalize", "a"}), "a\nü\n");
    EXPECT_EQ(out("a\nﬁ\n", {"--normalize", "a=nfkc"}), "a\nfi\n");
    EXPECT_EQ(out("a\nxy\n", {"--replace", "a=#x#x,#"}), "a\n\"x,y\"\n");
}

TEST_F(KvtTranslate, ColumnsComeAndGo) {
    EXPECT_EQ(out("a,b,c\n1,2,3\n", {"--drop", "b"}), "a,c\n1,3\n");
    EXPECT_EQ(out("a,b,c\n1,2,3\n", {"--keep", "c,1", "--rename", "c=x"}), "x,a\n3,1\n");
    EXPECT_EQ(out("a,b\n1 2 3,4\n1,4\n", {"--split", "a= :x,y,z"}), "x,y,z,b\n1,2,3,4\n1,,,4\n");
    EXPECT_EQ(out("a,b,c\n1,2,3\n", {"--join", "d=c,a:-"}), "b,d\n2,3-1\n");
    EXPECT_EQ(out("a,b\n1,x\n2,y\n", {"--where", "b~[y-z]"}), "a,b\n2,y\n");
    EXPECT_EQ(out("a,b\n1,x\n2,y\n", {"--where", "b!~[y-z]"}), "a,b\n1,x\n");
}

TEST_F(KvtTranslate, StepsAreDoneInTheirOrder) {
    EXPECT_EQ(out("a\n x1 \n", {"--replace", "a=/^x/y/", "--strip", "a"}), "a\nx1\n");
    EXPECT_EQ(out("a\n x1 \n", {"--strip", "a", "--replace", "a=/^x/y/"}), "a\ny1\n");
}

TEST_F(KvtTranslate, RowsAreSortedOrMadeUnique) {
    const std::string input = "k,v\nb,1\na,2\nb,3\n";
    EXPECT_EQ(out(input, {"--sort", "k"}), "k,v\na,2\nb,1\nb,3\n");
    EXPECT_EQ(out(input, {"--unique", "k"}), "k,v\nb,1\na,2\n");
    const ChildResult result = translate(input, {"--unique", "k"});
    EXPECT_TRUE(contains(result.err, "3 rows read, 2 written, 0 rejected, 1 skipped")) << result.err;
}

TEST_F(KvtTranslate, WrongJobsAreRefused) {
    for (const std::vector<std::string>& arguments : {std::vector<std::string>{"--drop", "x"},
                                                      {"--date", "a=%Q"},
                                                      {"--date", "a"},
                                                      {"--replace", "a=/(/x/"},
                                                      {"--case", "a=title"},
                                                      {"--normalize", "a=nfx"},
                                                      {"--add", "a=1D"},
                                                      {"--delimiter", "ab"},
                                                      {"--delimiter", "\""},
                                                      {"--sort", "a", "--drop", "a"},
                                                      {"--threads", "0"},
                                                      {"--part", "3/2"},
                                                      {"--reject", "r", "--on-error", "keep"},
                                                      {"--from", "nothing"},
                                                      {"--drop", "a"}}) {
        const ChildResult result = translate("a\n1\n", arguments);
        EXPECT_EQ(result.status, 2) << arguments.back();
        EXPECT_EQ(result.out, "") << arguments.back();
        EXPECT_TRUE(result.err.starts_with("kvt: ")) << result.err;
    }
    EXPECT_TRUE(contains(translate("name\n", {"--drop", "nane"}).err, "Did you mean 'name'?"));
    EXPECT_TRUE(contains(translate("a,a\n", {"--drop", "a"}).err, "several columns"));
}

// ---- Failures

const std::string dates = "k,d\n1,01.02.2020\n2,x\n3,31.02.2020\n4,\n";

TEST_F(KvtTranslate, StopLeavesNoResult) {
    const ChildResult result = translate(dates, {"--date", "d=%d.%m.%Y", "-o", path("out")});
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.err, "standard input: row 3, column d, byte 19: \"x\": ")) << result.err;
    EXPECT_FALSE(exists("out"));
}

TEST_F(KvtTranslate, KeepEmptyAndSkip) {
    const auto with = [&](const std::string& policy) {
        const ChildResult result = translate(dates, {"--date", "d=%d.%m.%Y", "--on-error", policy});
        EXPECT_EQ(result.status, 1);
        return result.out;
    };
    EXPECT_EQ(with("keep"), "k,d\n1,20200201\n2,x\n3,31.02.2020\n4,\n");
    EXPECT_EQ(with("empty"), "k,d\n1,20200201\n2,\n3,\n4,\n");
    EXPECT_EQ(with("skip"), "k,d\n1,20200201\n4,\n");
}

TEST_F(KvtTranslate, RejectedRowsGoThroughTheSameJobOnceTheyAreMended) {
    const std::string input = "k;d\n1;01.02.2020\n\xFC;02/03/2020\n";
    write("in", input);
    std::vector<std::string> job = {"--from", "windows-1252", "--delimiter", ";", "--date", "d=%d.%m.%Y"};
    std::vector<std::string> first = job;
    first.insert(first.end(),
                 {path("in"), "--reject", path("bad"), "--report", path("report.csv"), "-o", path("out")});
    EXPECT_EQ(translate("", first).status, 1);
    EXPECT_EQ(read("out"), "k;d\n1;20200201\n");
    EXPECT_EQ(read("bad"), "k;d\n\xFC;02/03/2020\n");
    EXPECT_TRUE(contains(read("report.csv"), "file,row,column,offset,value,number,text\n"));
    EXPECT_TRUE(contains(read("report.csv"), ",3,d,19,02/03/2020,933067,\"The value fits"))
        << read("report.csv");
    write("bad", "k;d\n\xFC;02.03.2020\n");
    job.push_back(path("bad"));
    EXPECT_EQ(out("", job), "k;d\nü;20200302\n");
}

TEST_F(KvtTranslate, RejectedRowsOfSeveralFilesStayApart) {
    write("one", "k,d\n1,x");
    write("two", "k,d\n2,y");
    EXPECT_EQ(translate("", {"--date", "d=ISO", "--reject", path("bad"), path("one"), path("two")}).status,
              1);
    EXPECT_EQ(read("bad"), "k,d\n1,x\n2,y");
}

TEST_F(KvtTranslate, PlacesAreThoseInTheFile) {
    // Two bytes of UTF-8 for one of the file, and the other way round.
    const auto offset = [&](const std::string& from, const std::string& input) {
        EXPECT_EQ(translate(input, {"--from", from, "--date", "d=ISO", "--on-error", "keep", "--report",
                                    path("report"), "-o", path("out")})
                      .status,
                  1);
        return firstLine(read("report")).at("offset").get<std::uint64_t>();
    };
    EXPECT_EQ(offset("windows-1252", "k,d\n\xFC\xFC,x\n"), 7U);
    EXPECT_EQ(offset("UTF-16LE", std::string("k\0,\0d\0\n\0a\0,\0x\0\n\0", 16)), 12U);
    EXPECT_EQ(offset("Shift_JIS", "k,d\n\x8A\xBF,x\n"), 7U);
    EXPECT_EQ(offset("ISO-2022-JP", "k,d\n\x1B$B4A\x1B(B,x\n"), 13U);
    EXPECT_EQ(offset("UTF-8", "\xEF\xBB\xBFk,d\n1,x\n"), 9U);
}

TEST_F(KvtTranslate, LostCharactersAreFailuresOfTheirCell) {
    const ChildResult bad = translate("a,b\n1,\x81\n2,x\n", {"--from", "US-ASCII", "--on-error", "skip"});
    EXPECT_EQ(bad.status, 1);
    EXPECT_EQ(bad.out, "a,b\n2,x\n");
    EXPECT_TRUE(contains(bad.err, "column b, byte 6")) << bad.err;
    // Where bytes end that are no character is seen by the byte behind them, be that one of the next that are none.
    const ChildResult adjacent = translate("a,b\n\xC5\xEC\x81x,1\n2,\xFF\n", {"--on-error", "keep"});
    for (const char* said : {"bad bytes C5", "bad bytes EC 81", "bad bytes FF", "row 3, column b, byte 13"}) {
        EXPECT_TRUE(contains(adjacent.err, said)) << adjacent.err;
    }
    const ChildResult unwritable =
        translate("a,b\n1,Ł\n2,x\n", {"--to", "windows-1252", "--on-error", "empty"});
    EXPECT_EQ(unwritable.status, 1);
    EXPECT_EQ(unwritable.out, "a,b\n1,\n2,x\n");
    EXPECT_TRUE(contains(unwritable.err, "U+0141")) << unwritable.err;
    EXPECT_EQ(translate("a\nŁ\n", {"--to", "windows-1252"}).status, 2);
    // A row that is left out is not written, whatever else of its block is.
    const ChildResult leftOut = translate(
        "d,b\nx,Ł\n01.02.2023,Ł\n", {"--to", "windows-1252", "--date", "d=%d.%m.%Y", "--on-error", "skip"});
    EXPECT_TRUE(contains(leftOut.err, "2 failures")) << leftOut.err;
}

TEST_F(KvtTranslate, TooManyErrorsEndIt) {
    const ChildResult result = translate(
        dates, {"--date", "d=%d.%m.%Y", "--on-error", "keep", "--max-errors", "1", "-o", path("out")});
    EXPECT_EQ(result.status, 2);
    EXPECT_TRUE(contains(result.err, "more than 1 failure")) << result.err;
    EXPECT_FALSE(exists("out"));
}

TEST_F(KvtTranslate, ADryRunWritesNothing) {
    const ChildResult result =
        translate(dates, {"--date", "d=%d.%m.%Y", "--dry-run", "--reject", path("bad"), "-o", path("out")});
    EXPECT_EQ(result.status, 1);
    EXPECT_EQ(result.out, "");
    EXPECT_TRUE(contains(result.err, "4 rows read, 2 written, 2 rejected")) << result.err;
    EXPECT_TRUE(names().empty());
}

// ---- Threads and parts

class KvtTranslateLarge : public KvtTranslate {
protected:
    // Some three blocks, with quotes, line ends within them, failures and lost bytes.
    std::string makeInput(unsigned seed) const {
        std::mt19937 random(seed);
        std::string text = "id;day;amount;note\r\n";
        for (int row = 0; text.size() < 900'000; ++row) {
            text += std::to_string(row) + ";" + std::to_string(1 + random() % 32) + "." +
                    std::to_string(1 + random() % 12) + ".2020;" + std::to_string(random() % 1000) +
                    (random() % 50 == 0 ? "x" : ",5") + ";";
            switch (random() % 6) {
            case 0:
                text += "\"a;b\nc\"\"d\r\n\"";
                break;
            case 1:
                text += random() % 40 == 0 ? "\x81" : "\xFC";
                break;
            case 2:
                text += random() % 40 == 0 ? "too;many" : "5\" pipe";
                break;
            default:
                text += "plain";
            }
            text += random() % 9 == 0 ? "\r" : "\n";
        }
        return text;
    }
    std::vector<std::string> job(const std::string& name, std::vector<std::string> more) const {
        std::vector<std::string> arguments = {
            "--from",      "windows-1252",        "--delimiter", ";",
            "--date",      "day=%d.%m.%Y",        "--number",    "amount=de",
            "--case",      "note=upper",          "--reject",    path(name + ".bad"),
            "--report",    path(name + ".jsonl"), "-o",          path(name + ".csv"),
            path("in.csv")};
        arguments.insert(arguments.end(), more.begin(), more.end());
        return arguments;
    }
};

TEST_F(KvtTranslateLarge, OneThreadAndFourGiveTheSame) {
    for (unsigned seed = 1; seed <= 3; ++seed) {
        write("in.csv", makeInput(seed));
        const ChildResult one = translate("", job("one", {"--threads", "1"}));
        const ChildResult four = translate("", job("four", {"--threads", "4"}));
        EXPECT_EQ(one.status, 1) << one.err;
        EXPECT_EQ(four.status, 1) << four.err;
        EXPECT_EQ(one.err, four.err);
        for (const std::string ending : {".csv", ".bad", ".jsonl"}) {
            EXPECT_FALSE(read("one" + ending).empty());
            EXPECT_TRUE(read("one" + ending) == read("four" + ending)) << ending;
        }
    }
}

TEST_F(KvtTranslateLarge, PartsInOrderAreTheWhole) {
    write("in.csv", makeInput(4));
    EXPECT_EQ(translate("", job("whole", {"--threads", "1"})).status, 1);
    for (const unsigned count : {2U, 7U, 31U}) {
        std::string output;
        std::string rejected;
        std::vector<std::string> reports = {"--merge-reports", "-o", path("merged.jsonl")};
        for (unsigned number = 1; number <= count; ++number) {
            const std::string name = "part" + std::to_string(number);
            const ChildResult result =
                translate("", job(name, {"--part", std::to_string(number) + "/" + std::to_string(count)}));
            EXPECT_LE(result.status, 1) << result.err;
            output += read(name + ".csv");
            rejected += read(name + ".bad");
            reports.push_back(path(name + ".jsonl"));
        }
        EXPECT_TRUE(output == read("whole.csv")) << count;
        EXPECT_TRUE(rejected == read("whole.bad")) << count;
        EXPECT_EQ(translate("", reports).status, 0);
        EXPECT_TRUE(read("merged.jsonl") == read("whole.jsonl")) << count;
    }
}

TEST_F(KvtTranslateLarge, WideUnitsAndCharactersOfTwoBytesAreCutAsWell) {
    write("in.csv", makeInput(5));
    ASSERT_EQ(kvt({"convert", "--from", "windows-1252", "--to", "UTF-8", "--on-error", "replace",
                   path("in.csv"), "-o", path("utf8.csv")})
                  .status,
              0);
    for (const std::string encoding : {"UTF-16LE", "UTF-16BE", "UTF-32LE", "UTF-32BE", "GB18030", "EUC-JP"}) {
        ASSERT_LE(kvt({"convert", "--from", "UTF-8", "--to", encoding, "--on-error", "replace",
                       path("utf8.csv"), "-o", path("wide.csv")})
                      .status,
                  1);
        const auto run = [&](const std::string& name, std::vector<std::string> more) {
            more.insert(more.begin(), {"--from", encoding, "--delimiter", ";", "--date", "day=%d.%m.%Y",
                                       "--reject", path(name + ".bad"), "--report", path(name + ".jsonl"),
                                       "-o", path(name + ".csv"), path("wide.csv")});
            const ChildResult result = translate("", more);
            EXPECT_LE(result.status, 1) << encoding << result.err;
            return read(name + ".csv") + read(name + ".bad") + read(name + ".jsonl");
        };
        const std::string whole = run("whole", {"--threads", "1"});
        EXPECT_TRUE(run("four", {"--threads", "4"}) == whole) << encoding;
        std::string outputs;
        std::string rest[2];
        for (const std::string number : {"1", "2", "3"}) {
            run("part", {"--part", number + "/3"});
            outputs += read("part.csv");
            rest[0] += read("part.bad");
            rest[1] += read("part.jsonl");
        }
        EXPECT_TRUE(outputs + rest[0] + rest[1] == whole) << encoding;
    }
}

TEST_F(KvtTranslateLarge, MorePartsThanRows) {
    write("small.csv", "a,b\n1,2\n3,4\n");
    std::string output;
    for (int number = 1; number <= 20; ++number) {
        output += out("", {"--part", std::to_string(number) + "/20", path("small.csv")});
    }
    EXPECT_EQ(output, "a,b\n1,2\n3,4\n");
}

TEST_F(KvtTranslateLarge, EncodingsThatCannotBeBegunInTheMiddleHaveNoParts) {
    write("small.csv", "a,b\n1,2\n");
    for (const char* option : {"--from", "--to"}) {
        const ChildResult result = translate("", {"--part", "1/2", option, "ISO-2022-JP", path("small.csv")});
        EXPECT_EQ(result.status, 2);
        EXPECT_TRUE(contains(result.err, "ISO-2022-JP cannot be begun in the middle")) << result.err;
    }
}

} // namespace kvt::test
