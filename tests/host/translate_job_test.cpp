// Job files: what they say, what is refused and where, and that a job comes back from its text.
#include <base/failure.h>
#include <translate/job_file.h>
#include <translate/job_text.h>
#include <translate/step_table.h>

#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <random>
#include <string>

namespace host {

namespace {

std::string complaintAbout(const std::string& text) {
    try {
        readJob(text, "job.toml");
        return "none";
    } catch (const Failure& failure) {
        return failure.what();
    }
}

TEST(JobFile, HasAsciiOnlyOutsideOfStringsAndComments) {
    const std::string about = "a character that is not ASCII stands outside of strings and comments";
    EXPECT_EQ(complaintAbout("[input]\nheader \xC3\xBC= true\n"), "job.toml:2:8: " + about);
    EXPECT_EQ(complaintAbout("[input]\n\xEF\xBB\xBBheader = true\n"), "job.toml:2:1: " + about);
    EXPECT_EQ(complaintAbout("[input] # \xC3\xBC\nquote = \"'\" \xC3\xBC\n"), "job.toml:2:13: " + about);
    EXPECT_EQ(complaintAbout("\xFF"), "job.toml:1:1: " + about);
    for (const char* text : {"\"\xC3\xBC\"", "'\xC3\xBC'", "\"\\\"\xC3\xBC\"", "'\\' # \xC3\xBC",
                             "\"\"\"\n\xC3\xBC\"\"\xC3\xBC\"\"\"\"\"", "\'\'\'\xC3\xBC\'\n\xC3\xBC\'\'\'",
                             "\"\" # \"\xC3\xBC"}) {
        const std::string complaint =
            complaintAbout("[[step]]\ndo = \"drop\"\ncolumns = " + std::string(text) + "\n");
        EXPECT_EQ(complaint.find("ASCII"), std::string::npos) << text << ": " << complaint;
        EXPECT_EQ(complaint.find("rror while parsing"), std::string::npos) << text << ": " << complaint;
    }
    EXPECT_EQ(complaintAbout("\xEF\xBB\xBF[input]\nheader = true\n"), "none");
}

// The quote opens no string to TOML, so that its reader meets a letter where it looks for the end of a number.
TEST(JobFile, MayHaveLettersWhereAValueIsBroken) {
    for (const char* value : {"[13^\"\xCF\x9D\"]", "1.\"\xE3\x81\x82\"", "\"\"\"\\\xC3\xBC\"\"\""}) {
        EXPECT_EQ(complaintAbout("x = " + std::string(value) + "\n").rfind("job.toml:1:", 0), 0U) << value;
    }
}

TEST(JobFile, SaysAllThatAJobHas) {
    const Job job = readJob(R"(
[input]
encoding = "windows-1252"
delimiter = ";"
quote = "'"
header = false
[output]
encoding = "UTF-16LE"
delimiter = "tab"
line-ends = "crlf"
quote-all = true
[failures]
on-error = "skip"
max-errors = 10
[[step]]
do = "strip"
column = "a"
[[step]]
do = "case"
column = 2
change = "upper"
)",
                            "job.toml");
    EXPECT_EQ(job.input.encoding, "windows-1252");
    EXPECT_EQ(job.input.delimiter, ";");
    EXPECT_EQ(job.input.quote, "'");
    EXPECT_FALSE(job.input.hasHeader);
    EXPECT_EQ(job.output.encoding, "UTF-16LE");
    EXPECT_EQ(job.output.delimiter, "tab");
    EXPECT_EQ(job.output.lineEnds, "crlf");
    EXPECT_TRUE(job.output.quoteAll);
    EXPECT_EQ(job.onError, "skip");
    EXPECT_EQ(job.mostErrors, "10");
    ASSERT_EQ(job.steps.size(), 2U);
    EXPECT_EQ(job.steps[0], (JobStep{"strip", {{"column", "a"}}}));
    EXPECT_EQ(job.steps[1], (JobStep{"case", {{"change", "upper"}, {"column", "2"}}}));
}

TEST(JobFile, LeavesWhatItDoesNotSayAsUsual) {
    const Job job = readJob("", "job.toml");
    const Job usual;
    EXPECT_EQ(job.input.encoding, usual.input.encoding);
    EXPECT_TRUE(job.input.hasHeader);
    EXPECT_EQ(job.onError, usual.onError);
    EXPECT_TRUE(job.steps.empty());
}

// A list is what one types with "|" or "," between its texts.
TEST(JobFile, TakesLists) {
    const Job job = readJob("[[step]]\ndo = \"date\"\ncolumn = \"a\"\nformat = [\"%Y\", \"x|y%m\"]\n"
                            "[[step]]\ndo = \"keep\"\ncolumns = [\"a\", \"b\"]\n",
                            "job.toml");
    EXPECT_EQ(job.steps[0].arguments[1].second, "%Y|x||y%m");
    EXPECT_EQ(job.steps[1].arguments[0].second, "a,b");
}

TEST(JobFile, IsRefusedWithThePlace) {
    const struct {
        const char* text;
        const char* complaint;
    } rows[] = {
        {"[inputs]\n", "job.toml:1:2: nothing is called 'inputs' here. Did you mean 'input'?"},
        {"[input]\nencodng = \"x\"\n",
         "job.toml:2:1: nothing is called 'encodng' here. Did you mean 'encoding'?"},
        {"[input]\nencoding = 1\n", "job.toml:2:12: this is a text in quotes"},
        {"[input]\nheader = \"yes\"\n", "job.toml:2:10: this is true or false"},
        {"[failures]\nmax-errors = -1\n", "job.toml:2:14: this is a whole number from 0"},
        {"[failures]\non-error = \"ask\"\n",
         "job.toml:2:12: this is one of 'stop', 'keep', 'empty', 'skip', not 'ask'"},
        {"input = 1\n", "job.toml:1:9: 'input' is a table, as in '[input]'"},
        {"[step]\ndo = \"strip\"\n", "job.toml:1:1: a step begins with '[[step]]'"},
        {"[[step]]\ncolumn = \"a\"\n", "job.toml:1:1: 'do' is missing, which names the step"},
        {"[[step]]\ndo = \"strpi\"\n", "job.toml:1:1: there is no step 'strpi'. Did you mean 'strip'?"},
        {"[[step]]\ndo = \"strip\"\n", "job.toml:1:1: 'strip' needs 'column'"},
        {"[[step]]\ndo = \"keep\"\ncolumns = [\"a,b\"]\n",
         "job.toml:3:12: a column with a comma in its name stands in a list by its number"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(complaintAbout(row.text), row.complaint) << row.text;
    }
    EXPECT_EQ(complaintAbout("[input\n").substr(0, 9), "job.toml:");
    EXPECT_EQ(complaintAbout("a = \"\xFF\"\n").substr(0, 9), "job.toml:");
}

// The page on job files has every step and argument, in the words of the help.
TEST(JobFile, IsDescribedByItsPage) {
    std::ifstream in(KVT_SOURCE_DIR "/docs/jobs.md");
    const std::string page{std::istreambuf_iterator<char>(in), {}};
    std::string rows;
    for (const StepRow& row : stepTable()) {
        std::string name = "`" + row.name + "`";
        for (const StepArgument& argument : row.arguments) {
            std::string help = argument.help;
            for (std::size_t at = help.find('|'); at != std::string::npos; at = help.find('|', at + 2)) {
                help.insert(at, 1, '\\');
            }
            const std::string quoted = "`" + argument.name + "`";
            rows += "| " + name + " | " + (argument.isRequired ? quoted : "*" + quoted + "*") + " | " + help +
                    " |\n";
            name.clear();
        }
    }
    EXPECT_NE(page.find(rows), std::string::npos) << rows;
}

// Steps with any texts for arguments, as long as they can be read.
TEST(JobText, IsReadAsTheSameJob) {
    std::mt19937 random(20261122);
    for (int round = 0; round < 300; ++round) {
        Job job;
        const auto text = [&] {
            static constexpr const char* pieces[] = {"a",        "\"", "\\", "\t",   "\n",
                                                     "\xC3\xA4", "#",  "'",  "\x7F", " "};
            std::string made = "x";
            for (auto count = random() % 6; count > 0; --count) {
                made += pieces[random() % 10];
            }
            return made;
        };
        job.input.delimiter = random() % 2 == 0 ? ";" : "tab";
        job.input.hasHeader = random() % 2 == 0;
        job.output.quoteAll = random() % 2 == 0;
        job.onError = random() % 2 == 0 ? "stop" : "keep";
        job.mostErrors = random() % 2 == 0 ? "" : "7";
        for (auto count = random() % 4; count > 0; --count) {
            job.steps.push_back(random() % 2 == 0
                                    ? makeStep("strip", {{"column", text()}})
                                    : makeStep("rename", {{"column", text()}, {"name", text()}}));
        }
        const Job back = readJob(jobText(job), "written");
        ASSERT_EQ(jobText(back), jobText(job));
        ASSERT_EQ(back.steps, job.steps);
    }
}

TEST(JobText, WritesStringsOfToml) {
    EXPECT_EQ(tomlString("a\"b\\c\td\ne\x7F"), R"("a\"b\\c\td\u000Ae\u007F")");
}

} // namespace

} // namespace host
