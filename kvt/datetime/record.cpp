#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/text.h>

#include <optional>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::size_t dateDigits = 8;
constexpr std::size_t timeDigits = 6;

UString<0> stringOf(std::string_view text) {
    return UString<0>(UStringView<0>(text));
}

std::string_view withoutZerosAtEnd(std::string_view digits) noexcept {
    while (!digits.empty() && digits.back() == '0') {
        digits.remove_suffix(1);
    }
    return digits;
}

// Cuts `text` in front of the first character that `isCut` accepts, and returns the rest with it; empty if none.
template <typename Predicate>
std::string_view cutAt(std::string_view& text, Predicate isCut) noexcept {
    std::size_t position = 0;
    while (position < text.size() && !isCut(text[position])) {
        ++position;
    }
    const std::string_view rest = text.substr(position);
    text = text.substr(0, position);
    return rest;
}

// The kind by the number of digits alone.
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

// The numbers of a record as they are written, unchecked.
DateTimeFields numbersOf(const CanonicalRecord& record) noexcept {
    DateTimeFields fields;
    if (!record.dateText.isEmpty()) {
        const std::string_view date = viewOf(record.dateText);
        fields.year = static_cast<std::int64_t>(digitsValue(date.substr(0, 4)));
        fields.month = digitsValue(date.substr(4, 2));
        fields.day = digitsValue(date.substr(6, 2));
    }
    if (!record.timeText.isEmpty()) {
        const std::string_view time = viewOf(record.timeText);
        fields.hours = static_cast<std::int64_t>(digitsValue(time.substr(0, 2)));
        fields.minutes = static_cast<std::int64_t>(digitsValue(time.substr(2, 2)));
        fields.seconds = static_cast<std::int64_t>(digitsValue(time.substr(4)));
    }
    if (!record.fractionText.isEmpty()) {
        fields.nanoseconds = static_cast<std::int64_t>(fractionNanoseconds(viewOf(record.fractionText)));
    }
    return fields;
}

} // namespace

Outcome<CanonicalRecord> parseCanonical(std::string_view text, bool lenient) {
    Outcome<CanonicalRecord> outcome{CanonicalRecord()};
    CanonicalRecord& record = *outcome;
    record.lenient = lenient;

    std::string_view digits = trimmed(text);
    const std::string_view rawOffset = cutAt(digits, [](char c) { return c == '+' || c == '-'; });
    std::optional<OffsetForm> offset;
    if (!rawOffset.empty()) {
        offset = readOffset(rawOffset);
        if (!offset) {
            return outcome;
        }
        record.offsetRepaired = offset->view() != rawOffset;
    }
    std::string_view fraction = cutAt(digits, [](char c) { return c == '.'; });
    const bool hasPoint = !fraction.empty();
    if (hasPoint) {
        fraction = withoutZerosAtEnd(fraction.substr(1));
    }
    if (!allDigits(digits) || !allDigits(fraction)) {
        return outcome;
    }
    record.fractionText = stringOf(fraction);
    record.type = typeOf(digits.size(), hasPoint, offset.has_value());
    if (record.type == TemporalType::Unsupported) {
        return outcome;
    }
    if (digits.size() != timeDigits) {
        record.dateText = stringOf(digits.substr(0, dateDigits));
    }
    if (digits.size() != dateDigits) {
        record.timeText = stringOf(digits.substr(digits.size() - timeDigits));
    }
    if (offset) {
        record.offsetText = stringOf(offset->view());
    }
    Outcome<NanoCount> checked = countFromFields(numbersOf(record), lenient);
    if (!checked) {
        outcome = std::move(checked.failure());
    }
    return outcome;
}

Outcome<DateTimeParts> partsFromRecord(const CanonicalRecord& record, bool withOffset) {
    DateTimeParts parts;
    if (record.type == TemporalType::Unsupported) {
        return parts;
    }
    const DateTimeFields fields = numbersOf(record);
    const Outcome<NanoCount> checked = countFromFields(fields, record.lenient);
    if (!checked) {
        return checked.failure();
    }
    parts.setYear(fields.year);
    parts.setMonth(fields.month);
    parts.setDay(fields.day);
    parts.setHours(static_cast<std::uint64_t>(fields.hours));
    parts.setMinutes(static_cast<std::uint64_t>(fields.minutes));
    parts.setSeconds(static_cast<std::uint64_t>(fields.seconds));
    parts.setNanoseconds(static_cast<std::uint64_t>(fields.nanoseconds));
    parts.setType(record.type);
    if (withOffset) {
        parts.setOffset(record.offsetText);
    }
    return parts;
}

Outcome<TemporalInstant> instantFromRecord(const CanonicalRecord& record, bool withOffset) {
    const Outcome<NanoCount> count = countFromFields(numbersOf(record), record.lenient);
    if (!count) {
        return count.failure();
    }
    TemporalInstant instant{*count, std::nullopt};
    if (withOffset) {
        if (const std::optional<OffsetForm> offset = readOffset(viewOf(record.offsetText))) {
            instant.offsetMinutes = offset->minutes;
        }
    }
    return instant;
}

// ---- Writing

namespace {

// What a text is made of; a record has the parts of its kind only.
struct Wanted {
    bool date;
    bool time;
    bool offset;
};

// The numbers go through a count, so that what `lenient` or a rounded fraction let run over is carried.
Outcome<UString<0>> textOf(const CanonicalRecord& record, Wanted wanted) {
    const Outcome<NanoCount> count = countFromFields(numbersOf(record), record.lenient);
    if (!count) {
        return count.failure();
    }
    const DateTimeFields fields = fieldsFromCount(*count);
    TextBuffer text;
    if (wanted.date && !isTimeKind(record.type)) {
        writeDate(text, fields.year, fields.month, fields.day, false);
    }
    if (wanted.time) {
        writeTime(text, static_cast<std::uint64_t>(fields.hours), static_cast<std::uint64_t>(fields.minutes),
                  static_cast<std::uint64_t>(fields.seconds), static_cast<std::uint64_t>(fields.nanoseconds), false);
    }
    if (wanted.offset) {
        text.put(viewOf(record.offsetText));
    }
    return text.toString();
}

} // namespace

Outcome<UString<0>> dateText(const CanonicalRecord& record) {
    return textOf(record, {true, false, false});
}

Outcome<UString<0>> timeText(const CanonicalRecord& record, bool withOffset) {
    return textOf(record, {false, true, withOffset});
}

Outcome<UString<0>> datetimeText(const CanonicalRecord& record, bool withOffset) {
    return textOf(record, {true, true, withOffset});
}

Outcome<UString<0>> canonicalText(const CanonicalRecord& record) {
    return textOf(record, {true, record.type != TemporalType::Date, true});
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
