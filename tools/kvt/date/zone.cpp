// The functions of `kvt date` about offsets from UTC and the zone of the machine: zone with its subcommands, and now.

#include "date/function.h"

#include "base/failure.h"
#include "cli/choices.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "cli/output_option.h"
#include "date/lines.h"
#include "date/zone_setting.h"

#include <kvt/datetime/datetime.h>

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
        syntax.option("--as", as_, "WHAT", "'text' (default), or its 'minutes' or 'seconds'")
            .takes(wordsOf(offsetChoices));
    }
    void prepare(const std::string&) override { type_ = choose("--as", as_, offsetChoices); }
    DateOutcome apply(const UString<0>& value) override {
        return outcomeOf(datetime::timezoneGet(value, type_));
    }

    std::string as_ = "text";
    datetime::UTCOffsetType type_ = datetime::UTCOffsetType::OffsetText;
};

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
        setting_.emplace(operand, zoneMode("--mode", modeName_), database_);
    }
    DateOutcome apply(const UString<0>& value) override { return setting_->apply(value); }

    std::string modeName_ = "automatic";
    ZoneDatabaseOption database_;
    std::optional<ZoneSetting> setting_;
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
        declareOutput(*syntax_, output_);
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
        return showOutcome(outcomeOf(datetime::now(mode)), json_, output_, diagnostics);
    }

private:
    Syntax* syntax_ = nullptr;
    bool utc_ = false;
    bool noOffset_ = false;
    bool json_ = false;
    std::string output_;
    ZoneDatabaseOption database_;
};

} // namespace

void addZoneFunctions(DateFunctions& functions) {
    functions.push_back(std::make_unique<ZoneFunction>());
    functions.push_back(std::make_unique<NowFunction>());
}

} // namespace host
