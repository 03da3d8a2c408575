// parse(): keywords and patterns, and which kind of value a pattern gives.
#include <kvt/datetime/datetime.h>

#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/keywords.h>
#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/pattern_reader.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/system_bytes.h>
#include <kvt/datetime/message_numbers.h>

#include <array>
#include <string>
#include <string_view>

namespace kvt::ex::datetime {

namespace {

using namespace detail;

// What a pattern that fits gives: a date, a time or both, as it asks for them.
TextResult resultOf(const PatternReading& reading) {
    const bool hasTime = (reading.parts & timePart) != 0;
    const bool hasDate = (reading.parts & datePart) != 0 || !hasTime;
    const TemporalType kind = hasDate && hasTime ? TemporalType::Datetime
                              : hasTime          ? TemporalType::Time
                                                 : TemporalType::Date;
    // Offsets of 100 hours and more can be read but not written; there is none then.
    const std::optional<OffsetForm> offset =
        hasTime && (reading.parts & offsetPart) != 0 ? offsetOfMinutes(reading.offsetMinutes) : std::nullopt;
    return detail::resultOf(ReturnState::Success, kind, reading.fields, offset);
}

// ---- Messages

// A part of a format that has been read, as it reads with every "%T" replaced.
std::string expanded(std::string_view format) {
    std::string text;
    while (!format.empty()) {
        const std::string_view element = elementOf(format);
        const PatternRow* const row = rowOfElement(element);
        text += row != nullptr && row->reads.reading == Reading::Time ? timeExpansion : element;
        format.remove_prefix(element.size());
    }
    return text;
}

// Whether there is one, or what looks like one behind "%%". A format is too short for a search by a call.
bool hasTimeFlag(std::string_view format) {
    for (std::size_t i = 1; i < format.size(); ++i) {
        if (format[i] == 'T' && format[i - 1] == '%') {
            return true;
        }
    }
    return false;
}

// Made in place, since a value that does not fit is nothing rare.
TextResult failedByMismatch(std::string_view format, std::size_t place) {
    place = placeBetweenCharacters(format, place);
    const std::string_view matched = format.substr(0, place);
    TextResult result(ReturnState::Failure, UStringView<0>(), std::nullopt);
    LogMessageInfo& info = std::get<2>(result).emplace();
    info.messageNumber = message_number::formatMismatch;
    info.parameters.reserve(2);
    if (hasTimeFlag(matched)) {
        appendReadable(info.parameters, expanded(matched));
    } else {
        appendReadable(info.parameters, matched);
    }
    appendReadable(info.parameters, format.substr(place));
    return result;
}

// The message about the fields as a whole; its parameter is the format as the caller gave it.
std::uint32_t numberOf(ParseValidation problem) {
    using namespace message_number;
    constexpr std::array numbers = {ordinalWithoutYear, dateIncomplete, offsetWithoutTime,
                                    timeIncomplete,     nothingGiven,   hourNotForMeridiem,
                                    ordinalPastYearEnd, noSuchDate,     resultYearOutOfRange};
    return numbers[static_cast<std::size_t>(problem)];
}

// `bytes` is the format in the system's encoding, in which the failure has its place.
TextResult failedBy(const PatternFailure& failure, std::string_view format, std::string_view bytes) {
    if (const auto* mismatch = std::get_if<ParseMismatch>(&failure)) {
        return failedByMismatch(bytes, mismatch->place);
    }
    if (const auto* problem = std::get_if<ParseValidation>(&failure)) {
        return failed<UString<0>>(numberOf(*problem), {format});
    }
    if (const auto* unknown = std::get_if<ParseUnknownFlag>(&failure)) {
        const std::string_view rest =
            bytes.substr(static_cast<std::size_t>(unknown->flag.data() - bytes.data()));
        const std::string_view flag = wholeCharacters(rest, unknown->flag.size());
        return failed<UString<0>>(message_number::unknownFlag,
                                  {viewOf(readableSystemBytes(flag)), "@DateTimeParse()"});
    }
    if (const auto* epoch = std::get_if<ParseEpochTimeRange>(&failure)) {
        return failed<UString<0>>(message_number::epochTimeOutOfRange, {epoch->seconds});
    }
    const auto& flags = std::get<FormatStringBadCombo>(failure);
    return failed<UString<0>>(message_number::flagsExcludeEachOther, {flags.first, flags.second});
}

// ---- The two kinds of format

// By the first form of ISO 8601 that fits.
bool readIso(std::string_view value, bool lenient, PatternReading& reading) {
    if (!isSystemUtf8() && !ex::detail::isAllAscii(value)) {
        return false; // all of the value has to match, and the patterns are ASCII
    }
    const SystemBytes bytes(value);
    PatternReader reader(bytes.view(), isoReadPattern(isoOrder.front()), lenient);
    for (const TemporalType kind : isoOrder) {
        const std::string_view pattern = isoReadPattern(kind);
        // Most forms begin like the one before, and need not be read from their beginning.
        if (!reader.goOnBy(pattern)) {
            reader = PatternReader(bytes.view(), pattern, lenient);
        }
        if (!reader.readAll(reading)) {
            return true;
        }
    }
    return false;
}

// By the first keyword that fits the value.
TextResult parseByKeywords(const UString<0>& value, const UString<0>& format, bool lenient) {
    bool anyKnown = false;
    KeywordList keywords(viewOf(format));
    while (const std::optional<Keyword> keyword = keywords.nextKeyword()) {
        anyKnown = true;
        if (*keyword == Keyword::Iso) {
            PatternReading reading;
            if (readIso(trimmed(viewOf(value)), lenient, reading)) {
                return resultOf(reading);
            }
        } else if (const Outcome<CanonicalRecord> record = parseCanonical(viewOf(value), lenient); !record) {
            return makeDateTimeResult(ReturnState::Failure, UString<0>(), *messageOf(record.failure()));
        } else if (record->type != TemporalType::Unsupported) {
            return resultOf(answerOf(*record));
        }
    }
    return anyKnown ? failed<UString<0>>(message_number::noKeywordMatched, {viewOf(value)})
                    : failed<UString<0>>(message_number::noKnownKeyword, {viewOf(format)});
}

TextResult parseByPattern(std::string_view value, std::string_view pattern, bool lenient) {
    const SystemBytes valueBytes(value);
    const SystemBytes patternBytes(pattern);
    PatternReading reading;
    const auto failure = PatternReader(valueBytes.view(), patternBytes.view(), lenient).readAll(reading);
    return failure ? failedBy(*failure, pattern, patternBytes.view()) : resultOf(reading);
}

} // namespace

TextResult parse(const UString<0>& value, const UString<0>& format, bool lenient) {
    return guarded<UString<0>>([&]() -> TextResult {
        const std::string_view trimmedValue = trimmed(viewOf(value));
        const std::string_view trimmedFormat = trimmed(viewOf(format));
        if (trimmedValue.empty()) {
            return TextResult(ReturnState::Failure, UString<0>(), std::nullopt);
        }
        if (trimmedFormat.empty()) {
            return failed<UString<0>>(message_number::formatEmpty);
        }
        return isKeywordList(trimmedFormat) ? parseByKeywords(value, format, lenient)
                                            : parseByPattern(trimmedValue, trimmedFormat, lenient);
    });
}

} // namespace kvt::ex::datetime
