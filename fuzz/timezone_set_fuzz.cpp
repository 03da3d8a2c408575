// timezoneSet: no input makes it throw, and what it gives agrees with timezoneGet, timezoneRemove, cast and itself.
//
// Input: a byte for the mode, then the value, a line feed, and the zone. There is no zone database, so "local" fails.
#include <fuzzing.h>

#include <kvt/datetime/datetime.h>
#include <kvt/datetime/utc_offset.h>

#include <string>

using namespace kvt::ex::datetime;
using namespace kvt::fuzz;
using kvt::ex::UString;
using kvt::ex::UStringView;

namespace {

constexpr SetZoneMode modes[] = {SetZoneMode::Automatic, SetZoneMode::Replace, SetZoneMode::Convert,
                                 static_cast<SetZoneMode>(3)};

UString<0> ustring(std::string_view text) {
    return UString<0>(UStringView<0>(text));
}

std::string textOf(const TextResult& result) {
    return std::get<1>(result).toStdString();
}

bool succeeded(const TextResult& result) {
    return std::get<0>(result) == ReturnState::Success;
}

std::uint32_t messageOf(const TextResult& result) {
    return std::get<2>(result) ? std::get<2>(result)->messageNumber : 0;
}

std::string trimmed(std::string_view text) {
    constexpr std::string_view blanks = " \t\r\n\f\v";
    const std::size_t begin = std::min(text.find_first_not_of(blanks), text.size());
    text.remove_prefix(begin);
    return std::string(text.substr(0, text.find_last_not_of(blanks) + 1));
}

std::string lowerCase(std::string text) {
    for (char& c : text) {
        c = c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c;
    }
    return text;
}

// The wall clock of a value as canonical text; a date's is midnight.
std::string wallClock(const UString<0>& value) {
    const TextResult bare = timezoneRemove(value);
    const TextResult asDatetime = cast(std::get<1>(bare), CastToTemporalType::Datetime);
    return textOf(succeeded(asDatetime) ? asDatetime : cast(std::get<1>(bare), CastToTemporalType::Time));
}

void checkFailure(const TextResult& result, const UString<0>& value, const std::string& zone,
                  SetZoneMode mode) {
    require(std::get<0>(result) == ReturnState::Failure && textOf(result).empty(), "a failure has no text");
    const TextResult bare = timezoneRemove(value);
    const bool hasOffset = succeeded(timezoneGet(value, UTCOffsetType::OffsetText));
    if (!succeeded(bare)) {
        requireEqual(messageOf(result), messageOf(bare), "the value is looked at first");
        return;
    }
    const bool isTime = wallClock(value).find('.') == 6 || wallClock(value).size() == 6;
    const std::uint32_t expected = isTime && zone == "local"                    ? 933096
                                   : mode == SetZoneMode::Convert && !hasOffset ? 933073
                                   : zone.empty()                               ? 933092
                                                                                : 0;
    requireEqual(messageOf(result), expected, "the order of checks");
    require(expected != 0 || zone == "local", "only the zone of the machine fails without a message");
}

void checkSuccess(const TextResult& result, const UString<0>& value, const std::string& zone,
                  SetZoneMode mode) {
    require(!std::get<2>(result), "success has no message");
    const UString<0>& text = std::get<1>(result);
    const auto offset = ZQTDateTimeUTCOffset::repairOffset(zone == "utc" ? ustring("+00:00") : ustring(zone));
    const TextResult offsetThen = timezoneGet(text, UTCOffsetType::OffsetInMinutes);
    if (messageOf(offsetThen) == 933065 || messageOf(timezoneRemove(text)) == 933063) {
        return; // the way to another offset led out of the years that can be read
    }
    requireEqual(textOf(offsetThen), offset ? std::to_string(offset->offsetMinutes()) : "", "the offset");

    const TextResult offsetBefore = timezoneGet(value, UTCOffsetType::OffsetText);
    if (mode == SetZoneMode::Replace || !succeeded(offsetBefore)) {
        requireEqual(wallClock(text), wallClock(value), "the wall clock stays");
    } else if (mode != static_cast<SetZoneMode>(3) && offset) {
        const TextResult back = timezoneSet(text, std::get<1>(offsetBefore), SetZoneMode::Convert);
        requireEqual(wallClock(std::get<1>(back)), wallClock(value), "there and back");
    }
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const bool withoutDatabase = (setInstallPathWrapper("/nowhere"), true);
    require(withoutDatabase, "the folder is named once");

    Input input(data, size);
    const SetZoneMode mode = input.pick(modes);
    const std::string_view rest = input.rest();
    const std::size_t end = std::min(rest.find('\n'), rest.size());
    const UString<0> value = ustring(rest.substr(0, end));
    const std::string_view zone = rest.substr(std::min(end + 1, rest.size()));

    const TextResult result = timezoneSet(value, ustring(zone), mode);
    const std::string plainZone = lowerCase(trimmed(zone));
    if (succeeded(result)) {
        checkSuccess(result, value, plainZone, mode);
    } else {
        checkFailure(result, value, plainZone, mode);
    }
    return 0;
}
