// format(): keywords, the check of a pattern against the kind of the value, and the messages.
#include <kvt/datetime/datetime.h>

#include <kvt/datetime/detail/keywords.h>
#include <kvt/datetime/detail/pattern_table.h>
#include <kvt/datetime/detail/pattern_writer.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/system_bytes.h>
#include <kvt/datetime/message_numbers.h>

#include <string>
#include <string_view>

namespace kvt::ex::datetime {

namespace {

using namespace detail;

std::string_view wholeCharacter(std::string_view text) {
    std::size_t length = 1;
    while (length < text.size() && (static_cast<unsigned char>(text[length]) & 0xC0) == 0x80) {
        ++length;
    }
    return text.substr(0, length);
}

// The message about the first flag of a pattern that is unknown, or that the kind of value does not allow.
std::optional<LogMessageInfo> complaintAbout(std::string_view pattern, TemporalType kind) {
    for (std::size_t at = pattern.find('%'); at != std::string_view::npos; at = pattern.find('%', at)) {
        ++at;
        if (at == pattern.size()) {
            return message(message_number::formatEndsInPercent);
        }
        if (pattern[at] == '%') {
            ++at;
            continue;
        }
        const std::string_view behind = pattern.substr(at, pattern.find('%', at) - at);
        const std::size_t length = behind.front() == 'E' ? 1 + wholeCharacter(behind.substr(1)).size()
                                                         : wholeCharacter(behind).size();
        const std::string_view flag = behind.substr(0, length);
        const PatternRow* const row = rowOfElement(pattern.substr(at - 1, 1 + length));
        const bool isKnown = row != nullptr && row->writes.writing != Writing::Unknown;
        if (isKnown && row->writes.kinds.has(kind)) {
            continue;
        }
        const std::string shown = std::string("%").append(flag);
        return isKnown ? message(message_number::flagNotForKind, {shown, kindWord(kind)})
                       : message(message_number::unknownFlag, {shown, "@DateTimeFormat()"});
    }
    return std::nullopt;
}

TextResult unsupported(const UString<0>& value) {
    return failed<UString<0>>(message_number::valueUnsupported, {viewOf(value)});
}

TextResult failedBy(const PatternFailure& failure, TemporalType kind) {
    if (const auto* flag = std::get_if<FormatFlag>(&failure)) {
        return failed<UString<0>>(message_number::flagNotForKind, {flag->flag, kindWord(kind)});
    }
    const auto& flags = std::get<FormatStringBadCombo>(failure);
    return failed<UString<0>>(message_number::flagsExcludeEachOther, {flags.first, flags.second});
}

TextResult formatByPattern(const UString<0>& value, const CanonicalRecord& record, std::string_view pattern) {
    if (record.type == TemporalType::Unsupported) {
        return unsupported(value);
    }
    if (auto complaint = complaintAbout(pattern, record.type)) {
        return makeDateTimeResult(ReturnState::Failure, UString<0>(), std::move(*complaint));
    }
    const std::optional<std::int32_t> offsetMinutes =
        hasOffset(record.type) ? std::optional(record.offset.minutes) : std::nullopt;
    const SystemBytes patternBytes(pattern);
    TextBuffer text;
    if (const std::optional<PatternFailure> failure =
            renderFields(text, patternBytes.view(), carriedFields(record), offsetMinutes)) {
        return failedBy(*failure, record.type);
    }
    return TextResult(ReturnState::Success, textOfSystemBytes(text.view()), std::nullopt);
}

TextResult formatByKeywords(const UString<0>& value, const CanonicalRecord& record,
                            std::string_view keywords) {
    std::optional<Keyword> first;
    forEachKeyword(keywords, [&](Keyword keyword) {
        first = keyword;
        return true;
    });
    if (!first) {
        return formatByPattern(value, record, keywords); // a text without any flag
    }
    if (record.type == TemporalType::Unsupported) {
        return unsupported(value);
    }
    return *first == Keyword::Zqt ? TextResult(ReturnState::Success, canonicalText(record), std::nullopt)
                                  : formatByPattern(value, record, isoWritePattern(record.type));
}

} // namespace

TextResult format(const UString<0>& value, const UString<0>& format) {
    return guarded<UString<0>>(
        [&]() -> TextResult {
            const std::string_view pattern = trimmed(viewOf(format));
            if (trimmed(viewOf(value)).empty()) {
                return TextResult(ReturnState::Failure, UString<0>(), std::nullopt);
            }
            if (pattern.empty()) {
                return failed<UString<0>>(message_number::formatEmpty);
            }
            const Outcome<CanonicalRecord> record = parseCanonical(viewOf(value), false);
            if (!record) {
                return makeDateTimeResult(ReturnState::Failure, UString<0>(), *messageOf(record.failure()));
            }
            return isKeywordList(pattern) ? formatByKeywords(value, *record, pattern)
                                          : formatByPattern(value, *record, pattern);
        },
        LastResort::UnexpectedFormat);
}

} // namespace kvt::ex::datetime
