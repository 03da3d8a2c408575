// Every message that the date and time functions can give, each reached once with its parameters; and that there is no
// other, by the header that names them.
#include "answer.h"
#include "machine_zone.h"
#include "zone_folder.h"
#include <support/allocations.h>

#include <kvt/datetime/datetime.h>

#include <functional>
#include <optional>
#include <set>
#include <string_view>

namespace {

using namespace kvt::ex::datetime;
using kvt::test::Answer;
using kvt::test::answerOf;
using kvt::test::failure;

const auto automatic = SetZoneMode::Automatic;

Answer formatWithoutMemory() {
    const auto value = kvt::test::ustring("20200102030405.125+01:00");
    const auto pattern = kvt::test::ustring("%Y-%m-%dT%H:%M:%S%Ez");
    (void)format(value, pattern); // the system's encoding is found out once
    std::optional<TextResult> result;
    {
        const kvt::test::FailingAllocations one(0, 1);
        result.emplace(format(value, pattern));
    }
    return answerOf(*result);
}

Answer nowWithoutZone() {
    kvt::test::setMachineZonePath("/usr/share/zoneinfo/Nowhere/Land");
    const Answer answer = answerOf(now(ZoneMode::LocalWithOffset));
    kvt::test::setMachineZone("Europe/Berlin");
    return answer;
}

struct Row {
    std::function<Answer()> call;
    Answer answer;
};

// A row for each number, in their order.
std::vector<Row> rows() {
    const auto read = [](const char* value, const char* pattern) {
        return [=] { return answerOf(parse(value, pattern, false)); };
    };
    const auto write = [](const char* value, const char* pattern) {
        return [=] { return answerOf(format(value, pattern)); };
    };
    const auto zone = [](const char* value, const char* name, SetZoneMode mode) {
        return [=] { return answerOf(timezoneSet(value, name, mode)); };
    };
    const Answer noZone = {
        ReturnState::Error, "", 0.0, 933050, {"Nowhere/Land not found in timezone database"}};
    return {
        {nowWithoutZone, noZone},
        {[] { return answerOf(cast("120000", CastToTemporalType::Date)); },
         failure(933052, {"time", "date", "datetime", "unknown"})},
        {[] { return answerOf(diff("20200101", "120000")); }, failure(933059, {"20200101", "120000"})},
        {[] { return answerOf(add("120000", "P1D")); }, failure(933060, {"120000", "P1D"})},
        {[] { return answerOf(add("abc", "P1D")); }, failure(933063, {"abc"})},
        {[] { return answerOf(add("20200101", "1D")); }, failure(933064, {"1D"})},
        {read("20200231", "ZQT"), failure(933065, {"31", "day", "1", "29"})},
        {read("2020x", "%Y-%m"), failure(933067, {"%Y", "-%m"})},
        {[] { return answerOf(add("20200101", "P1.5D")); }, failure(933068)},
        {[] { return answerOf(timezoneGet("120000", UTCOffsetType::OffsetText)); },
         failure(933071, {"120000"})},
        {zone("120000", "", SetZoneMode::Convert), failure(933073, {"120000"})},
        {read("2020", ""), failure(933074)},
        {read("2020", "FOO"), failure(933075, {"FOO"})},
        {write("20200102", "%Y%"), failure(933076)},
        {write("20200102", "%z"), failure(933078, {"%z", "date"})},
        {read("2020", "%q"), failure(933079, {"%q", "@DateTimeParse()"})},
        {read("1", "%j"), failure(933081, {"%j"})},
        {read("2020", "%Y"), failure(933082, {"%Y"})},
        {read("1Z", "%s%z"), failure(933083, {"%s", "%z"})},
        {formatWithoutMemory, failure(933084)},
        {read("Z", "%z"), failure(933085, {"%z"})},
        {read("1", "%M"), failure(933086, {"%M"})},
        {read("am", "%p"), failure(933087, {"%p"})},
        {read("13 am", "%H %p"), failure(933088, {"%H %p"})},
        {read("2021 366", "%Y %j"), failure(933089, {"%Y %j"})},
        {read("2021 02 29", "%Y %m %d"), failure(933090, {"%Y %m %d"})},
        {read("9999 12 31 23:59:59.9999999999", "%Y %m %d %T"), failure(933091, {"%Y %m %d %T"})},
        {zone("20200101120000", "", automatic), failure(933092)},
        {read("253402300800", "%s"), failure(933093, {"253402300800"})},
        {zone("20200329023000", "local", automatic), failure(933094, {"20200329023000"})},
        {zone("20201025023000", "local", automatic), failure(933095, {"20201025023000"})},
        {zone("120000", "local", automatic), failure(933096, {"120000"})},
        {read("abc", "ZQT"), failure(933097, {"abc"})},
    };
}

std::set<std::uint32_t> numbersOfTheHeader() {
    const std::string header = kvt::test::contentsOf(KVT_SOURCE_DIR "/kvt/datetime/message_numbers.h");
    std::set<std::uint32_t> numbers;
    constexpr std::string_view type = "inline constexpr std::uint32_t ";
    for (std::size_t at = header.find(type); at != std::string::npos; at = header.find(type, at + 1)) {
        numbers.insert(static_cast<std::uint32_t>(std::stoul(header.substr(header.find('=', at) + 1))));
    }
    return numbers;
}

TEST(DateTimeMessages, AreAllReachedAndNoOther) {
    static const kvt::test::ZoneFolder folder(kvt::test::databaseOfTheSystem());
    setInstallPathWrapper(folder.path());
    kvt::test::setMachineZone("Europe/Berlin");
    std::set<std::uint32_t> reached;
    for (const Row& row : rows()) {
        const Answer answer = row.call();
        EXPECT_EQ(answer, row.answer);
        EXPECT_TRUE(reached.insert(answer.message).second) << answer.message << " stands here twice";
    }
    EXPECT_EQ(reached, numbersOfTheHeader());
}

} // namespace
