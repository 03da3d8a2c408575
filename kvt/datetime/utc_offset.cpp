// The public face of offset.h. It alone takes the empty text, which is not an offset and counts as zero minutes.
#include <kvt/datetime/detail/offset.h>
#include <kvt/datetime/detail/text.h>
#include <kvt/datetime/utc_offset.h>

#include <optional>

namespace kvt::ex::datetime {

kvt::future::optional<ZQTDateTimeUTCOffset> ZQTDateTimeUTCOffset::repairOffset(const UString<0>& text) {
    if (text.isEmpty()) {
        return ZQTDateTimeUTCOffset(0, UString<0>());
    }
    const std::optional<detail::OffsetForm> form = detail::offsetOfText(detail::viewOf(text));
    if (!form) {
        return std::nullopt;
    }
    return ZQTDateTimeUTCOffset(form->minutes, UString<0>(UStringView<0>(form->view())));
}

} // namespace kvt::ex::datetime
