// cast: a value as another kind.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;

TextResult impossible(std::initializer_list<std::string_view> words) {
    return detail::failed<UString<0>>(message_number::castImpossible, words);
}

// The state says whether the offset was repaired, if the text has it.
TextResult castTo(TemporalType kind, const CanonicalRecord& record) {
    const bool keepsOffset = kind != TemporalType::Date;
    return detail::makeDateTimeResult(
        keepsOffset && record.offsetRepaired ? ReturnState::Repaired : ReturnState::Success,
        detail::canonicalText(kind, detail::carriedFields(record),
                              keepsOffset ? record.offsetText() : std::string_view()));
}

TextResult castDate(const CanonicalRecord& record, CastToTemporalType target) {
    switch (target) {
    case CastToTemporalType::Date:
        return castTo(TemporalType::Date, record);
    case CastToTemporalType::Time:
        return castTo(TemporalType::Time, record);
    case CastToTemporalType::Datetime:
        return castTo(TemporalType::Datetime, record);
    case CastToTemporalType::Unknown:
        return impossible({"date", "unknown"});
    }
    return impossible({"date"});
}

// What a time cannot become is named with all the later targets behind it.
TextResult castTime(const CanonicalRecord& record, CastToTemporalType target) {
    switch (target) {
    case CastToTemporalType::Date:
        return impossible({"time", "date", "datetime", "unknown"});
    case CastToTemporalType::Time:
        return castTo(TemporalType::Time, record);
    case CastToTemporalType::Datetime:
        return impossible({"time", "datetime", "unknown"});
    case CastToTemporalType::Unknown:
        return impossible({"time", "unknown"});
    }
    return impossible({"time"});
}

TextResult castDatetime(const CanonicalRecord& record, CastToTemporalType target) {
    switch (target) {
    case CastToTemporalType::Date:
        return castTo(TemporalType::Date, record);
    case CastToTemporalType::Time:
        return castTo(TemporalType::Time, record);
    case CastToTemporalType::Datetime:
        return castTo(TemporalType::Datetime, record);
    case CastToTemporalType::Unknown:
        return impossible({"datetime", "unknown"});
    }
    return impossible({"datetime"});
}

} // namespace

TextResult cast(const UString<0>& value, CastToTemporalType target) {
    return detail::guarded<UString<0>>([&] {
        return detail::readValue(detail::viewOf(value)).andThen([&](const CanonicalRecord& record) {
            if (record.type == TemporalType::Date) {
                return castDate(record, target);
            }
            return detail::isTimeKind(record.type) ? castTime(record, target) : castDatetime(record, target);
        });
    });
}

} // namespace kvt::ex::datetime
