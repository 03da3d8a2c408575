// The functions of `kvt date` that turn one form of a value into another: parse, format, cast.

#include "date/function.h"

#include "base/failure.h"
#include "base/messages.h"
#include "base/table.h"
#include "base/text.h"
#include "base/text_units.h"
#include "cli/choices.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/message_numbers.h>
#include <kvt/datetime/pattern_trace.h>

#include <algorithm>
#include <limits>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
using kvt::ex::UString;

constexpr const char* emptyValue = "The value is empty.";

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

// The language of patterns as one of the two functions knows it, for its help.
std::string patternHelp(const char* heading, UString<0> datetime::PatternElement::*words) {
    std::vector<std::vector<std::string>> rows;
    for (const datetime::PatternElement& row : datetime::patternElements()) {
        if (!(row.*words).isEmpty()) {
            rows.push_back({" ", row.element.toStdString(), (row.*words).toStdString()});
        }
    }
    return std::string(heading) + "\n" + formatTable({Align::Left, Align::Left, Align::Left}, rows) + "\n";
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
    std::string ownNotes() const override {
        return patternHelp("What a pattern reads; --lenient lifts a bound in brackets:",
                           &datetime::PatternElement::reads);
    }
    void prepare(const std::string& operand) override {
        formats_ = {toUString(operand)};
        for (const std::string& other : others_) {
            formats_.push_back(toUString(other));
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
    DateOutcome read(const UString<0>& value, const UString<0>& format) const {
        DateOutcome outcome = outcomeOf(datetime::parse(value, format, lenient_));
        outcome.withoutMessage = emptyValue;
        return outcome;
    }

    std::vector<std::string> others_;
    std::vector<UString<0>> formats_;
    bool lenient_ = false;
};

class FormatFunction : public ValueFunction {
public:
    FormatFunction()
        : ValueFunction({"format", "Write a value in any form", R"(kvt date format 20200131 '%A, %e %B %Y'
kvt date format 20200131123000+01:00 ISO)",
                         "VALUE", "FORMAT", "A pattern such as '%d.%m.%Y', or the keyword ZQT or ISO"}) {}

private:
    std::string ownNotes() const override {
        return patternHelp("What a pattern writes:", &datetime::PatternElement::writes);
    }
    void prepare(const std::string& operand) override {
        // The library takes such a format for text that is to be written as it stands.
        if (operand.find('%') == std::string::npos && !withoutBlanks(operand).empty() &&
            !hasKeyword(operand)) {
            throw Failure(describe(datetime::message_number::noKnownKeyword, {printable(operand)}));
        }
        format_ = toUString(operand);
    }
    // Whether one of the words between "|" is a keyword, in any case.
    static bool hasKeyword(const std::string& format) {
        for (std::size_t begin = 0; begin <= format.size();) {
            const std::size_t end = std::min(format.find('|', begin), format.size());
            std::string word = withoutBlanks(std::string_view(format).substr(begin, end - begin));
            std::transform(word.begin(), word.end(), word.begin(), asciiLower);
            if (word == "zqt" || word == "iso") {
                return true;
            }
            begin = end + 1;
        }
        return false;
    }
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
