// The key of a number is its class, in which negative ones are before zero and zero before positive ones; then, for
// what is neither zero nor infinite, its exponent as eight bytes, highest first, and its digits without zeros around
// them. Of negative numbers, the bytes are turned round, and closed by one that is above all others.
#include "sort/line_key.h"

#include "base/text_units.h"
#include "text/text_operation.h"

#include <kvt/datetime/datetime.h>
#include <kvt/foundation/throwable.h>

#include <algorithm>
#include <charconv>
#include <iterator>
#include <tuple>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;

// The first bytes of keys of numbers and dates.
enum Class : char {
    MissingFirst,
    NegativeInfinity,
    Negative,
    Zero,
    Positive,
    PositiveInfinity,
    TimeOfDay,
    Date,
    MissingLast,
};

// No number and no date that anybody means is nearly as long.
constexpr std::size_t longestValue = 64 * 1024;

// The folded form of a piece of valid UTF-8.
void fold(std::string_view text, std::string& out) {
    if (!std::all_of(text.begin(), text.end(), isAscii)) {
        appendFolded(text, out);
        return;
    }
    std::transform(text.begin(), text.end(), std::back_inserter(out), asciiLower);
}

// Bytes at the front of `text` that are whole characters, at most `most` of them.
std::size_t wholeCharacters(std::string_view text, std::size_t most) {
    if (text.size() <= most) {
        return text.size();
    }
    std::size_t size = most;
    while (isContinuation(text[size])) {
        --size;
    }
    return size;
}

std::string_view withoutBlanks(std::string_view text) {
    constexpr std::string_view blanks = " \t\r";
    const std::size_t first = std::min(text.find_first_not_of(blanks), text.size());
    text.remove_prefix(first);
    return text.substr(0, text.find_last_not_of(blanks) + 1);
}

// Takes digits off the front.
std::string_view takeDigits(std::string_view& text) {
    const auto end = std::find_if_not(text.begin(), text.end(), isDigit);
    const std::string_view digits = text.substr(0, static_cast<std::size_t>(end - text.begin()));
    text.remove_prefix(digits.size());
    return digits;
}

bool isWord(std::string_view text, std::string_view word) {
    return std::equal(text.begin(), text.end(), word.begin(), word.end(),
                      [](char left, char right) { return asciiLower(left) == right; });
}

// What stands behind "e"; false where that is not an exponent.
bool readExponent(std::string_view text, std::int64_t& exponent) {
    constexpr std::size_t mostDigits = 17;
    const bool isNegative = text.starts_with('-');
    text.remove_prefix(isNegative || text.starts_with('+') ? 1 : 0);
    const char* const end = text.data() + text.size();
    if (text.empty() || !isDigit(text.front()) || text.size() > mostDigits ||
        std::from_chars(text.data(), end, exponent).ptr != end) {
        return false;
    }
    exponent = isNegative ? -exponent : exponent;
    return true;
}

// The number is 0.DIGITS times ten to the power of `exponent`.
void appendFinite(bool isNegative, std::int64_t exponent, const std::string& digits, std::string& key) {
    key += isNegative ? Negative : Positive;
    const std::size_t begin = key.size();
    const std::uint64_t biased = static_cast<std::uint64_t>(exponent) ^ (std::uint64_t{1} << 63);
    for (int shift = 56; shift >= 0; shift -= 8) {
        key += static_cast<char>(biased >> shift);
    }
    key += digits;
    if (isNegative) {
        std::transform(key.begin() + static_cast<std::ptrdiff_t>(begin), key.end(),
                       key.begin() + static_cast<std::ptrdiff_t>(begin),
                       [](char byte) { return static_cast<char>(~byte); });
        key += '\xff';
    }
}

bool isGood(datetime::ReturnState state) {
    return state == datetime::ReturnState::Success || state == datetime::ReturnState::Repaired;
}

} // namespace

LineKeys::LineKeys(const KeyRule& rule, Workspace& workspace, std::uint64_t memory)
    : rule_(rule), dateFormat_(rule.dateFormat.data(), rule.dateFormat.size()), workspace_(workspace),
      key_(workspace, memory) {}

std::string_view LineKeys::of(std::string_view line) {
    const std::string_view field = rule_.field == 0 ? line : fieldOf(line);
    switch (rule_.by) {
    case KeyRule::By::Bytes:
        return field;
    case KeyRule::By::FoldedText:
        return folded(field);
    case KeyRule::By::Number:
    case KeyRule::By::Date:
        break;
    }
    piece_.clear();
    wasFound_ = field.size() <= longestValue &&
                (rule_.by == KeyRule::By::Number ? appendNumberKey(field, piece_)
                                                 : appendDateKey(field, dateFormat_, piece_));
    if (!wasFound_) {
        piece_ += rule_.missingFirst ? MissingFirst : MissingLast;
    }
    return piece_;
}

// A field that is not there is empty.
std::string_view LineKeys::fieldOf(std::string_view line) const {
    for (std::uint64_t number = 1; number < rule_.field; ++number) {
        const std::size_t end = findDelimiter(line);
        if (end == std::string_view::npos) {
            return {};
        }
        line.remove_prefix(end + rule_.delimiter.size());
    }
    return line.substr(0, findDelimiter(line));
}

// A line may be longer than what may be held in memory.
std::size_t LineKeys::findDelimiter(std::string_view text) const {
    constexpr std::size_t window = 1024 * 1024;
    const std::size_t overlap = rule_.delimiter.size() - 1;
    for (std::size_t begin = 0;; begin += window) {
        const std::size_t found = text.substr(begin, window + overlap).find(rule_.delimiter);
        if (found != std::string_view::npos) {
            return begin + found;
        }
        if (text.size() - begin <= window + overlap) {
            return std::string_view::npos;
        }
        workspace_.letGo(text.substr(begin, window));
    }
}

std::string_view LineKeys::folded(std::string_view text) {
    constexpr std::size_t foldedAtOnce = 64 * 1024;
    key_.clear();
    while (!text.empty()) {
        const std::size_t size = wholeCharacters(text, foldedAtOnce);
        piece_.clear();
        fold(text.substr(0, size), piece_);
        key_.append(piece_);
        workspace_.letGo(text.substr(0, size));
        text.remove_prefix(size);
    }
    return key_.view();
}

bool appendNumberKey(std::string_view text, std::string& key) {
    text = withoutBlanks(text);
    const bool isNegative = text.starts_with('-');
    text.remove_prefix(isNegative || text.starts_with('+') ? 1 : 0);
    if (isWord(text, "inf") || isWord(text, "infinity")) {
        key += isNegative ? NegativeInfinity : PositiveInfinity;
        return true;
    }
    const std::string_view whole = takeDigits(text);
    std::string_view fraction;
    if (text.starts_with('.')) {
        text.remove_prefix(1);
        fraction = takeDigits(text);
    }
    std::int64_t exponent = 0;
    const bool hasExponent = text.starts_with('e') || text.starts_with('E');
    if ((whole.empty() && fraction.empty()) || (!hasExponent && !text.empty()) ||
        (hasExponent && !readExponent(text.substr(1), exponent))) {
        return false;
    }
    std::string digits(whole);
    digits.append(fraction);
    const std::size_t first = digits.find_first_not_of('0');
    if (first == std::string::npos) {
        key += Zero;
        return true;
    }
    exponent += static_cast<std::int64_t>(whole.size()) - static_cast<std::int64_t>(first);
    digits = digits.substr(first, digits.find_last_not_of('0') + 1 - first);
    appendFinite(isNegative, exponent, digits, key);
    return true;
}

bool appendDateKey(std::string_view text, const kvt::ex::UString<0>& format, std::string& key) {
    constexpr const char* offsetSigns = "+-";
    try {
        const auto read = datetime::parse(kvt::ex::UString<0>(text.data(), text.size()), format, false);
        if (!isGood(std::get<0>(read))) {
            return false;
        }
        std::string value = std::get<1>(read).toStdString();
        if (value.find_first_of(offsetSigns) != std::string::npos) {
            const auto inUtc =
                datetime::timezoneSet(std::get<1>(read), "utc", datetime::SetZoneMode::Convert);
            if (!isGood(std::get<0>(inUtc))) {
                return false;
            }
            value = std::get<1>(inUtc).toStdString();
        }
        value.resize(std::min(value.find_first_of(offsetSigns), value.size()));
        if (value.empty()) {
            return false;
        }
        constexpr std::size_t digitsOfTime = 6;
        const bool isTime = std::min(value.find('.'), value.size()) == digitsOfTime;
        key += isTime ? TimeOfDay : Date;
        key += value;
        return true;
    } catch (const kvt::ex::Throwable&) { // of bytes that are not text
        return false;
    }
}

} // namespace host
