// Words for elements, and the steps of a PatternReader as they go. The reader counts bytes in the system's encoding; a
// trace shows whole characters and counts in the value as it was given.
#include <kvt/datetime/pattern_trace.h>

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/keywords.h>
#include <kvt/datetime/detail/pattern_reader.h>
#include <kvt/datetime/detail/pattern_table.h>
#include <kvt/datetime/detail/system_bytes.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>
#include <kvt/foundation/throwable.h>

#include <algorithm>
#include <optional>
#include <string>
#include <string_view>

namespace kvt::ex::datetime {

namespace {

using namespace detail;

UString<0> ustring(std::string_view text) {
    return UString<0>(UStringView<0>(text));
}

/// Bytes of the value in front of something, where that is the end of a character.
using Place = std::optional<std::uint64_t>;

// ---- Words for elements

enum class BoundStyle { Strict, Lenient, InBrackets };

std::string boundsOf(const ReadRule& rule, BoundStyle style) {
    const std::string lowest = std::to_string(rule.lowest);
    const std::string highest = std::to_string(rule.highest);
    if (!rule.lenientLifts || style == BoundStyle::Strict) {
        return lowest + " to " + highest;
    }
    return style == BoundStyle::Lenient ? "from " + lowest : lowest + " to (" + highest + ")";
}

std::string wordsOf(const ReadRule& rule, bool isExact, BoundStyle style) {
    std::string words(rule.what);
    if (rule.width != 0) {
        words += std::string(isExact ? ": exactly " : ": up to ") + std::to_string(rule.width) + " digits, " +
                 boundsOf(rule, style);
    }
    return words + (rule.reading == Reading::Seconds ? ", and a fraction" : "");
}

std::string wordsOf(const WriteRule& rule) {
    return std::string(rule.what) + (rule.kinds.words.empty() ? "" : "; ") + std::string(rule.kinds.words);
}

// What an element of a format reads, right behind a number or not.
std::string wordsOf(std::string_view element, bool isBehindNumber, bool lenient) {
    const PatternRow* const row = rowOfElement(element);
    if (row == nullptr || row->reads.reading == Reading::Unknown) {
        return element.front() == '%' ? "no known flag" : "itself";
    }
    const bool hasTail = row->reads.reading == Reading::Word && element.size() > 1;
    return wordsOf(row->reads, isBehindNumber && row->reads.isExactInRow,
                   lenient ? BoundStyle::Lenient : BoundStyle::Strict) +
           (hasTail ? ", that ends in what follows" : "");
}

bool endsInNumber(std::string_view element) {
    const PatternRow* const row = rowOfElement(element);
    return row != nullptr && isNumeric(row->reads.reading);
}

std::string_view wordsOf(StopReason reason) {
    switch (reason) {
    case StopReason::None:
        break;
    case StopReason::EndOfValue:
        return "The value ends here.";
    case StopReason::OtherCharacter:
        return "Another character stands here.";
    case StopReason::ValueGoesOn:
        return "The value goes on.";
    case StopReason::FormatGoesOn:
        return "The format goes on behind it.";
    case StopReason::NotANumber:
        return "No digit stands here.";
    case StopReason::TooFewDigits:
        return "There are too few digits.";
    case StopReason::OutOfBounds:
        return "The number is out of its bounds.";
    case StopReason::UnknownName:
        return "The name is not known.";
    case StopReason::NotAnOffset:
        return "An offset begins with Z, + or -.";
    case StopReason::WordEndsOtherwise:
        return "The word ends in something else.";
    case StopReason::NextIsFuzzyToo:
        return "What follows a * has to be known text or a flag.";
    case StopReason::UnknownFlag:
        return "There is no such flag.";
    case StopReason::SecondsOutOfRange:
        return "The seconds are outside of the years 1000 to 9999.";
    }
    return "";
}

// ---- Steps

bool isInsideCharacter(std::string_view utf8, std::size_t place) {
    return place < utf8.size() && (static_cast<unsigned char>(utf8[place]) & 0xC0) == 0x80;
}

bool isLiteral(char c) {
    return c != '%' && rowOfCharacter(c) == nullptr;
}

// The element at the start of a format as people see it: characters that stand for themselves together, no character
// in two.
std::string_view shownElement(std::string_view format) {
    if (!isLiteral(format.front())) {
        return wholeCharacters(format, elementOf(format).size());
    }
    return format.substr(0, static_cast<std::size_t>(
                                std::find_if_not(format.begin(), format.end(), isLiteral) - format.begin()));
}

/// Fills the steps of a trace. Value and format are without the blanks at their ends, in UTF-8.
class Tracer {
public:
    Tracer(std::string_view value, std::string_view format, bool lenient, PatternTrace& trace)
        : value_(value), format_(format), lenient_(lenient), trace_(trace) {}

    void run() {
        try {
            const SystemBytes value(value_);
            const SystemBytes format(format_);
            value_.empty() ? addRest(format.view(), PatternStepState::NotReached)
                           : readAll(value.view(), format.view());
        } catch (const Throwable&) {
            // One of the texts is not in the system's encoding.
            addRest(format_, PatternStepState::Unknown);
        }
    }

private:
    void readAll(std::string_view value, std::string_view format) {
        PatternReader reader(value, format, lenient_);
        while (!reader.isDone()) {
            const std::size_t begin = reader.formatPlace();
            const std::size_t from = reader.valuePlace();
            std::size_t to = from; // what the characters have taken that stand for themselves
            const std::size_t end = begin + shownElement(format.substr(begin)).size();
            while (reader.formatPlace() < end && reader.readNext()) {
                to = reader.valuePlace();
            }
            if (reader.formatPlace() < end) {
                return addStopped(reader, value, format, {begin, from, to});
            }
            addRead(format.substr(begin, end - begin), placeOf(value, from), placeOf(value, to));
        }
        trace_.end = placeOf(value, reader.valuePlace());
    }

    struct Stretch {
        std::size_t begin; ///< in the format
        std::size_t from;  ///< in the value
        std::size_t to;
    };

    // Of characters that stand for themselves some may have been read.
    void addStopped(const PatternReader& reader, std::string_view value, std::string_view format,
                    Stretch read) {
        const std::size_t cut = std::max(read.begin, placeBetweenCharacters(format, reader.formatPlace()));
        const std::size_t to = read.to - (reader.formatPlace() - cut);
        if (cut > read.begin) {
            addRead(format.substr(read.begin, cut - read.begin), placeOf(value, read.from),
                    placeOf(value, to));
        }
        const std::string_view element = shownElement(format.substr(cut));
        PatternStep& step = add(element, PatternStepState::Stopped);
        step.at = placeOf(value, to);
        step.why = ustring(wordsOf(reader.stopReason()));
        addRest(format.substr(cut + element.size()), PatternStepState::NotReached);
    }

    void addRead(std::string_view element, Place from, Place to) {
        const bool isWhole = from && to;
        PatternStep& step = add(element, isWhole ? PatternStepState::Read : PatternStepState::Unknown);
        step.at = from;
        if (isWhole) {
            step.taken = ustring(value_.substr(*from, *to - *from));
        }
    }

    void addRest(std::string_view format, PatternStepState state) {
        while (!format.empty()) {
            const std::string_view element = shownElement(format);
            add(element, state);
            format.remove_prefix(element.size());
        }
    }

    PatternStep& add(std::string_view element, PatternStepState state) {
        PatternStep step;
        step.element = readableSystemBytes(element);
        step.reads = ustring(wordsOf(element, isBehindNumber_, lenient_));
        step.state = state;
        isBehindNumber_ = endsInNumber(element);
        trace_.steps.push_back(std::move(step));
        return trace_.steps.back();
    }

    // Where a place of the system's bytes is in the value; none inside a character.
    Place placeOf(std::string_view bytes, std::size_t place) const {
        const bool isSame = bytes.data() == value_.data();
        const std::size_t found = isSame ? place : readableSystemBytes(bytes.substr(0, place)).size();
        return isInsideCharacter(value_, found) ? std::nullopt : Place(found);
    }

    std::string_view value_;
    std::string_view format_;
    bool lenient_;
    PatternTrace& trace_;
    bool isBehindNumber_ = false;
};

void traceByPattern(const UString<0>& value, bool lenient, PatternTrace& trace) {
    trace.isKnown = true;
    trace.isPattern = true;
    trace.wasTried = true;
    trace.result = parse(value, trace.form, lenient);
    Tracer(trimmed(viewOf(value)), viewOf(trace.form), lenient, trace).run();
}

// ---- Keywords

bool isGood(const TextResult& result) {
    return std::get<0>(result) == ReturnState::Success;
}

// Whether a result ends the search. A part that is out of range does; only what is not such a form goes on to the next
// keyword.
bool isLast(const TextResult& result) {
    const auto& message = std::get<2>(result);
    return isGood(result) || !message || message->messageNumber != message_number::noKeywordMatched;
}

class KeywordTracer {
public:
    KeywordTracer(const UString<0>& value, bool lenient) : value_(value), lenient_(lenient) {}

    void add(std::string_view item) {
        const std::optional<Keyword> keyword = keywordOf(item);
        if (!keyword) {
            addForm(item, "no known keyword", false);
        } else if (*keyword == Keyword::Zqt) {
            PatternTrace& trace = addForm(item, "the canonical form", true);
            if (!isOver_) {
                trace.wasTried = true;
                trace.result = parse(value_, UString<0>("ZQT"), lenient_);
                isOver_ = isLast(trace.result);
            }
        } else {
            for (const TemporalType kind : isoOrder) {
                addIso(item, isoReadPattern(kind));
            }
        }
    }

    vector<PatternTrace> take() { return std::move(traces_); }

private:
    PatternTrace& addForm(std::string_view item, std::string_view form, bool isKnown) {
        PatternTrace trace;
        trace.isKnown = isKnown;
        trace.keyword = ustring(trimmed(item));
        trace.form = ustring(form);
        traces_.push_back(std::move(trace));
        return traces_.back();
    }

    void addIso(std::string_view item, std::string_view pattern) {
        PatternTrace& trace = addForm(item, pattern, true);
        trace.isPattern = true;
        if (!isOver_) {
            traceByPattern(value_, lenient_, trace);
            isOver_ = isGood(trace.result);
        }
    }

    const UString<0>& value_;
    bool lenient_;
    bool isOver_ = false;
    vector<PatternTrace> traces_;
};

} // namespace

vector<PatternElement> patternElements() {
    vector<PatternElement> elements;
    elements.reserve(patternRows.size());
    for (const PatternRow& row : patternRows) {
        elements.push_back({ustring(row.element), ustring(wordsOf(row.reads, false, BoundStyle::InBrackets)),
                            ustring(wordsOf(row.writes))});
    }
    return elements;
}

vector<PatternTrace> traceParse(const UString<0>& value, const UString<0>& format, bool lenient) {
    const std::string_view list = trimmed(viewOf(format));
    if (isKeywordList(list)) {
        KeywordTracer tracer(value, lenient);
        KeywordList items(list);
        while (const std::optional<std::string_view> item = items.nextItem()) {
            tracer.add(*item);
        }
        return tracer.take();
    }
    vector<PatternTrace> traces(1);
    traces.front().form = ustring(list);
    traceByPattern(value, lenient, traces.front());
    return traces;
}

} // namespace kvt::ex::datetime
