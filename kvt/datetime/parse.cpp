// parse(): keywords and patterns, and which kind of value a pattern gives.
#include <kvt/datetime/datetime.h>

#include <kvt/datetime/detail/keywords.h>
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
// whose only time is one of them gives a date.
constexpr std::array<std::string_view, 8> timeFlags = {"%T", "%H", "%I", "%p", "%M", "%S", "%s", "%Es"};
constexpr std::array<std::string_view, 10> dateFlags = {"%Y", "%m", "%N", "%b", "%B", "%d", "%e", "%j", "%s", "%Es"};
// Those that give the result an offset.
constexpr std::array<std::string_view, 3> offsetFlags = {"%z", "%Ez", "%s"};

constexpr std::size_t dateLength = 8;

template <typename Flags>
bool holdsAny(std::string_view format, const Flags& flags) {
    return std::any_of(flags.begin(), flags.end(),
                       [&](std::string_view flag) { return format.find(flag) != std::string_view::npos; });
}

std::string withoutPercentPairs(std::string_view format) {
    std::string rest;
    for (std::size_t i = 0; i < format.size(); ++i) {
        if (format.substr(i, 2) == "%%") {
            ++i;
        } else {
            rest += format[i];
        }
    }
    return rest;
}

// What a pattern that is known to fit gives: a date, a time or both, as it asks for them.
UString<0> resultText(const PatternReading& reading, std::string_view format, bool withOffset) {
    TemporalInstant instant{reading.count, std::nullopt};
    if (withOffset) {
        TextBuffer offset;
        writeOffset(offset, reading.offsetMinutes);
        applyOffsetText(instant, offset.view(), SetZoneMode::Replace);
    }
    const UString<0> whole = instantText(instant, withOffset);
    std::string shortened;
    std::string_view plain = format;
    if (format.find("%%") != std::string_view::npos) {
        shortened = withoutPercentPairs(format);
        plain = shortened;
    }
    if (!holdsAny(plain, timeFlags)) {
        return UString<0>(whole.substr(0, dateLength));
    }
    if (!holdsAny(plain, dateFlags)) {
        return UString<0>(whole.substr(dateLength));
    }
    return whole;
}

// `value` and `format` are bytes in the system's encoding.
Outcome<UString<0>> readPattern(std::string_view value, std::string_view format, bool lenient) {
    const bool withOffset = holdsAny(format, offsetFlags);
    Outcome<PatternReading> reading = readFields(value, format, withOffset, lenient);
    if (!reading) {
        return std::move(reading.failure());
    }
    return resultText(*reading, format, withOffset);
}

// The messages of patterns. A format's bytes come back as text.
std::optional<LogMessageInfo> wordsOf(const Failure& failure, std::string_view format) {
    using namespace message_number;
    if (const auto* unknown = std::get_if<ParseUnknownFlag>(&failure)) {
        return message(unknownFlag, {viewOf(textOfSystemBytes(unknown->flag)), "@DateTimeParse()"});
    }
    if (const auto* mismatch = std::get_if<ParseMismatch>(&failure)) {
        return message(formatMismatch, {viewOf(textOfSystemBytes(mismatch->matched)),
                                        viewOf(textOfSystemBytes(mismatch->rest))});
    }
    if (const auto* validation = std::get_if<ParseValidation>(&failure)) {
        constexpr std::array numbers = {ordinalWithoutYear, dateIncomplete,     offsetWithoutTime,
                                        timeIncomplete,     nothingGiven,       hourNotForMeridiem,
                                        ordinalPastYearEnd, noSuchDate,         resultYearOutOfRange};
        const auto index = static_cast<std::size_t>(*validation);
        return index < numbers.size() ? std::optional(message(numbers[index], {format})) : std::nullopt;
    }
    return messageOf(failure);
}

TextResult success(UString<0> text) {
    return makeDateTimeResult(ReturnState::Success, std::move(text));
}

// The first keyword that fits the value.
Outcome<TextResult> parseByKeywords(const UString<0>& value, const UString<0>& format, std::string_view keywords,
                                    bool lenient) {
    std::optional<Outcome<UString<0>>> found;
    const auto readAsIso = [&] {
        const SystemBytes bytes(trimmed(viewOf(value)));
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
