// The reader that every function begins with, and the writer that most of them end with.
//
// A value is read once: its kind, its numbers, its offset, and the pieces of its text as they stand. What comes between
// works on numbers, and makes a ValueAnswer of them. resultOf() makes the text of that, once.
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
    // Not defaulted: that would clear all of it each time a value is read.
    CanonicalRecord() noexcept {} // NOLINT(modernize-use-equals-default)

    TemporalType type = TemporalType::Unsupported;
    bool offsetRepaired = false; ///< the offset was not canonical in the text
    bool lenient = false;
    OffsetForm offset;             ///< of the kinds with an offset only
    std::string_view text;         ///< all of it, without white space at its ends
    std::string_view digits;       ///< of the date, the time or both
    std::string_view fractionText; ///< digits behind the ".", without zeros at the end
    DateTimeFields fields;         ///< as they are written; 1970-01-01 stands for a date that is not there

    /// Eight digits, or empty.
    std::string_view dateText() const noexcept;
    /// Six digits, or empty.
    std::string_view timeText() const noexcept;
    /// Canonical, or empty. A view into this record.
    std::string_view offsetText() const noexcept {
        return hasOffset(type) ? offset.view() : std::string_view();
    }
    /// The text that was read, if it is what would be written of these numbers; else empty. Only of values that were
    /// read without `lenient`, whose numbers need no carrying.
    std::string_view canonicalText() const noexcept;
};

/// Reads a text. A wrong shape gives a record of type `Unsupported`, in which all else is open; the right shape with
/// bad numbers is a failure. With `lenient`, what exceeds the upper bounds of month, day, hours, minutes and seconds
/// is let through.
Outcome<CanonicalRecord> parseCanonical(std::string_view text, bool lenient);

/// The same without `lenient`, where only values are taken: a wrong shape fails by ValueUnsupported.
Outcome<CanonicalRecord> readValue(std::string_view text);

/// The instant of a record, without its offset a wall clock. Not for `Unsupported`, which has none.
TemporalInstant instantWithOffset(const CanonicalRecord& record) noexcept;

/// The numbers of a record within their bounds: its own or, where `lenient` or a rounded fraction let some run over,
/// `carried`, which they are carried into. The year may be 10000 then.
const DateTimeFields& carriedFields(const CanonicalRecord& record, DateTimeFields& carried) noexcept;

/// A value as the answer of a function, before there is a text of it.
struct ValueAnswer {
    // Not defaulted, for the reason that a record's is not.
    ValueAnswer() noexcept {} // NOLINT(modernize-use-equals-default)

    ReturnState state = ReturnState::Success;
    TemporalType kind = TemporalType::Unsupported; ///< of the text; it is empty for this one
    DateTimeFields fields;                         ///< within their bounds, but for the year
    std::optional<OffsetForm> offset;              ///< to be written behind the value
    std::string_view text; ///< if not empty, the text itself, and the numbers play no part
};

/// Makes the answer the record as it is, of its own kind. The offset is as it was written: "+10:75" stays. In its
/// place, since a copy of what was just written has to wait for it.
void setAnswer(ValueAnswer& answer, const CanonicalRecord& record) noexcept;

/// The same as a value.
inline ValueAnswer answerOf(const CanonicalRecord& record) noexcept {
    ValueAnswer answer;
    setAnswer(answer, record);
    return answer;
}

/// The instant, with its offset if it has one and there is a text for it.
ValueAnswer answerOf(TemporalType kind, const TemporalInstant& instant,
                     ReturnState state = ReturnState::Success) noexcept;

/// A result with the text of these numbers. Like the one below, it is made in its place.
TextResult resultOf(ReturnState state, TemporalType kind, const DateTimeFields& fields,
                    const std::optional<OffsetForm>& offset);

inline TextResult resultOf(const ValueAnswer& answer) {
    return answer.text.empty() ? resultOf(answer.state, answer.kind, answer.fields, answer.offset)
                               : TextResult(answer.state, UStringView<0>(answer.text), std::nullopt);
}

/// The text alone.
UString<0> canonicalText(const ValueAnswer& answer);

/// Writes the numbers as canonical text: the date or the time or both, as the kind has them, and then `offset` as it is
/// given. The numbers are within their bounds, but for the year. Nothing for `Unsupported`.
void writeCanonical(TextBuffer& text, TemporalType kind, const DateTimeFields& fields,
                    std::string_view offset);

/// The word for a kind in messages: "date", "time", "time with UTC offset" and so on; "unsupported" for all else.
std::string_view kindWord(TemporalType type) noexcept;

} // namespace kvt::ex::datetime::detail
