// The functions of `kvt date` that turn one form of a value into another: parse, format, cast.

#include "date/function.h"
#include "date/pattern_words.h"

#include "base/failure.h"
#include "base/text.h"
#include "cli/choices.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/message_numbers.h>

#include <limits>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
using kvt::ex::UString;

// How well a value fits a format that it failed by, for the choice among several: by how much of a pattern it fits, and
// best where the pattern is not what it failed by, as on 30 February.
std::size_t howWellItFits(const DateOutcome& failure) {
    namespace message_number = datetime::message_number;
    if (!failure.message || failure.message->number == message_number::noKeywordMatched) {
        return 0;
    }
    return failure.message->number == message_number::formatMismatch
               ? failure.message->parameters.at(0).size()
               : std::numeric_limits<std::size_t>::max();
}

class ParseFunction : public ValueFunction {
public:
    ParseFunction()
        : ValueFunction({"parse", "Read a value in any form", R"(kvt date parse '31 Jan 2020' '%d %b %Y'
kvt date parse 2020-01-31T12:30:00Z ISO
cut -f 3 log.tsv | kvt date parse 'ZQT|ISO' --or '%d.%m.%Y$' --or '%d %b %Y$')",
                         "VALUE", "FORMAT",
                         "A pattern such as '%Y-%m-%d', or the keywords ZQT and ISO, '|' between "
                         "them"}) {}

private:
    void declareOptions(Syntax& syntax) override {
        syntax.option(
            "--or", others_, "FORMAT",
            "Another FORMAT for values that FORMAT does not fit; may be given several times, and the "
            "first that fits is taken. A value that fits none is reported by the one that it fits "
            "best"); // one FORMAT for each --or, however many stand behind it
        syntax.flag("--lenient", lenient_,
                    "Let parts run over into the next larger one: 30 February is in March");
    }
    std::string ownNotes() const override { return readPatternHelp(); }
    std::string whatIsWrongWith(const std::string& format) const override {
        std::string wrong = wrongInReadFormat(format);
        for (auto other = others_.begin(); wrong.empty() && other != others_.end(); ++other) {
            requireUtf8("--or", *other);
            wrong = wrongInReadFormat(*other);
        }
        return wrong;
    }
    std::string exampleFor(const std::string& value) const override {
        for (const char* format : {"ISO", "ZQT", "%d.%m.%Y$", "%m/%d/%Y$", "%d %b %Y$", "%H:%M$"}) {
            if (outcomeOf(datetime::parse(toUString(value), format, lenient_)).isGood()) {
                return *format == '%' ? "'" + std::string(format) + "'" : format;
            }
        }
        return "FORMAT";
    }
    void prepare(const std::string& operand) override {
        formats_ = {{operand, toUString(operand)}};
        for (const std::string& other : others_) {
            formats_.push_back({other, toUString(other)});
        }
    }
    DateOutcome apply(const UString<0>& value) override {
        DateOutcome best = read(value, formats_.front());
        for (auto format = formats_.begin() + 1; format != formats_.end() && !best.isGood(); ++format) {
            DateOutcome outcome = read(value, *format);
            if (outcome.isGood() || howWellItFits(outcome) > howWellItFits(best)) {
                best = std::move(outcome);
            }
        }
        return best;
    }
    struct Format {
        std::string typed;
        UString<0> text;
    };
    DateOutcome read(const UString<0>& value, const Format& format) const {
        DateOutcome outcome = outcomeOf(datetime::parse(value, format.text, lenient_));
        outcome.format = format.typed;
        return outcome;
    }

    std::vector<std::string> others_;
    std::vector<Format> formats_;
    bool lenient_ = false;
};

class FormatFunction : public ValueFunction {
public:
    FormatFunction()
        : ValueFunction({"format", "Write a value in any form", R"(kvt date format 20200131 '%A, %e %B %Y'
kvt date format 20200131123000+01:00 ISO)",
                         "VALUE", "FORMAT", "A pattern such as '%d.%m.%Y', or the keyword ZQT or ISO"}) {}

private:
    std::string ownNotes() const override { return writtenPatternHelp(); }
    std::string whatIsWrongWith(const std::string& format) const override {
        return wrongInWrittenFormat(format);
    }
    std::string exampleFor(const std::string& value) const override { return isValue(value) ? "ISO" : ""; }
    void prepare(const std::string& operand) override { format_ = toUString(operand); }
    DateOutcome apply(const UString<0>& value) override {
        return outcomeOf(datetime::format(value, format_));
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
