// How a value was read by a pattern: what each element of the pattern took from the value, and where and why it
// stopped.
//
// The library says only whether the whole pattern fits and, if not, at which element it failed. All else comes from
// asking it more: how far the value was read once the first elements of the pattern had theirs, is the one length to
// which the value can be cut so that these elements take it up to its end. A "$" behind them asks just that. No
// element looks at more than one byte behind what it takes, so that cutting there changes nothing; a longer piece
// fails, as something is left over; and the longest pieces are asked about first.
//
// Three things keep the question exact. It begins with a "%%" and the value with a "%", so that blanks at the start
// are not trimmed away and there always is a flag; like the start of a pattern, that leaves no number before. A piece
// that ends in a blank gets a character behind it that is nowhere else, as blanks at the end are trimmed too. And
// after a "*", which looks at the pattern behind itself, the questions begin anew.
//
// Places are those of whole characters: a "?" that takes one of several bytes of a character leaves its place and the
// end of what it took unknown, and that is what is said.
#pragma once

#include "date_outcome.h"

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace host {

enum class StepState {
    Read,       ///< it took `taken`, which may be nothing
    Stopped,    ///< it did not fit what stood at `at`
    NotReached, ///< an element before it did not fit
    Unknown,    ///< it was read, or may have been; how is not known
};

struct WhyStep {
    std::string element; ///< as it stands in the pattern
    std::string meaning; ///< what it reads
    StepState state = StepState::Unknown;
    std::optional<std::size_t> at; ///< bytes of the value before it
    std::string taken;
};

struct WhyReading {
    std::string value;  ///< without the blanks at its ends, which do not count
    std::string format; ///< likewise
    std::vector<WhyStep> steps;
    std::optional<std::size_t> end; ///< bytes of the value that were read, where all elements were
    DateOutcome outcome;
};

/// The text without the blanks that do not count.
std::string withoutBlanks(std::string_view text);

/// Whether `format` is a pattern; else it is a list of keywords.
bool isPattern(std::string_view format);

/// `format` has to be a pattern. Throws what the library throws for text that is no UTF-8.
WhyReading whyByPattern(const std::string& value, const std::string& format, bool lenient);

/// One form that was tried because a keyword names it.
struct WhyTry {
    std::string keyword;
    std::string form; ///< the pattern that stands behind it, or what else it means
    bool wasTried = false;
    std::optional<WhyReading> reading; ///< where the form is a pattern
    bool fits = false;
};

/// The forms of a list of keywords, in order, up to the one that fits.
std::vector<WhyTry> whyByKeywords(const std::string& value, const std::string& format, bool lenient);

/// "read", "stopped", "not reached" or "not known".
const char* stepStateName(StepState state);

} // namespace host
