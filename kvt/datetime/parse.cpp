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

#include <algorithm>
#include <array>
#include <string>
#include <string_view>

namespace kvt::ex::datetime {

namespace {

using namespace detail;

constexpr std::array<std::string_view, 5> isoPatterns = {
    "%Y-%m-%d$", "%Y-%m-%dT%H:%M:%S$", "%Y-%m-%dT%H:%M:%S%Ez$", "%H:%M:%S$", "%H:%M:%S%Ez$",
};

// The flags that make a format ask for a time and for a date. %k and %l are not among the first, so that a format
// whose only time is one of them gives a date. %s and %Es ask for both.
constexpr std::string_view timeFlags = "THIpMSs";
constexpr std::string_view dateFlags = "YmNbBdejs";
// Those that give the result an offset: %z, %Ez and %s, but not %Es.
constexpr std::string_view offsetFlags = "zs";

constexpr bool holds(std::string_view flags, char flag) {
    return flags.find(flag) != std::string_view::npos;
}

/// What a format asks for.
struct Wanted {
    bool date = false;
    bool time = false;
    bool offset = false;
};

// The format is looked at as a text: what stands in it behind a fuzzy word counts as well. In the search for offsets
// even the second character of "%%" counts as the beginning of a flag, so that "%%z" asks for one.
Wanted wantedBy(std::string_view format) {
    Wanted wanted;
    bool isSecondOfPair = false;
    for (std::size_t at = format.find('%'); at != std::string_view::npos; at = format.find('%', at + 1)) {
        std::string_view behind = format.substr(at + 1);
        const bool isModified =
            behind.size() > 1 && behind[0] == 'E' && (behind[1] == 's' || behind[1] == 'z');
        behind.remove_prefix(isModified ? 1 : 0);
        const char flag = behind.empty() ? '\0' : behind.front();
        wanted.offset |= holds(offsetFlags, flag) && !(isModified && flag == 's');
        if (!isSecondOfPair) {
            wanted.date |= holds(dateFlags, flag);
            wanted.time |= holds(timeFlags, flag);
        }
        isSecondOfPair = !isSecondOfPair && flag == '%';
    }
    return wanted;
}

// What a pattern that is known to fit gives: a date, a time or both, as it asks for them.
UString<0> resultText(const PatternReading& reading, const Wanted& wanted) {
    const DateTimeFields fields = fieldsFromCount(reading.count);
    TextBuffer text;
    if (wanted.date || !wanted.time) {
        writeDate(text, fields.year, fields.month, fields.day, false);
    }
    if (wanted.time) {
        writeTime(text, static_cast<std::uint64_t>(fields.hours), static_cast<std::uint64_t>(fields.minutes),
                  static_cast<std::uint64_t>(fields.seconds), static_cast<std::uint64_t>(fields.nanoseconds),
                  false);
        // Offsets of 100 hours and more can be read but not written; there is none then.
        const std::optional<OffsetForm> offset = offsetOfMinutes(reading.offsetMinutes);
        if (wanted.offset && offset) {
            text.put(offset->view());
        }
    }
    return text.toString();
}

// `value` and `format` are bytes in the system's encoding.
Outcome<UString<0>> readPattern(std::string_view value, std::string_view format, bool lenient) {
    const Wanted wanted = wantedBy(format);
    Outcome<PatternReading> reading = readFields(value, format, wanted.offset, lenient);
    if (!reading) {
        return std::move(reading.failure());
    }
    return resultText(*reading, wanted);
}

// The messages of patterns. A format's bytes come back as text.
std::optional<LogMessageInfo> wordsOf(const Failure& failure, std::string_view format) {
    using namespace message_number;
    if (const auto* unknown = std::get_if<ParseUnknownFlag>(&failure)) {
        return message(unknownFlag, {viewOf(readableSystemBytes(unknown->flag)), "@DateTimeParse()"});
    }
    if (const auto* mismatch = std::get_if<ParseMismatch>(&failure)) {
        std::string matched = mismatch->matched;
        std::string rest = mismatch->rest;
        cutBetweenCharacters(matched, rest);
        return message(formatMismatch,
                       {viewOf(readableSystemBytes(matched)), viewOf(readableSystemBytes(rest))});
    }
    if (const auto* validation = std::get_if<ParseValidation>(&failure)) {
        constexpr std::array numbers = {ordinalWithoutYear, dateIncomplete, offsetWithoutTime,
                                        timeIncomplete,     nothingGiven,   hourNotForMeridiem,
                                        ordinalPastYearEnd, noSuchDate,     resultYearOutOfRange};
        const auto index = static_cast<std::size_t>(*validation);
        return index < numbers.size() ? std::optional(message(numbers[index], {format})) : std::nullopt;
    }
    return messageOf(failure);
}

TextResult success(UString<0> text) {
    return makeDateTimeResult(ReturnState::Success, std::move(text));
}

// The first keyword that fits the value.
Outcome<TextResult> parseByKeywords(const UString<0>& value, const UString<0>& format,
                                    std::string_view keywords, bool lenient) {
    std::optional<Outcome<UString<0>>> found;
    const auto readAsIso = [&] {
        const std::string_view plain = trimmed(viewOf(value));
        if (!isAscii(plain)) {
            return false; // all of the value has to match, and the patterns are ASCII
        }
        const SystemBytes bytes(plain);
        return std::any_of(isoPatterns.begin(), isoPatterns.end(), [&](std::string_view pattern) {
            Outcome<UString<0>> text = readPattern(bytes.view(), pattern, lenient);
            if (text) {
                found = std::move(text);
            }
            return found.has_value();
        });
    };
    const auto readAsCanonical = [&] {
        Outcome<CanonicalRecord> record = parseCanonical(viewOf(value), lenient);
        if (!record) {
            found = Outcome<UString<0>>(std::move(record.failure()));
        } else if (record->type != TemporalType::Unsupported) {
            found = canonicalText(*record);
        }
        return found.has_value();
    };
    const bool anyKnown = forEachKeyword(
        keywords, [&](Keyword keyword) { return keyword == Keyword::Zqt ? readAsCanonical() : readAsIso(); });
    if (!found) {
        return anyKnown ? failed<UString<0>>(message_number::noKeywordMatched, {viewOf(value)})
                        : failed<UString<0>>(message_number::noKnownKeyword, {viewOf(format)});
    }
    if (!*found) {
        return std::move(found->failure());
    }
    return success(std::move(**found));
}

Outcome<TextResult> parseByPattern(std::string_view value, std::string_view pattern, bool lenient) {
    const SystemBytes valueBytes(value);
    const SystemBytes patternBytes(pattern);
    Outcome<UString<0>> text = readPattern(valueBytes.view(), patternBytes.view(), lenient);
    if (!text) {
        return std::move(text.failure());
    }
    return success(std::move(*text));
}

} // namespace

TextResult parse(const UString<0>& value, const UString<0>& format, bool lenient) {
    const std::string_view trimmedFormat = trimmed(viewOf(format));
    return guarded<UString<0>>(
        [&]() -> Outcome<TextResult> {
            const std::string_view trimmedValue = trimmed(viewOf(value));
            if (trimmedValue.empty()) {
                return makeDateTimeResult(ReturnState::Failure, UString<0>());
            }
            if (trimmedFormat.empty()) {
                return failed<UString<0>>(message_number::formatEmpty);
            }
            return isKeywordList(trimmedFormat) ? parseByKeywords(value, format, trimmedFormat, lenient)
                                                : parseByPattern(trimmedValue, trimmedFormat, lenient);
        },
        LastResort::Generic, [&](const Failure& failure) { return wordsOf(failure, trimmedFormat); });
}

} // namespace kvt::ex::datetime
