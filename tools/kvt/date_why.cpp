#include "date_why.h"

#include "date_function.h"

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/message_numbers.h>

#include <algorithm>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
namespace message_number = kvt::ex::datetime::message_number;

constexpr std::string_view blanks = " \t\r\n\f\v";

bool isBlank(char c) {
    return blanks.find(c) != std::string_view::npos;
}

bool isInsideCharacter(char byte) {
    return (static_cast<unsigned char>(byte) & 0xC0u) == 0x80u;
}

// ---- The elements of a pattern

struct NumberFlag {
    char flag;
    const char* what;
    const char* width;
    const char* bounds;
    const char* lenientBounds;
};

constexpr NumberFlag numberFlags[] = {
    {'Y', "year", "4", "1000 to 9999", "1000 to 9999"},
    {'m', "month", "2", "1 to 12", "from 1"},
    {'N', "month", "2", "1 to 12", "from 1"},
    {'d', "day of the month", "2", "1 to 31", "from 1"},
    {'e', "day of the month", "2", "1 to 31", "from 1"},
    {'j', "day of the year", "3", "1 to 366", "from 1"},
    {'H', "hour", "2", "0 to 23", "from 0"},
    {'k', "hour", "2", "0 to 23", "from 0"},
    {'I', "hour", "2", "1 to 12", "1 to 12"},
    {'l', "hour", "2", "1 to 12", "1 to 12"},
    {'M', "minute", "2", "0 to 59", "from 0"},
    {'S', "second", "2", "0 to 59", "from 0"},
};

struct OtherFlag {
    const char* flag;
    const char* meaning;
};

constexpr OtherFlag otherFlags[] = {
    {"%b", "month by three letters; an unknown one leaves it open"},
    {"%B", "month by its whole name"},
    {"%p", "am or pm"},
    {"%T", "time, as %H:%M:%S"},
    {"%s", "seconds since 1970 in UTC"},
    {"%Es", "seconds since 1970 as a local time"},
    {"%z", "offset: Z, +hh, +hhmm or +hh:mm"},
    {"%Ez", "offset: Z, +hh, +hhmm or +hh:mm"},
    {"%%", "the character itself"},
    {"%$", "the character itself"},
    {"%*", "the character itself"},
    {"%?", "the character itself"},
};

const NumberFlag* numberFlagOf(std::string_view element) {
    const auto* const found =
        std::find_if(std::begin(numberFlags), std::end(numberFlags), [&](const NumberFlag& row) {
            return element.size() == 2 && element[0] == '%' && element[1] == row.flag;
        });
    return found == std::end(numberFlags) ? nullptr : found;
}

bool isEpochOrOffset(std::string_view element) {
    return element == "%s" || element == "%Es" || element == "%z" || element == "%Ez";
}

// Whether a number right behind this element has to take its whole width.
bool endsInNumber(std::string_view element) {
    return numberFlagOf(element) != nullptr || element == "%T" || isEpochOrOffset(element);
}

std::string meaningOf(std::string_view element, bool afterNumber, bool lenient) {
    if (const NumberFlag* row = numberFlagOf(element)) {
        const bool exact = afterNumber && row->flag != 'j';
        return std::string(row->what) + ": " + (exact ? "exactly " : "up to ") + row->width + " digits, " +
               (lenient ? row->lenientBounds : row->bounds) + (row->flag == 'S' ? ", and a fraction" : "");
    }
    for (const OtherFlag& row : otherFlags) {
        if (element == row.flag) {
            return row.meaning;
        }
    }
    switch (element.front()) {
    case '%':
        return "no known flag";
    case '*':
        return element.size() == 1 ? "one word, up to a blank"
                                   : "one word, up to a blank, that ends in what follows";
    case '?':
        return "any one character";
    case '$':
        return "the end of the value, as the end of the format";
    default:
        return "itself";
    }
}

// The length of the element at the start of `format`.
std::size_t elementLength(std::string_view format) {
    const auto upTo = [&](std::size_t end) { return std::min(end, format.size()); };
    const auto wholeCharacter = [&](std::size_t end) {
        while (end < format.size() && isInsideCharacter(format[end])) {
            ++end;
        }
        return upTo(end);
    };
    switch (format.front()) {
    case '%':
        return format.substr(0, 2) == "%E" ? wholeCharacter(3) : wholeCharacter(2);
    case '?':
    case '$':
        return 1;
    case '*': {
        // What the word has to end in belongs to the "*".
        if (format.substr(1, 1) == "%") {
            const bool isLiteral =
                format.size() > 2 && std::string_view("%*?").find(format[2]) != std::string_view::npos;
            return isLiteral ? 3 : 1;
        }
        return upTo(format.find_first_of(std::string(blanks) + "$", 1));
    }
    default:
        return upTo(format.find_first_of("%?$*"));
    }
}

struct Element {
    std::size_t begin;
    std::size_t end;
};

// `cut` is a place where an element ends in any case: a failure may lie inside a run of ordinary characters.
std::vector<Element> elementsOf(std::string_view format, std::size_t cut) {
    std::vector<Element> elements;
    for (std::size_t begin = 0; begin < format.size();) {
        std::size_t end = begin + elementLength(format.substr(begin));
        if (begin < cut && cut < end) {
            end = cut;
        }
        elements.push_back({begin, end});
        begin = end;
    }
    return elements;
}

// A part of a format as a message tells it once it has matched: with what stands behind each "%T".
std::string expanded(std::string_view format) {
    std::string text;
    for (const Element& element : elementsOf(format, 0)) {
        const std::string_view one = format.substr(element.begin, element.end - element.begin);
        text += one == "%T" ? std::string_view("%H:%M:%S") : one;
    }
    return text;
}

// ---- Questions

enum class Answer { Fits, DoesNotFit, BadElement, NotKnown };

// Whether all elements found what they read. What is wrong with the fields as a whole is seen only after that.
Answer answerOf(const DateOutcome& outcome) {
    using namespace message_number;
    if (outcome.isGood()) {
        return Answer::Fits;
    }
    if (!outcome.message) {
        return Answer::NotKnown;
    }
    switch (outcome.message->number) {
    case formatMismatch:
        return Answer::DoesNotFit;
    case unknownFlag:
    case epochTimeOutOfRange:
        return Answer::BadElement;
    case ordinalWithoutYear:
    case dateIncomplete:
    case flagsExcludeEachOther:
    case offsetWithoutTime:
    case timeIncomplete:
    case nothingGiven:
    case hourNotForMeridiem:
    case ordinalPastYearEnd:
    case noSuchDate:
    case resultYearOutOfRange:
        return Answer::Fits;
    default:
        return Answer::NotKnown;
    }
}

DateOutcome parsed(const std::string& value, const std::string& format, bool lenient) {
    return outcomeOf(datetime::parse(toUString(value), toUString(format), lenient));
}

// A control character, none of the blanks, that `value` does not hold.
std::optional<char> unusedCharacter(std::string_view value) {
    for (char c = '\x01'; c < ' '; ++c) {
        if (!isBlank(c) && value.find(c) == std::string_view::npos) {
            return c;
        }
    }
    return std::nullopt;
}

class Explanation {
public:
    Explanation(const std::string& value, const std::string& format, bool lenient)
        : lenient_(lenient), reading_{withoutBlanks(value),
                                      withoutBlanks(format),
                                      {},
                                      std::nullopt,
                                      parsed(value, format, lenient)} {
        reading_.outcome.withoutMessage = "The value is empty.";
        unused_ = unusedCharacter(reading_.value);
    }

    WhyReading run() {
        const std::optional<std::size_t> failing = failingPlace();
        hasStopped_ = reading_.value.empty();
        bool afterNumber = false;
        for (const Element& element : elementsOf(reading_.format, failing.value_or(0))) {
            const std::string text = reading_.format.substr(element.begin, element.end - element.begin);
            reading_.steps.push_back(
                {text, meaningOf(text, afterNumber, lenient_), StepState::Unknown, std::nullopt, ""});
            afterNumber = endsInNumber(text);
            walk(element, reading_.steps.back(), failing);
        }
        if (!hasStopped_ && isCertain_) {
            reading_.end = position_;
        }
        return std::move(reading_);
    }

private:
    // Where in the format it failed; its end where no element did. None where a failure says nothing about places.
    std::optional<std::size_t> failingPlace() {
        switch (answerOf(reading_.outcome)) {
        case Answer::Fits:
        case Answer::BadElement: // which one is found on the way
            return reading_.format.size();
        case Answer::DoesNotFit:
            break;
        case Answer::NotKnown:
            return std::nullopt;
        }
        const std::vector<std::string>& parts = reading_.outcome.message->parameters;
        if (parts.size() != 2) {
            return std::nullopt;
        }
        // Where the format did not survive the system's encoding, there is no place in it either.
        if (!reading_.format.ends_with(parts[1])) {
            return std::nullopt;
        }
        const std::size_t place = reading_.format.size() - parts[1].size();
        return parts[0] == expanded(reading_.format.substr(0, place)) ? std::optional(place) : std::nullopt;
    }

    void walk(const Element& element, WhyStep& step, std::optional<std::size_t> failing) {
        if (hasStopped_) {
            step.state = StepState::NotReached;
        } else if (!failing) {
            isCertain_ = false;
        } else if (element.begin == *failing || isBad(element)) {
            stop(step);
        } else if (step.element == "$" && !isEndAt(element)) {
            stop(step); // which goes unsaid, as flags that exclude each other are told first
        } else if (step.element == "$") {
            step.state = StepState::Read;
            step.at = position_ = reading_.value.size();
            isCertain_ = true;
        } else {
            findEnd(element, step);
        }
    }

    // Whether a "$" may be the end of both, as far as that is known.
    bool isEndAt(const Element& element) const {
        return element.end == reading_.format.size() && (!isCertain_ || position_ == reading_.value.size());
    }

    bool flagsExcludeEachOther() const {
        return reading_.outcome.message &&
               reading_.outcome.message->number == message_number::flagsExcludeEachOther;
    }

    bool isAsciiFrom(std::size_t place) const {
        return std::all_of(reading_.value.begin() + static_cast<std::ptrdiff_t>(place), reading_.value.end(),
                           [](char c) { return static_cast<unsigned char>(c) < 0x80; });
    }

    void stop(WhyStep& step) {
        hasStopped_ = true;
        step.state = StepState::Stopped;
        step.at = knownPosition();
    }

    bool isBad(const Element& element) const {
        return answerOf(reading_.outcome) == Answer::BadElement && canAsk_ &&
               ask(element, reading_.value.size()) == Answer::BadElement;
    }

    void findEnd(const Element& element, WhyStep& step) {
        const bool isWord = step.element.front() == '*';
        for (std::size_t end = reading_.value.size() + 1; canAsk_ && end-- > position_;) {
            const bool isWhole = end == reading_.value.size() || !isInsideCharacter(reading_.value[end]);
            if (isWhole && ask(element, end) == Answer::Fits) {
                take(step, end);
                // Two flags that exclude each other would hide whether all else fits.
                if (isWord || isEpochOrOffset(step.element)) {
                    askFromFormat_ = element.end;
                    askFromValue_ = end;
                }
                return;
            }
        }
        if (isCertain_ && flagsExcludeEachOther() && isAsciiFrom(position_)) {
            stop(step); // which goes unsaid, as the flags are told first
            return;
        }
        // The element was read, but not up to a whole character.
        step.at = knownPosition();
        isCertain_ = false;
        canAsk_ = canAsk_ && !isWord;
    }

    void take(WhyStep& step, std::size_t end) {
        step.at = knownPosition();
        if (isCertain_) {
            step.state = StepState::Read;
            step.taken = reading_.value.substr(position_, end - position_);
        }
        position_ = end;
        isCertain_ = true;
    }

    std::optional<std::size_t> knownPosition() const {
        return isCertain_ ? std::optional(position_) : std::nullopt;
    }

    // Do the elements up to this one take the value up to `end`?
    Answer ask(const Element& element, std::size_t end) const {
        const bool isWord = reading_.format[element.begin] == '*';
        const std::size_t formatEnd = isWord ? element.begin + 1 : element.end;
        std::string value = "%" + reading_.value.substr(askFromValue_, end - askFromValue_);
        std::string format = "%%" + reading_.format.substr(askFromFormat_, formatEnd - askFromFormat_);
        if (isBlank(value.back())) {
            if (!unused_) {
                return Answer::NotKnown;
            }
            value += *unused_;
            format += *unused_;
        }
        // A "%" that ends the format would make a flag of the "$".
        const bool isLonePercent = reading_.format.substr(element.begin) == "%";
        return answerOf(parsed(value, format + (isLonePercent ? "" : "$"), lenient_));
    }

    bool lenient_;
    WhyReading reading_;
    std::optional<char> unused_;
    std::size_t position_ = 0; ///< what the elements so far took of the value, as far as that is known
    bool isCertain_ = true;    ///< whether it is
    bool canAsk_ = true;       ///< whether anything can be found out about further elements
    bool hasStopped_ = false;
    std::size_t askFromValue_ = 0; ///< where questions begin: at the start, or behind a later element
    std::size_t askFromFormat_ = 0;
};

constexpr const char* isoPatterns[] = {"%Y-%m-%d$", "%Y-%m-%dT%H:%M:%S$", "%Y-%m-%dT%H:%M:%S%Ez$",
                                       "%H:%M:%S$", "%H:%M:%S%Ez$"};

std::string upperCased(std::string text) {
    for (char& c : text) {
        c = c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c;
    }
    return text;
}

} // namespace

std::string withoutBlanks(std::string_view text) {
    const std::size_t begin = std::min(text.find_first_not_of(blanks), text.size());
    const std::size_t end = text.find_last_not_of(blanks) + 1;
    return std::string(text.substr(begin, std::max(end, begin) - begin));
}

bool isPattern(std::string_view format) {
    return format.find('%') != std::string_view::npos;
}

WhyReading whyByPattern(const std::string& value, const std::string& format, bool lenient) {
    return Explanation(value, format, lenient).run();
}

std::vector<WhyTry> whyByKeywords(const std::string& value, const std::string& format, bool lenient) {
    std::vector<WhyTry> tries;
    bool isOver = false;
    for (std::size_t begin = 0; begin <= format.size();) {
        const std::size_t end = std::min(format.find('|', begin), format.size());
        const std::string keyword = withoutBlanks(format.substr(begin, end - begin));
        begin = end + 1;
        if (upperCased(keyword) == "ZQT") {
            WhyTry& made =
                tries.emplace_back(WhyTry{keyword, "the canonical form", !isOver, std::nullopt, false});
            if (made.wasTried) {
                const DateOutcome outcome = parsed(value, "ZQT", lenient);
                made.fits = outcome.isGood();
                // A part that is out of range ends it all; only what is no such form goes on to the next keyword.
                isOver = made.fits || !outcome.message ||
                         outcome.message->number != message_number::noKeywordMatched;
            }
        } else if (upperCased(keyword) == "ISO") {
            for (const char* pattern : isoPatterns) {
                WhyTry& made = tries.emplace_back(WhyTry{keyword, pattern, !isOver, std::nullopt, false});
                if (made.wasTried) {
                    made.reading = whyByPattern(value, pattern, lenient);
                    made.fits = isOver = made.reading->outcome.isGood();
                }
            }
        } else {
            tries.push_back({keyword, "no known keyword", false, std::nullopt, false});
        }
    }
    return tries;
}

const char* stepStateName(StepState state) {
    switch (state) {
    case StepState::Read:
        return "read";
    case StepState::Stopped:
        return "stopped";
    case StepState::NotReached:
        return "not reached";
    case StepState::Unknown:
        break;
    }
    return "not known";
}

} // namespace host
