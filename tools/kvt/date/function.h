// What a function of `kvt date` is to that command: a subcommand with a help, options, and something to run.
//
// Most take one value and perhaps one thing more, such as a format, and read many values from standard input when the
// value is left out. They derive from ValueFunction, and say only what becomes of one value. A new function is a
// class in one of this folder's files and one line in date_command.cpp.
#pragma once

#include "base/diagnostics.h"
#include "cli/syntax.h"
#include "date/outcome.h"
#include "date/pattern_words.h"
#include "text/value_lines.h"

#include <kvt/string/ustring.h>

#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace host {

class DateFunction {
public:
    virtual ~DateFunction() = default;
    /// Adds the subcommand to `parent`.
    virtual void declare(Syntax& parent) = 0;
    /// Whether this is the one that the command line asks for.
    virtual bool isChosen() const = 0;
    /// Gives an ExitStatus.
    virtual int run(Diagnostics& diagnostics) = 0;
};

using DateFunctions = std::vector<std::unique_ptr<DateFunction>>;

class ValueFunction : public DateFunction {
public:
    struct Words {
        const char* name;
        const char* summary;
        const char* examples;
        const char* value;       ///< the name of the value in the help
        const char* operand;     ///< the name of what stands behind the value; empty when nothing does
        const char* operandHelp; ///< and what it is
    };
    explicit ValueFunction(const Words& words) : words_(words) {}

    void declare(Syntax& parent) final;
    bool isChosen() const final { return syntax_ != nullptr && syntax_->isChosen(); }
    int run(Diagnostics& diagnostics) final;

protected:
    virtual void declareOptions(Syntax&) {}
    /// What the help says about the function alone, behind the options.
    virtual std::string ownNotes() const { return {}; }
    /// What is wrong with the operand, whatever the value is; empty where nothing is.
    virtual std::string whatIsWrongWith(const std::string&) const { return {}; }
    /// For a `value` that stands without an operand: one with which it would do. Empty where `value` is not one.
    virtual std::string exampleFor(const std::string&) const { return {}; }
    /// Looks at the operand and the options once, before all values. Throws Failure.
    virtual void prepare(const std::string& operand) = 0;
    virtual DateOutcome apply(const kvt::ex::UString<0>& value) = 0;

private:
    std::string likelyMeant(const std::string& typed) const;

    struct Typed {
        Option option;
        std::string text;
    };

    Words words_;
    Syntax* syntax_ = nullptr;
    Typed first_;
    Typed second_;
    Typed negativeInterval_;
    ValueLines lines_;
    bool json_ = false;
};

/// A subcommand that has subcommands of its own and does nothing else.
class FunctionGroup : public DateFunction {
public:
    FunctionGroup(const char* name, const char* summary, const char* examples)
        : name_(name), summary_(summary), examples_(examples) {}

    void declare(Syntax& parent) final;
    bool isChosen() const final { return syntax_ != nullptr && syntax_->isChosen(); }
    int run(Diagnostics& diagnostics) final;

protected:
    void add(std::unique_ptr<DateFunction> function) { functions_.push_back(std::move(function)); }

private:
    const char* name_;
    const char* summary_;
    const char* examples_;
    Syntax* syntax_ = nullptr;
    DateFunctions functions_;
};

/// Declares --zone-database, and names its folder to the library once the command line is read.
class ZoneDatabaseOption {
public:
    void declare(Syntax& syntax);
    /// As if that folder was given; the usual one where it is empty.
    void choose(const std::string& folder) { named_ = folder; }
    void use() const;
    /// The folder, which is made where it has to be and can be.
    std::string folder() const;

private:
    std::string named_;
};

/// The text of an argument. Throws what the library throws where it is not UTF-8.
kvt::ex::UString<0> toUString(const std::string& utf8);

/// Whether it is a date, a time or both in canonical form.
bool isValue(const std::string& text);

/// What the help of every function says about input and exit statuses.
extern const char* const valueNotes;

// The functions by what they deal with; each adds its own, in the order of the help.
void addTextFunctions(DateFunctions& functions);       ///< parse, format, cast
void addArithmeticFunctions(DateFunctions& functions); ///< add, diff, compare, interval
void addZoneFunctions(DateFunctions& functions);       ///< zone, now
void addWhyFunction(DateFunctions& functions);         ///< why

} // namespace host
