// Patterns of a fixed length are read and written without the library, with its results; and a date that is read and
// written at once is what the two steps make of it one after the other.

#include <translate/block_worker.h>
#include <translate/fixed_date.h>
#include <translate/step_table.h>

#include <kvt/datetime/datetime.h>

#include <gtest/gtest.h>

#include <random>
#include <string>

namespace kvt::test {

TEST(FixedDateForm, GivesWhatTheLibraryGives) {
    std::mt19937 random(7);
    constexpr std::string_view characters = "0123456789.-/: T";
    for (const std::string pattern :
         {"%d.%m.%Y", "%Y%m%d", "%Y-%m-%dT%H:%M:%S", "%m/%d/%Y %H:%M", "%d %m %Y %H", "%H%M%d%m%Y"}) {
        const auto form = host::FixedDateForm::toRead(pattern);
        ASSERT_TRUE(form) << pattern;
        host::FixedDateText read(form->canonical());
        int taken = 0;
        for (int round = 0; round < 100'000; ++round) {
            // A value that fits, but for the numbers, and perhaps for a character.
            std::string value;
            for (std::size_t at = 0; at < pattern.size(); ++at) {
                if (pattern[at] != '%') {
                    value += pattern[at];
                    continue;
                }
                ++at;
                std::string number = std::to_string(pattern[at] == 'Y' ? random() % 10000 : random() % 62);
                const std::size_t width = pattern[at] == 'Y' ? 4 : 2;
                value += std::string(width - std::min(width, number.size()), '0') + number;
            }
            if (random() % 4 == 0) {
                value[random() % value.size()] = characters[random() % characters.size()];
            }
            if (read.take(value, *form)) {
                ++taken;
                const auto result = ex::datetime::parse(ex::UString<0>(value.data(), value.size()),
                                                        ex::UString<0>((pattern + "$").c_str()), false);
                ASSERT_EQ(read.view(), std::get<1>(result).toStdString()) << value << " by " << pattern;
            }
        }
        EXPECT_GT(taken, 100) << pattern;
    }
}

TEST(FixedDateForm, LeavesOtherPatternsToTheLibrary) {
    for (const char* pattern :
         {"%d.%m.%y", "%d.%b.%Y", "%d.%m.%Y*", "%d.%m.%Y?", "%H:%M", "%d.%m", "%d.%m.%Y %M", "ISO",
          "%d.%m.%Y %d", "%d.%m.%Y %H:%M:%S.", "%Ez", "%%%d%m%Y", ""}) {
        EXPECT_FALSE(host::FixedDateForm::toRead(pattern)) << pattern;
    }
}

TEST(FixedDateForm, WritesWhatTheLibraryWrites) {
    std::mt19937 random(8);
    const auto two = [&](unsigned below) {
        const std::string number = std::to_string(random() % below);
        return number.size() == 1 ? "0" + number : number;
    };
    for (const std::string pattern : {"%Y-%m-%d", "%d.%m.%Y", "%m/%Y", "%Y", "%H:%M:%S", "%Y-%m-%dT%H:%M:%S",
                                      "%M", "on %d/%m", "%S s", "%Y~%m", "%d\"%m"}) {
        const auto form = host::FixedDateForm::toWrite(pattern);
        ASSERT_TRUE(form) << pattern;
        host::FixedDateText written(*form);
        int taken = 0;
        for (int round = 0; round < 20'000; ++round) {
            std::string value = (random() % 20 == 0 ? "00" : "") + two(100) + two(100) + two(14) + two(33);
            if (random() % 2 == 0) {
                value += two(25) + two(62) + two(62);
            }
            if (random() % 8 == 0) {
                value[random() % value.size()] = "x -+.:9"[random() % 7];
            }
            const auto& canonical = value.size() == 8 ? host::FixedDateForm::canonicalDate()
                                                      : host::FixedDateForm::canonicalDateTime();
            if (written.take(value, canonical)) {
                ++taken;
                const auto result = ex::datetime::format(ex::UString<0>(value.data(), value.size()),
                                                         ex::UString<0>(pattern.c_str()));
                ASSERT_EQ(written.view(), std::get<1>(result).toStdString()) << value << " by " << pattern;
            }
        }
        EXPECT_GT(taken, 1000) << pattern;
    }
    for (const char* pattern : {"ISO", "%b", "%d.%m.%y", "%Y%Y", "%S.%M", "%d%%", "%F", "", "*%d", "%d?",
                                "%Y$", " %d", "%d ", "\xC3\xBC%Y"}) {
        EXPECT_FALSE(host::FixedDateForm::toWrite(pattern)) << pattern;
    }
}

TEST(FixedDateForm, ReadsNearlyAllPlainDatesItself) {
    const auto form = host::FixedDateForm::toRead("%d.%m.%Y");
    host::FixedDateText read(form->canonical());
    for (int month = 1; month <= 12; ++month) {
        for (int day = 1; day <= 28; ++day) {
            const auto two = [](int number) {
                return std::string(number < 10 ? "0" : "") + std::to_string(number);
            };
            EXPECT_TRUE(read.take(two(day) + "." + two(month) + ".2023", *form));
            EXPECT_EQ(read.view(), "2023" + two(month) + two(day));
        }
    }
    EXPECT_TRUE(read.take("29.02.2000", *form));
    EXPECT_FALSE(read.take("29.02.1900", *form));
    EXPECT_FALSE(read.take("1.1.2000", *form));
}

TEST(FixedDateForm, KnowsWhetherItsTextsAreCanonical) {
    for (const char* pattern : {"%Y%m%d", "%Y%m%d%H%M%S"}) {
        EXPECT_TRUE(host::FixedDateForm::toRead(pattern)->isCanonical()) << pattern;
    }
    for (const char* pattern : {"%Y%d%m", "%Y%m%d%H", "%Y-%m-%d", "%m%d%Y", "%Y%m%d%H%M"}) {
        EXPECT_FALSE(host::FixedDateForm::toRead(pattern)->isCanonical()) << pattern;
    }
}

namespace {

std::string randomDateCell(std::mt19937& random) {
    const auto number = [&](unsigned from, unsigned to, std::size_t width) {
        const std::string digits = std::to_string(from + random() % (to - from + 1));
        return std::string(width - std::min(width, digits.size()), '0') + digits;
    };
    const std::string day = number(1, 29 + random() % 4, 2);
    const std::string month = number(1, 12 + random() % 2, 2);
    const std::string year = number(random() % 10 == 0 ? 0 : 1950, 2050, 4);
    const std::string time = number(0, 24, 2) + ":" + number(0, 60, 2);
    const std::string texts[] = {day + "." + month + "." + year,
                                 year + month + day,
                                 year + "-" + month + "-" + day,
                                 year + month + day + number(0, 23, 2) + number(0, 59, 2) + number(0, 59, 2),
                                 day + "." + month + "." + year + " " + time,
                                 day + "." + month + "." + year.substr(2),
                                 number(1, 31, 1) + "." + number(1, 12, 1) + "." + year,
                                 day + "\xC3\xBC" + month,
                                 " " + day + "." + month + "." + year + " ",
                                 ""};
    std::string text = texts[random() % std::size(texts)];
    if (!text.empty() && random() % 10 == 0) {
        text[random() % text.size()] = ".-: x"[random() % 5];
    }
    return random() % 5 == 0 ? "\"" + text + "\"" : text;
}

// All that a job says of a table, in words.
std::string accountOf(const std::vector<host::JobStep>& steps, const std::string& policy,
                      const std::string& table) {
    host::Job job;
    job.onError = policy;
    job.steps = steps;
    host::Plan plan(job);
    plan.names = {"1", "2"};
    host::BlockWorker worker(plan, true);
    host::SourceBlock block;
    block.bytes = table;
    block.isMoreToCome = true;
    host::BlockResult result;
    worker.process(block, result);
    const host::RowCounts& counts = result.counts;
    std::string account = std::string(result.output) + "rejected\n" + result.rejected;
    for (const std::uint64_t count :
         {counts.read, counts.written, counts.rejected, counts.skipped, counts.cellsChanged, result.rows}) {
        account += std::to_string(count) + " ";
    }
    for (const host::CellFailure& failure : result.failures) {
        account += "\n" + std::to_string(failure.row) + " " + std::to_string(failure.offset) + " " +
                   failure.column + " " + failure.value + " " + std::to_string(failure.problem.number) + " " +
                   failure.problem.text;
    }
    return account;
}

} // namespace

TEST(DateSteps, ReadingAndWritingAtOnceIsTheSameAsOneAfterTheOther) {
    std::mt19937 random(9);
    const std::vector<std::string> formats = {
        "%d.%m.%Y", "%Y%m%d", "%Y%m%d%H%M%S", "%Y-%m-%d",  "%d.%m.%Y %H:%M",     "%d.%m.%Y|%Y-%m-%d",
        "%d.%m.%y", "ISO",    "%d.%m.%Y$",    "%d.%m.%Y*", "ISO|%d.%m.%Y %H:%M", "%Y%m%d%H%M%S|%Y%m%d"};
    const std::vector<std::string> written = {"%Y-%m-%d",     "%Y%m%d", "%d.%m.%Y",
                                              "%H:%M",        "%d,%m",  "%d. %B %Y",
                                              "%Y%m%d%H%M%S", "ISO",    "%Y-%m-%dT%H:%M:%S"};
    const host::JobStep between = host::makeStep("rename", {{"column", "2"}, {"name", "2"}});
    for (int round = 0; round < 150; ++round) {
        const auto& format = formats[random() % formats.size()];
        const auto& form = written[random() % written.size()];
        const host::JobStep date =
            host::makeStep("date", {{"column", "1"}, {"format", format}, {"pivot", "50"}});
        const host::JobStep write = host::makeStep("write-date", {{"column", "1"}, {"format", form}});
        std::vector<host::JobStep> atOnce = {date, write};
        std::vector<host::JobStep> singly = {date, between, write};
        if (random() % 3 == 0) {
            const host::JobStep before = host::makeStep("strip", {{"column", "1"}});
            atOnce.insert(atOnce.begin(), before);
            singly.insert(singly.begin(), before);
        }
        if (random() % 3 == 0) {
            const host::JobStep again = host::makeStep("date", {{"column", "1"}, {"format", "%Y-%m-%d"}});
            atOnce.push_back(again);
            singly.push_back(again);
        }
        std::string table;
        for (int row = 0; row < 40; ++row) {
            table += randomDateCell(random) + "," + randomDateCell(random) + "\n";
        }
        for (const char* policy : {"keep", "empty", "skip", "stop"}) {
            ASSERT_EQ(accountOf(atOnce, policy, table), accountOf(singly, policy, table))
                << format << " to " << form << ", " << policy << "\n"
                << table;
        }
    }
}

} // namespace kvt::test
