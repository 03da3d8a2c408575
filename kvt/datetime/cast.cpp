// cast: a value as another kind.

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/detail/record.h>
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>

#include <span>
#include <string_view>

namespace kvt::ex::datetime {

namespace {

using detail::CanonicalRecord;
using detail::Outcome;
using detail::ValueAnswer;

// Whether a value has the parts of a kind without an offset, and no others.
bool hasPartsOf(TemporalType kind, TemporalType type) noexcept {
    switch (kind) {
    case TemporalType::Time:
        return detail::isTimeKind(type);
    case TemporalType::Date:
        return type == TemporalType::Date;
    default:
        return type == TemporalType::Datetime || type == TemporalType::DatetimeWithOffset;
    }
}

// The state says whether the offset was repaired, if the text has it.
Outcome<ValueAnswer> castTo(TemporalType kind, const CanonicalRecord& record) {
    Outcome<ValueAnswer> answer;
    if (hasPartsOf(kind, record.type)) { // as it mostly has: nothing is left out or added then
        answer->text = record.canonicalText();
        if (!answer->text.empty()) {
            return answer;
        }
    }
    detail::setAnswer(*answer, record);
    answer->kind = kind;
    if (kind == TemporalType::Date) {
        answer->offset.reset();
    } else if (record.offsetRepaired) {
        answer->state = ReturnState::Repaired;
    }
    return answer;
}

// What a message says of a value that cannot become the target: the word for its family, then the target and, for a
// time, all the later targets that it cannot become either.
std::span<const std::string_view> wordsOfFailure(TemporalType kind, CastToTemporalType target) noexcept {
    static constexpr std::string_view ofDate[] = {"date", "unknown"};
    static constexpr std::string_view ofDatetime[] = {"datetime", "unknown"};
    static constexpr std::string_view timeToDate[] = {"time", "date", "datetime", "unknown"};
    static constexpr std::string_view timeToDatetime[] = {"time", "datetime", "unknown"};
    static constexpr std::string_view timeToUnknown[] = {"time", "unknown"};
    std::span<const std::string_view> words = timeToUnknown;
    if (kind == TemporalType::Date) {
        words = ofDate;
    } else if (!detail::isTimeKind(kind)) {
        words = ofDatetime;
    } else if (target == CastToTemporalType::Date) {
        words = timeToDate;
    } else if (target == CastToTemporalType::Datetime) {
        words = timeToDatetime;
    }
    return target > CastToTemporalType::Unknown ? words.first(1)
                                                : words; // there is no word for such a target
}

Outcome<ValueAnswer> castRecord(const CanonicalRecord& record, CastToTemporalType target) {
    const bool isTime = detail::isTimeKind(record.type);
    switch (target) {
    case CastToTemporalType::Time:
        return castTo(TemporalType::Time, record);
    case CastToTemporalType::Date:
    case CastToTemporalType::Datetime:
        if (!isTime) {
            return castTo(target == CastToTemporalType::Date ? TemporalType::Date : TemporalType::Datetime,
                          record);
        }
        break;
    case CastToTemporalType::Unknown:
        break;
    }
    return detail::CastImpossible{wordsOfFailure(record.type, target)};
}

} // namespace

TextResult cast(const UString<0>& value, CastToTemporalType target) {
    return detail::guarded<UString<0>>([&] {
        return detail::readValue(detail::viewOf(value)).andThen([&](const CanonicalRecord& record) {
            return castRecord(record, target);
        });
    });
}

} // namespace kvt::ex::datetime
