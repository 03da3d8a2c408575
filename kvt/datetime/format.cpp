// format(): keywords, the check of a pattern against the kind of the value, and the messages.
#include <kvt/datetime/datetime.h>

#include <kvt/datetime/detail/keywords.h>
#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/pattern_writer.h>
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

/// What is particular to a kind of value: the flags that ask for what it does not have, without and with the
/// modifier E, and its form in ISO 8601.
struct KindRules {
    std::string_view forbidden;
    std::string_view forbiddenModified;
    std::string_view isoPattern;
};

constexpr std::array<KindRules, 5> rulesByKind = {{
    {"sz", "z", "%Y-%m-%d"},
    {"sYymNbBuUwWdejaAz", "sz", "%H:%M:%S"},
    {"sYymNbBuUwWdejaA", "s", "%H:%M:%S%Ez"},
    {"sz", "z", "%Y-%m-%dT%H:%M:%S"},
    {"", "s", "%Y-%m-%dT%H:%M:%S%Ez"},
}};

constexpr std::string_view knownFlags = "ABHIMNSTUWYabdejklmpsuwyz";
constexpr std::string_view knownModified = "sz";

const KindRules& rulesOf(TemporalType kind) {
    return rulesByKind[static_cast<std::size_t>(kind)];
}

bool holds(std::string_view flags, char flag) {
    return flags.find(flag) != std::string_view::npos;
}

// A flag is a character, or "E" and one more if there is one.
bool isForbidden(std::string_view flag, const KindRules& rules) {
    return flag.size() == 2 && flag[0] == 'E' ? holds(rules.forbiddenModified, flag[1])
                                              : flag.size() == 1 && holds(rules.forbidden, flag[0]);
}

bool isKnown(std::string_view flag) {
    return flag.size() == 2 && flag[0] == 'E' ? holds(knownModified, flag[1])
                                              : flag.size() == 1 && holds(knownFlags, flag[0]);
}

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
        if (isForbidden(flag, rulesOf(kind))) {
            return message(message_number::flagNotForKind, {std::string("%").append(flag), kindWord(kind)});
        }
        if (!isKnown(flag)) {
            return message(message_number::unknownFlag, {std::string("%").append(flag), "@DateTimeFormat()"});
        }
    }
    return std::nullopt;
}

Outcome<TextResult> unsupported(const UString<0>& value) {
    return failed<UString<0>>(message_number::valueUnsupported, {viewOf(value)});
}

Outcome<TextResult> success(Outcome<UString<0>> text) {
    if (!text) {
        return std::move(text.failure());
    }
    return makeDateTimeResult(ReturnState::Success, std::move(*text));
}

Outcome<TextResult> formatByPattern(const UString<0>& value, const CanonicalRecord& record,
                                    std::string_view pattern) {
    if (record.type == TemporalType::Unsupported) {
        return unsupported(value);
    }
    if (auto complaint = complaintAbout(pattern, record.type)) {
        return makeDateTimeResult(ReturnState::Failure, UString<0>(), std::move(*complaint));
    }
    const std::optional<std::int32_t> offsetMinutes =
        hasOffset(record.type) ? std::optional(record.offset.minutes) : std::nullopt;
    const SystemBytes patternBytes(pattern);
    PatternText text;
    if (std::optional<Failure> failure =
            renderFields(text, patternBytes.view(), nanosOf(record.count), offsetMinutes)) {
        return std::move(*failure);
    }
    return success(textOfSystemBytes(text.view()));
}

Outcome<TextResult> formatByKeywords(const UString<0>& value, const CanonicalRecord& record,
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
    return *first == Keyword::Zqt ? success(canonicalText(record))
                                  : formatByPattern(value, record, rulesOf(record.type).isoPattern);
}

std::optional<LogMessageInfo> wordsOf(const Failure& failure, const UString<0>& value) {
    const auto* flag = std::get_if<FormatFlag>(&failure);
    if (flag == nullptr) {
        return messageOf(failure);
    }
    constexpr std::array<std::string_view, 4> flags = {"%s", "%Es", "%z", "%Z"};
    const Outcome<CanonicalRecord> record = parseCanonical(viewOf(value), false);
    return message(message_number::flagNotForKind,
                   {flags[static_cast<std::size_t>(*flag)],
                    kindWord(record ? record->type : TemporalType::Unsupported)});
}

} // namespace

TextResult format(const UString<0>& value, const UString<0>& format) {
    return guarded<UString<0>>(
        [&]() -> Outcome<TextResult> {
            const std::string_view pattern = trimmed(viewOf(format));
            if (trimmed(viewOf(value)).empty()) {
                return makeDateTimeResult(ReturnState::Failure, UString<0>());
            }
            if (pattern.empty()) {
                return failed<UString<0>>(message_number::formatEmpty);
            }
            const Outcome<CanonicalRecord> record = parseCanonical(viewOf(value), false);
            if (!record) {
                return record.failure();
            }
            return isKeywordList(pattern) ? formatByKeywords(value, *record, pattern)
                                          : formatByPattern(value, *record, pattern);
        },
        LastResort::UnexpectedFormat, [&](const Failure& failure) { return wordsOf(failure, value); });
}

} // namespace kvt::ex::datetime
