// The functions of `kvt date` that reckon: add, diff, compare, and interval with its own subcommands.

#include "date/function.h"

#include "base/failure.h"
#include "cli/choices.h"
#include "cli/command.h"
#include "cli/exit_status.h"
#include "cli/output_option.h"
#include "cli/sizes.h"
#include "date/lines.h"

#include <kvt/datetime/datetime.h>

#include <optional>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
using kvt::ex::UString;

// The other one of two values.
std::string wrongInSecond(const std::string& value) {
    const DateOutcome read = outcomeOf(datetime::timezoneRemove(toUString(value)));
    return read.isGood() ? "" : failureText(read);
}

class AddFunction : public ValueFunction {
public:
    AddFunction()
        : ValueFunction({"add", "Move a value by an interval", R"(kvt date add 20200131 P1M
kvt date add 20200131120000 -PT90M)",
                         "VALUE", "INTERVAL", "[-]P[nY][nM][nD][T[nH][nM][nS]]"}) {}

private:
    std::string whatIsWrongWith(const std::string& interval) const override {
        const DateOutcome negated = outcomeOf(datetime::intervalNegate(toUString(interval)));
        return negated.isGood() ? "" : failureText(negated);
    }
    std::string exampleFor(const std::string& value) const override { return isValue(value) ? "P1D" : ""; }
    void prepare(const std::string& operand) override { interval_ = toUString(operand); }
    DateOutcome apply(const UString<0>& value) override { return outcomeOf(datetime::add(value, interval_)); }

    UString<0> interval_;
};

const Choices<datetime::UnitType> unitChoices = {
    {"years", datetime::UnitType::Years},     {"months", datetime::UnitType::Months},
    {"weeks", datetime::UnitType::Weeks},     {"days", datetime::UnitType::Days},
    {"hours", datetime::UnitType::Hours},     {"minutes", datetime::UnitType::Minutes},
    {"seconds", datetime::UnitType::Seconds},
};

class DiffFunction : public ValueFunction {
public:
    DiffFunction()
        : ValueFunction({"diff", "Print the interval FIRST minus SECOND", R"(kvt date diff 20200301 20200131
kvt date diff 20200301 20200131 --unit days)",
                         "FIRST", "SECOND", "What is taken from it"}) {}

private:
    void declareOptions(Syntax& syntax) override {
        syntax
            .option("--unit", unitName_, "UNIT",
                    "Print one number, in years, months, weeks, days, hours, minutes or seconds")
            .takes(wordsOf(unitChoices));
    }
    std::string whatIsWrongWith(const std::string& second) const override { return wrongInSecond(second); }
    void prepare(const std::string& operand) override {
        second_ = toUString(operand);
        if (!unitName_.empty()) {
            unit_ = choose("--unit", unitName_, unitChoices);
        }
    }
    DateOutcome apply(const UString<0>& value) override {
        return unit_ ? outcomeOf(datetime::diffAsNumber(value, second_, *unit_))
                     : outcomeOf(datetime::diff(value, second_));
    }

    UString<0> second_;
    std::string unitName_;
    std::optional<datetime::UnitType> unit_;
};

class CompareFunction : public ValueFunction {
public:
    CompareFunction()
        : ValueFunction({"compare",
                         "Print -1, 0 or 1 as FIRST is earlier than, the same as or later than SECOND",
                         "kvt date compare 20200131120000+01:00 20200131110000+00:00", "FIRST", "SECOND",
                         "What it is compared with"}) {}

private:
    std::string whatIsWrongWith(const std::string& second) const override { return wrongInSecond(second); }
    void prepare(const std::string& operand) override { second_ = toUString(operand); }
    DateOutcome apply(const UString<0>& value) override {
        const int order = datetime::compare(value, second_);
        if (order >= -1) {
            return {datetime::ReturnState::Success, order, std::nullopt};
        }
        // It says no more than that it failed; diff() fails for the same values, and says why.
        DateOutcome outcome = outcomeOf(datetime::diff(value, second_));
        return outcome.isGood() ? failedOutcome("The two cannot be compared.") : outcome;
    }

    UString<0> second_;
};

class NegateFunction : public ValueFunction {
public:
    NegateFunction()
        : ValueFunction({"negate", "Turn the sign of an interval", "kvt date interval negate P1M", "INTERVAL",
                         "", ""}) {}

private:
    void prepare(const std::string&) override {}
    DateOutcome apply(const UString<0>& value) override { return outcomeOf(datetime::intervalNegate(value)); }
};

constexpr const char* createNotes = R"(The numbers stay as they are: 90 minutes are PT90M.

Exit status:
  0  done
  2  not done)";

class CreateFunction : public DateFunction {
public:
    void declare(Syntax& parent) override {
        syntax_ = &parent.subcommand("create", "Make an interval of numbers");
        syntax_->option("--years", years_, "N", "Years");
        syntax_->option("--months", months_, "N", "Months");
        syntax_->option("--days", days_, "N", "Days");
        syntax_->option("--hours", hours_, "N", "Hours");
        syntax_->option("--minutes", minutes_, "N", "Minutes");
        syntax_->option("--seconds", seconds_, "N", "Seconds, which may have a fraction");
        syntax_->flag("--negative", negative_, "Give it a minus sign");
        syntax_->flag("--json", json_, "Print a JSON object on a line");
        declareOutput(*syntax_, output_);
        syntax_->setHelp("kvt date interval create --days 3 --minutes 90", createNotes);
    }
    bool isChosen() const override { return syntax_->isChosen(); }
    int run(Diagnostics& diagnostics) override {
        const datetime::IntervalParts parts(
            number("--years", years_), number("--months", months_), number("--days", days_),
            number("--hours", hours_), number("--minutes", minutes_),
            parseDecimal("--seconds", unsignedText("--seconds", seconds_)), negative_);
        return showOutcome(outcomeOf(datetime::intervalCreate(parts)), json_, output_, diagnostics);
    }

private:
    static const std::string& unsignedText(const char* option, const std::string& typed) {
        if (typed.starts_with('-')) {
            throw Failure(std::string(option) +
                          " takes a number from 0; --negative makes the whole interval negative");
        }
        return typed;
    }
    static std::uint64_t number(const char* option, const std::string& typed) {
        return parseNumber(option, unsignedText(option, typed));
    }

    Syntax* syntax_ = nullptr;
    std::string years_ = "0";
    std::string months_ = "0";
    std::string days_ = "0";
    std::string hours_ = "0";
    std::string minutes_ = "0";
    std::string seconds_ = "0";
    std::string output_;
    bool negative_ = false;
    bool json_ = false;
};

class IntervalFunction : public FunctionGroup {
public:
    IntervalFunction()
        : FunctionGroup("interval", "Make and negate intervals",
                        R"(kvt date interval create --days 3 --minutes 90
kvt date interval negate P1M)") {
        add(std::make_unique<CreateFunction>());
        add(std::make_unique<NegateFunction>());
    }
};

} // namespace

void addArithmeticFunctions(DateFunctions& functions) {
    functions.push_back(std::make_unique<AddFunction>());
    functions.push_back(std::make_unique<DiffFunction>());
    functions.push_back(std::make_unique<CompareFunction>());
    functions.push_back(std::make_unique<IntervalFunction>());
}

} // namespace host
