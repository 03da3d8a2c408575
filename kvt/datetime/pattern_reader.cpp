// The pattern reader: the elements of the format one by one, each of which takes something from the value by its row in
// the table; then the fields that were given are put together (pattern_fields.h).
//
// A step answers by a bool whether the value fits. Why it does not is kept as a reason, for the trace; what is wrong
// with the format or with a number as such, and not just a mismatch, outranks that.
#include <kvt/datetime/detail/pattern_reader.h>

#include <kvt/datetime/detail/nano_count.h>
#include <kvt/datetime/detail/text.h>

#include <algorithm>
#include <array>

namespace kvt::ex::datetime::detail {

namespace {

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

constexpr char lowered(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c;
}

constexpr bool isLetter(char c) {
    return lowered(c) >= 'a' && lowered(c) <= 'z';
}

bool endsWith(std::string_view text, std::string_view tail) {
    return text.size() >= tail.size() && text.substr(text.size() - tail.size()) == tail;
}

// The number of a month, 1 to 12, whose name begins with or is `name`, in any case; none when there is no such month.
std::optional<std::int32_t> monthOf(std::string_view name, std::size_t significant) {
    for (std::size_t i = 0; i < monthNames.size(); ++i) {
        const std::string_view candidate = monthNames[i].substr(0, significant);
        if (std::equal(candidate.begin(), candidate.end(), name.begin(), name.end(),
                       [](char left, char right) { return lowered(left) == lowered(right); })) {
            return static_cast<std::int32_t>(i) + 1;
        }
    }
    return std::nullopt;
}

// ---- Plain numbers

// What is needed of the row of a number that has two or four digits, side by side.
struct PlainNumber {
    std::uint8_t width = 0; // 0 where the flag is not such a number
    bool hasFraction = false;
    Field field = Field::Year;
    Parts gives = noPart;
    std::int16_t lowest = 0;
    std::int16_t highest = 0;
};

// By the character behind "%".
constexpr auto plainNumbers = [] {
    std::array<PlainNumber, 256> numbers{};
    for (const PatternRow& row : patternRows) {
        const ReadRule& rule = row.reads;
        const bool hasFraction = rule.reading == Reading::Seconds;
        if (row.element.size() == 2 && (hasFraction || rule.reading == Reading::Number) &&
            rule.width % 2 == 0) {
            numbers[static_cast<unsigned char>(row.element.back())] = {rule.width, hasFraction, rule.field,
                                                                       rule.gives, rule.lowest, rule.highest};
        }
    }
    return numbers;
}();

// The number of two or four digits; negative where there are not.
inline std::int32_t digitsOf(const char* digits, std::uint8_t width) noexcept {
    const std::int32_t high = digitPair(digits);
    if (width == 2 || high < 0) {
        return high;
    }
    const std::int32_t low = digitPair(digits + 2);
    return low < 0 ? low : high * 100 + low;
}

// ---- Words of unknown length

// What such a word has to end in: the format behind the "*", up to white space or "$".
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
    const PatternRow* const row = isFlag(tail) ? rowOfElement(tail.substr(0, 2)) : nullptr;
    return row != nullptr && row->reads.reading == Reading::Itself;
}

// How much of the tail is done with when the word has been read.
std::size_t coveredLength(std::string_view tail) {
    if (isFlag(tail)) {
        return isLiteralFlag(tail) ? 2 : 0;
    }
    return tail.size();
}

// The parts that a result has by this format, which is looked at as a text: what stands in it behind a fuzzy word
// counts as well. In the search for offsets even the second character of "%%" counts as the beginning of a flag, so
// that "%%z" asks for one.
Parts partsOf(std::string_view format) noexcept {
    Parts parts = noPart;
    bool isSecondOfPair = false;
    for (std::size_t at = 0; at + 1 < format.size(); ++at) {
        if (format[at] != '%') {
            isSecondOfPair = false;
            continue;
        }
        const bool isModified = format[at + 1] == 'E' && at + 2 < format.size();
        const PatternRow* const row = rowOfFlag(format[at + (isModified ? 2 : 1)], isModified);
        if (row != nullptr) {
            parts = parts |
                    (isSecondOfPair ? static_cast<Parts>(row->reads.gives & offsetPart) : row->reads.gives);
        }
        isSecondOfPair = !isSecondOfPair && format[at + 1] == '%';
    }
    return parts;
}

} // namespace

std::string_view elementOf(std::string_view format) noexcept {
    switch (format.front()) {
    case '%':
        return format.substr(0, format.size() > 1 && format[1] == 'E' ? 3 : 2);
    case '*':
        return format.substr(0, 1 + coveredLength(tailOf(format.substr(1))));
    default:
        return format.substr(0, 1);
    }
}

// ---- The value

inline bool PatternReader::take(char c) noexcept {
    const bool isTaken = !isAtEnd() && *at_ == c;
    at_ += isTaken ? 1 : 0;
    return isTaken;
}

inline std::string_view PatternReader::takeBytes(std::size_t count) noexcept {
    const std::string_view taken(at_, std::min(count, static_cast<std::size_t>(valueEnd_ - at_)));
    at_ += taken.size();
    return taken;
}

template <typename Predicate>
std::string_view PatternReader::takeWhile(Predicate predicate) noexcept {
    const char* const begin = at_;
    at_ = std::find_if_not(begin, valueEnd_, predicate);
    return {begin, static_cast<std::size_t>(at_ - begin)};
}

// Up to `width` digits, or exactly that many; negative where there are not.
inline std::int32_t PatternReader::takeNumber(unsigned width, bool exactWidth) noexcept {
    const char* const begin = at_;
    const char* const end =
        valueEnd_ - begin > static_cast<std::ptrdiff_t>(width) ? begin + width : valueEnd_;
    const char* place = begin;
    std::int32_t number = 0;
    for (; place != end && isDigit(*place); ++place) {
        number = number * 10 + (*place - '0');
    }
    at_ = place;
    if (place == begin) {
        stop(isAtEnd() ? StopReason::EndOfValue : StopReason::NotANumber);
        return -1;
    }
    if (exactWidth && place - begin < static_cast<std::ptrdiff_t>(width)) {
        stop(StopReason::TooFewDigits);
        return -1;
    }
    return number;
}

// "." and digits, as many as there are, in nanoseconds; 0 without them.
std::int64_t PatternReader::takeFraction() noexcept {
    if (!take('.')) {
        return 0;
    }
    const std::string_view digits = takeBytes(countDigits({at_, static_cast<std::size_t>(valueEnd_ - at_)}));
    return static_cast<std::int64_t>(fractionNanoseconds(digits));
}

// With seconds since 1970 in the format, those of the minute do not count.
inline void PatternReader::readFraction() noexcept {
    const std::int64_t nanoseconds = takeFraction();
    if (!fields_.isEpoch()) {
        fields_.nanoseconds = nanoseconds;
    }
}

inline bool PatternReader::stop(StopReason reason) noexcept {
    stopReason_ = reason;
    return false;
}

inline bool PatternReader::stopAtCharacter() noexcept {
    return stop(isAtEnd() ? StopReason::EndOfValue : StopReason::OtherCharacter);
}

// Directly behind another number a field takes its whole width, as in "%Y%m%d".
inline bool PatternReader::readNumber(const ReadRule& rule, bool isInRow) {
    const std::int32_t number = takeNumber(rule.width, isInRow && rule.isExactInRow);
    if (number < 0) {
        return false;
    }
    if (number < rule.lowest || (number > rule.highest && !(lenient_ && rule.lenientLifts))) {
        return stop(StopReason::OutOfBounds);
    }
    fields_.set(rule.field, number);
    return true;
}

// ---- The pass over the format

inline bool PatternReader::read(const PatternRow& row) {
    const bool wasAfterNumber = afterNumber_;
    if (row.reads.reading == Reading::Number) { // as most of them
        afterNumber_ = true;
        return readNumber(row.reads, wasAfterNumber);
    }
    afterNumber_ = isNumeric(row.reads.reading);
    switch (row.reads.reading) {
    case Reading::Seconds:
        return readSeconds(row.reads, wasAfterNumber);
    case Reading::Time:
        return readTime(wasAfterNumber);
    case Reading::ShortMonth:
        return readShortMonth();
    case Reading::FullMonth:
        return readFullMonth();
    case Reading::Meridiem:
        return readMeridiem();
    case Reading::EpochSeconds:
        return readEpochSeconds(row.element);
    case Reading::Offset:
        return readOffset();
    default: // the character itself
        hidesFlags_ = true;
        return take(row.element.back()) || stopAtCharacter();
    }
}

bool PatternReader::readNext() {
    const char c = *next_;
    if (c == '%') {
        const bool isModified = formatEnd_ - next_ > 1 && next_[1] == 'E';
        const std::ptrdiff_t length = isModified ? 3 : 2;
        const PatternRow* const row =
            formatEnd_ - next_ >= length ? rowOfFlag(next_[length - 1], isModified) : nullptr;
        if (row == nullptr || row->reads.reading == Reading::Unknown) {
            culprit_ = restOfFormat().substr(0, static_cast<std::size_t>(length));
            return stop(StopReason::UnknownFlag);
        }
        if (!read(*row)) {
            return false;
        }
        parts_ = parts_ | row->reads.gives;
        next_ += length;
        return true;
    }
    if (const PatternRow* const row = rowOfCharacter(c)) {
        return readSpecial(*row);
    }
    if (!take(c)) {
        return stopAtCharacter();
    }
    afterNumber_ = false;
    ++next_;
    return true;
}

// Most patterns are numbers of two or four digits with plain characters between them. These are read here, with both
// places at hand; the first element that is more than that, or does not fit, is left to the general way.
void PatternReader::readPlainRun() noexcept {
    const char* at = at_;
    const char* next = next_;
    const char* const valueEnd = valueEnd_;
    const char* const formatEnd = formatEnd_;
    unsigned parts = parts_;
    bool afterNumber = afterNumber_;
    while (next != formatEnd && at != valueEnd) {
        if (*next != '%') {
            if (*at != *next || rowOfCharacter(*next) != nullptr) {
                break;
            }
            ++at;
            ++next;
            afterNumber = false;
            continue;
        }
        if (formatEnd - next < 2) {
            break;
        }
        const PlainNumber& rule = plainNumbers[static_cast<unsigned char>(next[1])];
        if (rule.width == 0 || valueEnd - at < rule.width) {
            break;
        }
        const std::int32_t number = digitsOf(at, rule.width);
        if (number < rule.lowest || number > rule.highest) {
            break;
        }
        fields_.set(rule.field, number);
        parts |= rule.gives;
        at += rule.width;
        if (rule.hasFraction) {
            at_ = at;
            readFraction();
            at = at_;
        }
        next += 2;
        afterNumber = true;
    }
    at_ = at;
    next_ = next;
    parts_ = static_cast<Parts>(parts);
    afterNumber_ = afterNumber;
}

std::optional<PatternFailure> PatternReader::readAll(PatternReading& reading) {
    for (readPlainRun(); !isDone(); readPlainRun()) {
        if (!readNext()) {
            return failure();
        }
    }
    reading.parts = parts();
    return makeUp(reading, fields_, lenient_);
}

bool PatternReader::goOnBy(std::string_view format) noexcept {
    const std::size_t place = formatPlace();
    if (stopReason_ != StopReason::ValueGoesOn ||
        format.substr(0, place) != std::string_view(formatBegin_, place)) {
        return false;
    }
    formatBegin_ = format.data();
    formatEnd_ = formatBegin_ + format.size();
    next_ = formatBegin_ + place;
    stopReason_ = StopReason::None;
    return true;
}

bool PatternReader::readSpecial(const PatternRow& row) {
    std::size_t length = 1;
    switch (row.reads.reading) {
    case Reading::End:
        if (!isAtEnd()) {
            return stop(StopReason::ValueGoesOn);
        }
        if (formatEnd_ - next_ > 1) {
            return stop(StopReason::FormatGoesOn);
        }
        break;
    case Reading::Word: {
        const std::string_view tail = tailOf(restOfFormat().substr(1));
        if (!readWord(tail)) {
            return false;
        }
        hidesFlags_ = true;
        length += coveredLength(tail);
        break;
    }
    default: // any character
        if (takeBytes(1).empty()) {
            return stop(StopReason::EndOfValue);
        }
    }
    afterNumber_ = false;
    next_ += length;
    return true;
}

// One word of the value, which has to end in what the format says comes next; a flag that is not a character reads what
// stands behind the word. Two words of unknown length cannot be told apart.
bool PatternReader::readWord(std::string_view tail) {
    const std::string_view word = takeWhile([](char c) { return !isSpace(c); });
    if (word.empty()) {
        return stopAtCharacter();
    }
    if (isFlag(tail)) {
        return !isLiteralFlag(tail) || endsWith(word, tail.substr(1)) || stop(StopReason::WordEndsOtherwise);
    }
    if (!tail.empty() && (tail.front() == '*' || tail.front() == '?')) {
        return stop(StopReason::NextIsFuzzyToo);
    }
    return endsWith(word, tail) || stop(StopReason::WordEndsOtherwise);
}

std::optional<PatternFailure> PatternReader::failure() const {
    if (stopReason_ == StopReason::UnknownFlag) {
        return ParseUnknownFlag{culprit_};
    }
    if (stopReason_ == StopReason::SecondsOutOfRange) {
        return ParseEpochTimeRange{culprit_};
    }
    // Where two flags exclude each other it is the format that is wrong, whatever the value.
    if (fields_.isEpoch() && fields_.hasOffset) {
        return FormatStringBadCombo{fields_.epochFlag, "%z"};
    }
    return ParseMismatch{formatPlace()};
}

Parts PatternReader::parts() const noexcept {
    return hidesFlags_ ? partsOf({formatBegin_, formatPlace()}) : parts_;
}

// ---- The flags

bool PatternReader::readSeconds(const ReadRule& rule, bool isInRow) {
    if (!readNumber(rule, isInRow)) {
        return false;
    }
    readFraction();
    return true;
}

// A failure within the expansion is one of the element "%T".
bool PatternReader::readTime(bool isInRow) {
    afterNumber_ = isInRow;
    for (std::string_view rest = timeExpansion; !rest.empty();) {
        const std::string_view element = elementOf(rest);
        const PatternRow* const row = rowOfElement(element);
        if (row != nullptr ? !read(*row) : !take(element.front())) {
            return row != nullptr ? false : stopAtCharacter();
        }
        afterNumber_ = row != nullptr;
        rest.remove_prefix(element.size());
    }
    return true;
}

// An unknown name leaves the month as it was; whether that will do is seen at the end.
bool PatternReader::readShortMonth() {
    const std::string_view name = takeBytes(shortNameLength);
    if (name.size() < shortNameLength) {
        return stop(StopReason::EndOfValue);
    }
    if (const auto month = monthOf(name, shortNameLength)) {
        fields_.set(Field::Month, *month);
    }
    return true;
}

bool PatternReader::readFullMonth() {
    const auto month = monthOf(takeWhile(isLetter), std::string_view::npos);
    if (!month) {
        return stop(StopReason::UnknownName);
    }
    fields_.set(Field::Month, *month);
    return true;
}

bool PatternReader::readMeridiem() {
    const std::string_view text = takeBytes(2);
    if (text.size() < 2 || lowered(text[1]) != 'm' || (lowered(text[0]) != 'a' && lowered(text[0]) != 'p')) {
        return stop(text.size() < 2 ? StopReason::EndOfValue : StopReason::UnknownName);
    }
    fields_.meridiem = lowered(text[0]);
    return true;
}

// Seconds since 1970: an optional "-", digits, and a fraction. They make the fields of the value superfluous.
bool PatternReader::readEpochSeconds(std::string_view flag) {
    fields_.epochFlag = flag;
    const char* const begin = at_;
    const bool isNegative = take('-');
    const std::string_view whole = takeWhile(isDigit);
    const std::int64_t fraction = takeFraction();
    if (whole.empty()) {
        return stop(StopReason::NotANumber);
    }
    culprit_ = {begin, static_cast<std::size_t>(at_ - begin)};
    if (whole.size() + (isNegative ? 1 : 0) > longestSeconds) {
        return stop(StopReason::SecondsOutOfRange);
    }
    // The fraction has the sign of the whole seconds, which "-0" does not have.
    const std::int64_t seconds = static_cast<std::int64_t>(digitsValue(whole)) * (isNegative ? -1 : 1);
    const std::int64_t nanoseconds = seconds < 0 ? -fraction : fraction;
    if (!isInRange(seconds, nanoseconds)) {
        return stop(StopReason::SecondsOutOfRange);
    }
    fields_.epochSeconds = seconds;
    fields_.nanoseconds = nanoseconds;
    return true;
}

bool PatternReader::readOffset() {
    fields_.hasOffset = true;
    if (take('Z')) {
        fields_.offsetMinutes = 0;
        return true;
    }
    const bool isNegative = take('-');
    if (!isNegative && !take('+')) {
        return stop(StopReason::NotAnOffset);
    }
    const std::int32_t hours = takeNumber(2, true);
    if (hours < 0) {
        return false;
    }
    const bool hasMinutes = take(':') || (!isAtEnd() && isDigit(*at_));
    const std::int32_t minutes = hasMinutes ? takeNumber(2, true) : 0;
    if (minutes < 0) {
        return false;
    }
    fields_.offsetMinutes = (hours * 60 + minutes) * (isNegative ? -1 : 1);
    return true;
}

} // namespace kvt::ex::datetime::detail
