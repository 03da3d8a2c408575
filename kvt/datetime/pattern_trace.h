// Patterns, explained: what each element of a pattern means, and what each took when a value was read. For programs
// that show patterns to people, as `kvt date why` does; whoever only wants the value calls parse() (datetime.h).
//
//     for (const PatternTrace& tried : traceParse("2020-13-01", "%Y-%m-%d", false)) {
//         for (const PatternStep& step : tried.steps) {
//             // "%Y" read "2020", "-" read "-", "%m" stopped at byte 5, "-" and "%d" were not reached
//         }
//     }
//
// All words are English and in UTF-8. They describe and are not messages; a host that translates has the numbers of
// message_numbers.h. The functions throw nothing but std::bad_alloc, and may be called from any thread.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/foundation/export.h>
#include <kvt/foundation/optional.h>
#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>

#include <cstdint>

namespace kvt::ex::datetime {

/// One element of the language of patterns.
struct PatternElement {
    UString<0> element; ///< "%Y", "%Ez", "*"
    UString<0>
        reads; ///< what parse() reads, with the bounds that `lenient` lifts in brackets; empty: unknown to it
    UString<0> writes; ///< what format() writes, and of which values; empty: unknown to it
};

/// All elements, in the order of the documents. Anything else stands for itself, byte for byte.
KVT_EXPORT vector<PatternElement> patternElements();

/// How far an element came.
enum class PatternStepState : std::uint32_t {
    Read = 0,       ///< it took `taken`, which may be nothing
    Stopped = 1,    ///< it did not fit what stood at `at`
    NotReached = 2, ///< an element before it did not fit
    Unknown = 3,    ///< it took a part of a character, or the text is not in the system's encoding at all
};

/// One element of a pattern, and what it did. Characters that stand for themselves are one element as long as they are
/// read or not reached together.
struct PatternStep {
    UString<0> element; ///< as it stands in the pattern
    UString<0> reads;   ///< what it reads, here: "month: exactly 2 digits, 1 to 12"
    PatternStepState state = PatternStepState::Unknown;
    kvt::future::optional<std::uint64_t>
        at;           ///< bytes of the value before it, where that is the end of a character
    UString<0> taken; ///< what it read; only with `Read`
    UString<0> why;   ///< why it stopped: "The number is out of its bounds."; only with `Stopped`
};

/// How a value was read by one pattern, or by a keyword.
struct PatternTrace {
    UString<0> keyword; ///< as it stands in the format; empty where the format is a pattern itself
    UString<0>
        form; ///< the pattern, without the blanks at its ends; what else the keyword stands for, in words
    bool isKnown = false;   ///< false for an item of a list that is not a keyword, and is passed over
    bool isPattern = false; ///< whether `form` is one
    bool wasTried = false;  ///< false where a form before it fitted
    vector<PatternStep> steps;
    kvt::future::optional<std::uint64_t> end; ///< bytes of the value that were read, where all elements were
    TextResult result; ///< what parse() gives by this form alone; only where it was tried
};

/// What parse() does with a value, step by step. One trace for a pattern; for keywords one for each form that they
/// stand for, in the order in which parse() tries them. Bytes are counted in the value without the blanks at its ends.
KVT_EXPORT vector<PatternTrace> traceParse(const UString<0>& value, const UString<0>& format, bool lenient);

} // namespace kvt::ex::datetime
