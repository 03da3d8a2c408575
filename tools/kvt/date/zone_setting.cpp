#include "date/zone_setting.h"

#include "base/failure.h"
#include "base/text.h"
#include "base/text_units.h"
#include "cli/choices.h"
#include "date/function.h"

#include <kvt/datetime/message_numbers.h>
#include <kvt/datetime/utc_offset.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <string_view>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
using kvt::ex::UString;

const Choices<datetime::SetZoneMode> modeChoices = {
    {"automatic", datetime::SetZoneMode::Automatic},
    {"replace", datetime::SetZoneMode::Replace},
    {"convert", datetime::SetZoneMode::Convert},
};

// "20200131120000.5+01:00" as seconds since 1970 of its own clock; a date alone is its midnight.
std::chrono::seconds clockOf(const std::string& canonical) {
    const auto part = [&](std::size_t begin, std::size_t length) {
        unsigned number = 0;
        for (const char digit : canonical.substr(begin, length)) {
            number = number * 10 + static_cast<unsigned>(digit - '0');
        }
        return number;
    };
    using namespace std::chrono;
    const sys_days day{year(static_cast<int>(part(0, 4))) / static_cast<int>(part(4, 2)) /
                       static_cast<int>(part(6, 2))};
    return day.time_since_epoch() + hours(part(8, 2)) + minutes(part(10, 2)) + seconds(part(12, 2));
}

std::string offsetText(int minutes) {
    const auto twoDigits = [](int number) {
        return std::string(number < 10 ? "0" : "") + std::to_string(number);
    };
    const int magnitude = std::abs(minutes);
    return (minutes < 0 ? "-" : "+") + twoDigits(magnitude / 60) + ":" + twoDigits(magnitude % 60);
}

// The library's numbers for what cannot be said of the machine's zone, in words for any zone.
DateOutcome failedFor(const NamedZone& zone, const UString<0>& value, std::uint32_t number) {
    namespace message_number = datetime::message_number;
    const std::string shown = "\"" + printable(value.toStdString()) + "\"";
    const std::string text =
        number == message_number::localZoneForTime
            ? shown + " has no date, and without one the offset of " + zone.name() + " is not known."
        : number == message_number::localTimeInGap
            ? "In " + zone.name() + ", " + shown + " is on no clock: they were put forward past it."
            : "In " + zone.name() + ", " + shown + " is on the clocks twice: they were put back across it.";
    DateOutcome outcome = failedOutcome("");
    outcome.message = DateMessage{number, {value.toStdString()}, text};
    return outcome;
}

bool hasOffset(const UString<0>& value) {
    return outcomeOf(datetime::timezoneGet(value, datetime::UTCOffsetType::OffsetText)).isGood();
}

bool isWord(const std::string& typed, std::string_view word) {
    return std::equal(typed.begin(), typed.end(), word.begin(), word.end(),
                      [](char left, char right) { return asciiLower(left) == right; });
}

} // namespace

datetime::SetZoneMode zoneMode(const std::string& what, const std::string& typed) {
    return choose(what, typed, modeChoices);
}

ZoneSetting::ZoneSetting(const std::string& zone, datetime::SetZoneMode mode,
                         const ZoneDatabaseOption& database)
    : zone_(toUString(zone)), mode_(mode) {
    const std::string typed = withoutBlanks(zone);
    if (typed.empty()) {
        throw Failure("ZONE is empty");
    }
    if (isWord(typed, "local")) {
        database.use();
    } else if (!isWord(typed, "utc") && !datetime::ZQTDateTimeUTCOffset::repairOffset(toUString(typed))) {
        named_.emplace(typed, database.folder());
    }
}

DateOutcome ZoneSetting::apply(const UString<0>& value) const {
    DateOutcome outcome = named_ ? applyNamed(value) : outcomeOf(datetime::timezoneSet(value, zone_, mode_));
    outcome.withoutMessage = "The zone of this machine, or the zone database, cannot be found; 'kvt doctor' "
                             "says which.";
    return outcome;
}

DateOutcome ZoneSetting::applyNamed(const UString<0>& value) const {
    // Whatever no zone can do fails for UTC as well.
    const datetime::TextResult inUtc = datetime::timezoneSet(value, "utc", mode_);
    DateOutcome outcome = outcomeOf(inUtc);
    if (!outcome.isGood()) {
        return outcome;
    }
    const std::string canonical = std::get<1>(inUtc).toStdString();
    constexpr std::size_t digitsOfTime = 6;
    if (std::min(canonical.find_first_of(".+-"), canonical.size()) == digitsOfTime) {
        return failedFor(*named_, value, datetime::message_number::localZoneForTime);
    }
    const bool isMoment = mode_ != datetime::SetZoneMode::Replace && hasOffset(value);
    int offset = 0;
    if (isMoment) {
        offset = named_->minutesAt(std::chrono::sys_seconds(clockOf(canonical)));
    } else {
        const NamedZone::AtWallClock found = named_->atWallClock(clockOf(canonical));
        if (found.clock != NamedZone::Clock::Once) {
            const UString<0> wallClock = std::get<1>(datetime::timezoneRemove(value));
            return failedFor(*named_, wallClock,
                             found.clock == NamedZone::Clock::Never
                                 ? datetime::message_number::localTimeInGap
                                 : datetime::message_number::localTimeAmbiguous);
        }
        offset = found.minutes;
    }
    return outcomeOf(datetime::timezoneSet(value, toUString(offsetText(offset)), mode_));
}

} // namespace host
