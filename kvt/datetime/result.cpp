// Messages are numbers and parameters here; the words belong to the host.
#include <kvt/datetime/detail/result.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/message_numbers.h>

namespace kvt::ex::datetime::detail {

namespace {

void fill(LogMessageInfo& info, std::uint32_t number, std::span<const std::string_view> parameters) {
    info.messageNumber = number;
    info.parameters.reserve(parameters.size());
    for (const std::string_view parameter : parameters) {
        info.parameters.emplace_back(UStringView<0>(parameter));
    }
}

} // namespace

LogMessageInfo message(std::uint32_t number, std::span<const std::string_view> parameters) {
    LogMessageInfo info;
    fill(info, number, parameters);
    return info;
}

void setMessage(kvt::future::optional<LogMessageInfo>& info, std::uint32_t number,
                std::initializer_list<std::string_view> parameters) {
    fill(info.emplace(), number, std::span(parameters.begin(), parameters.size()));
}

LogMessageInfo genericMessage() {
    return message(message_number::generic);
}

std::optional<LogMessageInfo> messageOf(const Failure& failure) {
    if (const auto* unsupported = std::get_if<ValueUnsupported>(&failure)) {
        return message(message_number::valueUnsupported, {unsupported->value});
    }
    if (const auto* unreadable = std::get_if<IntervalUnreadable>(&failure)) {
        return message(message_number::intervalUnreadable, {unreadable->interval});
    }
    if (const auto* kinds = std::get_if<KindsNotComparable>(&failure)) {
        return message(message_number::kindsNotComparable, {kinds->first, kinds->second});
    }
    if (const auto* range = std::get_if<DatePartRange>(&failure)) {
        return message(message_number::partOutOfRange,
                       {range->value.view(), range->part, range->lowest, range->highest});
    }
    if (const auto* impossible = std::get_if<CastImpossible>(&failure)) {
        return message(message_number::castImpossible, impossible->words);
    }
    if (const auto* onTime = std::get_if<DateIntervalOnTime>(&failure)) {
        return message(message_number::dateIntervalOnTime, {onTime->value, onTime->interval});
    }
    return std::nullopt;
}

void setLastMessage(kvt::future::optional<LogMessageInfo>& info, LastResort resort) noexcept {
    try {
        switch (resort) {
        case LastResort::Generic:
            info.emplace(genericMessage());
            break;
        case LastResort::UnexpectedFormat:
            info.emplace(message(message_number::formatFailedUnexpectedly));
            break;
        case LastResort::Silence:
            break;
        }
    } catch (...) {
        info.reset(); // not even memory for the message: the state says enough
    }
}

} // namespace kvt::ex::datetime::detail
