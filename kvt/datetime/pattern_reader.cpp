// The pattern reader: the elements of the format one by one, each of which takes something from the value; then the
// fields that were given are put together (pattern_fields.h).
//
// A step answers by a bool whether the value fits. What is wrong with the format or the numbers as such, and not just
// a mismatch, is kept in `failure_`, which outranks it.
#include <kvt/datetime/detail/pattern_reader.h>

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/system_bytes.h>
#include <kvt/datetime/detail/text.h>

#include <algorithm>
#include <array>
#include <optional>
#include <string>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::string_view expansionOfT = "%H:%M:%S";

constexpr std::array<std::string_view, 12> monthNames = {"january",   "february", "march",    "april",
                                                         "may",       "june",     "july",     "august",
                                                         "september", "october",  "november", "december"};
constexpr std::size_t shortNameLength = 3;

// 1000-01-01 and 10000-01-01, in seconds since 1970.
constexpr std::int64_t firstSecond = -30'610'224'000;
constexpr std::int64_t endSecond = 253'402'300'800;
// Digits and sign of seconds since 1970 that can be in that range.
constexpr std::size_t longestSeconds = 12;

// The nanoseconds are up to one second, and of the sign of the seconds.
constexpr bool isInRange(std::int64_t seconds, std::int64_t nanoseconds) {
    if (seconds < 0) {
        return seconds > firstSecond || (seconds == firstSecond && nanoseconds == 0);
    }
    return seconds + nanoseconds / nanosPerSecond < endSecond;
}

constexpr bool isSpace(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

constexpr char lowered(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c;
}

constexpr bool isLetter(char c) {
    return lowered(c) >= 'a' && lowered(c) <= 'z';
}

bool endsWith(std::string_view text, std::string_view tail) {
    return text.size() >= tail.size() && text.substr(text.size() - tail.size()) == tail;
}

std::int64_t nanosecondsOf(std::string_view fraction) {
    return static_cast<std::int64_t>(fractionNanoseconds(fraction));
}

/// The bytes of the value that are still to be read.
class Input {
public:
    explicit Input(std::string_view text) : rest_(text) {}

    bool atEnd() const { return rest_.empty(); }
    bool nextIs(char c) const { return !rest_.empty() && rest_.front() == c; }
    bool nextIsDigit() const { return !rest_.empty() && isDigit(rest_.front()); }

    bool take(char c) {
        const bool taken = nextIs(c);
        rest_.remove_prefix(taken ? 1 : 0);
        return taken;
    }
    std::string_view takeBytes(std::size_t count) {
        const std::string_view taken = rest_.substr(0, count);
        rest_.remove_prefix(taken.size());
        return taken;
    }
    template <typename Predicate>
    std::string_view takeWhile(Predicate predicate, std::size_t most = std::string_view::npos) {
        std::size_t count = 0;
        while (count < rest_.size() && count < most && predicate(rest_[count])) {
            ++count;
        }
        return takeBytes(count);
    }

private:
    std::string_view rest_;
};

/// The number of a month, 1 to 12, whose name begins with or is `name`; none when there is no such month.
std::optional<std::int64_t> monthOf(std::string_view name, std::size_t significant) {
    for (std::size_t i = 0; i < monthNames.size(); ++i) {
        const std::string_view candidate = monthNames[i].substr(0, significant);
        if (std::equal(candidate.begin(), candidate.end(), name.begin(), name.end(),
                       [](char left, char right) { return left == lowered(right); })) {
            return static_cast<std::int64_t>(i) + 1;
        }
    }
    return std::nullopt;
}

// ---- The elements of a format

// What a word of unknown length has to end in: the format behind the "*", up to white space or "$".
std::string_view tailOf(std::string_view behind) {
    std::size_t length = 0;
    while (length < behind.size() && !isSpace(behind[length]) && behind[length] != '$') {
        ++length;
    }
    return behind.substr(0, length);
}

bool isFlag(std::string_view tail) {
    return !tail.empty() && tail.front() == '%';
}

bool isLiteralFlag(std::string_view tail) {
    return isFlag(tail) && tail.size() > 1 && std::string_view("%*?").find(tail[1]) != std::string_view::npos;
}

// How much of the tail is done with when the word has been read.
std::size_t coveredLength(std::string_view tail) {
    if (isFlag(tail)) {
        return isLiteralFlag(tail) ? 2 : 0;
    }
    return tail.size();
}

// The first element of a format, which is not empty.
std::string_view elementOf(std::string_view format) {
    switch (format.front()) {
    case '%':
        return format.substr(0, format.size() > 1 && format[1] == 'E' ? 3 : 2);
    case '*':
        return format.substr(0, 1 + coveredLength(tailOf(format.substr(1))));
    default:
        return format.substr(0, 1);
    }
}

// A part of a format that has been read, as it reads with every "%T" replaced.
std::string expanded(std::string_view format) {
    if (format.find("%T") == std::string_view::npos) {
        return std::string(format);
    }
    std::string text;
    while (!format.empty()) {
        const std::string_view element = elementOf(format);
        text += element == "%T" ? expansionOfT : element;
        format.remove_prefix(element.size());
    }
    return text;
}

class PatternReader {
public:
    PatternReader(std::string_view value, std::string_view format, bool wantsOffset, bool lenient)
        : input_(value), format_(format), wantsOffset_(wantsOffset), lenient_(lenient) {}

    Outcome<PatternReading> run() {
        while (at_ < format_.size()) {
            const std::string_view element = elementOf(format_.substr(at_));
            if (!readElement(element)) {
                return failure();
            }
            at_ += element.size();
        }
        return instantOfFields(fields_, wantsOffset_, lenient_);
    }

private:
    // ---- The pass over the format. `at_` is where the present element begins.

    Failure failure() {
        if (failure_) {
            return std::move(*failure_);
        }
        // Where two flags exclude each other it is the format that is wrong, whatever the value.
        if (!fields_.epochFlag.empty() && fields_.hasOffset) {
            return FormatStringBadCombo{std::string(fields_.epochFlag), "%z"};
        }
        return ParseMismatch{expanded(format_.substr(0, at_)), std::string(format_.substr(at_))};
    }

    bool readElement(std::string_view element) {
        const char c = element.front();
        if (c == '%') {
            return readFlag(element);
        }
        afterNumber_ = false;
        switch (c) {
        case '$':
            return input_.atEnd() && at_ + 1 == format_.size();
        case '*':
            return readFuzzyWord(tailOf(format_.substr(at_ + 1)));
        case '?':
            return !input_.takeBytes(1).empty();
        default:
            return input_.take(c);
        }
    }

    bool readFlag(std::string_view element) {
        if (element == "%T") {
            return readTime();
        }
        if (element.size() == 2 && element[1] != 'E') {
            return readFlag(element[1]);
        }
        if (element == "%Es") {
            return readEpochSeconds(element);
        }
        return element == "%Ez" ? readOffset() : failByUnknownFlag(element.size());
    }

    // A failure within the expansion is one of the element "%T".
    bool readTime() { return readFlag('H') && readColon() && readFlag('M') && readColon() && readFlag('S'); }

    bool readColon() {
        afterNumber_ = false;
        return input_.take(':');
    }

    // One word of the input, which has to end in what the format says comes next; a flag that is not a character
    // reads what stands behind the word. Two words of unknown length cannot be told apart.
    bool readFuzzyWord(std::string_view tail) {
        const std::string_view word = input_.takeWhile([](char c) { return !isSpace(c); });
        if (word.empty()) {
            return false;
        }
        if (isFlag(tail)) {
            return !isLiteralFlag(tail) || endsWith(word, tail.substr(1));
        }
        const bool isFuzzy = !tail.empty() && (tail.front() == '*' || tail.front() == '?');
        return !isFuzzy && endsWith(word, tail);
    }

    // ---- The flags

    bool readFlag(char flag) {
        switch (flag) {
        case '$':
        case '%':
        case '*':
        case '?':
            afterNumber_ = false;
            return input_.take(flag);
        case 'Y':
            return readNumber(fields_.year, 4, lowestYear, highestYear, false);
        case 'm':
        case 'N':
            return readNumber(fields_.month, 2, 1, 12, lenient_);
        case 'd':
        case 'e':
            return readNumber(fields_.day, 2, 1, 31, lenient_);
        case 'j':
            afterNumber_ = false; // It takes what digits there are also right behind another number.
            return readNumber(fields_.ordinal, 3, 1, 366, lenient_);
        case 'H':
        case 'k':
            return readNumber(fields_.hours, 2, 0, 23, lenient_);
        case 'I':
        case 'l':
            return readNumber(fields_.hours, 2, 1, 12, false);
        case 'M':
            return readNumber(fields_.minutes, 2, 0, 59, lenient_);
        case 'S':
            return readSeconds();
        case 'b':
            return readShortMonth();
        case 'B':
            return readFullMonth();
        case 'p':
            return readMeridiem();
        case 's':
            return readEpochSeconds("%s");
        case 'z':
            return readOffset();
        default:
            return failByUnknownFlag(2);
        }
    }

    bool failByUnknownFlag(std::size_t length) {
        return fail(ParseUnknownFlag{std::string(wholeCharacters(format_.substr(at_), length))});
    }

    // Up to `width` digits, or exactly that many; none where there are too few.
    std::optional<std::int64_t> readDigits(std::size_t width, bool exactWidth) {
        const std::string_view digits = input_.takeWhile(isDigit, width);
        if (digits.empty() || (exactWidth && digits.size() < width)) {
            return std::nullopt;
        }
        return static_cast<std::int64_t>(digitsValue(digits));
    }

    // Directly behind another number a field takes its whole width, as in "%Y%m%d".
    bool readNumber(std::optional<std::int64_t>& field, std::size_t width, std::int64_t lowest,
                    std::int64_t highest, bool isUnbounded) {
        field = readDigits(width, afterNumber_);
        afterNumber_ = true;
        return field && *field >= lowest && (isUnbounded || *field <= highest);
    }

    bool readSeconds() {
        std::optional<std::int64_t> whole;
        if (!readNumber(whole, 2, 0, 59, lenient_)) {
            return false;
        }
        const std::string_view fraction = input_.take('.') ? input_.takeWhile(isDigit) : std::string_view();
        if (fields_.epochFlag.empty()) {
            fields_.seconds = *whole;
            fields_.nanoseconds = nanosecondsOf(fraction);
        }
        fields_.hasSeconds = true;
        return true;
    }

    // An unknown name leaves the month as it was; whether that will do is seen at the end.
    bool readShortMonth() {
        afterNumber_ = false;
        const std::string_view name = input_.takeBytes(shortNameLength);
        if (name.size() < shortNameLength) {
            return false;
        }
        if (const auto month = monthOf(name, shortNameLength)) {
            fields_.month = month;
        }
        return true;
    }

    bool readFullMonth() {
        afterNumber_ = false;
        fields_.month = monthOf(input_.takeWhile(isLetter), std::string_view::npos);
        return fields_.month.has_value();
    }

    bool readMeridiem() {
        afterNumber_ = false;
        const std::string_view text = input_.takeBytes(2);
        if (text.size() < 2 || lowered(text[1]) != 'm' ||
            (lowered(text[0]) != 'a' && lowered(text[0]) != 'p')) {
            return false;
        }
        fields_.meridiem = lowered(text[0]);
        return true;
    }

    // Seconds since 1970: an optional "-", digits, and a fraction. They make the fields of the value superfluous.
    bool readEpochSeconds(std::string_view flag) {
        fields_.epochFlag = flag;
        fields_.hasSeconds = true;
        afterNumber_ = true;
        const bool isNegative = input_.take('-');
        const std::string_view whole = input_.takeWhile(isDigit);
        const bool hasPoint = input_.take('.');
        const std::string_view fraction = hasPoint ? input_.takeWhile(isDigit) : std::string_view();
        const auto text = [&] {
            return std::string(isNegative ? "-" : "")
                .append(whole)
                .append(hasPoint ? "." : "")
                .append(fraction);
        };
        if (whole.empty()) {
            return false;
        }
        if (whole.size() + (isNegative ? 1 : 0) > longestSeconds) {
            return fail(ParseEpochTimeRange{text()});
        }
        // The fraction has the sign of the whole seconds, which "-0" does not have.
        const std::int64_t seconds = static_cast<std::int64_t>(digitsValue(whole)) * (isNegative ? -1 : 1);
        const std::int64_t nanoseconds = seconds < 0 ? -nanosecondsOf(fraction) : nanosecondsOf(fraction);
        if (!isInRange(seconds, nanoseconds)) {
            return fail(ParseEpochTimeRange{text()});
        }
        fields_.seconds = seconds;
        fields_.nanoseconds = nanoseconds;
        return true;
    }

    bool readOffset() {
        fields_.hasOffset = true;
        afterNumber_ = true;
        if (input_.take('Z')) {
            fields_.offsetMinutes = 0;
            return true;
        }
        const bool isNegative = input_.nextIs('-');
        if (!isNegative && !input_.nextIs('+')) {
            return false;
        }
        input_.takeBytes(1);
        const auto hours = readDigits(2, true);
        if (!hours) {
            return false;
        }
        const bool hasColon = input_.take(':');
        std::optional<std::int64_t> minutes = 0;
        if (hasColon || input_.nextIsDigit()) {
            minutes = readDigits(2, true);
        }
        if (!minutes) {
            return false;
        }
        fields_.offsetMinutes = static_cast<std::int32_t>((*hours * 60 + *minutes) * (isNegative ? -1 : 1));
        return true;
    }

    bool fail(Failure failure) {
        failure_ = std::move(failure);
        return false;
    }

    Input input_;
    std::string_view format_;
    bool wantsOffset_;
    bool lenient_;
    std::size_t at_ = 0;
    bool afterNumber_ = false;
    PatternFields fields_;
    std::optional<Failure> failure_;
};

} // namespace

Outcome<PatternReading> readFields(std::string_view value, std::string_view format, bool wantsOffset,
                                   bool lenient) {
    return PatternReader(value, format, wantsOffset, lenient).run();
}

} // namespace kvt::ex::datetime::detail
