// The reader that every function begins with, and the writer that most of them end with.
//
// A value is read once: its kind, its numbers, their count, its offset, and the pieces of its text as they stand. What
// comes between works on numbers. canonicalText() makes the text of the result, once, from a kind, numbers and an
// offset.
#pragma once

#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/failure.h>
#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/text.h>

#include <string_view>

namespace kvt::ex::datetime::detail {

/// Time or TimeWithOffset.
constexpr bool isTimeKind(TemporalType type) noexcept {
    return type == TemporalType::Time || type == TemporalType::TimeWithOffset;
}
/// TimeWithOffset or DatetimeWithOffset.
constexpr bool hasOffset(TemporalType type) noexcept {
    return type == TemporalType::TimeWithOffset || type == TemporalType::DatetimeWithOffset;
}

/// A value that has been read. The pieces of text are views into the text that it was read from.
struct CanonicalRecord {
    TemporalType type = TemporalType::Unsupported;
    bool offsetRepaired = false; ///< the offset was not canonical in the text
    bool lenient = false;
    std::string_view dateText;     ///< eight digits, or empty
    std::string_view timeText;     ///< six digits, or empty
    std::string_view fractionText; ///< digits behind the ".", without zeros at the end
    OffsetForm offset;             ///< of the kinds with an offset only
    DateTimeFields fields;         ///< as they are written; 1970-01-01 stands for a date that is not there
    TimeCount count;               ///< of the fields, with what runs over carried

    /// Canonical, or empty. A view into this record.
    std::string_view offsetText() const noexcept {
        return hasOffset(type) ? offset.view() : std::string_view();
    }
};

/// Reads a text. A wrong shape gives a record of type `Unsupported`, in which all else is open; the right shape with
/// bad numbers is a failure. With `lenient`, what exceeds the upper bounds of month, day, hours, minutes and seconds
/// is let through.
Outcome<CanonicalRecord> parseCanonical(std::string_view text, bool lenient);

/// The same without `lenient`, for who takes values only: a wrong shape fails by ValueUnsupported.
Outcome<CanonicalRecord> readValue(std::string_view text);

/// The instant of a record, without its offset a wall clock. Not for `Unsupported`, which has none.
TemporalInstant instantWithOffset(const CanonicalRecord& record) noexcept;

/// The numbers of a record within their bounds: what `lenient` or a rounded fraction let run over is carried. The year
/// may be 10000 then.
DateTimeFields carriedFields(const CanonicalRecord& record) noexcept;

/// Writes the numbers as canonical text: the date or the time or both, as the kind has them, and then `offset` as it is
/// given. The numbers are within their bounds, but for the year. Nothing for `Unsupported`.
void writeCanonical(TextBuffer& text, TemporalType kind, const DateTimeFields& fields,
                    std::string_view offset);

/// The same as a text of its own.
UString<0> canonicalText(TemporalType kind, const DateTimeFields& fields, std::string_view offset);

/// The record as text of its own kind. The offset is as it was written: "+10:75" stays.
UString<0> canonicalText(const CanonicalRecord& record);

/// The instant as text, with its offset if it has one and there is a text for it.
UString<0> canonicalText(TemporalType kind, const TemporalInstant& instant);

/// The word for a kind in messages: "date", "time", "time with UTC offset" and so on; "unsupported" for all else.
std::string_view kindWord(TemporalType type) noexcept;

} // namespace kvt::ex::datetime::detail
