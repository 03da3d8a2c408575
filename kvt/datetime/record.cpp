// One pass over the digits, the fraction and the offset of a text. The number of digits alone says what they are.
#include <kvt/datetime/detail/record.h>

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/text.h>

#include <array>
#include <optional>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::size_t dateDigits = 8;
constexpr std::size_t timeDigits = 6;

// Cuts the digits off that a text begins with.
std::string_view takeDigits(std::string_view& text) noexcept {
    std::size_t size = 0;
    while (size < text.size() && isDigit(text[size])) {
        ++size;
    }
    const std::string_view digits = text.substr(0, size);
    text.remove_prefix(size);
    return digits;
}

std::string_view withoutZerosAtEnd(std::string_view digits) noexcept {
    while (!digits.empty() && digits.back() == '0') {
        digits.remove_suffix(1);
    }
    return digits;
}

TemporalType typeOf(std::size_t digits, bool hasPoint, bool hasOffset) noexcept {
    switch (digits) {
    case dateDigits:
        return hasOffset || hasPoint ? TemporalType::Unsupported : TemporalType::Date;
    case timeDigits:
        return hasOffset ? TemporalType::TimeWithOffset : TemporalType::Time;
    case dateDigits + timeDigits:
        return hasOffset ? TemporalType::DatetimeWithOffset : TemporalType::Datetime;
    default:
        return TemporalType::Unsupported;
    }
}

// Splits the text up; false for a wrong shape. Anything but digits, one "." and an offset is one, so that it can be met
// in the order in which it stands.
bool split(std::string_view text, CanonicalRecord& record) noexcept {
    text = trimmed(text);
    const std::string_view digits = takeDigits(text);
    const bool hasPoint = !text.empty() && text.front() == '.';
    if (hasPoint) {
        text.remove_prefix(1);
        record.fractionText = withoutZerosAtEnd(takeDigits(text));
    }
    const bool isOffset = !text.empty();
    if (isOffset) {
        const std::optional<OffsetForm> offset = readOffset(text);
        if (!offset) {
            return false;
        }
        record.offset = *offset;
        record.offsetRepaired = text.size() != offset->view().size(); // of that size there is one form
    }
    record.type = typeOf(digits.size(), hasPoint, isOffset);
    if (record.type == TemporalType::Unsupported) {
        return false;
    }
    const std::size_t dateSize = digits.size() == timeDigits ? 0 : dateDigits;
    record.dateText = digits.substr(0, dateSize);
    record.timeText = digits.substr(dateSize);
    return true;
}

std::uint64_t pairAt(std::string_view digits, std::size_t position) noexcept {
    return static_cast<std::uint64_t>((digits[position] - '0') * 10 + (digits[position + 1] - '0'));
}

void readNumbers(CanonicalRecord& record) noexcept {
    DateTimeFields& fields = record.fields;
    if (const std::string_view date = record.dateText; !date.empty()) {
        fields.year = static_cast<std::int64_t>(pairAt(date, 0) * 100 + pairAt(date, 2));
        fields.month = pairAt(date, 4);
        fields.day = pairAt(date, 6);
    }
    if (const std::string_view time = record.timeText; !time.empty()) {
        fields.hours = static_cast<std::int64_t>(pairAt(time, 0));
        fields.minutes = static_cast<std::int64_t>(pairAt(time, 2));
        fields.seconds = static_cast<std::int64_t>(pairAt(time, 4));
    }
    if (!record.fractionText.empty()) {
        fields.nanoseconds = static_cast<std::int64_t>(fractionNanoseconds(record.fractionText));
    }
}

} // namespace

Outcome<CanonicalRecord> parseCanonical(std::string_view text, bool lenient) {
    Outcome<CanonicalRecord> outcome;
    CanonicalRecord& record = *outcome;
    record.lenient = lenient;
    if (!split(text, record)) {
        record.type = TemporalType::Unsupported;
        return outcome;
    }
    readNumbers(record);
    if (const Outcome<TimeCount> count = countFromFields(record.fields, lenient)) {
        record.count = *count;
    } else {
        outcome = count.failure();
    }
    return outcome;
}

Outcome<CanonicalRecord> readValue(std::string_view text) {
    Outcome<CanonicalRecord> outcome = parseCanonical(text, false);
    if (outcome && outcome->type == TemporalType::Unsupported) {
        outcome = ValueUnsupported{text};
    }
    return outcome;
}

TemporalInstant instantWithOffset(const CanonicalRecord& record) noexcept {
    return {record.count, hasOffset(record.type) ? std::optional(record.offset.minutes) : std::nullopt};
}

DateTimeFields carriedFields(const CanonicalRecord& record) noexcept {
    const bool mayRunOver = record.lenient || record.fields.nanoseconds >= nanosPerSecond;
    return mayRunOver ? fieldsFromCount(record.count) : record.fields;
}

// ---- Writing

namespace {

// The digits of a value, in pairs one behind the other.
class Digits {
public:
    template <typename Number>
    void put(Number number) noexcept {
        const auto pair = static_cast<unsigned>(number);
        *end_++ = static_cast<char>('0' + pair / 10);
        *end_++ = static_cast<char>('0' + pair % 10);
    }
    std::string_view view() const noexcept {
        return {text_.data(), static_cast<std::size_t>(end_ - text_.data())};
    }

private:
    std::array<char, dateDigits + timeDigits> text_;
    char* end_ = text_.data();
};

} // namespace

void writeCanonical(TextBuffer& text, TemporalType kind, const DateTimeFields& fields,
                    std::string_view offset) {
    Digits digits;
    if (kind == TemporalType::Unsupported) {
        return;
    }
    if (!isTimeKind(kind)) {
        if (fields.year >= lowestYear && fields.year <= highestYear) {
            digits.put(fields.year / 100);
            digits.put(fields.year % 100);
        } else {
            text.putSigned(fields.year, 4); // of what ran over at either end
        }
        digits.put(fields.month);
        digits.put(fields.day);
    }
    if (kind == TemporalType::Date) {
        text.put(digits.view());
    } else {
        digits.put(fields.hours);
        digits.put(fields.minutes);
        digits.put(fields.seconds);
        text.put(digits.view());
        text.putFraction(static_cast<std::uint64_t>(fields.nanoseconds));
    }
    text.put(offset);
}

UString<0> canonicalText(TemporalType kind, const DateTimeFields& fields, std::string_view offset) {
    TextBuffer text;
    writeCanonical(text, kind, fields, offset);
    return text.toString();
}

UString<0> canonicalText(const CanonicalRecord& record) {
    return canonicalText(record.type, carriedFields(record), record.offsetText());
}

UString<0> canonicalText(TemporalType kind, const TemporalInstant& instant) {
    const std::optional<OffsetForm> offset =
        instant.offsetMinutes ? offsetOfMinutes(*instant.offsetMinutes) : std::nullopt;
    return canonicalText(kind, fieldsFromCount(instant.count), offset ? offset->view() : std::string_view());
}

std::string_view kindWord(TemporalType type) noexcept {
    switch (type) {
    case TemporalType::Date:
        return "date";
    case TemporalType::Time:
        return "time";
    case TemporalType::TimeWithOffset:
        return "time with UTC offset";
    case TemporalType::Datetime:
        return "datetime";
    case TemporalType::DatetimeWithOffset:
        return "datetime with UTC offset";
    case TemporalType::Unsupported:
        break;
    }
    return "unsupported";
}

} // namespace kvt::ex::datetime::detail
