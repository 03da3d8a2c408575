// The functions of `kvt date` about offsets from UTC and the zone of the machine: zone with its subcommands, and now.

#include "date/function.h"

#include "base/failure.h"
#include "base/text.h"
#include "base/text_units.h"
#include "cli/choices.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "date/lines.h"
#include "zone/named_zone.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/message_numbers.h>
#include <kvt/datetime/utc_offset.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <optional>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
using kvt::ex::UString;

const Choices<datetime::UTCOffsetType> offsetChoices = {
    {"text", datetime::UTCOffsetType::OffsetText},
    {"minutes", datetime::UTCOffsetType::OffsetInMinutes},
    {"seconds", datetime::UTCOffsetType::OffsetInSeconds},
};

class GetFunction : public ValueFunction {
public:
    GetFunction()
        : ValueFunction({"get", "Print the offset of a value", R"(kvt date zone get 20200131120000-03:30
kvt date zone get 120000-03:30 --as seconds)",
                         "VALUE", "", ""}) {}

private:
    void declareOptions(Syntax& syntax) override {
        syntax.option("--as", as_, "WHAT", "'text' (default), or its 'minutes' or 'seconds'");
    }
    void prepare(const std::string&) override { type_ = choose("--as", as_, offsetChoices); }
    DateOutcome apply(const UString<0>& value) override {
        return outcomeOf(datetime::timezoneGet(value, type_));
    }

    std::string as_ = "text";
    datetime::UTCOffsetType type_ = datetime::UTCOffsetType::OffsetText;
};

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

class SetFunction : public ValueFunction {
public:
    SetFunction()
        : ValueFunction({"set", "Give a value another offset", R"(kvt date zone set 20200131120000+01:00 utc
kvt date zone set 20200131120000 local
kvt date zone set 20200131120000+00:00 Asia/Kolkata)",
                         "VALUE", "ZONE",
                         "An offset such as +01:00, 'utc', 'local' for the zone of this machine, or the name "
                         "of a zone, whose offset of that moment it is"}) {}

private:
    void declareOptions(Syntax& syntax) override {
        syntax.option("--mode", modeName_, "WHAT",
                      "'replace' keeps the wall clock, 'convert' keeps the moment; 'automatic', the default, "
                      "converts what has an offset");
        database_.declare(syntax);
    }
    void prepare(const std::string& operand) override {
        mode_ = choose("--mode", modeName_, modeChoices);
        zone_ = toUString(operand);
        const std::string typed = withoutBlanks(operand);
        if (typed.empty()) {
            throw Failure("ZONE is empty");
        }
        if (isWord(typed, "local")) {
            database_.use();
        } else if (!isWord(typed, "utc") && !datetime::ZQTDateTimeUTCOffset::repairOffset(toUString(typed))) {
            named_.emplace(typed, database_.folder());
        }
    }
    DateOutcome apply(const UString<0>& value) override {
        DateOutcome outcome =
            named_ ? applyNamed(value) : outcomeOf(datetime::timezoneSet(value, zone_, mode_));
        outcome.withoutMessage =
            "The zone of this machine, or the zone database, cannot be found; 'kvt doctor' "
            "says which.";
        return outcome;
    }

    DateOutcome applyNamed(const UString<0>& value) const {
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

    static bool hasOffset(const UString<0>& value) {
        return outcomeOf(datetime::timezoneGet(value, datetime::UTCOffsetType::OffsetText)).isGood();
    }
    static bool isWord(const std::string& typed, std::string_view word) {
        return std::equal(typed.begin(), typed.end(), word.begin(), word.end(),
                          [](char left, char right) { return asciiLower(left) == right; });
    }

    UString<0> zone_;
    std::string modeName_ = "automatic";
    datetime::SetZoneMode mode_ = datetime::SetZoneMode::Automatic;
    ZoneDatabaseOption database_;
    std::optional<NamedZone> named_;
};

class RemoveFunction : public ValueFunction {
public:
    RemoveFunction()
        : ValueFunction({"remove", "Drop the offset of a value, whose wall clock stays",
                         "kvt date zone remove 20200131120000+01:00", "VALUE", "", ""}) {}

private:
    void prepare(const std::string&) override {}
    DateOutcome apply(const UString<0>& value) override { return outcomeOf(datetime::timezoneRemove(value)); }
};

class ZoneFunction : public FunctionGroup {
public:
    ZoneFunction()
        : FunctionGroup("zone", "Get, set and remove offsets from UTC",
                        R"(kvt date zone get 20200131120000-03:30
kvt date zone set 20200131120000+01:00 utc
kvt date zone remove 20200131120000+01:00)") {
        add(std::make_unique<GetFunction>());
        add(std::make_unique<SetFunction>());
        add(std::make_unique<RemoveFunction>());
    }
};

constexpr const char* nowNotes = R"(Without --utc, the zone of the machine and the zone database are needed.

Exit status:
  0  done
  2  not done: the zone of the machine cannot be found)";

class NowFunction : public DateFunction {
public:
    void declare(Syntax& parent) override {
        syntax_ = &parent.subcommand("now", "Print the present moment");
        syntax_->flag("--utc", utc_, "In UTC, instead of the zone of this machine");
        syntax_->flag("--no-offset", noOffset_, "Without the offset");
        database_.declare(*syntax_);
        syntax_->flag("--json", json_, "Print a JSON object on a line");
        syntax_->setHelp("kvt date now --utc", nowNotes);
    }
    bool isChosen() const override { return syntax_->isChosen(); }
    int run(Diagnostics& diagnostics) override {
        if (utc_ && noOffset_) {
            throw Failure("--utc and --no-offset do not go together");
        }
        if (!utc_) {
            database_.use();
        }
        const datetime::ZoneMode mode = utc_        ? datetime::ZoneMode::Utc
                                        : noOffset_ ? datetime::ZoneMode::LocalWithoutOffset
                                                    : datetime::ZoneMode::LocalWithOffset;
        return showOutcome(outcomeOf(datetime::now(mode)), json_, diagnostics);
    }

private:
    Syntax* syntax_ = nullptr;
    bool utc_ = false;
    bool noOffset_ = false;
    bool json_ = false;
    ZoneDatabaseOption database_;
};

} // namespace

void addZoneFunctions(DateFunctions& functions) {
    functions.push_back(std::make_unique<ZoneFunction>());
    functions.push_back(std::make_unique<NowFunction>());
}

} // namespace host
