// The pattern reader: one pass over the format, each of whose elements takes something from the value, and then the
// fields that were given are put together.
//
// A step answers by a bool whether the value fits. What is wrong with the format or the numbers as such, and not just
// a mismatch, is kept in `failure_`, which outranks it.
#include <kvt/datetime/detail/pattern_reader.h>

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/text.h>

#include <algorithm>
#include <array>
#include <optional>
#include <string>
#include <vector>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::string_view expansionOfT = "%H:%M:%S";

constexpr std::array<std::string_view, 12> monthNames = {"january", "february", "march",     "april",
                                                         "may",     "june",     "july",      "august",
                                                         "september", "october", "november", "december"};
constexpr std::size_t shortNameLength = 3;

// 1000-01-01 and 10000-01-01, in seconds since 1970.
constexpr std::int64_t firstSecond = -30'610'224'000;
constexpr std::int64_t endSecond = 253'402'300'800;
// Digits and sign of seconds since 1970 that can be in that range.
constexpr std::size_t longestSeconds = 12;

constexpr std::int64_t monthsPerYear = 12;

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

class PatternReader {
public:
    PatternReader(std::string_view value, std::string_view format, bool wantsOffset, bool lenient)
        : input_(value), format_(format), wantsOffset_(wantsOffset), lenient_(lenient) {}

    Outcome<PatternReading> run() {
        if (!readFormat()) {
            if (failure_) {
                return std::move(*failure_);
            }
            return ParseMismatch{matchedFormat(), std::string(format_.substr(element_))};
        }
        return combine();
    }

private:
    // ---- The pass over the format. `at_` is the next character, `element_` where the present element begins.

    bool readFormat() {
        while (at_ < format_.size()) {
            element_ = at_;
            if (!readElement()) {
                return false;
            }
        }
        return true;
    }

    bool readElement() {
        const char c = format_[at_++];
        if (c == '%') {
            return readFlag();
        }
        afterNumber_ = false;
        switch (c) {
        case '$':
            return input_.atEnd() && at_ == format_.size();
        case '*':
            return readFuzzyWord();
        case '?':
            return !input_.takeBytes(1).empty();
        default:
            return input_.take(c);
        }
    }

    bool readFlag() {
        if (at_ == format_.size()) {
            return fail(ParseUnknownFlag{"%"});
        }
        const char flag = format_[at_++];
        if (flag == 'T') {
            return readTime();
        }
        if (flag != 'E') {
            return readFlag(flag);
        }
        const char modified = at_ < format_.size() ? format_[at_] : '\0';
        if (modified != 's' && modified != 'z') {
            return fail(ParseUnknownFlag{"%E" + std::string(format_.substr(at_, 1))});
        }
        ++at_;
        return modified == 's' ? readEpochSeconds("%Es") : readOffset();
    }

    // The format up to the present element, with what each "%T" that was read stands for.
    std::string matchedFormat() const {
        std::string matched(format_.substr(0, element_));
        for (auto time = times_.rbegin(); time != times_.rend(); ++time) {
            matched.replace(*time, 2, expansionOfT);
        }
        return matched;
    }

    // A failure within the expansion is one of the element "%T".
    bool readTime() {
        for (std::size_t i = 0; i < expansionOfT.size(); ++i) {
            if (expansionOfT[i] == '%') {
                if (!readFlag(expansionOfT[++i])) {
                    return false;
                }
            } else {
                afterNumber_ = false;
                if (!input_.take(expansionOfT[i])) {
                    return false;
                }
            }
        }
        times_.push_back(element_);
        return true;
    }

    bool readFlag(char flag) {
        switch (flag) {
        case '$':
        case '%':
        case '*':
        case '?':
            afterNumber_ = false;
            return input_.take(flag);
        case 'Y':
            return readNumber(year_, 4, lowestYear, highestYear, false);
        case 'm':
        case 'N':
            return readNumber(month_, 2, 1, 12, lenient_);
        case 'd':
        case 'e':
            return readNumber(day_, 2, 1, 31, lenient_);
        case 'j':
            afterNumber_ = false; // It takes what digits there are also right behind another number.
            return readNumber(ordinal_, 3, 1, 366, lenient_);
        case 'H':
        case 'k':
            return readNumber(hours_, 2, 0, 23, lenient_);
        case 'I':
        case 'l':
            return readNumber(hours_, 2, 1, 12, false);
        case 'M':
            return readNumber(minutes_, 2, 0, 59, lenient_);
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
            return fail(ParseUnknownFlag{std::string{'%', flag}});
        }
    }

    // One word of the input, which has to end in what the format says comes next.
    bool readFuzzyWord() {
        const std::string_view word = input_.takeWhile([](char c) { return !isSpace(c); });
        if (word.empty()) {
            return false;
        }
        if (at_ == format_.size()) {
            return true;
        }
        const auto isEnd = [](char c) { return isSpace(c) || c == '$'; };
        const std::string_view behind = format_.substr(at_);
        const auto* const end = std::find_if(behind.begin(), behind.end(), isEnd);
        const std::string_view tail = behind.substr(0, static_cast<std::size_t>(end - behind.begin()));
        if (tail.empty() || tail.front() != '%') {
            // Two words of unknown length cannot be told apart.
            const bool isFuzzy = !tail.empty() && (tail.front() == '*' || tail.front() == '?');
            at_ += tail.size();
            return !isFuzzy && endsWith(word, tail);
        }
        if (tail.size() > 1 && std::string_view("%*?$").find(tail[1]) != std::string_view::npos) {
            at_ += 2;
            return endsWith(word, tail.substr(1));
        }
        return true; // The flag reads what stands behind the word.
    }

    // ---- The flags

    // Up to `width` digits, or exactly that many; none where there are too few.
    std::optional<std::int64_t> readDigits(std::size_t width, bool exactWidth) {
        const std::string_view digits = input_.takeWhile(isDigit, width);
        if (digits.empty() || (exactWidth && digits.size() < width)) {
            return std::nullopt;
        }
        return static_cast<std::int64_t>(digitsValue(digits));
    }

    // Directly behind another number a field takes its whole width, as in "%Y%m%d".
    bool readNumber(std::optional<std::int64_t>& field, std::size_t width, std::int64_t lowest, std::int64_t highest,
                    bool isUnbounded) {
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
        if (epochFlag_.empty()) {
            count_ = nanosOf(*whole, static_cast<std::int64_t>(fractionNanoseconds(fraction)));
        }
        hasSeconds_ = true;
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
            month_ = month;
        }
        return true;
    }

    bool readFullMonth() {
        afterNumber_ = false;
        month_ = monthOf(input_.takeWhile(isLetter), std::string_view::npos);
        return month_.has_value();
    }

    bool readMeridiem() {
        afterNumber_ = false;
        const std::string_view text = input_.takeBytes(2);
        if (text.size() < 2 || lowered(text[1]) != 'm' || (lowered(text[0]) != 'a' && lowered(text[0]) != 'p')) {
            return false;
        }
        meridiem_ = lowered(text[0]);
        return true;
    }

    // Seconds since 1970: an optional "-", digits, and a fraction. They make the fields of the value superfluous.
    bool readEpochSeconds(std::string_view flag) {
        epochFlag_ = flag;
        hasSeconds_ = true;
        afterNumber_ = true;
        const bool isNegative = input_.take('-');
        const std::string_view whole = input_.takeWhile(isDigit);
        const bool hasPoint = input_.take('.');
        const std::string_view fraction = hasPoint ? input_.takeWhile(isDigit) : std::string_view();
        const auto text = [&] {
            return std::string(isNegative ? "-" : "").append(whole).append(hasPoint ? "." : "").append(fraction);
        };
        if (whole.empty()) {
            return false;
        }
        if (whole.size() + (isNegative ? 1 : 0) > longestSeconds) {
            return fail(ParseEpochTimeRange{text()});
        }
        // The fraction has the sign of the whole seconds, which "-0" does not have.
        const std::int64_t seconds = static_cast<std::int64_t>(digitsValue(whole)) * (isNegative ? -1 : 1);
        const auto nanoseconds = static_cast<std::int64_t>(fractionNanoseconds(fraction));
        count_ = nanosOf(seconds, seconds < 0 ? -nanoseconds : nanoseconds);
        if (count_ < nanosOf(firstSecond, 0) || count_ >= nanosOf(endSecond, 0)) {
            return fail(ParseEpochTimeRange{text()});
        }
        return true;
    }

    bool readOffset() {
        hasOffset_ = true;
        afterNumber_ = true;
        if (input_.take('Z')) {
            offsetMinutes_ = 0;
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
        offsetMinutes_ = static_cast<std::int32_t>((*hours * 60 + *minutes) * (isNegative ? -1 : 1));
        return true;
    }

    // ---- Putting the fields together. The order of the checks decides which message comes.

    Outcome<PatternReading> combine() {
        if (!epochFlag_.empty() && hasOffset_) {
            return FormatStringBadCombo{std::string(epochFlag_), "%z"};
        }
        if (const auto problem = epochFlag_.empty() ? incompleteness() : std::nullopt) {
            return *problem;
        }
        if (meridiem_ != '\0') {
            const std::int64_t hours = hours_.value_or(0);
            if (hours < 1 || hours > 12) {
                return ParseValidation::HourNotForMeridiem;
            }
            hours_ = hours % 12 + (meridiem_ == 'p' ? 12 : 0);
        }
        if (epochFlag_.empty()) {
            const std::int64_t year = year_.value_or(1970);
            if (const auto problem = ordinal_ ? placeOrdinal(year) : placeDate(year)) {
                return *problem;
            }
        }
        const std::int64_t year = civilFromDays(floorDivide(count_, nanosPerDay).quotient).year;
        if (year < lowestYear || year > highestYear) {
            return ParseValidation::ResultYearOutOfRange;
        }
        return PatternReading{count_, offsetMinutes_};
    }

    std::optional<ParseValidation> incompleteness() const {
        if (ordinal_ && !year_) {
            return ParseValidation::OrdinalWithoutYear;
        }
        const bool anyOfDate = year_ || month_ || day_;
        if (!ordinal_ && anyOfDate && !(year_ && month_ && day_)) {
            return ParseValidation::DateIncomplete;
        }
        if (hours_ ? hasSeconds_ && !minutes_ : minutes_ || hasSeconds_) {
            return ParseValidation::TimeIncomplete;
        }
        if (!hours_ && wantsOffset_) {
            return ParseValidation::OffsetWithoutTime;
        }
        if (!anyOfDate && !ordinal_ && !hours_) {
            return ParseValidation::NothingGiven;
        }
        return std::nullopt;
    }

    // The count so far is that of the seconds; hours, minutes and the day are added to it.
    void addDays(std::int64_t days) {
        const std::int64_t minutes = hours_.value_or(0) * 60 + minutes_.value_or(0);
        count_ += nanosOf(days * secondsPerDay + minutes * secondsPerMinute, 0);
    }

    std::optional<ParseValidation> placeOrdinal(std::int64_t year) {
        addDays(daysFromCivil(year, 1, 1) + *ordinal_ - 1);
        const std::int64_t reached = civilFromDays(floorDivide(count_, nanosPerDay).quotient).year;
        return lenient_ || reached == year ? std::nullopt : std::optional(ParseValidation::OrdinalPastYearEnd);
    }

    std::optional<ParseValidation> placeDate(std::int64_t year) {
        std::int64_t month = month_.value_or(1);
        const auto day = static_cast<unsigned>(day_.value_or(1));
        if (month > monthsPerYear || day > lastDayOfMonth(year, static_cast<unsigned>(month))) {
            if (!lenient_) {
                return ParseValidation::NoSuchDate;
            }
            year += (month - 1) / monthsPerYear;
            month = (month - 1) % monthsPerYear + 1;
        }
        addDays(daysFromCivil(year, static_cast<unsigned>(month), day));
        return std::nullopt;
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
    std::size_t element_ = 0;
    std::vector<std::size_t> times_; // where each "%T" that was read stands in the format
    bool afterNumber_ = false;
    std::optional<Failure> failure_;

    std::optional<std::int64_t> year_;
    std::optional<std::int64_t> month_;
    std::optional<std::int64_t> day_;
    std::optional<std::int64_t> ordinal_;
    std::optional<std::int64_t> hours_;
    std::optional<std::int64_t> minutes_;
    bool hasSeconds_ = false;
    NanoCount count_ = 0; // Seconds and fraction; with an epoch flag, the whole instant.
    char meridiem_ = '\0';
    std::string_view epochFlag_; // "%s" or "%Es" when one was read
    bool hasOffset_ = false;
    std::int32_t offsetMinutes_ = 0;
};

} // namespace

Outcome<PatternReading> readFields(std::string_view value, std::string_view format, bool wantsOffset, bool lenient) {
    return PatternReader(value, format, wantsOffset, lenient).run();
}

} // namespace kvt::ex::datetime::detail
