// The offset of an instant by its text, the two keywords included. Apart from instant.cpp, because only here an offset
// may depend on the zone of the machine.

#include <kvt/datetime/detail/instant.h>
#include <kvt/datetime/detail/local_zone.h>
#include <kvt/datetime/detail/offset.h>

namespace kvt::ex::datetime::detail {

namespace {

constexpr std::string_view localKeyword = "local";
constexpr std::string_view utcKeyword = "utc";

// The keywords are ASCII letters, and no other character folds to one of theirs.
bool isKeyword(std::string_view text, std::string_view keyword) noexcept {
    if (text.size() != keyword.size()) {
        return false;
    }
    for (std::size_t i = 0; i < text.size(); ++i) {
        const char lower = text[i] >= 'A' && text[i] <= 'Z' ? static_cast<char>(text[i] - 'A' + 'a') : text[i];
        if (lower != keyword[i]) {
            return false;
        }
    }
    return true;
}

} // namespace

void applyOffsetText(TemporalInstant& instant, std::string_view text, SetZoneMode mode) {
    if (mode == SetZoneMode::Automatic) {
        mode = instant.offsetMinutes ? SetZoneMode::Convert : SetZoneMode::Replace;
    }
    if (mode == SetZoneMode::Replace) {
        instant.offsetMinutes.reset();
    } else if (instant.offsetMinutes) {
        instant.count = utcCount(instant);
        instant.offsetMinutes = 0;
    }

    if (text.empty()) {
        instant.offsetMinutes.reset();
    } else if (isKeyword(text, localKeyword)) {
        instant.offsetMinutes = localOffsetMinutes(instant);
    } else if (isKeyword(text, utcKeyword)) {
        instant.offsetMinutes = 0;
    } else if (const std::optional<OffsetForm> offset = readOffset(text)) {
        instant.offsetMinutes = offset->minutes;
    } else {
        instant.offsetMinutes.reset();
    }

    if (mode == SetZoneMode::Convert && instant.offsetMinutes) {
        instant.count += NanoCount(std::int64_t{*instant.offsetMinutes} * nanosPerMinute);
    }
}

} // namespace kvt::ex::datetime::detail
