// Every message of parse() and format(), reached once with its parameters, and none besides.

#include "pattern_rows.h"
#include <support/allocations.h>

#include <kvt/datetime/message_numbers.h>

#include <optional>
#include <set>
#include <string>
#include <vector>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::failure;
using kvt::test::PatternRow;
using kvt::test::ustring;

const std::vector<PatternRow>& parseFailures() {
    static const std::vector<PatternRow> rows = {
        {"20200231", "ZQT", failure(933065, {"31", "day", "1", "29"})},
        {"2020x", "%Y-%m", failure(933067, {"%Y", "-%m"})},
        {"2020", "", failure(933074)},
        {"2020", "FOO", failure(933075, {"FOO"})},
        {"2020", "%q", failure(933079, {"%q", "@DateTimeParse()"})},
        {"1", "%j", failure(933081, {"%j"})},
        {"2020", "%Y", failure(933082, {"%Y"})},
        {"1Z", "%s%z", failure(933083, {"%s", "%z"})},
        {"Z", "%z", failure(933085, {"%z"})},
        {"1", "%M", failure(933086, {"%M"})},
        {"am", "%p", failure(933087, {"%p"})},
        {"13 am", "%H %p", failure(933088, {"%H %p"})},
        {"2021 366", "%Y %j", failure(933089, {"%Y %j"})},
        {"2021 02 29", "%Y %m %d", failure(933090, {"%Y %m %d"})},
        {"9999 12 31 23:59:59.9999999999", "%Y %m %d %T", failure(933091, {"%Y %m %d %T"})},
        {"253402300800", "%s", failure(933093, {"253402300800"})},
        {"abc", "ZQT", failure(933097, {"abc"})},
    };
    return rows;
}

const std::vector<PatternRow>& formatFailures() {
    static const std::vector<PatternRow> rows = {
        {"abc", "%Y", failure(933063, {"abc"})},
        {"20200231", "%Y", failure(933065, {"31", "day", "1", "29"})},
        {"20200102", "", failure(933074)},
        {"20200102", "%Y%", failure(933076)},
        {"20200102", "%z", failure(933078, {"%z", "date"})},
        {"20200102", "%Q", failure(933079, {"%Q", "@DateTimeFormat()"})},
        {"20200102000000+01", "%s%z", failure(933083, {"%s", "%z"})},
    };
    return rows;
}

std::set<std::uint32_t> numbersOf(const std::vector<PatternRow>& rows) {
    std::set<std::uint32_t> numbers;
    for (const PatternRow& row : rows) {
        numbers.insert(row.answer.message);
    }
    return numbers;
}

TEST(PatternMessages, AreReachedWithTheirParameters) {
    kvt::test::expectParsed(parseFailures());
    kvt::test::expectFormatted(formatFailures());
}

TEST(PatternMessages, AreAllReached) {
    using namespace message_number;
    const std::set<std::uint32_t> ofParse = {
        partOutOfRange,     formatMismatch,     formatEmpty,          noKnownKeyword,
        unknownFlag,        ordinalWithoutYear, dateIncomplete,       flagsExcludeEachOther,
        offsetWithoutTime,  timeIncomplete,     nothingGiven,         hourNotForMeridiem,
        ordinalPastYearEnd, noSuchDate,         resultYearOutOfRange, epochTimeOutOfRange,
        noKeywordMatched};
    const std::set<std::uint32_t> ofFormat = {valueUnsupported,     partOutOfRange, formatEmpty,
                                              formatEndsInPercent,  flagNotForKind, unknownFlag,
                                              flagsExcludeEachOther};
    EXPECT_EQ(numbersOf(parseFailures()), ofParse);
    EXPECT_EQ(numbersOf(formatFailures()), ofFormat);
}

// What remains is what nobody foresaw, such as no memory for a result that would have been good.
TEST(PatternMessages, TheLastResortIsReachedToo) {
    const auto value = ustring("20200102030405.125+01:00");
    const auto pattern = ustring("%Y%m%d%T%z");
    const auto written = ustring("2020010203:04:05.125+01:00");
    (void)parse(written, pattern, false); // the system's encoding is found out once
    std::optional<TextResult> result;
    {
        const kvt::test::FailingAllocations one(0, 1);
        result.emplace(parse(written, pattern, false));
    }
    EXPECT_EQ(answerOf(*result), failure(message_number::generic));
    EXPECT_EQ(message_number::generic, 933068u);
    {
        const kvt::test::FailingAllocations one(0, 1);
        result.emplace(format(value, pattern));
    }
    EXPECT_EQ(answerOf(*result), failure(message_number::formatFailedUnexpectedly));
    EXPECT_EQ(message_number::formatFailedUnexpectedly, 933084u);
}

// The answer, made with each allocation in turn the one that finds no memory: the good answer, where what failed was
// got over, or the last resort.
void expectGoodOrLastResort(const PatternRow& row, bool isParse) {
    using kvt::test::FailingAllocations;
    const auto value = ustring(row.value);
    const auto pattern = ustring(row.format);
    for (std::size_t succeeding = 0; succeeding < 60; ++succeeding) {
        for (const std::size_t failing : {std::size_t{1}, FailingAllocations::all}) {
            std::optional<TextResult> result;
            bool thrown = false;
            {
                const FailingAllocations scope(succeeding, failing);
                try {
                    // Made in place: moving a message needs memory.
                    struct InPlace {
                        const kvt::ex::UString<0>& value;
                        const kvt::ex::UString<0>& pattern;
                        bool isParse;
                        operator TextResult() const {
                            return isParse ? parse(value, pattern, false) : format(value, pattern);
                        }
                    };
                    result.emplace(InPlace{value, pattern, isParse});
                } catch (...) {
                    thrown = true;
                }
            }
            ASSERT_FALSE(thrown) << row.value << " by " << row.format << " with " << succeeding
                                 << " allocations";
            const Answer answer = answerOf(*result);
            const Answer lastResort = failure(isParse ? 933068 : 933084);
            // Without memory for a message there is none; keywords pass over a pattern that found no memory.
            EXPECT_TRUE(answer == row.answer || answer == lastResort || answer == kvt::test::silentFailure())
                << answer << " for " << row.value << " by " << row.format << " with " << succeeding;
        }
    }
}

TEST(PatternMemory, ItsLackIsNeverThrownAtTheHost) {
    const std::string longText(300, 'x');
    std::vector<PatternRow> parsed = parseFailures();
    parsed.push_back({"2020-01-02T03:04:05.123456789+01:00", "%Y-%m-%dT%T%Ez$",
                      kvt::test::success("20200102030405.123456789+01:00")});
    parsed.push_back(
        {"2020-01-02T03:04:05.123456789+01:00", "ISO", kvt::test::success("20200102030405.123456789+01:00")});
    parsed.push_back(
        {"20200102030405.123456789+01:00", "ZQT", kvt::test::success("20200102030405.123456789+01:00")});
    parsed.push_back({longText, longText + "%Y", kvt::test::mismatch(longText, "%Y")});
    for (const PatternRow& row : parsed) {
        expectGoodOrLastResort(row, true);
    }
    std::vector<PatternRow> formatted = formatFailures();
    formatted.push_back(
        {"20200102030405.123456789+01:00", "ISO", kvt::test::success("2020-01-02T03:04:05.123456789+01:00")});
    formatted.push_back({"20200102", longText + "%Y", kvt::test::success(longText + "2020")});
    for (const PatternRow& row : formatted) {
        expectGoodOrLastResort(row, false);
    }
}

// Once the system's encoding is known, a result within the small buffer of a string needs no memory at all.
TEST(PatternMemory, IsNeededForTheResultOnly) {
    const auto iso = ustring("2020-01-02T03:04:05.125+01:00");
    const auto isoPattern = ustring("%Y-%m-%dT%T%Ez");
    const auto shortIso = ustring("2020-01-02");
    const auto shortPattern = ustring("%Y-%m-%d");
    const auto date = ustring("20200102");
    const auto value = ustring("20200102030405.125+01:00");
    const auto keyword = ustring("iso");
    (void)parse(iso, isoPattern, false);
    std::optional<TextResult> results[5];
    {
        const kvt::test::FailingAllocations none(0);
        results[0].emplace(parse(shortIso, shortPattern, false));
        results[1].emplace(format(date, shortPattern));
        results[2].emplace(parse(shortIso, keyword, false));
    }
    {
        const kvt::test::FailingAllocations one(1);
        results[3].emplace(parse(iso, isoPattern, false));
    }
    {
        const kvt::test::FailingAllocations one(1);
        results[4].emplace(format(value, isoPattern));
    }
    EXPECT_EQ(answerOf(*results[0]), kvt::test::success("20200102"));
    EXPECT_EQ(answerOf(*results[1]), kvt::test::success("2020-01-02"));
    EXPECT_EQ(answerOf(*results[2]), kvt::test::success("20200102"));
    EXPECT_EQ(answerOf(*results[3]), kvt::test::success("20200102030405.125+01:00"));
    EXPECT_EQ(answerOf(*results[4]), kvt::test::success("2020-01-02T03:04:05.125+01:00"));
}

} // namespace
