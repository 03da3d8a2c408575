// cast: a value as another kind.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;
using detail::Outcome;

TextResult impossible(std::initializer_list<std::string_view> words) {
    return detail::failed<UString<0>>(message_number::castImpossible, words);
}

// A text of the record. An offset in it makes the state tell whether it was repaired.
Outcome<TextResult> rendered(Outcome<UString<0>> text, bool repaired) {
    if (!text) {
        return text.failure();
    }
    return detail::makeDateTimeResult(repaired ? ReturnState::Repaired : ReturnState::Success, std::move(*text));
}

Outcome<TextResult> castDate(const CanonicalRecord& record, CastToTemporalType target) {
    switch (target) {
    case CastToTemporalType::Date:
        return rendered(detail::dateText(record), false);
    case CastToTemporalType::Time:
        return rendered(detail::timeText(record, false), false);
    case CastToTemporalType::Datetime:
        return rendered(detail::datetimeText(record, false), false);
    case CastToTemporalType::Unknown:
        return impossible({"date", "unknown"});
    }
    return impossible({"date"});
}

// What a time cannot become is told with all the later targets behind it.
Outcome<TextResult> castTime(const CanonicalRecord& record, CastToTemporalType target) {
    switch (target) {
    case CastToTemporalType::Date:
        return impossible({"time", "date", "datetime", "unknown"});
    case CastToTemporalType::Time:
        return rendered(detail::timeText(record, true), record.offsetRepaired);
    case CastToTemporalType::Datetime:
        return impossible({"time", "datetime", "unknown"});
    case CastToTemporalType::Unknown:
        return impossible({"time", "unknown"});
    }
    return impossible({"time"});
}

Outcome<TextResult> castDatetime(const CanonicalRecord& record, CastToTemporalType target) {
    switch (target) {
    case CastToTemporalType::Date:
        return rendered(detail::dateText(record), false);
    case CastToTemporalType::Time:
        return rendered(detail::timeText(record, true), record.offsetRepaired);
    case CastToTemporalType::Datetime:
        return rendered(detail::datetimeText(record, true), record.offsetRepaired);
    case CastToTemporalType::Unknown:
        return impossible({"datetime", "unknown"});
    }
    return impossible({"datetime"});
}

} // namespace

TextResult cast(const UString<0>& value, CastToTemporalType target) {
    return detail::guarded<UString<0>>([&]() -> Outcome<TextResult> {
        const auto record = detail::parseCanonical(detail::viewOf(value), false);
        if (!record) {
            return record.failure();
        }
        if (record->type == TemporalType::Unsupported) {
            return detail::failed<UString<0>>(message_number::valueUnsupported, {detail::viewOf(value)});
        }
        if (record->type == TemporalType::Date) {
            return castDate(*record, target);
        }
        return detail::isTimeKind(record->type) ? castTime(*record, target) : castDatetime(*record, target);
    });
}

} // namespace kvt::ex::datetime
