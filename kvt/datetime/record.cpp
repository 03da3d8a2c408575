// One pass over the digits, the fraction and the offset of a text. The number of digits alone says what they are.
#include <kvt/datetime/detail/record.h>

#include <kvt/datetime/detail/calendar.h>
#include <kvt/datetime/detail/text.h>

#include <algorithm>
#include <optional>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::size_t dateDigits = 8;
constexpr std::size_t timeDigits = 6;

// Cuts the digits off that a text begins with.
std::string_view takeDigits(std::string_view& text) noexcept {
    const std::string_view digits = text.substr(0, countDigits(text));
    text.remove_prefix(digits.size());
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
    record.text = text;
    const std::string_view digits = takeDigits(text);
    const bool hasPoint = !text.empty() && text.front() == '.';
    if (hasPoint) {
        text.remove_prefix(1);
        record.fractionText = withoutZerosAtEnd(takeDigits(text));
    }
    const bool isOffset = !text.empty();
    if (isOffset) {
        if (!readOffset(text, record.offset)) {
            return false;
        }
        record.offsetRepaired = text.size() != record.offset.view().size(); // of that size there is one form
    }
    record.type = typeOf(digits.size(), hasPoint, isOffset);
    if (record.type == TemporalType::Unsupported) {
        return false;
    }
    record.digits = digits;
    return true;
}

std::int64_t pairAt(std::uint64_t pairs, unsigned index) noexcept {
    return static_cast<std::int64_t>(pairs >> index * 16 & 0xFF);
}

void readNumbers(CanonicalRecord& record) noexcept {
    DateTimeFields& fields = record.fields;
    const std::string_view digits = record.digits;
    if (digits.size() >= dateDigits) {
        const std::uint64_t date = pairsOf(digits.data());
        fields.year = pairAt(date, 0) * 100 + pairAt(date, 1);
        fields.month = static_cast<std::uint64_t>(pairAt(date, 2));
        fields.day = static_cast<std::uint64_t>(pairAt(date, 3));
    }
    if (digits.size() == timeDigits) {
        fields.hours = digitPair(digits.data());
        fields.minutes = digitPair(digits.data() + 2);
        fields.seconds = digitPair(digits.data() + 4);
    } else if (digits.size() > dateDigits) {
        const std::uint64_t time = pairsOf(digits.data() + timeDigits); // the last eight end with the time
        fields.hours = pairAt(time, 1);
        fields.minutes = pairAt(time, 2);
        fields.seconds = pairAt(time, 3);
    }
    if (!record.fractionText.empty()) {
        fields.nanoseconds = static_cast<std::int64_t>(fractionNanoseconds(record.fractionText));
    }
}

} // namespace

std::string_view CanonicalRecord::dateText() const noexcept {
    return isTimeKind(type) ? std::string_view() : digits.substr(0, dateDigits);
}

std::string_view CanonicalRecord::timeText() const noexcept {
    return isTimeKind(type) ? digits : digits.substr(std::min(dateDigits, digits.size()));
}

std::string_view CanonicalRecord::canonicalText() const noexcept {
    // Zeros at the end of a fraction are in no part, nor is a "." with nothing behind it. More than nine digits are
    // rounded.
    const std::size_t fractionSize = fractionText.empty() ? 0 : 1 + fractionText.size();
    const bool isCanonical = !offsetRepaired && fractionText.size() <= nanosecondDigits &&
                             text.size() == digits.size() + fractionSize + offsetText().size();
    return isCanonical ? text : std::string_view();
}

// Apart, since few values come here: room for a failure would cost each of them.
[[gnu::noinline]] static void failWhereOutOfRange(Outcome<CanonicalRecord>& outcome) {
    if (const std::optional<DatePartRange> wrong = partOutOfRange(outcome->fields, outcome->lenient)) {
        outcome = *wrong;
    }
}

Outcome<CanonicalRecord> parseCanonical(std::string_view text, bool lenient) {
    Outcome<CanonicalRecord> outcome;
    CanonicalRecord& record = *outcome;
    record.lenient = lenient;
    if (!split(text, record)) {
        record.type = TemporalType::Unsupported;
        return outcome;
    }
    readNumbers(record);
    if (!areOfEveryYear(record.fields)) {
        failWhereOutOfRange(outcome);
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
    return {countOf(record.fields),
            hasOffset(record.type) ? std::optional(record.offset.minutes) : std::nullopt};
}

const DateTimeFields& carriedFields(const CanonicalRecord& record, DateTimeFields& carried) noexcept {
    if (!record.lenient && record.fields.nanoseconds < nanosPerSecond) {
        return record.fields;
    }
    carried = fieldsFromCount(countOf(record.fields));
    return carried;
}

// ---- Writing

void setAnswer(ValueAnswer& answer, const CanonicalRecord& record) noexcept {
    answer.kind = record.type;
    DateTimeFields carried;
    answer.fields = carriedFields(record, carried);
    if (hasOffset(record.type)) {
        answer.offset = record.offset;
    }
}

ValueAnswer answerOf(TemporalType kind, const TemporalInstant& instant, ReturnState state) noexcept {
    ValueAnswer answer;
    answer.state = state;
    answer.kind = kind;
    answer.fields = fieldsFromCount(instant.count);
    if (instant.offsetMinutes) {
        answer.offset = offsetOfMinutes(*instant.offsetMinutes);
    }
    return answer;
}

void writeCanonical(TextBuffer& text, TemporalType kind, const DateTimeFields& fields,
                    std::string_view offset) {
    if (kind == TemporalType::Unsupported) {
        return;
    }
    if (!isTimeKind(kind)) {
        text.putSigned(fields.year, 4);
        writePair(writePair(text.room(4), static_cast<unsigned>(fields.month)),
                  static_cast<unsigned>(fields.day));
    }
    if (kind != TemporalType::Date) {
        char* const place = writePair(text.room(6), static_cast<unsigned>(fields.hours));
        writePair(writePair(place, static_cast<unsigned>(fields.minutes)),
                  static_cast<unsigned>(fields.seconds));
        text.putFraction(static_cast<std::uint64_t>(fields.nanoseconds));
    }
    text.put(offset);
}

namespace {

std::string_view viewOf(const std::optional<OffsetForm>& offset) noexcept {
    return offset ? offset->view() : std::string_view();
}

} // namespace

TextResult resultOf(ReturnState state, TemporalType kind, const DateTimeFields& fields,
                    const std::optional<OffsetForm>& offset) {
    TextBuffer text;
    writeCanonical(text, kind, fields, viewOf(offset));
    return TextResult(state, UStringView<0>(text.view()), std::nullopt);
}

UString<0> canonicalText(const ValueAnswer& answer) {
    TextBuffer text;
    writeCanonical(text, answer.kind, answer.fields, viewOf(answer.offset));
    return text.toString();
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
