// The public values. Their setters check nothing, so that the texts made here have room for fields of any size; only
// create() and the readers know bounds.
#include <kvt/datetime/datetime_parts.h>
#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/text.h>

#include <array>
#include <optional>

namespace kvt::ex::datetime {

namespace {

constexpr bool isExtended(FormatType format) noexcept {
    return format == FormatType::Extended;
}

} // namespace

DateTimeParts::DateTimeParts(std::int64_t year, std::uint64_t month, std::uint64_t day, std::uint64_t hours,
                             std::uint64_t minutes, double seconds, const UString<0>& offset)
    : DateTimeParts(year, month, day, hours, minutes, detail::splitSeconds(seconds).seconds,
                    detail::splitSeconds(seconds).nanoseconds, offset) {}

DateTimeParts::DateTimeParts(std::int64_t year, std::uint64_t month, std::uint64_t day, std::uint64_t hours,
                             std::uint64_t minutes, std::uint64_t seconds, std::uint64_t nanoseconds,
                             const UString<0>& offset)
    : year_(year), month_(month), day_(day), hours_(hours), minutes_(minutes), seconds_(seconds),
      nanoseconds_(nanoseconds) {
    setOffset(offset);
    type_ = hasOffset() ? TemporalType::DatetimeWithOffset : TemporalType::Datetime;
}

void DateTimeParts::setOffset(const UString<0>& offset) {
    const std::optional<detail::OffsetForm> form = detail::offsetOfText(detail::viewOf(offset));
    offset_ = form ? UString<0>(UStringView<0>(form->view())) : UString<0>();
}

UString<0> DateTimeParts::secondsFractionalToString() const {
    detail::TextBuffer text;
    if (seconds_ < 10) {
        text.put('0');
    }
    text.putSeconds(seconds_, nanoseconds_);
    return text.toString();
}

UString<0> DateTimeParts::toDateString(const FormatType& format) const {
    detail::TextBuffer text;
    if (hasDate()) {
        detail::writeDate(text, year_, month_, day_, isExtended(format));
    }
    return text.toString();
}

UString<0> DateTimeParts::toTimeString(const FormatType& format, bool withOffset) const {
    detail::TextBuffer text;
    detail::writeTime(text, hours_, minutes_, seconds_, nanoseconds_, isExtended(format));
    if (withOffset) {
        text.put(detail::viewOf(offset_));
    }
    return text.toString();
}

UString<0> DateTimeParts::toDatetimeString(const FormatType& format, bool withOffset) const {
    detail::TextBuffer text;
    if (hasDate()) {
        detail::writeDate(text, year_, month_, day_, isExtended(format));
        if (isExtended(format)) {
            text.put('T');
        }
    }
    detail::writeTime(text, hours_, minutes_, seconds_, nanoseconds_, isExtended(format));
    if (withOffset) {
        text.put(detail::viewOf(offset_));
    }
    return text.toString();
}

IntervalParts::IntervalParts(std::uint64_t years, std::uint64_t months, std::uint64_t days,
                             std::uint64_t hours, std::uint64_t minutes, double seconds,
                             bool negative) noexcept
    : years_(years), months_(months), days_(days), hours_(hours), minutes_(minutes),
      seconds_(detail::splitSeconds(seconds).seconds),
      nanoseconds_(detail::splitSeconds(seconds).nanoseconds), negative_(negative) {}

UString<0> secondsFractionalToString(double seconds) {
    std::array<char, detail::longestFixedDouble> text;
    const char* const end = detail::writeFixed(text.data(), text.data() + text.size(), seconds);
    return UString<0>(UStringView<0>(text.data(), static_cast<std::size_t>(end - text.data())));
}

} // namespace kvt::ex::datetime
