#include "pattern_reference.h"

#include <datetime/naive_calendar.h>

#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <sstream>

namespace kvt::test {

namespace {

// ---- Failures

struct Mismatch {
    std::string matched;
    std::string rest;
};
struct UnknownFlag {
    std::string flag;
};
struct EpochRange {
    std::string seconds;
};
struct BadCombination {
    std::string first;
    std::string second;
};
enum class Invalid {
    ordinalWithoutYear = 933081,
    dateIncomplete = 933082,
    offsetWithoutTime = 933085,
    timeIncomplete = 933086,
    nothingGiven = 933087,
    hourNotForMeridiem = 933088,
    ordinalPastYearEnd = 933089,
    noSuchDate = 933090,
    yearOutOfRange = 933091,
};

// ---- A moment

/// Seconds since 1970 and nanoseconds to be added, which are 0 to 999,999,999.
struct Moment {
    long long seconds = 0;
    long long nanoseconds = 0;

    void normalise() {
        while (nanoseconds < 0) {
            nanoseconds += 1000000000;
            --seconds;
        }
        while (nanoseconds >= 1000000000) {
            nanoseconds -= 1000000000;
            ++seconds;
        }
    }
    long long day() const { return seconds >= 0 ? seconds / 86400 : -((-seconds + 86399) / 86400); }
    long long year() const {
        constexpr long long earliest = 900;
        long long year = earliest + (day() - daysToYear(earliest)) / 366; // or a little later
        while (daysToYear(year + 1) <= day()) {
            ++year;
        }
        return year;
    }
    std::string text() const {
        const long long reached = year();
        long long dayOfYear = day() - daysToYear(reached);
        int month = 1;
        while (dayOfYear >= daysInMonth(reached, month)) {
            dayOfYear -= daysInMonth(reached, month);
            ++month;
        }
        const long long time = seconds - day() * 86400;
        char digits[128];
        std::snprintf(digits, sizeof digits, "%04lld%02d%02lld%02lld%02lld%02lld.%09lld", reached, month,
                      dayOfYear + 1, time / 3600, time / 60 % 60, time % 60, nanoseconds);
        std::string text = digits;
        while (text.back() == '0') {
            text.pop_back();
        }
        if (text.back() == '.') {
            text.pop_back();
        }
        return text;
    }
};

// ---- The reader

constexpr long long notGiven = -1;
constexpr long long yearNotGiven = -10000;
const std::string expansion = "%H:%M:%S";

const std::vector<std::string>& monthNames() {
    static const std::vector<std::string> names = {"january",   "february", "march",    "april",
                                                   "may",       "june",     "july",     "august",
                                                   "september", "october",  "november", "december"};
    return names;
}

class Reader {
public:
    Reader(const std::string& value, std::string format, bool wantsOffset, bool lenient)
        : in_(value), format_(std::move(format)), wantsOffset_(wantsOffset), lenient_(lenient) {}

    Moment instant;
    long long offset = 0;

    void run() {
        readAll();
        if (failed_ || in_.fail()) {
            if (!epoch_.empty() && offsetSeen_) {
                throw BadCombination{epoch_, "%z"};
            }
            std::size_t split = element_;
            if (inTime_) {
                format_.replace(timeBegin_, expansion.size(), "%T");
                split = timeBegin_;
            }
            throw Mismatch{format_.substr(0, split), format_.substr(split)};
        }
        combine();
    }

private:
    // The end of the input, once seen, would otherwise make the stream refuse a look.
    int next() {
        if (in_.fail()) {
            return EOF;
        }
        in_.clear();
        const int c = in_.peek();
        in_.clear();
        return c;
    }
    bool atEnd() { return next() == EOF; }
    bool nextIsDigit() { return !atEnd() && std::isdigit(next()) != 0; }
    char get() {
        const int c = next();
        if (c != EOF) {
            in_.get();
        }
        return static_cast<char>(c);
    }

    void readAll() {
        bool inFlag = false;
        bool afterE = false;
        for (std::size_t i = 0; i < format_.size(); ++i) {
            if (inTime_ && i >= timeBegin_ + expansion.size()) {
                inTime_ = false;
            }
            const char c = format_[i];
            if (!inFlag && c == '%') {
                if (i + 1 == format_.size()) {
                    throw UnknownFlag{"%"};
                }
                element_ = i;
                inFlag = true;
                continue;
            }
            if (!inFlag) {
                element_ = i;
                readCharacter(c, i);
            } else if (!afterE && c == 'E') {
                const std::string behind = format_.substr(i + 1, 1);
                if (behind != "s" && behind != "z") {
                    throw UnknownFlag{"%E" + behind};
                }
                afterE = true;
                continue;
            } else if (c == 'T') {
                format_.replace(element_, 2, expansion);
                inTime_ = true;
                timeBegin_ = element_;
                inFlag = false;
                i = element_ - 1; // to the first character of what was put in
                continue;
            } else {
                readFlag(c, afterE);
                inFlag = false;
                afterE = false;
            }
            if (failed_ || in_.fail()) {
                return;
            }
        }
    }

    void readCharacter(char c, std::size_t& i) {
        if (c == '$') {
            failed_ = !atEnd() || i + 1 != format_.size();
        } else if (c == '*') {
            readWord(i);
        } else if (c == '?') {
            failed_ = atEnd();
            get();
        } else {
            failed_ = atEnd() || get() != c;
        }
        previousNumeric_ = false;
    }

    static bool endsWith(const std::string& text, const std::string& end) {
        return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
    }

    void readWord(std::size_t& i) {
        if (atEnd() || std::isspace(next()) != 0) {
            failed_ = true;
            return;
        }
        std::string word;
        in_ >> word;
        if (in_.fail() || i + 1 == format_.size()) {
            return;
        }
        std::string tail;
        for (std::size_t j = i + 1; j < format_.size() && std::isspace(format_[j]) == 0 && format_[j] != '$';
             ++j) {
            tail += format_[j];
        }
        if (!tail.empty() && (tail[0] == '*' || tail[0] == '?')) {
            failed_ = true;
        } else if (tail.empty() || tail[0] != '%') {
            failed_ = !endsWith(word, tail);
            i += tail.size();
        } else {
            for (const char c : std::string("%*?$")) {
                if (tail.substr(0, 2) == std::string("%") + c) {
                    failed_ = !endsWith(word, tail.substr(1));
                    i += 2;
                    return;
                }
            }
        }
    }

    void readFlag(char c, bool afterE) {
        if (afterE) {
            c == 's' ? readEpoch("%Es") : readOffset();
            return;
        }
        switch (c) {
        case '$':
        case '%':
        case '*':
        case '?':
            failed_ = atEnd() || get() != c;
            previousNumeric_ = false;
            return;
        case 'Y':
            return readNumber(year_, c, 1000, 9999, false);
        case 'm':
        case 'N':
            return readNumber(month_, c, 1, 12, lenient_);
        case 'd':
        case 'e':
            return readNumber(day_, c, 1, 31, lenient_);
        case 'j':
            return readNumber(ordinal_, c, 1, 366, lenient_);
        case 'H':
        case 'k':
            return readNumber(hours_, c, 0, 23, lenient_);
        case 'I':
        case 'l':
            return readNumber(hours_, c, 1, 12, false);
        case 'M':
            return readNumber(minutes_, c, 0, 59, lenient_);
        case 'S':
            return readSeconds();
        case 'b':
        case 'B':
        case 'p':
            readName(c);
            previousNumeric_ = false;
            return;
        case 's':
            return readEpoch("%s");
        case 'z':
            return readOffset();
        default:
            throw UnknownFlag{std::string("%") + c};
        }
    }

    std::string takeDigits(std::size_t width, bool exactWidth) {
        std::string digits;
        while (digits.size() < width && nextIsDigit()) {
            digits += get();
        }
        if (digits.empty() || (exactWidth && digits.size() < width)) {
            in_.setstate(std::ios::failbit);
            return "0";
        }
        return digits;
    }

    void readNumber(long long& field, char flag, long long lowest, long long highest, bool unbounded) {
        const std::size_t width = flag == 'Y' ? 4 : flag == 'j' ? 3 : 2;
        field = std::stoll(takeDigits(width, previousNumeric_ && flag != 'j'));
        previousNumeric_ = true;
        failed_ = field < lowest || (!unbounded && field > highest);
    }

    void readSeconds() {
        std::string text = takeDigits(2, previousNumeric_);
        previousNumeric_ = true;
        const long long whole = std::stoll(text);
        if (!in_.fail() && next() == '.') {
            text += get();
            while (nextIsDigit()) {
                text += get();
            }
        }
        if (epoch_.empty()) {
            failed_ = !readSecondsText(text, instant);
        }
        if (!lenient_ && whole > 59) {
            failed_ = true;
        }
        seconds_ = 0;
    }

    static std::string lowerCase(std::string text) {
        for (char& c : text) {
            c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        }
        return text;
    }

    void readName(char flag) {
        std::string name;
        if (flag == 'B') {
            while (!atEnd() && std::isalpha(next()) != 0) {
                name += get();
            }
        } else {
            for (std::size_t count = flag == 'b' ? 3 : 2; count > 0; --count) {
                if (atEnd()) {
                    failed_ = true;
                    return;
                }
                name += get();
            }
        }
        name = lowerCase(name);
        if (flag == 'p') {
            meridiem_ = name;
            failed_ = name != "am" && name != "pm";
            return;
        }
        for (std::size_t i = 0; i < monthNames().size(); ++i) {
            if (name == (flag == 'b' ? monthNames()[i].substr(0, 3) : monthNames()[i])) {
                month_ = static_cast<long long>(i) + 1;
                return;
            }
        }
        failed_ = flag == 'B';
    }

    void readEpoch(const std::string& flag) {
        seconds_ = 0;
        epoch_ = flag;
        previousNumeric_ = true;
        std::string text;
        if (next() == '-') {
            text += get();
        }
        while (nextIsDigit() || (next() == '.' && text.find('.') == std::string::npos)) {
            text += get();
        }
        failed_ = text.empty() || !readSecondsText(text, instant);
    }

    static bool readSecondsText(const std::string& text, Moment& moment) {
        const std::size_t point = text.find('.');
        if (point == 0) {
            return false;
        }
        const std::string whole = text.substr(0, point);
        if (whole.size() >= 13) {
            throw EpochRange{text};
        }
        if (whole == "-") {
            return false;
        }
        moment = {std::stoll(whole), 0};
        if (point != std::string::npos && point + 1 < text.size()) {
            const double fraction = std::strtod(text.substr(point).c_str(), nullptr);
            moment.nanoseconds = static_cast<long long>(fraction * 1e9 + 0.5);
            if (moment.seconds < 0) {
                moment.nanoseconds = -moment.nanoseconds;
            }
        }
        moment.normalise();
        if (moment.seconds < -30610224000 || moment.seconds >= 253402300800) {
            throw EpochRange{text};
        }
        return true;
    }

    void readOffset() {
        offsetSeen_ = true;
        previousNumeric_ = true;
        if (atEnd()) {
            failed_ = true;
            return;
        }
        const char sign = get();
        if (sign == 'Z') {
            offset = 0;
            return;
        }
        if (sign != '+' && sign != '-') {
            failed_ = true;
            return;
        }
        const long long hours = std::stoll(takeDigits(2, true));
        const bool colon = next() == ':';
        if (colon) {
            get();
        }
        long long minutes = 0;
        if (nextIsDigit()) {
            minutes = std::stoll(takeDigits(2, true));
        } else if (colon) {
            failed_ = true;
        }
        offset = (hours * 60 + minutes) * (sign == '-' ? -1 : 1);
    }

    void combine() {
        const bool isEpoch = !epoch_.empty();
        if (isEpoch && offsetSeen_) {
            throw BadCombination{epoch_, "%z"};
        }
        if (!isEpoch) {
            checkComplete();
        }
        if (year_ == yearNotGiven) {
            if (month_ == notGiven && day_ == notGiven && ordinal_ == notGiven && hours_ == notGiven &&
                minutes_ == notGiven && seconds_ == notGiven) {
                throw Invalid::nothingGiven;
            }
            year_ = 1970;
        }
        for (long long* field : {&month_, &day_}) {
            *field = *field == notGiven ? 1 : *field;
        }
        for (long long* field : {&hours_, &minutes_, &seconds_}) {
            *field = *field == notGiven ? 0 : *field;
        }
        if (!meridiem_.empty()) {
            if (hours_ < 1 || hours_ > 12) {
                throw Invalid::hourNotForMeridiem;
            }
            if (meridiem_ == "pm" && hours_ < 12) {
                hours_ += 12;
            } else if (meridiem_ == "am" && hours_ == 12) {
                hours_ = 0;
            }
        }
        if (!isEpoch) {
            place();
        }
        if (instant.year() < 1000 || instant.year() > 9999) {
            throw Invalid::yearOutOfRange;
        }
    }

    void checkComplete() const {
        const bool year = year_ != yearNotGiven;
        const bool month = month_ != notGiven;
        const bool day = day_ != notGiven;
        const bool hours = hours_ != notGiven;
        const bool minutes = minutes_ != notGiven;
        const bool seconds = seconds_ != notGiven;
        if (ordinal_ != notGiven && !year) {
            throw Invalid::ordinalWithoutYear;
        }
        if (ordinal_ == notGiven && ((year && (!month || !day)) || ((month || day) && !year))) {
            throw Invalid::dateIncomplete;
        }
        if ((hours && !minutes && seconds) || (!hours && (minutes || seconds))) {
            throw Invalid::timeIncomplete;
        }
        if (!hours && !minutes && !seconds && wantsOffset_) {
            throw Invalid::offsetWithoutTime;
        }
    }

    void place() {
        const long long timeOfDay = hours_ * 3600 + minutes_ * 60;
        if (ordinal_ != notGiven) {
            instant.seconds += (daysToYear(year_) + ordinal_ - 1) * 86400 + timeOfDay;
            if (!lenient_ && instant.year() != year_) {
                throw Invalid::ordinalPastYearEnd;
            }
            return;
        }
        long long year = year_;
        long long month = month_;
        if (month > 12 || day_ > daysInMonth(year, static_cast<int>(month))) {
            if (!lenient_) {
                throw Invalid::noSuchDate;
            }
            while (month > 12) {
                month -= 12;
                ++year;
            }
        }
        instant.seconds +=
            naiveDays(year, static_cast<int>(month), static_cast<int>(day_)) * 86400 + timeOfDay;
    }

    std::istringstream in_;
    std::string format_;
    bool wantsOffset_;
    bool lenient_;

    bool failed_ = false;
    bool inTime_ = false;
    bool previousNumeric_ = false;
    std::size_t element_ = 0;
    std::size_t timeBegin_ = 0;

    long long year_ = yearNotGiven;
    long long month_ = notGiven;
    long long day_ = notGiven;
    long long ordinal_ = notGiven;
    long long hours_ = notGiven;
    long long minutes_ = notGiven;
    long long seconds_ = notGiven;
    std::string meridiem_;
    std::string epoch_;
    bool offsetSeen_ = false;
};

// ---- What becomes of what was read

bool holdsOneOf(const std::string& format, const std::vector<std::string>& flags) {
    for (const std::string& flag : flags) {
        if (format.find(flag) != std::string::npos) {
            return true;
        }
    }
    return false;
}

std::string withoutPairs(const std::string& format) {
    std::string rest;
    for (std::size_t i = 0; i < format.size(); ++i) {
        if (format.compare(i, 2, "%%") == 0) {
            ++i;
        } else {
            rest += format[i];
        }
    }
    return rest;
}

std::string offsetText(long long minutes) {
    char text[32];
    const long long magnitude = minutes < 0 ? -minutes : minutes;
    std::snprintf(text, sizeof text, "%c%02lld:%02lld", minutes < 0 ? '-' : '+', magnitude / 60,
                  magnitude % 60);
    const std::string offset = text;
    return offset.size() == 6 ? offset : ""; // other lengths are not offsets
}

} // namespace

PatternAnswer referenceParse(const std::string& value, const std::string& format, bool lenient) {
    const auto failure = [](std::uint32_t number, std::vector<std::string> parameters) {
        return PatternAnswer{false, "", number, std::move(parameters)};
    };
    const bool wantsOffset = holdsOneOf(format, {"%z", "%Ez", "%s"});
    try {
        Reader reader(value, format, wantsOffset, lenient);
        reader.run();
        const std::string whole = reader.instant.text() + (wantsOffset ? offsetText(reader.offset) : "");
        const std::string plain = withoutPairs(format);
        if (!holdsOneOf(plain, {"%T", "%H", "%I", "%p", "%M", "%S", "%s", "%Es"})) {
            return {true, whole.substr(0, 8), 0, {}};
        }
        if (!holdsOneOf(plain, {"%Y", "%m", "%N", "%b", "%B", "%d", "%e", "%j", "%s", "%Es"})) {
            return {true, whole.substr(8), 0, {}};
        }
        return {true, whole, 0, {}};
    } catch (const UnknownFlag& unknown) {
        return failure(933079, {unknown.flag, "@DateTimeParse()"});
    } catch (const Mismatch& mismatch) {
        return failure(933067, {mismatch.matched, mismatch.rest});
    } catch (const BadCombination& flags) {
        return failure(933083, {flags.first, flags.second});
    } catch (const EpochRange& range) {
        return failure(933093, {range.seconds});
    } catch (Invalid invalid) {
        return failure(static_cast<std::uint32_t>(invalid), {format});
    }
}

} // namespace kvt::test
