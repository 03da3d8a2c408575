// format(): keywords, and the messages about a pattern that does not suit the kind of the value.
#include <kvt/datetime/datetime.h>

#include <kvt/datetime/detail/keywords.h>
#include <kvt/datetime/detail/pattern_table.h>
#include <kvt/datetime/detail/pattern_writer.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/system_bytes.h>
#include <kvt/datetime/message_numbers.h>
#include <kvt/foundation/detail/utf.h>

#include <string>
#include <string_view>

namespace kvt::ex::datetime {

namespace {

using namespace detail;

std::string_view wholeCharacter(std::string_view text) {
    std::size_t length = 1;
    while (length < text.size() && ex::detail::isContinuation(text[length])) {
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

TextResult complained(LogMessageInfo complaint) {
    return makeDateTimeResult(ReturnState::Failure, UString<0>(), std::move(complaint));
}

TextResult formatByPattern(const UString<0>& value, const CanonicalRecord& record, std::string_view pattern) {
    if (record.type == TemporalType::Unsupported) {
        return unsupported(value);
    }
    // A flag that is wrong comes before a character that the system's encoding does not have.
    if (!isSystemText(pattern)) {
        if (auto complaint = complaintAbout(pattern, record.type)) {
            return complained(std::move(*complaint));
        }
    }
    const SystemBytes patternBytes(pattern);
    TextBuffer text;
    DateTimeFields carried;
    const DateTimeFields& fields = carriedFields(record, carried);
    switch (renderFields(text, patternBytes.view(), record.type, fields, record.offset.minutes)) {
    case WrittenPattern::WrongFlag:
        return complained(complaintAbout(pattern, record.type).value());
    case WrittenPattern::EpochBesideOffset:
        return failed<UString<0>>(message_number::flagsExcludeEachOther, {"%s", "%z"});
    case WrittenPattern::Whole:
        break;
    }
    return isSystemText(text.view())
               ? TextResult(ReturnState::Success, UStringView<0>(text.view()), std::nullopt)
               : TextResult(ReturnState::Success, textOfSystemBytes(text.view()), std::nullopt);
}

TextResult formatByKeywords(const UString<0>& value, const CanonicalRecord& record,
                            std::string_view keywords) {
    const std::optional<Keyword> first = KeywordList(keywords).nextKeyword();
    if (!first) {
        return formatByPattern(value, record, keywords); // a text without any flag
    }
    if (record.type == TemporalType::Unsupported) {
        return unsupported(value);
    }
    return *first == Keyword::Zqt ? resultOf(answerOf(record))
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
