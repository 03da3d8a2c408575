// The text of a value, split up before any number is read: the reader that every function begins with.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/instant.h>

#include <string_view>

namespace kvt::ex::datetime::detail {

struct CanonicalRecord {
    TemporalType type = TemporalType::Unsupported;
    UString<0> dateText;     ///< eight digits, or empty
    UString<0> timeText;     ///< six digits, or empty
    UString<0> fractionText; ///< digits behind the ".", without zeros at the end
    UString<0> offsetText;   ///< canonical, or empty
    bool offsetRepaired = false; ///< the offset was not canonical in the text
    bool lenient = false;
};

/// Splits a text. Wrong shapes give a record of type `Unsupported`; the right shape with bad numbers is a failure.
/// With `lenient`, what exceeds the upper bounds of month, day, hours, minutes and seconds is let through.
Outcome<CanonicalRecord> parseCanonical(std::string_view text, bool lenient);

/// The numbers of a record as they are written, checked; 1970-01-01 stands for a date that is not there. For
/// `Unsupported` the default parts, unchecked.
Outcome<DateTimeParts> partsFromRecord(const CanonicalRecord& record, bool withOffset);

/// The instant of a record: partsFromRecord and instantFromParts. With the offset if `withOffset`, else a wall clock.
/// Not for `Unsupported`, which has none.
Outcome<TemporalInstant> instantFromRecord(const CanonicalRecord& record, bool withOffset);

/// The record as canonical text, with what `lenient` let through carried over. The offset is the record's own text, not
/// made from its minutes: "+10:75" stays. The date text is empty for the kinds without a date, the time text of a date
/// is midnight, and the datetime text of a time is the time alone. Not for `Unsupported`.
Outcome<UString<0>> dateText(const CanonicalRecord& record);
Outcome<UString<0>> timeText(const CanonicalRecord& record, bool withOffset);
Outcome<UString<0>> datetimeText(const CanonicalRecord& record, bool withOffset);

/// The text of a record in the form of its own kind, with its offset. Not for `Unsupported`.
Outcome<UString<0>> canonicalText(const CanonicalRecord& record);

/// Time or TimeWithOffset; Datetime or DatetimeWithOffset.
constexpr bool isTimeKind(TemporalType type) noexcept {
    return type == TemporalType::Time || type == TemporalType::TimeWithOffset;
}
constexpr bool isDatetimeKind(TemporalType type) noexcept {
    return type == TemporalType::Datetime || type == TemporalType::DatetimeWithOffset;
}

/// The word for a kind in messages: "date", "time", "time with UTC offset" and so on; "unsupported" for all else.
std::string_view kindWord(TemporalType type) noexcept;

} // namespace kvt::ex::datetime::detail
