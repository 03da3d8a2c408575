// Fields are read by hand, digit by digit, as the folder is looked over within milliseconds.

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/zone_line.h>

#include <algorithm>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::array<std::string_view, 12> monthNames = {"Jan", "Feb", "Mar", "Apr", "May", "Jun",
                                                         "Jul", "Aug", "Sep", "Oct", "Nov", "Dec"};
constexpr std::array<std::string_view, 7> weekdayNames = {"Sun", "Mon", "Tue", "Wed", "Thu", "Fri", "Sat"};

constexpr std::int64_t secondsPerHour = 3600;
constexpr std::int64_t secondsPerDay = 24 * secondsPerHour;
// As far as the zone compiler goes.
constexpr int mostHours = 167;

[[noreturn]] void bad(std::string_view word, const char* what) {
    throw BadZoneLine{std::string("\"").append(word).append("\" ").append(what)};
}

constexpr bool isDigit(char c) noexcept {
    return c >= '0' && c <= '9';
}

// A blank for the streams with which the `date` library reads.
constexpr bool isBlank(char c) noexcept {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

// A quote and a "#" within a word mean one thing to the zone compiler and another to the `date` library.
void requirePlain(char c) {
    if (c == '#' || c == '"') {
        throw BadZoneLine{c == '#' ? "a \"#\" stands within a word" : "quoted words are not understood"};
    }
    if (c < '!' || c > '~') {
        constexpr const char* digits = "0123456789ABCDEF";
        const auto byte = static_cast<unsigned char>(c);
        throw BadZoneLine{std::string("a word has the byte 0x") + digits[byte >> 4] + digits[byte & 15]};
    }
}

template <std::size_t N>
std::optional<unsigned> indexIn(const std::array<std::string_view, N>& names, std::string_view word) {
    const auto found = std::find(names.begin(), names.end(), word);
    return found == names.end() ? std::nullopt : std::optional(static_cast<unsigned>(found - names.begin()));
}

// A number of up to `mostDigits` digits, taken from the front of `text`.
std::optional<int> takeNumber(std::string_view& text, std::size_t mostDigits) {
    std::size_t digits = 0;
    int value = 0;
    while (digits < text.size() && isDigit(text[digits])) {
        value = value * 10 + (text[digits] - '0');
        if (++digits > mostDigits) {
            return std::nullopt;
        }
    }
    text.remove_prefix(digits);
    return digits == 0 ? std::nullopt : std::optional(value);
}

int readYear(std::string_view word) {
    std::string_view rest = word;
    const std::optional<int> year = takeNumber(rest, 4);
    if (!year || !rest.empty()) {
        bad(word, "is not a year");
    }
    return *year;
}

unsigned readMonth(std::string_view word) {
    const std::optional<unsigned> month = indexIn(monthNames, word);
    if (!month) {
        bad(word, "is not a month, as \"Jan\"");
    }
    return *month + 1;
}

unsigned readWeekday(std::string_view word, std::string_view name) {
    const std::optional<unsigned> weekday = indexIn(weekdayNames, name);
    if (!weekday) {
        bad(word, "is not a day, as \"5\", \"lastSun\", \"Sun>=8\" or \"Sun<=25\"");
    }
    return *weekday;
}

// A day that the month has in each of the years.
ZoneDay readDay(std::string_view word, unsigned month, int from, int to) {
    constexpr std::string_view last = "last";
    if (word.starts_with(last)) {
        return {ZoneDay::Kind::Last, month, 31, readWeekday(word, word.substr(last.size()))};
    }
    ZoneDay day{ZoneDay::Kind::OfMonth, month, 0, 0};
    std::string_view number = word;
    if (const std::size_t relation = word.find_first_of("<>"); relation != std::string_view::npos) {
        day.weekday = readWeekday(word, word.substr(0, relation));
        day.kind = word[relation] == '>' ? ZoneDay::Kind::OnOrAfter : ZoneDay::Kind::OnOrBefore;
        number = word.substr(relation + 1);
        if (!number.starts_with('=')) {
            readWeekday(word, {});
        }
        number.remove_prefix(1);
    }
    const std::optional<int> value = takeNumber(number, 2);
    if (!value || !number.empty()) {
        readWeekday(word, {});
    }
    day.day = static_cast<unsigned>(*value);
    constexpr int commonYear = 2001;
    if (day.day < 1 || day.day > lastDayOfMonth(from == to ? from : commonYear, month)) {
        bad(word, "is not a day of that month");
    }
    // The `date` library looks for it in its own year.
    if ((day.kind == ZoneDay::Kind::OnOrBefore && month == 1 && day.day < 7) ||
        (day.kind == ZoneDay::Kind::OnOrAfter && month == 12 && day.day > 25)) {
        bad(word, "is not a day of one year, but of two");
    }
    return day;
}

struct Clock {
    std::int64_t seconds = 0;
    bool hasMinutes = false; ///< minutes or seconds that are not zero
};

// H, H:MM or H:MM:SS, without a sign, from the front of `text`.
std::optional<Clock> takeClock(std::string_view& text, int secondsInMinute = 60) {
    const std::optional<int> hours = takeNumber(text, 3);
    if (!hours || *hours > mostHours) {
        return std::nullopt;
    }
    Clock clock{*hours * secondsPerHour, false};
    std::int64_t unit = 60;
    for (int limit = 60; unit > 0 && text.starts_with(':'); unit /= 60, limit = secondsInMinute) {
        text.remove_prefix(1);
        const std::optional<int> part = takeNumber(text, 2);
        if (!part || *part >= limit) {
            return std::nullopt;
        }
        clock.seconds += *part * unit;
        clock.hasMinutes = clock.hasMinutes || *part != 0;
    }
    return clock;
}

// The AT of a rule, the time of an UNTIL: a clock, and a letter for whose it is.
struct TimeOfDay {
    std::int64_t seconds = 0;
    bool isUtc = false;
};

TimeOfDay readTime(std::string_view word) {
    std::string_view rest = word;
    const bool isNegative = rest.starts_with('-');
    rest.remove_prefix(isNegative ? 1 : 0);
    const std::optional<Clock> clock = takeClock(rest);
    if (!clock || rest.size() > 1 || (!rest.empty() && std::string_view("wsu").find(rest[0]) > 2)) {
        bad(word, "is not a time, as \"2:00\", \"2:00s\" or \"1:00u\"");
    }
    if (isNegative && clock->hasMinutes) {
        bad(word, "is a negative time with minutes, which is misread");
    }
    return {isNegative ? -clock->seconds : clock->seconds, rest == "u"};
}

// STDOFF and SAVE.
std::int64_t readSpan(std::string_view word) {
    std::string_view rest = word;
    const bool isNegative = rest.starts_with('-');
    rest.remove_prefix(isNegative || rest.starts_with('+') ? 1 : 0);
    const std::optional<Clock> clock = takeClock(rest);
    if (!clock || !rest.empty() || clock->seconds > secondsPerDay) {
        bad(word, "is not a length of time, as \"1:00\"");
    }
    return isNegative ? -clock->seconds : clock->seconds;
}

std::int64_t readSaveMinutes(std::string_view word) {
    const std::int64_t seconds = readSpan(word);
    // The bounds are those that the `date` library takes for granted.
    if (seconds % 60 != 0 || seconds < -secondsPerHour || seconds > 2 * secondsPerHour) {
        bad(word, "is not a saving in whole minutes from -1:00 to 2:00");
    }
    return seconds / 60;
}

// Whether a word in the place of a rule's name is one, and not a length of time.
bool isRuleName(std::string_view word) {
    return !isDigit(word[0]) && word[0] != '-' && word[0] != '+';
}

} // namespace

std::int64_t daysOf(const ZoneDay& day, int year) {
    const auto weekdayOf = [](std::int64_t days) {
        constexpr std::int64_t thursday = 4; // 1970-01-01
        return ((days + thursday) % 7 + 7) % 7;
    };
    const bool isLast = day.kind == ZoneDay::Kind::Last;
    const std::int64_t days =
        daysFromCivil(year, day.month, isLast ? lastDayOfMonth(year, day.month) : day.day);
    if (day.kind == ZoneDay::Kind::OfMonth) {
        return days;
    }
    const std::int64_t after = (day.weekday - weekdayOf(days) + 7) % 7;
    return day.kind == ZoneDay::Kind::OnOrAfter || after == 0 ? days + after : days + after - 7;
}

ZoneWords zoneWords(std::string_view line) {
    ZoneWords words;
    for (std::size_t at = 0; at < line.size();) {
        if (isBlank(line[at])) {
            ++at;
            continue;
        }
        if (line[at] == '#') {
            break;
        }
        const std::size_t begin = at;
        for (; at < line.size() && !isBlank(line[at]); ++at) {
            requirePlain(line[at]);
        }
        if (words.count == ZoneWords::most) {
            throw BadZoneLine{"there are more words than any line has"};
        }
        words.word[words.count++] = line.substr(begin, at - begin);
    }
    return words;
}

ZoneRule readZoneRule(const ZoneWords& words) {
    if (words.count != 10) {
        throw BadZoneLine{"a rule has ten words, not " + std::to_string(words.count)};
    }
    ZoneRule rule;
    rule.name = words.word[1];
    if (!isRuleName(rule.name)) {
        bad(rule.name, "is not a name for a rule");
    }
    rule.from = words.word[2] == "min" ? firstZoneYear : readYear(words.word[2]);
    rule.to = words.word[3] == "only"  ? rule.from
              : words.word[3] == "max" ? lastZoneYear
                                       : readYear(words.word[3]);
    if (rule.to < rule.from) {
        throw BadZoneLine{"the rule ends before it begins"};
    }
    if (words.word[4] != "-") {
        bad(words.word[4], "stands where a \"-\" should");
    }
    rule.on = readDay(words.word[6], readMonth(words.word[5]), rule.from, rule.to);
    rule.atSeconds = readTime(words.word[7]).seconds;
    rule.saveMinutes = readSaveMinutes(words.word[8]);
    return rule;
}

ZoneSpan readZoneSpan(const ZoneWords& words, std::size_t first) {
    const std::size_t count = words.count - first;
    if (words.count < first + 3 || count > 7) {
        throw BadZoneLine{"a line of a zone has three to seven words behind its name, not " +
                          std::to_string(words.count < first ? 0 : count)};
    }
    const std::string_view* word = words.word.data() + first;
    ZoneSpan span;
    span.offsetSeconds = readSpan(word[0]);
    if (isRuleName(word[1])) {
        span.rule = word[1];
    } else if (word[1] != "-") {
        readSaveMinutes(word[1]);
    }
    if (count == 3) {
        return span;
    }
    const int year = readYear(word[3]);
    const unsigned month = count > 4 ? readMonth(word[4]) : 1;
    const ZoneDay day = readDay(count > 5 ? word[5] : "1", month, year, year);
    const TimeOfDay time = count > 6 ? readTime(word[6]) : TimeOfDay();
    span.until = daysOf(day, year) * secondsPerDay + time.seconds - (time.isUtc ? 0 : span.offsetSeconds);
    return span;
}

void readLeapSecond(const ZoneWords& words) {
    if (words.count != 7) {
        throw BadZoneLine{"a leap second has seven words, not " + std::to_string(words.count)};
    }
    const int year = readYear(words.word[1]);
    readDay(words.word[3], readMonth(words.word[2]), year, year);
    std::string_view time = words.word[4];
    if (!takeClock(time, 61) || !time.empty()) {
        bad(words.word[4], "is not a time, as \"23:59:60\"");
    }
    if (words.word[5] != "+" && words.word[5] != "-") {
        bad(words.word[5], "stands where \"+\" or \"-\" should");
    }
    if (!words.word[6].starts_with('S') && !words.word[6].starts_with('R')) {
        bad(words.word[6], "is neither \"S\" nor \"R\"");
    }
}

} // namespace kvt::ex::datetime::detail
