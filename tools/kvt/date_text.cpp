// The functions of `kvt date` that turn one form of a value into another: parse, format, cast.

#include "date_function.h"

#include <kvt/datetime/datetime.h>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
using kvt::ex::UString;

constexpr const char* emptyValue = "The value is empty.";

class ParseFunction : public ValueFunction {
public:
    ParseFunction()
        : ValueFunction({"parse", "Read a value in any form", R"(kvt date parse '31 Jan 2020' '%d %b %Y'
kvt date parse 2020-01-31T12:30:00Z ISO
cut -f 3 log.tsv | kvt date parse 'ZQT|ISO')",
                         "VALUE", "FORMAT",
                         "A pattern such as '%Y-%m-%d', or the keywords ZQT and ISO, '|' between "
                         "them"}) {}

private:
    void declareOptions(CLI::App& app) override {
        app.add_flag("--lenient", lenient_,
                     "Let parts run over into the next larger one: 30 February is in March");
    }
    void prepare(const std::string& operand) override { format_ = toUString(operand); }
    DateOutcome apply(const UString<0>& value) override {
        DateOutcome outcome = outcomeOf(datetime::parse(value, format_, lenient_));
        outcome.withoutMessage = emptyValue;
        return outcome;
    }

    UString<0> format_;
    bool lenient_ = false;
};

class FormatFunction : public ValueFunction {
public:
    FormatFunction()
        : ValueFunction({"format", "Write a value in any form", R"(kvt date format 20200131 '%A, %e %B %Y'
kvt date format 20200131123000+01:00 ISO)",
                         "VALUE", "FORMAT", "A pattern such as '%d.%m.%Y', or the keyword ZQT or ISO"}) {}

private:
    void prepare(const std::string& operand) override { format_ = toUString(operand); }
    DateOutcome apply(const UString<0>& value) override {
        DateOutcome outcome = outcomeOf(datetime::format(value, format_));
        outcome.withoutMessage = emptyValue;
        return outcome;
    }

    UString<0> format_;
};

const Choices<datetime::CastToTemporalType> castChoices = {
    {"date", datetime::CastToTemporalType::Date},
    {"time", datetime::CastToTemporalType::Time},
    {"datetime", datetime::CastToTemporalType::Datetime},
};

class CastFunction : public ValueFunction {
public:
    CastFunction()
        : ValueFunction({"cast", "Make a value one of another kind", "kvt date cast 20200131123000 date",
                         "VALUE", "KIND", "date, time or datetime"}) {}

private:
    void prepare(const std::string& operand) override { target_ = choose("KIND", operand, castChoices); }
    DateOutcome apply(const UString<0>& value) override { return outcomeOf(datetime::cast(value, target_)); }

    datetime::CastToTemporalType target_ = datetime::CastToTemporalType::Unknown;
};

} // namespace

void addTextFunctions(DateFunctions& functions) {
    functions.push_back(std::make_unique<ParseFunction>());
    functions.push_back(std::make_unique<FormatFunction>());
    functions.push_back(std::make_unique<CastFunction>());
}

} // namespace host
